// The circular list of attachments.
#include "image/attachments.h"

#include <utility>

namespace zq {

struct AttachmentList::Node : Link {
    ClassId id;
    std::unique_ptr<Attachment> attachment;
};

AttachmentList::AttachmentList() {
    static_assert(sizeof(Head) == 4 * sizeof(void*));
    head_.next = &head_;
    head_.previous = &head_;
    head_.count = 0;
    head_.reserved = 0;
}

AttachmentList::~AttachmentList() {
    clear();
}

AttachmentList::Node* AttachmentList::find_node(const ClassId& id) const {
    for (Link* link = head_.next; link != &head_; link = link->next) {
        auto* node = static_cast<Node*>(link);
        if (same_class(node->id, id)) {
            return node;
        }
    }
    return nullptr;
}

void AttachmentList::NodeDeleter::operator()(Node* node) const {
    delete node;
}

AttachmentList::Entry AttachmentList::make_entry(const ClassId& id,
                                                 std::unique_ptr<Attachment> attachment) {
    Entry entry(new Node);
    entry->id = id;
    entry->attachment = std::move(attachment);
    return entry;
}

void AttachmentList::set(const ClassId& id, std::unique_ptr<Attachment> attachment) {
    set(make_entry(id, std::move(attachment)));
}

void AttachmentList::set(Entry entry) noexcept {
    if (entry == nullptr) {
        return;
    }
    if (Node* node = find_node(entry->id)) {
        node->attachment = std::move(entry->attachment);
        return;
    }
    entry->next = &head_;
    entry->previous = head_.previous;
    head_.previous->next = entry.get();
    head_.previous = entry.release();
    ++head_.count;
}

Attachment* AttachmentList::find(const ClassId& id) const {
    const Node* node = find_node(id);
    return node == nullptr ? nullptr : node->attachment.get();
}

void AttachmentList::visit(const Visitor& visitor) const {
    for (const Link* link = head_.next; link != &head_; link = link->next) {
        const auto* node = static_cast<const Node*>(link);
        visitor(node->id, *node->attachment);
    }
}

bool AttachmentList::remove(const ClassId& id) {
    Node* node = find_node(id);
    if (node == nullptr) {
        return false;
    }
    erase(node);
    return true;
}

void AttachmentList::clear() {
    Link* link = std::exchange(head_.next, &head_);
    head_.previous = &head_;
    head_.count = 0;
    while (link != &head_) {
        const Entry owner(static_cast<Node*>(link));
        link = link->next;
    }
}

void AttachmentList::erase(Node* node) {
    const Entry owner(node);
    node->previous->next = node->next;
    node->next->previous = node->previous;
    --head_.count;
}

}  // namespace zq
