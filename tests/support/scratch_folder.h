// A folder of a test's own, and whole files in and out.
#pragma once

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <string>

namespace zqtest {

class ScratchFolder {
  public:
    ScratchFolder() : folder_(std::filesystem::temp_directory_path() / unique_name()) {
        std::filesystem::create_directories(folder_);
    }
    ~ScratchFolder() {
        std::error_code ignored;
        std::filesystem::remove_all(folder_, ignored);
    }
    ScratchFolder(const ScratchFolder&) = delete;
    ScratchFolder& operator=(const ScratchFolder&) = delete;

    std::string path(const std::string& name) const { return (folder_ / name).string(); }
    // Files of any name, so that what a failed write leaves behind is seen.
    std::ptrdiff_t count() const {
        return std::distance(std::filesystem::directory_iterator(folder_), {});
    }

  private:
    static std::string unique_name() { return "zqtest-" + std::to_string(std::random_device{}()); }
    std::filesystem::path folder_;
};

inline std::string load_bytes(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

inline void store_bytes(const std::string& path, const std::string& bytes) {
    std::ofstream out(path, std::ios::binary);
    out << bytes;
}

}  // namespace zqtest
