// Core functions for sibling libraries: images by handle.
#include <zqvissvc/image.h>

#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <utility>

#include "base/required.h"
#include "host/boundary.h"
#include "image/attachment_classes.h"
#include "image/image_lock.h"
#include "image/lifecycle.h"
#include "image/memory.h"
#include "image/registry.h"

using namespace zq;

namespace {

std::string_view text_of(const char* name) {
    return name == nullptr ? std::string_view() : name;
}

// Checks the target before there is an image to lose.
template <class Create>
ZqError create_into(ZqImageHandle* image, Create create) {
    return host::run_core([&] {
        ZqImageHandle& target = required(image);
        target = create();
    });
}

std::span<const ImageHandle> request(const ZqImageHandle* images, int32_t count) {
    if (count < 0) {
        throw kInvalidParameter;
    }
    if (count > 0 && images == nullptr) {
        throw kNullPointer;
    }
    return {images, static_cast<std::size_t>(count)};
}

class ForeignExtraInfo final : public ImageExtraInfo {
  public:
    ForeignExtraInfo(void* object, ZqRemoveKindProc on_remove, ZqDestroyProc destroy)
        : owned_({}), remove_kind_(on_remove) {
        owned_.own(object, destroy);
    }
    void remove_kind(std::int32_t kind) override {
        if (remove_kind_ != nullptr) {
            remove_kind_(owned_.object(), kind);
        }
    }

  private:
    ForeignAttachment owned_;
    ZqRemoveKindProc remove_kind_;
};

}  // namespace

ZqError ZQ_CALL NewImage(int32_t type, int32_t width, int32_t height, int32_t border,
                         ZqImageHandle* image) {
    return create_into(image, [&] { return new_image({type, width, height, border}); });
}

ZqError ZQ_CALL NewGreedyImage(int32_t type, int32_t width, int32_t height, int32_t border,
                               ZqImageHandle* image) {
    return create_into(image, [&] { return new_image({type, width, height, border, true}); });
}

ZqError ZQ_CALL NewNamedImage(int32_t type, int32_t width, int32_t height, int32_t border,
                              const char* name, uint8_t greedy, ZqImageHandle* image) {
    return create_into(image, [&] {
        const ImageShape shape = {type, width, height, border, greedy != 0};
        return new_named_image(shape, text_of(name), Variant::kRegistered).image;
    });
}

ZqError ZQ_CALL NewPrivateNamedImage(int32_t type, int32_t width, int32_t height, int32_t border,
                                     const char* name, uint8_t greedy, ZqImageHandle* image) {
    return create_into(image, [&] {
        const ImageShape shape = {type, width, height, border, greedy != 0};
        return new_named_image(shape, text_of(name), Variant::kPrivate).image;
    });
}

ZqError ZQ_CALL NewExternalImage(int32_t type, int32_t width, int32_t height, int32_t border,
                                 void* buffer, int32_t rowPixels, const char* name,
                                 ZqImageHandle* image) {
    return create_into(image, [&] {
        const ImageShape shape = {type, width, height, border};
        return new_external_image(shape, static_cast<std::uint8_t*>(buffer), rowPixels,
                                  text_of(name))
            .image;
    });
}

ZqError ZQ_CALL ZqDisposeImage(ZqImageHandle image) {
    return host::run_core([&] { dispose_image(image); });
}

ZqError ZQ_CALL ZqFindImage(const char* name, ZqImageHandle* image) {
    return host::run_core([&] {
        const Pin pin = Registry::instance().find(text_of(name), kImageTag);
        required(image) = pin ? Image::handle_of(pin.object) : nullptr;
    });
}

ZqError ZQ_CALL ZqLockImages(const ZqImageHandle* images, int32_t count) {
    return host::run_core([&] { lock_images(request(images, count)); });
}

ZqError ZQ_CALL ZqUnlockImages(const ZqImageHandle* images, int32_t count) {
    return host::run_core([&] { unlock_images(request(images, count)); });
}

