// Codes of the keys that windows act on: the home system's virtual-key codes.
#pragma once

#include <cstdint>

namespace panelglow::platform::desktop::key {

inline constexpr std::uint32_t kBackspace = 0x08;
inline constexpr std::uint32_t kTab = 0x09;
inline constexpr std::uint32_t kEnter = 0x0D;
inline constexpr std::uint32_t kEscape = 0x1B;
inline constexpr std::uint32_t kSpace = 0x20;
inline constexpr std::uint32_t kEnd = 0x23;
inline constexpr std::uint32_t kHome = 0x24;
inline constexpr std::uint32_t kLeft = 0x25;
inline constexpr std::uint32_t kUp = 0x26;
inline constexpr std::uint32_t kRight = 0x27;
inline constexpr std::uint32_t kDown = 0x28;
inline constexpr std::uint32_t kDelete = 0x2E;

}  // namespace panelglow::platform::desktop::key
