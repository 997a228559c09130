// Intrusive doubly linked node. A list is a sentinel node that points at itself when empty; a node in no list has both
// pointers null.
#pragma once

struct linkable {
  linkable* next = nullptr;
  linkable* prev = nullptr;

  linkable() = default;
  linkable(const linkable&) = delete;
  linkable& operator=(const linkable&) = delete;

  bool islinked() const { return next != nullptr; }

  // Removes the node from its list, if it is in one.
  void unlink() {
    if (next == nullptr) return;
    next->prev = prev;
    prev->next = next;
    next = prev = nullptr;
  }

  // Makes this node the sentinel of an empty list.
  void makesentinel() { next = prev = this; }

  // For a sentinel: true when the list has no node.
  bool isempty() const { return next == this; }

  // Inserts a node right after this one.
  void linkafter(linkable& node) {
    node.next = next;
    node.prev = this;
    next->prev = &node;
    next = &node;
  }
};
