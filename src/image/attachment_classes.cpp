// Classes of attachments that sibling libraries know how to make and to flatten.
#include "image/attachment_classes.h"

#include <algorithm>
#include <mutex>
#include <optional>

#include "base/checked.h"
#include "platform/mutex.h"

namespace zq {

namespace {

// A class may write this much past the size that it reports.
constexpr std::size_t kFlattenSlack = 4;

struct Register {
    platform::Mutex mutex;
    std::vector<ZqAttachmentClass> classes;
};

Register& the_register() {
    static Register all;
    return all;
}

auto position_of(Register& all, const ClassId& id) {
    return std::find_if(
        all.classes.begin(), all.classes.end(),
        [&](const ZqAttachmentClass& entry) { return same_class(entry.classId, id); });
}

std::optional<ZqAttachmentClass> find_class(const ClassId& id) {
    Register& all = the_register();
    const std::lock_guard lock(all.mutex);
    const auto found = position_of(all, id);
    return found == all.classes.end() ? std::nullopt : std::optional(*found);
}

void check(ZqError code) {
    if (code != kSuccess) {
        throw static_cast<GRLIBError_enum>(code);
    }
}

// Of a class that nobody registered: carried as it came.
class OpaqueAttachment final : public Attachment {
  public:
    explicit OpaqueAttachment(std::span<const std::uint8_t> bytes,
                              const AttachmentOrigin& origin = {})
        : bytes_(bytes.begin(), bytes.end()), origin_(origin) {}
    std::vector<std::uint8_t> flattened() const override { return bytes_; }
    std::uint32_t header_word() const override { return origin_.header_word; }
    std::uint16_t class_number() const override { return origin_.class_number; }

  private:
    std::vector<std::uint8_t> bytes_;
    AttachmentOrigin origin_;
};

std::unique_ptr<Attachment> make_by_class(const ZqAttachmentClass& known, const ClassId& id,
                                          std::span<const std::uint8_t> bytes) {
    // Made first, so that a want of memory can not lose the object.
    auto attachment = std::make_unique<ForeignAttachment>(id);
    void* object = nullptr;
    check(known.create(bytes.data(), checked_narrow<std::uint32_t>(bytes.size()), &object));
    attachment->own(object, known.destroy);
    return attachment;
}

}  // namespace

void register_attachment_class(const ZqAttachmentClass& description) {
    Register& all = the_register();
    const std::lock_guard lock(all.mutex);
    const auto found = position_of(all, description.classId);
    if (found == all.classes.end()) {
        all.classes.push_back(description);
    } else {
        *found = description;
    }
}

bool unregister_attachment_class(const ClassId& id) {
    Register& all = the_register();
    const std::lock_guard lock(all.mutex);
    const auto found = position_of(all, id);
    if (found == all.classes.end()) {
        return false;
    }
    all.classes.erase(found);
    return true;
}

ForeignAttachment::~ForeignAttachment() {
    if (destroy_ != nullptr) {
        destroy_(object_);
    }
}

std::vector<std::uint8_t> ForeignAttachment::flattened() const {
    const std::optional<ZqAttachmentClass> known = find_class(id_);
    if (!known) {
        return {};
    }
    const std::size_t size = known->flattenedSize(object_);
    std::vector<std::uint8_t> bytes(size == 0 ? 0 : checked_add(size, kFlattenSlack));
    if (size > 0) {
        check(known->flatten(object_, bytes.data()));
        bytes.resize(size);
    }
    return bytes;
}

std::uint32_t ForeignAttachment::header_word() const {
    const std::optional<ZqAttachmentClass> known = find_class(id_);
    return known && known->headerWord != nullptr ? known->headerWord(object_) : 0;
}

std::uint16_t ForeignAttachment::class_number() const {
    const std::optional<ZqAttachmentClass> known = find_class(id_);
    return known ? known->classNumber : std::uint16_t{0};
}

std::unique_ptr<Attachment> make_attachment(const ClassId& id,
                                            std::span<const std::uint8_t> bytes) {
    const std::optional<ZqAttachmentClass> known = find_class(id);
    if (!known) {
        return std::make_unique<OpaqueAttachment>(bytes);
    }
    return make_by_class(*known, id, bytes);
}

std::unique_ptr<Attachment> restore_attachment(const ClassId& id,
                                               std::span<const std::uint8_t> bytes,
                                               const AttachmentOrigin& origin) {
    if (const std::optional<ZqAttachmentClass> known = find_class(id)) {
        try {
            return make_by_class(*known, id, bytes);
        } catch (GRLIBError_enum code) {
            if (code == kNotEnoughMemory) {
                throw;
            }
        }
    }
    return std::make_unique<OpaqueAttachment>(bytes, origin);
}

}  // namespace zq
