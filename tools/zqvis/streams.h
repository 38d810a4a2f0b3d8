// Files by name where "-" stands for a standard stream. The library reads and writes paths, so a
// standard stream passes through a temporary file.
#ifndef ZQVIS_STREAMS_H
#define ZQVIS_STREAMS_H

#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <functional>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "paths.h"

constexpr const char* kStandardStream = "-";

// What a message calls an output.
std::string name_for_reports(const std::string& output);

// A folder that lives as long as the object and is this user's alone.
class TemporaryFolder {
  public:
    TemporaryFolder();
    TemporaryFolder(const TemporaryFolder&) = delete;
    TemporaryFolder& operator=(const TemporaryFolder&) = delete;
    ~TemporaryFolder();

    std::string file(const std::string& name) const { return text_of(path_ / name); }

  private:
    std::filesystem::path path_;
};

// A readable path for an input.
class Input {
  public:
    explicit Input(const std::string& name);

    const std::string& path() const { return path_; }

  private:
    std::unique_ptr<TemporaryFolder> folder_;
    std::string path_;
};

// The file's bytes, but no more than `most`. A folder or an unreadable file is a Failure.
std::vector<uint8_t> read_bytes(const std::string& path, size_t most);

// Has `write` make a file at the path that it is handed, then brings it to the output.
void write_through_path(const std::string& output,
                        const std::function<void(const std::string&)>& write);

// Where raw bytes go. A file appears under its name, whole, at commit; nothing is left without it.
class ByteOutput {
  public:
    explicit ByteOutput(const std::string& name);
    ByteOutput(const ByteOutput&) = delete;
    ByteOutput& operator=(const ByteOutput&) = delete;
    ~ByteOutput();

    void write(std::span<const uint8_t> bytes);
    void commit();

  private:
    std::string name_;
    std::string beside_;  // where the bytes go until commit; empty: straight to the output
    std::FILE* stream_ = nullptr;
};

#endif
