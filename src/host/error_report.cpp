// Composes and reports the results of entry points.
#include "host/error_report.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <cstddef>
#include <cstring>

#include "base/error_codes.h"
#include "host/boundary.h"
#include "host/error_ranges.h"
#include "host/host_string.h"
#include "host/run_hooks.h"
#include "host/thread_record.h"

namespace zq::host {
namespace {

constexpr std::size_t kNameBytes = 64;
constexpr std::size_t kMessageBytes = 256;
constexpr std::size_t kBoxBytes = 512;
constexpr std::size_t kErrorTextBytes = 127;
constexpr std::uint32_t kShowResults = 0;
constexpr std::uint32_t kReportOnly = 2;

// Each value is whole; together they may come from two results that threads reported at the same
// time.
struct ProcessState {
    std::atomic<std::uint32_t> mode{kReportOnly};
    std::atomic<std::int32_t> code{0};
    std::atomic<std::int32_t> function{0};
    std::atomic<std::int32_t> message_id{0};
};
constinit ProcessState g_state;

// A text of bounded length; longer ones are cut.
template <std::size_t kCapacity>
class Text {
  public:
    Text() { bytes_[0] = '\0'; }
    std::string_view view() const { return {bytes_.data(), length_}; }
    const char* c_str() const { return bytes_.data(); }

    // False when the source has no such text; it is empty then.
    bool load(const TextSource& source, std::int64_t id) {
        length_ = source.load(id, bytes_.data(), bytes_.size());
        return length_ > 0;
    }

    void append(std::string_view text) {
        const std::size_t added = std::min(text.size(), kCapacity - length_);
        std::copy_n(text.data(), added, bytes_.data() + length_);
        length_ += added;
        bytes_[length_] = '\0';
    }

  private:
    std::array<char, kCapacity + 1> bytes_;
    std::size_t length_ = 0;
};

struct ErrorTexts {
    Text<kNameBytes> name;
    Text<kMessageBytes> message;
};

using SourceText = Text<kNameBytes + 1 + kMessageBytes>;

// The library's own code range as string ids; wide, since any code may be asked for.
std::int64_t own_message_id(std::int32_t code) {
    return std::int64_t{code} - kFirstCode + kFirstMessageId;
}

ErrorTexts look_up(std::int32_t code, FunctionId function) {
    ErrorTexts texts;
    const auto name_id = static_cast<std::int64_t>(function);
    if (const auto range = find_error_range(code)) {
        const std::int64_t id = std::int64_t{code} - range->first + range->first_message_id;
        if (texts.message.load(range->source, id)) {
            texts.name.load(range->source, name_id);
            return texts;
        }
    }
    texts.message.load(TextSource{}, kUnknownErrorId);
    texts.name.load(TextSource{}, name_id);
    return texts;
}

SourceText compose(std::string_view name, std::string_view message) {
    SourceText text;
    text.append(name.substr(0, kNameBytes));
    text.append("\n");
    text.append(message);
    return text;
}

SourceText source_text(std::int32_t code, FunctionId function) {
    const ErrorTexts texts = look_up(code, function);
    return compose(texts.name.view(), texts.message.view());
}

// Without memory for the text, status and code have to do. The cluster is packed, so its handle is
// copied.
void set_source(ZqErrorCluster& error, std::string_view text) {
    ZqStringHandle source = error.source;
    run_core([&] { set_string(&source, text); });
    error.source = source;
}

void remember(std::int32_t code, FunctionId function) {
    g_state.code.store(code, std::memory_order_relaxed);
    if (code == 0) return;
    const bool own = code >= kFirstCode && code <= kLastCode;
    g_state.function.store(static_cast<std::int32_t>(function), std::memory_order_relaxed);
    g_state.message_id.store(
        own ? static_cast<std::int32_t>(own_message_id(code)) : kFirstMessageId,
        std::memory_order_relaxed);
}

// Stores what the cluster says without its source text.
void begin_report(std::int32_t code, ZqErrorCluster* error, FunctionId function) {
    if (error != nullptr) {
        error->status = code != 0 ? 1 : 0;
        error->code = code;
        if (code == 0) set_source(*error, {});
    }
    remember(code, function);
}

void show_result(const ZqErrorCluster* error, const SourceText& composed) {
    if (g_state.mode.load(std::memory_order_relaxed) != kShowResults) return;
    Text<kBoxBytes> text;
    text.append(error != nullptr ? view(error->source) : composed.view());
    show_modal_box("KEMO Vision", text.c_str());
}

}  // namespace

std::int32_t process_result(std::int32_t code, ZqErrorCluster* error, FunctionId function) {
    if (!thread_is_active()) return kSystemError;
    begin_report(code, error, function);
    SourceText text;
    if (code != 0 && function != FunctionId::kNone) {
        text = source_text(code, function);
        if (error != nullptr) set_source(*error, text.view());
    }
    show_result(error, text);
    return code;
}

std::int32_t process_result_as(std::int32_t code, ZqErrorCluster* error, std::string_view caller) {
    if (!thread_is_active()) return kSystemError;
    begin_report(code, error, FunctionId::kNone);
    if (code == 0) return code;
    const ErrorTexts texts = look_up(code, FunctionId::kNone);
    const SourceText text = compose(caller, texts.message.view());
    if (error != nullptr) set_source(*error, text.view());
    show_result(error, text);
    return code;
}

void set_error_mode(std::uint32_t mode) {
    g_state.mode.store(std::min(mode, kReportOnly), std::memory_order_relaxed);
}

LastError last_error() {
    return {.code = g_state.code.load(std::memory_order_relaxed),
            .function = static_cast<FunctionId>(g_state.function.load(std::memory_order_relaxed)),
            .message_id = g_state.message_id.load(std::memory_order_relaxed)};
}

void set_last_source(ZqStringHandle* source) {
    const LastError last = last_error();
    if (last.code == 0 || last.function == FunctionId::kNone) return set_string(source, {});
    set_string(source, source_text(last.code, last.function).view());
}

std::string message_text(std::int32_t code) {
    return std::string(look_up(code, FunctionId::kNone).message.view());
}

void set_error_text(std::int32_t code, ZqStringHandle* text) {
    const std::int64_t id = code == 0 ? kSuccessMessageId : own_message_id(code);
    Text<kErrorTextBytes> message;
    if (id < kSuccessMessageId || !message.load(TextSource{}, id)) {
        message.load(TextSource{}, kUnknownErrorId);
    }
    // One byte more than the text: the terminator.
    set_string(text, {message.c_str(), message.view().size() + 1});
}

}  // namespace zq::host
