#include "boardtool/TraceText.h"

#include <array>
#include <cstdio>

namespace panelglow::boardtool {

std::string HexNumber(std::uint64_t number) {
  std::array<char, 24> text{};
  std::snprintf(text.data(), text.size(), "%llx", static_cast<unsigned long long>(number));
  return text.data();
}

std::string HexBytes(std::span<const std::byte> bytes) {
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::string text;
  for (const std::byte byte : bytes) {
    text += kDigits[std::to_integer<std::size_t>(byte) >> 4U];
    text += kDigits[std::to_integer<std::size_t>(byte) & 0xFU];
  }
  return text.empty() ? "-" : text;
}

}  // namespace panelglow::boardtool
