// Names that the system compares without regard to ASCII case.
#pragma once

#include <algorithm>
#include <string>
#include <string_view>

namespace panelglow::platform {

inline std::string Lowered(std::string_view text) {
  std::string lowered(text);
  std::transform(lowered.begin(), lowered.end(), lowered.begin(),
                 [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; });
  return lowered;
}

inline bool EqualNames(std::string_view one, std::string_view other) { return Lowered(one) == Lowered(other); }

}  // namespace panelglow::platform