ZqError ZQ_CALL ZqResizeImage(ZqImageHandle image, int32_t width, int32_t height,
                              uint8_t changeType, int32_t type, int32_t mode) {
    return host::run_core([&] {
        if (mode < 0 || mode > 2) {
            throw kInvalidParameter;
        }
        const std::optional<std::int32_t> new_type =
            changeType != 0 ? std::optional(type) : std::nullopt;
        LockedImage(image)->resize(width, height, new_type, static_cast<ResizeMode>(mode));
    });
}

ZqError ZQ_CALL ZqSetImageBorder(ZqImageHandle image, int32_t border) {
    return host::run_core([&] { LockedImage(image)->set_border(border); });
}

ZqError ZQ_CALL ZqGetPixelAddress(ZqImageHandle image, int32_t x, int32_t y, void** address) {
    return host::run_core([&] { required(address) = LockedImage(image)->pixel(x, y); });
}

ZqError ZQ_CALL ZqSetBitDepth(ZqImageHandle image, int32_t bitDepth) {
    return host::run_core([&] { LockedImage(image)->set_bit_depth(bitDepth); });
}

ZqError ZQ_CALL ZqGetBitDepth(ZqImageHandle image, int32_t* bitDepth) {
    return host::run_core([&] { required(bitDepth) = LockedImage(image)->bit_depth(); });
}

ZqError ZQ_CALL ZqGetSampleOffset(ZqImageHandle image, int32_t* offset) {
    return host::run_core([&] { required(offset) = LockedImage(image)->sample_offset(); });
}

ZqError ZQ_CALL ZqSetAttachment(ZqImageHandle image, const ZqClassId* classId, void* object,
                                ZqDestroyProc destroy) {
    return host::run_core([&] {
        const ClassId& id = required(classId);
        const LockedImage locked(image);
        auto attachment = std::make_unique<ForeignAttachment>(id);
        ForeignAttachment* owned = attachment.get();
        AttachmentList::Entry entry = AttachmentList::make_entry(id, std::move(attachment));
        owned->own(object, destroy);
        locked->attachments().set(std::move(entry));
    });
}

ZqError ZQ_CALL ZqFindAttachment(ZqImageHandle image, const ZqClassId* classId, void** object) {
    return host::run_core([&] {
        Attachment* found = LockedImage(image)->attachments().find(required(classId));
        const auto* foreign = dynamic_cast<ForeignAttachment*>(found);
        required(object) = foreign == nullptr ? nullptr : foreign->object();
    });
}

ZqError ZQ_CALL ZqRemoveAttachment(ZqImageHandle image, const ZqClassId* classId) {
    return host::run_core([&] { LockedImage(image)->attachments().remove(required(classId)); });
}

ZqError ZQ_CALL ZqRegisterAttachmentClass(const ZqAttachmentClass* description) {
    return host::run_core([&] {
        const ZqAttachmentClass& asked = required(description);
        if (asked.flattenedSize == nullptr || asked.flatten == nullptr || asked.create == nullptr) {
            throw kNullPointer;
        }
        register_attachment_class(asked);
    });
}

ZqError ZQ_CALL ZqUnregisterAttachmentClass(const ZqClassId* classId) {
    return host::run_core([&] { unregister_attachment_class(required(classId)); });
}

ZqError ZQ_CALL ZqSetExtraInfo(ZqImageHandle image, void* object, ZqRemoveKindProc removeKind,
                               ZqDestroyProc destroy) {
    return host::run_core([&] {
        const LockedImage locked(image);
        locked->set_extra_info(std::make_unique<ForeignExtraInfo>(object, removeKind, destroy));
    });
}

ZqError ZQ_CALL ZqSetMemoryMode(int32_t mode, ZqAllocateProc allocate, ZqReleaseProc release) {
    return host::run_core([&] {
        const memory::HostRoutine routine = {allocate, release};
        memory::set_mode(static_cast<memory::Mode>(mode), &routine);
    });
}

uint8_t ZQ_CALL GetHaveRegisteredCleanupProc(ZqImageHandle image) {
    bool registered = false;
    host::run_core([&] { registered = LockedImage(image)->has_cleanup_procedure(); });
    return registered ? 1 : 0;
}

void ZQ_CALL SetHaveRegisteredCleanupProc(ZqImageHandle image) {
    host::run_core([&] { LockedImage(image)->set_has_cleanup_procedure(true); });
}
