// Walking through a folder.
#include "folder.h"

#include <algorithm>
#include <filesystem>
#include <vector>

#include "formats.h"
#include "paths.h"

namespace fs = std::filesystem;

namespace {

// A name that is no text is no image's: nothing here could open it.
bool names_image(const fs::path& name) {
    try {
        return format_of_path(text_of(name)) != nullptr;
    } catch (const fs::filesystem_error&) {
        return false;
    }
}

std::vector<fs::path> images_beside(const fs::path& file) {
    const fs::path folder = file.has_parent_path() ? file.parent_path() : fs::path(".");
    std::vector<fs::path> names;
    std::error_code error;
    for (fs::directory_iterator entry(folder, error), end; !error && entry != end;
         entry.increment(error)) {
        std::error_code unreadable;
        const fs::path name = entry->path().filename();
        if (names_image(name) && entry->is_regular_file(unreadable)) names.push_back(name);
    }
    std::ranges::sort(names);
    return names;
}

}  // namespace

std::string neighbour(const std::string& file, int steps) {
    const fs::path path = path_of(file);
    const std::vector<fs::path> names = images_beside(path);
    if (names.empty() || steps == 0) return file;
    const auto here = std::ranges::lower_bound(names, path.filename());
    std::ptrdiff_t index = here - names.begin() + steps;
    // A file that is not among them stands between its neighbours.
    if (steps > 0 && (here == names.end() || *here != path.filename())) --index;
    index = std::clamp<std::ptrdiff_t>(index, 0, std::ssize(names) - 1);
    return text_of(path.parent_path() / names[static_cast<size_t>(index)]);
}
