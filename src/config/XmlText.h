// The text type of XML names and values: 16 bytes, with up to 15 characters in place. A tree is mostly short texts;
// with std::string it would take twice the memory, and a log of some megabytes is loaded in each run.
#pragma once

#include <algorithm>
#include <array>
#include <concepts>
#include <cstdint>
#include <cstring>
#include <ostream>
#include <stdexcept>
#include <string>
#include <string_view>

namespace panelglow {

/// A string of any bytes, up to 4 GB, that is only ever replaced as a whole. A view of it is good until then.
class XmlText {
 public:
  XmlText() noexcept = default;

  template <class Text>
  requires std::convertible_to<const Text&, std::string_view> XmlText(const Text& text) { Store(text); }

  XmlText(const XmlText& other) { other.IsInPlace() ? void(bytes_ = other.bytes_) : Store(other); }
  XmlText(XmlText&& other) noexcept : bytes_(other.bytes_) { other.bytes_ = kEmpty; }
  XmlText& operator=(XmlText other) noexcept {
    std::swap(bytes_, other.bytes_);
    return *this;
  }
  ~XmlText() {
    if (!IsInPlace()) {
      delete[] Heap();
    }
  }

  operator std::string_view() const noexcept {
    return IsInPlace() ? std::string_view(bytes_.data(), static_cast<std::size_t>(kInPlace - bytes_.back()))
                       : std::string_view(Heap(), HeapSize());
  }
  operator std::string() const { return std::string(std::string_view(*this)); }

  [[nodiscard]] bool empty() const noexcept { return bytes_.back() == kInPlace; }
  void clear() noexcept { *this = XmlText(); }

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
  // In place, the last byte holds how many of the 15 before it are free. Otherwise it is kOnHeap, the first eight
  // bytes are the address of the characters and the next four their number. Nothing here asks whether char is signed.
  using Bytes = std::array<char, 16>;
  static constexpr char kInPlace = 15;
  static constexpr char kOnHeap = 16;
  static constexpr Bytes kEmpty{0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, kInPlace};

  [[nodiscard]] bool IsInPlace() const noexcept { return bytes_.back() != kOnHeap; }
  [[nodiscard]] char* Heap() const noexcept {
    char* characters = nullptr;
    std::memcpy(&characters, bytes_.data(), sizeof(characters));
    return characters;
  }
  [[nodiscard]] std::uint32_t HeapSize() const noexcept {
    std::uint32_t size = 0;
    std::memcpy(&size, bytes_.data() + sizeof(char*), sizeof(size));
    return size;
  }

  // Over an empty text.
  void Store(std::string_view text) {
    if (text.size() <= static_cast<std::size_t>(kInPlace)) {
      std::copy(text.begin(), text.end(), bytes_.begin());
      bytes_.back() = static_cast<char>(kInPlace - static_cast<char>(text.size()));
      return;
    }
    const auto size = static_cast<std::uint32_t>(text.size());
    if (size != text.size()) {
      throw std::length_error("a text of more than 4 GB");
    }
    char* const characters = new char[size];
    std::copy(text.begin(), text.end(), characters);
    std::memcpy(bytes_.data(), &characters, sizeof(characters));
    std::memcpy(bytes_.data() + sizeof(char*), &size, sizeof(size));
    bytes_.back() = kOnHeap;
  }

  alignas(char*) Bytes bytes_ = kEmpty;
};

}  // namespace panelglow
