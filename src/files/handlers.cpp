// The list of file formats and the choice among them.
#include "files/handlers.h"

#include <algorithm>
#include <array>
#include <string>

#include "files/aipd_handler.h"
#include "files/bmp_handler.h"
#include "files/jpeg2000_handler.h"
#include "files/jpeg_handler.h"
#include "files/png_handler.h"
#include "files/tiff_handler.h"

namespace zq {

namespace {

template <class Handler>
std::unique_ptr<ImageFileHandler> make(const HandlerEntry& entry) {
    return std::make_unique<Handler>(entry.code, entry.name_id);
}

constexpr std::array kHandlers = {
    HandlerEntry{0, 140, make<BmpFileHandler>, true, true},
    HandlerEntry{1, 141, make<AipdFileHandler>, true, true},
    HandlerEntry{2, 171, make<TiffFileHandler>, true, true},
    HandlerEntry{3, 190, make<JpegFileHandler>, true, true},
    HandlerEntry{4, 191, make<PngFileHandler>, true, true},
    HandlerEntry{7, 40365, make<Jpeg2000FileHandler>, true, true},
};

// The letters of type names are ASCII; the process's locale must not matter.
constexpr char upper(char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
}

std::string normalised(std::string_view type_name) {
    constexpr std::size_t kLength = 8;
    const std::size_t start =
        std::min(type_name.find_first_not_of(" \t\n\v\f\r"), type_name.size());
    std::string name(type_name.substr(start, kLength));
    name.resize(kLength, ' ');
    std::transform(name.begin(), name.end(), name.begin(), upper);
    return name;
}

template <class Matches>
std::unique_ptr<ImageFileHandler> make_first_writer(Matches matches) {
    const auto found =
        std::find_if(kHandlers.begin(), kHandlers.end(),
                     [&](const HandlerEntry& entry) { return entry.writable && matches(entry); });
    return found != kHandlers.end() ? found->make(*found) : nullptr;
}

}  // namespace

std::span<const HandlerEntry> handlers() {
    return kHandlers;
}

std::unique_ptr<ImageFileHandler> make_writer(std::int32_t code) {
    return make_first_writer([code](const HandlerEntry& entry) { return entry.code == code; });
}

std::unique_ptr<ImageFileHandler> make_writer(std::string_view type_name) {
    const std::string wanted = normalised(type_name);
    return make_first_writer([&wanted](const HandlerEntry& entry) {
        return normalised(ImageFileHandler::padded_type_name(entry.name_id)) == wanted;
    });
}

}  // namespace zq
