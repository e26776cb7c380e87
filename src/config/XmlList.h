// The list type of the XML tree: a vector of 16 bytes whose memory may stand in a block (see XmlBlocks.h).
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <new>
#include <stdexcept>
#include <utility>

#include "config/XmlBlocks.h"

namespace panelglow {

/// As std::vector, with what the tree needs of it. Pointers to items are good until the list grows or loses items.
template <class Item>
class XmlList {
 public:
  using value_type = Item;
  using iterator = Item*;
  using const_iterator = const Item*;

  XmlList() noexcept = default;
  XmlList(const XmlList& other) : XmlList() {
    reserve(other.size());
    for (const Item& item : other) {
      emplace_back(item);
    }
  }
  XmlList(XmlList&& other) noexcept
      : items_(std::exchange(other.items_, nullptr)),
        size_(std::exchange(other.size_, 0)),
        room_(std::exchange(other.room_, 0)) {}
  XmlList& operator=(XmlList other) noexcept {
    std::swap(items_, other.items_);
    std::swap(size_, other.size_);
    std::swap(room_, other.room_);
    return *this;
  }
  ~XmlList() {
    clear();
    FreeRoom();
  }

  [[nodiscard]] Item* begin() noexcept { return items_; }
  [[nodiscard]] Item* end() noexcept { return items_ + size_; }
  [[nodiscard]] const Item* begin() const noexcept { return items_; }
  [[nodiscard]] const Item* end() const noexcept { return items_ + size_; }
  [[nodiscard]] Item* data() noexcept { return items_; }
  [[nodiscard]] const Item* data() const noexcept { return items_; }
  [[nodiscard]] std::size_t size() const noexcept { return size_; }
  [[nodiscard]] std::size_t capacity() const noexcept { return room_ & kLargestCapacity; }
  [[nodiscard]] bool empty() const noexcept { return size_ == 0; }
  [[nodiscard]] Item& operator[](std::size_t index) noexcept { return items_[index]; }
  [[nodiscard]] const Item& operator[](std::size_t index) const noexcept { return items_[index]; }
  [[nodiscard]] Item& front() noexcept { return *items_; }
  [[nodiscard]] const Item& front() const noexcept { return *items_; }
  [[nodiscard]] Item& back() noexcept { return items_[size_ - 1]; }
  [[nodiscard]] const Item& back() const noexcept { return items_[size_ - 1]; }

  template <class... Arguments>
  Item& emplace_back(Arguments&&... arguments) {
    if (size_ < capacity()) {
      return Counted(new (end()) Item(std::forward<Arguments>(arguments)...));
    }
    Item item(std::forward<Arguments>(arguments)...);  // before the items move: it may be made from one of them
    reserve(std::max<std::size_t>(1, 2 * capacity()));
    return Counted(new (end()) Item(std::move(item)));
  }
  void push_back(Item&& item) { emplace_back(std::move(item)); }

  void pop_back() noexcept { std::destroy_at(items_ + --size_); }

  void clear() noexcept {
    std::destroy(begin(), end());
    size_ = 0;
  }

  /// `blocks`, unless null, is where the room comes from if it is small enough.
  void reserve(std::size_t wanted, XmlBlocks* blocks = nullptr) {
    if (wanted <= capacity()) {
      return;
    }
    if (wanted > kLargestCapacity) {
      throw std::length_error("a list of more than 2 G items");
    }
    static_assert(alignof(Item) <= alignof(void*));  // what a block has
    const std::size_t size = wanted * sizeof(Item);
    const std::uint32_t place = blocks != nullptr && size <= XmlBlocks::kLargestPiece ? kInBlock : 0;
    auto* const items = static_cast<Item*>(place == kInBlock ? blocks->Take(size) : ::operator new(size));
    MoveItems(begin(), end(), items);
    FreeRoom();
    items_ = items;
    room_ = static_cast<std::uint32_t>(wanted) | place;
  }

  /// Moves the items of `other` from `first` on to the end of this list.
  void TakeTail(XmlList& other, std::size_t first, XmlBlocks* blocks) {
    const std::size_t count = other.size() - first;
    if (count == 0) {
      return;
    }
    if (size() + count > capacity()) {
      reserve(std::max(size() + count, 2 * capacity()), blocks);
    }
    MoveItems(other.begin() + first, other.end(), end());
    size_ += static_cast<std::uint32_t>(count);
    other.size_ = static_cast<std::uint32_t>(first);
  }

  template <class Predicate>
  friend void erase_if(XmlList& list, Predicate predicate) {
    Item* const end = std::remove_if(list.begin(), list.end(), predicate);
    std::destroy(end, list.end());
    list.size_ = static_cast<std::uint32_t>(end - list.begin());
  }

 private:
  static constexpr std::uint32_t kInBlock = 0x80000000;
  static constexpr std::uint32_t kLargestCapacity = kInBlock - 1;

  // Counts an item at the end only once it is there: making it may have thrown.
  Item& Counted(Item* item) noexcept {
    ++size_;
    return *item;
  }

  // To memory that holds nothing. Where they were is memory that holds nothing afterwards: what was moved from owns
  // nothing, so its destructor has nothing to do and is not called.
  static void MoveItems(Item* from, Item* end, Item* to) noexcept {
    for (; from != end; ++from, ++to) {
      new (to) Item(std::move(*from));
    }
  }

  void FreeRoom() noexcept {
    if ((room_ & kInBlock) != 0) {
      XmlBlocks::GiveBack(items_);
    } else if (items_ != nullptr) {
      ::operator delete(items_);
    }
  }

  Item* items_ = nullptr;
  std::uint32_t size_ = 0;
  std::uint32_t room_ = 0;  // the capacity, and kInBlock
};

}  // namespace panelglow
