// A value of the board's files with the place where it stands, so that whoever cannot use it can say which one it is.
#pragma once

#include <cstdint>
#include <string>
#include <utility>

namespace panelglow {

struct Setting {
  Setting() = default;
  // Texts of no file, too, are settings: they have no place, and nothing is told of them.
  Setting(std::string value, std::string where = {})  // NOLINT(google-explicit-constructor)
      : text(std::move(value)), place(std::move(where)) {}
  Setting(const char* value) : text(value) {}  // NOLINT(google-explicit-constructor)

  std::string text;
  std::string place;  // as in messages: file, section, key; empty for a default
};

/// Tells people `what` (a sentence; its full stop may be missing) of a setting that has a place.
void TellOf(const Setting& setting, const std::string& what);

/// The bits of an int. A number of this width has a sign as well; those of every other width have none.
constexpr unsigned kIntBits = 31;

/// Tells people when a token of a setting is no number, or one that does not fit into `bits`; `counted` is what it
/// counts as.
void CheckNumber(const std::string& token, unsigned bits, std::uint32_t counted, const Setting& setting);

/// The low `bits` (8 or 16) of a number in a setting, of any other token 0; what is odd about it is told.
std::uint32_t NumberIn(const std::string& token, unsigned bits, const Setting& setting);

/// The same of a number of 32 bits without sign.
std::uint32_t WideNumberIn(const std::string& token, const Setting& setting);

}  // namespace panelglow
