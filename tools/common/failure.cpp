// Codes of system failures, and messages of codes.
#include "failure.h"

#include <zqvissvc/errors.h>

#include <cerrno>

#include "refhost/refhost.h"

namespace {

ZqError code_of(const std::error_code& error) {
    const std::error_condition condition = error.default_error_condition();
    if (condition == std::errc::no_such_file_or_directory) return ZQ_ERR_FILE_NOT_FOUND;
    if (condition == std::errc::not_enough_memory) return ZQ_ERR_NOT_ENOUGH_MEMORY;
    if (condition == std::errc::permission_denied) return ZQ_ERR_FILE_ACCESS_DENIED;
    if (condition == std::errc::too_many_files_open) return ZQ_ERR_TOO_MANY_FILES_OPEN;
    if (condition == std::errc::no_space_on_device) return ZQ_ERR_DISK_FULL;
    return ZQ_ERR_FILE_IO;
}

}  // namespace

Failure::Failure(const std::error_code& error, std::string file)
    : Failure(code_of(error), std::move(file)) {}

void check(ZqError code, const std::string& file) {
    if (code != ZQ_ERR_NONE) throw Failure(code, file);
}

void fail_with_errno(const std::string& file) {
    throw Failure(std::error_code(errno, std::generic_category()), file);
}

std::string message_of(ZqError code) {
    refhost::String text;
    if (GetErrorText(code, text.out()) != ZQ_ERR_NONE) return "no message";
    std::string message = text.text();
    while (message.ends_with('\0')) message.pop_back();
    return message;
}
