// Who calls? Only what the daemon itself does is recorded and replayed; its libraries call the C library too. Never
// built with a sanitizer: its runtime comes through here before it has set itself up.
#include "front.h"

#include <algorithm>
#include <array>
#include <link.h>

namespace
{
struct address_range {
    ElfW(Addr) begin;
    ElfW(Addr) end;
};

std::array<address_range, 3> daemons; // the main program, this library, the C library
size_t ranges;

address_range range_of(const dl_phdr_info &info)
{
    address_range range = {~ElfW(Addr){0}, 0};
    for (int i = 0; i < info.dlpi_phnum; i++) {
        const ElfW(Phdr) &segment = info.dlpi_phdr[i];
        if (segment.p_type == PT_LOAD) {
            range.begin = std::min<ElfW(Addr)>(range.begin, info.dlpi_addr + segment.p_vaddr);
            range.end = std::max<ElfW(Addr)>(range.end, info.dlpi_addr + segment.p_vaddr + segment.p_memsz);
        }
    }
    return range;
}

bool lies_in(const address_range &range, const void *address)
{
    const auto at = reinterpret_cast<ElfW(Addr)>(address);
    return at >= range.begin && at < range.end;
}

// The first object of the list is the main program.
int take_range(dl_phdr_info *info, size_t, void *c_library)
{
    const address_range range = range_of(*info);
    const bool wanted =
        ranges == 0 || lies_in(range, reinterpret_cast<const void *>(take_range)) || lies_in(range, c_library);
    if (wanted && ranges < daemons.size()) {
        daemons[ranges++] = range;
    }
    return 0;
}

next_functions found;
} // namespace

const next_functions &next()
{
    if (!found.open) {
#define X(name) found.name = reinterpret_cast<decltype(found.name)>(dlsym(RTLD_NEXT, #name));
        KIV_NEXT_FUNCTIONS(X)
#undef X
    }
    return found;
}

void find_callers()
{
    if (ranges == 0) {
        dl_iterate_phdr(take_range, reinterpret_cast<void *>(next().system));
    }
}

bool is_program(const void *caller)
{
    return lies_in(daemons[0], caller);
}

bool is_daemon(const void *caller)
{
    for (const address_range &range : daemons) {
        if (lies_in(range, caller)) {
            return true;
        }
    }
    return false;
}
