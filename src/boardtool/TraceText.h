// The words of a trace.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

namespace panelglow::boardtool {

inline constexpr std::string_view kTraceHead = "panelglow-board trace 1";
inline constexpr std::string_view kReal = "real";
inline constexpr std::string_view kSimulated = "simulated";

/// Hexadecimal without a prefix.
std::string HexNumber(std::uint64_t number);

/// Two digits a byte; "-" for none.
std::string HexBytes(std::span<const std::byte> bytes);

}  // namespace panelglow::boardtool
