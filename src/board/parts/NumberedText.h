// Texts that name a number that a chip does not have.
#pragma once

#include <string>

namespace panelglow {

/// `text` with "%d" replaced by `number`.
inline std::string NumberedText(std::string text, int number) {
  const std::size_t at = text.find("%d");
  return at == std::string::npos ? text : text.replace(at, 2, std::to_string(number));
}

}  // namespace panelglow
