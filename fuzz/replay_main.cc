// Runs a fuzz target once on every file of a folder: kept inputs become a regular test.
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size);

namespace {

std::vector<std::uint8_t> read_file(const std::filesystem::path& path) {
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 2 || !std::filesystem::is_directory(argv[1])) {
        std::fprintf(stderr, "usage: %s CORPUS_FOLDER\n", argv[0]);
        return 2;
    }
    int count = 0;
    for (const auto& entry : std::filesystem::directory_iterator(argv[1])) {
        std::printf("replaying %s\n", entry.path().filename().string().c_str());
        std::fflush(stdout);  // a crash must leave the name of its input behind
        const auto input = read_file(entry.path());
        LLVMFuzzerTestOneInput(input.data(), input.size());
        ++count;
    }
    // An empty folder means that the target's inputs were forgotten.
    return count > 0 ? 0 : 1;
}
