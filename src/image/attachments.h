// What clients hang on an image: the keyed collection of attachment objects and the extra
// information.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <vector>

#include "image/class_id.h"

namespace zq {

// An object owned by an image's collection.
class Attachment {
  public:
    virtual ~Attachment() = default;
    // The object as bytes from which its class can make it again; empty when it can not be carried.
    // Throws kNotEnoughMemory, or whatever code the object's owner gives.
    virtual std::vector<std::uint8_t> flattened() const { return {}; }
    // What travels beside those bytes: a word of the object's own, and the number of its class, by
    // which files group objects.
    virtual std::uint32_t header_word() const { return 0; }
    virtual std::uint16_t class_number() const { return 0; }
};

// Extra information: one object a image that holds parts of several kinds.
class ImageExtraInfo {
  public:
    virtual ~ImageExtraInfo() = default;
    // Drops the part of this kind; nothing happens when there is none.
    virtual void remove_kind(std::int32_t kind) = 0;
};

// A circular list with one entry a class. Threads: the image's lock.
class AttachmentList {
    struct Node;
    struct NodeDeleter {
        void operator()(Node* node) const;
    };

  public:
    // An object ready to be attached: what may fail is behind it.
    using Entry = std::unique_ptr<Node, NodeDeleter>;
    static Entry make_entry(const ClassId& id, std::unique_ptr<Attachment> attachment);

    AttachmentList();
    ~AttachmentList();
    AttachmentList(const AttachmentList&) = delete;
    AttachmentList& operator=(const AttachmentList&) = delete;

    // Takes the object; one of the same class that was there is destroyed.
    void set(const ClassId& id, std::unique_ptr<Attachment> attachment);
    // The same without anything that could fail; an empty entry does nothing.
    void set(Entry entry) noexcept;
    // Borrowed; null when absent.
    Attachment* find(const ClassId& id) const;
    // Every object with its class, in the order in which the classes came.
    using Visitor = std::function<void(const ClassId&, const Attachment&)>;
    void visit(const Visitor& visitor) const;
    // False when absent.
    bool remove(const ClassId& id);
    void clear();
    // Whoever changes what an attachment holds says so here; whoever keeps something made from the
    // attachments sees by the count that it is out of date.
    void note_change() noexcept { ++change_count_; }
    std::uint64_t change_count() const { return change_count_; }
    // What `image->customData` points at.
    void* head() { return &head_; }

  private:
    struct Link {
        Link* next;
        Link* previous;
    };
    // Four machine words; 16 bytes in a 32-bit process.
    struct Head : Link {
        std::uintptr_t count;
        std::uintptr_t reserved;
    };
    Node* find_node(const ClassId& id) const;
    void erase(Node* node);
    Head head_;
    std::uint64_t change_count_ = 0;
};

}  // namespace zq
