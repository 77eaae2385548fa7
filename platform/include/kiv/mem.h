/* libkivmem: byte fill and copy. Any thread; regions do not overlap. */
#ifndef KIV_MEM_H
#define KIV_MEM_H

#include <stddef.h>

#ifdef __cplusplus
extern "C" {
#endif

/* Fills size bytes at dest with the low byte of value. */
void kiv_mem_set(void *dest, int value, size_t size);

/* Copies size bytes from src to dest. */
void kiv_mem_cpy(void *dest, const void *src, size_t size);

#ifdef __cplusplus
}
#endif
#endif
