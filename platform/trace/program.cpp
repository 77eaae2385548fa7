#include "trace/program.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <link.h>

constexpr ElfW(Word) PACKAGE_METADATA = 0xcafe1a7e;
constexpr char METADATA_OWNER[] = "FDO";
constexpr size_t NOTE_ALIGNMENT = 4;

static size_t padded(size_t size)
{
    return (size + NOTE_ALIGNMENT - 1) / NOTE_ALIGNMENT * NOTE_ALIGNMENT;
}

// The text of the metadata in a segment of notes; null when there is none.
static const char *find_metadata(const char *notes, size_t size)
{
    for (size_t at = 0; at + sizeof(ElfW(Nhdr)) <= size;) {
        ElfW(Nhdr) note;
        memcpy(&note, notes + at, sizeof note);
        const char *owner = notes + at + sizeof note;
        if (note.n_type == PACKAGE_METADATA && note.n_namesz == sizeof METADATA_OWNER &&
            memcmp(owner, METADATA_OWNER, sizeof METADATA_OWNER) == 0) {
            return owner + padded(note.n_namesz);
        }
        at += sizeof note + padded(note.n_namesz) + padded(note.n_descsz);
    }
    return nullptr;
}

// The first object is the main program. Stops there.
static int look_into_program(dl_phdr_info *info, size_t, void *found)
{
    for (int i = 0; i < info->dlpi_phnum; i++) {
        const ElfW(Phdr) &segment = info->dlpi_phdr[i];
        if (segment.p_type != PT_NOTE) {
            continue;
        }
        const char *text =
            // NOLINTNEXTLINE(performance-no-int-to-ptr): the loader says where the segment lies as a number
            find_metadata(reinterpret_cast<const char *>(info->dlpi_addr + segment.p_vaddr), segment.p_memsz);
        if (text != nullptr) {
            *static_cast<const char **>(found) = text;
        }
    }
    return 1;
}

// The value of "KEY":"VALUE"; the metadata is one flat object of texts.
static void take_value(const char *metadata, const char *key, char *value, size_t size)
{
    const char *at = metadata != nullptr ? strstr(metadata, key) : nullptr;
    if (at != nullptr) {
        at += strlen(key);
        snprintf(value, size, "%.*s", static_cast<int>(strcspn(at, "\"")), at);
    }
}

void find_program(char *name, size_t name_size, char *version, size_t version_size)
{
    const char *metadata = nullptr;
    dl_iterate_phdr(look_into_program, &metadata);
    snprintf(name, name_size, "%s", program_invocation_short_name);
    snprintf(version, version_size, "unknown");
    take_value(metadata, "\"name\":\"", name, name_size);
    take_value(metadata, "\"version\":\"", version, version_size);
}
