// Payloads: a word that says what they are, then each object behind a header of 28 bytes.
#include "files/vision_objects.h"

#include <algorithm>
#include <cstring>
#include <optional>
#include <utility>

#include "base/byte_order.h"
#include "base/error_codes.h"
#include "files/png_chunks.h"
#include "files/png_texts.h"
#include "image/attachment_classes.h"
#include "serialize/custom_data.h"

namespace zq {

namespace {

constexpr std::uint32_t kPayloadWord = 0x00061010;
constexpr std::uint32_t kHeaderConstant = 4;
constexpr std::size_t kHeaderBytes = 28;
constexpr std::uint16_t kPrivateClasses = 65535;
// In one payload. An image has one object a class, and looks a class up by comparing all.
constexpr std::size_t kMostObjects = 1000;

// The payload of a chunk of its own, as it came.
class TimingAttachment final : public Attachment {
  public:
    explicit TimingAttachment(std::vector<std::uint8_t> payload) : payload_(std::move(payload)) {}
    const std::vector<std::uint8_t>& payload() const { return payload_; }

  private:
    std::vector<std::uint8_t> payload_;
};

void append_le32(std::vector<std::uint8_t>& bytes, std::uint32_t number) {
    for (int shift = 0; shift < 32; shift += 8) {
        bytes.push_back(static_cast<std::uint8_t>(number >> shift));
    }
}

void append_class(std::vector<std::uint8_t>& bytes, const ClassId& id) {
    append_le32(bytes, id.data1);
    append_le32(bytes, std::uint32_t{id.data2} | std::uint32_t{id.data3} << 16);
    bytes.insert(bytes.end(), std::begin(id.data4), std::end(id.data4));
}

ClassId load_class(const std::uint8_t* bytes) {
    const std::uint32_t middle = load_le32(bytes + 4);
    ClassId id = {load_le32(bytes),
                  static_cast<std::uint16_t>(middle),
                  static_cast<std::uint16_t>(middle >> 16),
                  {}};
    std::copy_n(bytes + 8, sizeof(id.data4), std::begin(id.data4));
    return id;
}

// Custom data and timing have places of their own in the file.
bool is_information(const ClassId& id) {
    return !same_class(id, kCustomDataAttachment) && !same_class(id, kTimingAttachment);
}

class Gathering {
  public:
    void add(const ClassId& id, const Attachment& object) {
        if (!is_information(id)) return;
        const std::vector<std::uint8_t> form = object.flattened();
        if (form.empty()) return;
        Part& part = object.class_number() == kPrivateClasses ? private_ : common_;
        if (++part.count > kMostObjects || form.size() > kLargestPayload) throw kUnableToWriteData;
        if (part.payload.empty()) append_le32(part.payload, kPayloadWord);
        append_le32(part.payload, object.header_word());
        append_le32(part.payload, kHeaderConstant);
        append_le32(part.payload, static_cast<std::uint32_t>(form.size()));
        append_class(part.payload, id);
        part.payload.insert(part.payload.end(), form.begin(), form.end());
    }
    std::vector<std::uint8_t> take_common() { return std::move(common_.payload); }
    std::vector<std::uint8_t> take_private() { return std::move(private_.payload); }

  private:
    struct Part {
        std::size_t count = 0;
        std::vector<std::uint8_t> payload;
    };
    Part common_;
    Part private_;
};

// The place of one object in its payload.
struct ObjectView {
    std::uint32_t header_word;
    ClassId id;
    std::span<const std::uint8_t> form;
};

// None at all when anything is wrong, however late.
std::optional<std::vector<ObjectView>> parse(std::span<const std::uint8_t> payload) {
    if (payload.size() < 4 || load_le32(payload.data()) != kPayloadWord) return std::nullopt;
    std::vector<ObjectView> views;
    for (auto rest = payload.subspan(4); !rest.empty();) {
        if (rest.size() < kHeaderBytes || views.size() == kMostObjects) return std::nullopt;
        const std::uint32_t length = load_le32(&rest[8]);
        if (load_le32(&rest[4]) != kHeaderConstant || length == 0) return std::nullopt;
        if (length > rest.size() - kHeaderBytes) return std::nullopt;
        views.push_back(
            {load_le32(rest.data()), load_class(&rest[12]), rest.subspan(kHeaderBytes, length)});
        rest = rest.subspan(kHeaderBytes + length);
    }
    return views;
}

void add_objects(std::span<const std::uint8_t> payload, std::uint16_t class_number,
                 VisionObjects& objects) {
    const auto views = parse(payload);
    if (!views) return;
    for (const ObjectView& view : *views) {
        if (!is_information(view.id)) continue;
        objects.push_back(AttachmentList::make_entry(
            view.id, restore_attachment(view.id, view.form, {view.header_word, class_number})));
    }
}

}  // namespace

void gather_vision(Image& image, PngVision& vision) {
    Gathering gathering;
    image.attachments().visit(
        [&](const ClassId& id, const Attachment& object) { gathering.add(id, object); });
    if (vision.objects.empty()) vision.objects = gathering.take_common();
    if (vision.private_objects.empty()) vision.private_objects = gathering.take_private();
    const auto* timing =
        dynamic_cast<const TimingAttachment*>(image.attachments().find(kTimingAttachment));
    if (vision.timing.empty() && timing != nullptr) vision.timing = timing->payload();
    const CustomData* custom_data = CustomData::find(image);
    vision.texts = custom_data != nullptr ? texts_of(*custom_data) : std::vector<PngText>();
}

VisionObjects make_objects(const PngVision& vision) {
    VisionObjects objects;
    add_objects(vision.objects, 0, objects);
    add_objects(vision.private_objects, kPrivateClasses, objects);
    if (!vision.timing.empty()) {
        objects.push_back(AttachmentList::make_entry(
            kTimingAttachment, std::make_unique<TimingAttachment>(vision.timing)));
    }
    if (auto store = custom_data_of(vision.texts, vision.is_written_by(kPngVersion))) {
        objects.push_back(AttachmentList::make_entry(kCustomDataAttachment, std::move(store)));
    }
    return objects;
}

void replace_attachments(Image& image, VisionObjects objects) noexcept {
    image.attachments().clear();
    for (AttachmentList::Entry& entry : objects) image.attachments().set(std::move(entry));
    image.attachments().note_change();
}

}  // namespace zq
