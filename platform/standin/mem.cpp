#include "kiv/mem.h"

#include <cstring>

void kiv_mem_set(void *dest, int value, size_t size)
{
    if (dest != nullptr && size > 0) {
        memset(dest, value, size);
    }
}

void kiv_mem_cpy(void *dest, const void *src, size_t size)
{
    if (dest != nullptr && src != nullptr && size > 0) {
        memcpy(dest, src, size);
    }
}
