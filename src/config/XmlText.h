// The text type of XML names and values: 16 bytes, with up to 15 characters in place. A tree is mostly short texts;
// with std::string it would take twice the memory, and a log of some megabytes is loaded in each run.
#pragma once

#include <array>
#include <concepts>
#include <cstdint>
#include <cstring>
#include <ostream>
#include <stdexcept>
#include <string>
#include <string_view>

#include "config/XmlBlocks.h"

namespace panelglow {

/// A string of any bytes, up to 4 GB, that is only ever replaced as a whole. A view of it is good until then.
class XmlText {
 public:
  XmlText() noexcept = default;

  template <class Text>
  requires std::convertible_to<const Text&, std::string_view> XmlText(const Text& text) { Store(text); }

  /// `blocks`, unless null, is where the characters of a longer text have their room if it is small enough.
  XmlText(std::string_view text, XmlBlocks* blocks) { Store(text, blocks); }

  XmlText(const XmlText& other) { other.IsInPlace() ? void(bytes_ = other.bytes_) : Store(other); }
  XmlText(XmlText&& other) noexcept : bytes_(other.bytes_) { other.bytes_ = kEmpty; }
  XmlText& operator=(XmlText other) noexcept {
    std::swap(bytes_, other.bytes_);
    return *this;
  }
  ~XmlText() { FreeCharacters(); }

  /// As an assignment of XmlText(text, blocks), made in its place. `text` is no view of this one.
  void Set(std::string_view text, XmlBlocks* blocks) {
    clear();
    Store(text, blocks);
  }

  operator std::string_view() const noexcept {
    return IsInPlace() ? std::string_view(bytes_.data(), static_cast<std::size_t>(kInPlace - bytes_.back()))
                       : std::string_view(Characters(), Size());
  }
  operator std::string() const { return std::string(std::string_view(*this)); }

  [[nodiscard]] bool empty() const noexcept { return bytes_.back() == kInPlace; }
  void clear() noexcept {
    FreeCharacters();
    bytes_ = kEmpty;
  }

  friend bool operator==(const XmlText& left, const XmlText& right) noexcept {
    return std::string_view(left) == std::string_view(right);
  }
  template <class Text>
  requires std::convertible_to<const Text&, std::string_view>
  friend bool operator==(const XmlText& left, const Text& right) {
    return std::string_view(left) == std::string_view(right);
  }
  friend std::ostream& operator<<(std::ostream& stream, const XmlText& text) {
    return stream << std::string_view(text);
  }

 private:
  // In place, the last byte holds how many of the 15 before it are free. Otherwise it says where the characters are;
  // the first eight bytes are their address and the next four their number. Nothing here asks whether char is signed.
  using Bytes = std::array<char, 16>;
  static constexpr char kInPlace = 15;
  static constexpr char kOnHeap = 16;
  static constexpr char kInBlock = 17;
  static constexpr Bytes kEmpty{0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, kInPlace};

  [[nodiscard]] bool IsInPlace() const noexcept { return bytes_.back() <= kInPlace; }
  [[nodiscard]] char* Characters() const noexcept {
    char* characters = nullptr;
    std::memcpy(&characters, bytes_.data(), sizeof(characters));
    return characters;
  }
  [[nodiscard]] std::uint32_t Size() const noexcept {
    std::uint32_t size = 0;
    std::memcpy(&size, bytes_.data() + sizeof(char*), sizeof(size));
    return size;
  }

  void FreeCharacters() noexcept {
    if (bytes_.back() == kInBlock) {
      XmlBlocks::GiveBack(Characters());
    } else if (bytes_.back() == kOnHeap) {
      delete[] Characters();
    }
  }

  // The ends of a text of one to two times `kPiece` characters, which overlap.
  template <std::size_t kPiece>
  void CopyEnds(std::string_view text) noexcept {
    std::memcpy(bytes_.data(), text.data(), kPiece);
    std::memcpy(bytes_.data() + text.size() - kPiece, text.data() + text.size() - kPiece, kPiece);
  }

  // Copies of a size that the compiler knows: a call would take longer than copying what most texts are.
  void StoreInPlace(std::string_view text) noexcept {
    if (text.size() >= 8) {
      CopyEnds<8>(text);
    } else if (text.size() >= 4) {
      CopyEnds<4>(text);
    } else if (text.size() >= 2) {
      CopyEnds<2>(text);
    } else if (text.size() == 1) {
      bytes_.front() = text.front();
    }
    bytes_.back() = static_cast<char>(kInPlace - static_cast<char>(text.size()));
  }

  // Over an empty text.
  void Store(std::string_view text, XmlBlocks* blocks = nullptr) {
    if (text.size() <= static_cast<std::size_t>(kInPlace)) {
      StoreInPlace(text);
      return;
    }
    const auto size = static_cast<std::uint32_t>(text.size());
    if (size != text.size()) {
      throw std::length_error("a text of more than 4 GB");
    }
    const bool inBlock = blocks != nullptr && size <= XmlBlocks::kLargestPiece;
    char* const characters = inBlock ? static_cast<char*>(blocks->Take(size)) : new char[size];
    std::memcpy(characters, text.data(), size);
    std::memcpy(bytes_.data(), &characters, sizeof(characters));
    std::memcpy(bytes_.data() + sizeof(char*), &size, sizeof(size));
    bytes_.back() = inBlock ? kInBlock : kOnHeap;
  }

  alignas(char*) Bytes bytes_ = kEmpty;
};

}  // namespace panelglow
