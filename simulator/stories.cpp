#include "stories.h"

#include "world/device.h"

#include <algorithm>
#include <filesystem>

namespace fs = std::filesystem;

namespace
{
bool find_in_folder(const std::string &folder, std::vector<std::string> &files)
{
    std::vector<std::string> found;
    std::error_code failure;
    fs::recursive_directory_iterator entry(folder, failure);
    std::string at = folder;
    for (const fs::recursive_directory_iterator end; !failure && entry != end; entry.increment(failure)) {
        at = entry->path().string();
        if (entry->path().extension() == ".scn") {
            found.push_back(at);
        }
    }
    if (failure || found.empty()) {
        fprintf(stderr, "%s: %s\n", at.c_str(), failure ? failure.message().c_str() : "holds no scenario (*.scn)");
        return false;
    }
    std::sort(found.begin(), found.end());
    files.insert(files.end(), found.begin(), found.end());
    return true;
}
} // namespace

bool find_stories(const std::vector<std::string> &paths, std::vector<std::string> &files)
{
    bool all = true;
    for (const std::string &path : paths) {
        std::error_code failure;
        if (fs::is_directory(path, failure)) {
            all &= find_in_folder(path, files);
        } else {
            files.push_back(path);
        }
    }
    return all;
}

bool load_story(const std::string &path, scenario &story, std::string &error)
{
    std::string text;
    if (!load_scenario_file(path, text)) {
        error = path + ": cannot be read, or is larger than 256 KiB\n";
        return false;
    }
    if (parse_scenario(text, path, load_scenario_file, story, error)) {
        return true;
    }
    error += "\n";
    return false;
}
