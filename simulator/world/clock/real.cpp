#include "real.h"

#include "standin.h"

#include <dlfcn.h>
#include <link.h>

namespace
{
real_functions found;
bool looked_up;

struct address_range {
    ElfW(Addr) begin;
    ElfW(Addr) end;
};
address_range main_program;

// The first object of the list is the main program.
int take_main_program(dl_phdr_info *info, size_t, void *)
{
    main_program.begin = ~ElfW(Addr){0};
    for (int i = 0; i < info->dlpi_phnum; i++) {
        const ElfW(Phdr) &segment = info->dlpi_phdr[i];
        if (segment.p_type != PT_LOAD) {
            continue;
        }
        const ElfW(Addr) begin = info->dlpi_addr + segment.p_vaddr;
        if (begin < main_program.begin) {
            main_program.begin = begin;
        }
        if (begin + segment.p_memsz > main_program.end) {
            main_program.end = begin + segment.p_memsz;
        }
    }
    return 1;
}

void look_up()
{
#define X(name) found.name = reinterpret_cast<decltype(found.name)>(dlsym(RTLD_NEXT, #name));
    KIV_REAL_FUNCTIONS(X)
    X(gettimeofday)
#undef X
    dl_iterate_phdr(take_main_program, nullptr);
    looked_up = true;
}
} // namespace

const real_functions &real()
{
    if (!looked_up) {
        look_up();
    }
    return found;
}

bool in_main_program(const void *address)
{
    const auto at = reinterpret_cast<ElfW(Addr)>(address);
    real();
    return at >= main_program.begin && at < main_program.end;
}

bool is_traced(const void *caller)
{
    return trace_begin && in_main_program(caller);
}
