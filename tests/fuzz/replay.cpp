// Runs a fuzz target over files without a fuzzer: each one whole and cut short at up to 64 places.
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <vector>

extern "C" int LLVMFuzzerInitialize(int *argc, char ***argv);
extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size);

constexpr size_t CUTS = 64;

static void replay(const std::filesystem::path &path)
{
    std::ifstream file(path, std::ios::binary);
    const std::vector<char> whole{std::istreambuf_iterator<char>(file), {}};
    const size_t pace = whole.size() / CUTS + 1;

    for (size_t length = whole.size() % pace; length <= whole.size(); length += pace) {
        // Exactly as long as the text, so that a sanitizer sees a read behind its end.
        const std::vector<uint8_t> cut(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(length));
        LLVMFuzzerTestOneInput(cut.data(), cut.size());
    }
}

int main(int argc, char **argv)
{
    int files = 0;

    if (LLVMFuzzerInitialize(&argc, &argv) != 0) {
        return 1;
    }
    for (int i = 1; i < argc; ++i) {
        for (const auto &entry : std::filesystem::recursive_directory_iterator(argv[i])) {
            if (entry.is_regular_file()) {
                replay(entry.path());
                ++files;
            }
        }
    }
    std::fprintf(stderr, "%d files replayed\n", files);
    return files > 0 ? 0 : 1;
}
