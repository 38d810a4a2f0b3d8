// Choice of the handler for a write, probing for a read.
#include "files/image_files.h"

#include "files/code_of.h"
#include "files/handlers.h"
#include "files/raw_handler.h"

namespace zq {

namespace {

bool is_empty(const char* text) {
    return text == nullptr || *text == '\0';
}

template <class Type>
void write_as(const char* path, Type type, const WriteJob& job) {
    if (is_empty(path)) throw kInvalidParameter;
    const std::unique_ptr<ImageFileHandler> handler = make_writer(type);
    if (!handler) throw kUnsupportedFileType;
    throw_if_failed(handler->write(path, job));
}

}  // namespace

void write_file(const char* path, const char* type_name, const WriteJob& job) {
    write_as(path, std::string_view(type_name == nullptr ? "" : type_name), job);
}

void write_file(const char* path, std::int32_t type_code, const WriteJob& job) {
    write_as(path, type_code, job);
}

bool read_file(const char* path, Image& target, const ZqRawParameters* raw, const Accept& accept) {
    if (is_empty(path)) throw kUnableToReadData;
    InputFile file(path);
    if (raw == nullptr) return read_file(file, target, accept);
    bool recognised = false;
    throw_if_failed(RawFileHandler(*raw, target.extent()).read(file, target, accept, recognised));
    return true;
}

bool read_file(InputFile& file, Image& target, const Accept& accept) {
    for (const HandlerEntry& entry : handlers()) {
        if (!entry.probed) continue;
        file.rewind();
        bool recognised = false;
        throw_if_failed(entry.make(entry)->read(file, target, accept, recognised));
        if (recognised) return true;
    }
    return false;
}

}  // namespace zq
