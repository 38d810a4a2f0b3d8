// Classes of attachments that sibling libraries know how to make and to flatten, and the attachment
// objects behind them. Threads: the register is safe; objects are under their image's lock.
#pragma once

#include <zqvissvc/image.h>

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "image/attachments.h"

namespace zq {

// A class registered again replaces the one before. Throws std::bad_alloc.
void register_attachment_class(const ZqAttachmentClass& description);
// False when it was not registered.
bool unregister_attachment_class(const ClassId& id);

// A client's object behind the library's interface; empty until own() is called.
class ForeignAttachment final : public Attachment {
  public:
    explicit ForeignAttachment(const ClassId& id) : id_(id) {}
    ~ForeignAttachment() override;
    ForeignAttachment(const ForeignAttachment&) = delete;
    ForeignAttachment& operator=(const ForeignAttachment&) = delete;

    // `destroy` (may be null) is called with the object at the end.
    void own(void* object, ZqDestroyProc destroy) {
        object_ = object;
        destroy_ = destroy;
    }
    void* object() const { return object_; }
    // By the class's routines; empty while the class is not registered.
    std::vector<std::uint8_t> flattened() const override;
    std::uint32_t header_word() const override;
    std::uint16_t class_number() const override;

  private:
    ClassId id_;
    void* object_ = nullptr;
    ZqDestroyProc destroy_ = nullptr;
};

// Makes an object from what flattened() gave: by its class's routine, or, while nobody registered
// the class, one that keeps the bytes. The routine may call the host. Throws its code and
// std::bad_alloc.
std::unique_ptr<Attachment> make_attachment(const ClassId& id, std::span<const std::uint8_t> bytes);

// What an object was stored with.
struct AttachmentOrigin {
    std::uint32_t header_word = 0;
    std::uint16_t class_number = 0;
};

// The same for a file, which is read whatever its objects are: one that its class refuses keeps its
// bytes, too. Such an object is written again as it came. Throws kNotEnoughMemory and
// std::bad_alloc.
std::unique_ptr<Attachment> restore_attachment(const ClassId& id,
                                               std::span<const std::uint8_t> bytes,
                                               const AttachmentOrigin& origin);

}  // namespace zq
