// How the tool's own code fails: with a code of the library, whose message the library itself
// gives.
#ifndef ZQTOOLS_FAILURE_H
#define ZQTOOLS_FAILURE_H

#include <zqvissvc/types.h>

#include <string>
#include <system_error>

class Failure {
  public:
    // Without a file the failure belongs to the input that is being worked on.
    explicit Failure(ZqError code, std::string file = {}) : code_(code), file_(std::move(file)) {}
    explicit Failure(const std::error_code& error, std::string file = {});

    ZqError code() const { return code_; }
    const std::string& file() const { return file_; }

  private:
    ZqError code_;
    std::string file_;
};

// Throws a Failure unless the code is 0.
void check(ZqError code, const std::string& file = {});

// For system calls that leave their reason in errno.
[[noreturn]] void fail_with_errno(const std::string& file);

// The library's message of a code.
std::string message_of(ZqError code);

#endif
