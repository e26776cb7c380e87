// Reads and edits the text of an INI file in memory, by the rules of the platform's profile services. Pure functions
// over one text; `Char` is char (code page bytes) or char16_t. Every look-up is one pass without allocation per line.
#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>

namespace panelglow::platform::profile {

/// The value of a key, without blanks around it and one pair of equal quotes; nothing when there is no such section
/// or key. The view lives as long as `text`.
template <class Char>
std::optional<std::basic_string_view<Char>> FindValue(std::basic_string_view<Char> text,
                                                      std::basic_string_view<Char> section,
                                                      std::basic_string_view<Char> key);

/// A section's header, or a line of a section that is neither blank nor a comment, as the look-ups see it.
struct OutlineLine {
  std::size_t number = 1;  // of the line in the text
  std::size_t column = 1;  // of its first character that is no blank
  bool isHeader = false;
  bool isEntry = false;         // it has a "="
  std::string_view name;        // of the section, or of the key; all of a line that is no entry
  std::string_view value;       // with its quotes
  std::size_t valueColumn = 1;  // where it begins, or would
  std::string_view line;        // whole, without its line end
};

/// Gives the headers and lines of a text in order, those before the first header, too.
void VisitLines(std::string_view text, const std::function<void(const OutlineLine&)>& visit);

/// The names of all sections, each ended by NUL. A repeated name stands as often as the file has it.
template <class Char>
std::basic_string<Char> SectionNames(std::basic_string_view<Char> text);

/// The keys of a section, each ended by NUL; lines without "=" are left out.
template <class Char>
std::basic_string<Char> KeyNames(std::basic_string_view<Char> text, std::basic_string_view<Char> section);

/// The lines of a section, each ended by NUL: "key=value" without the blanks around "=", quotes kept; no comments, no
/// blank lines.
template <class Char>
std::basic_string<Char> SectionLines(std::basic_string_view<Char> text, std::basic_string_view<Char> section);

/// The text with a value set; without `value` the key deleted, without `key` the section. All other lines stay.
template <class Char>
std::basic_string<Char> WithValue(std::basic_string_view<Char> text, std::basic_string_view<Char> section,
                                  std::optional<std::basic_string_view<Char>> key,
                                  std::optional<std::basic_string_view<Char>> value);

/// The text with the values of these keys set in turn, in one pass where the keys are new.
template <class Char>
std::basic_string<Char> WithValues(
    std::basic_string_view<Char> text, std::basic_string_view<Char> section,
    std::type_identity_t<std::span<const std::pair<std::basic_string<Char>, std::basic_string<Char>>>> entries);

/// Copies a single text: cut to size - 1 characters, NUL behind it; returns the characters copied.
template <class Char>
std::size_t CopyText(std::basic_string_view<Char> text, std::span<Char> buffer);

/// Copies a list of NUL-ended texts, ended by one more NUL. A list that does not fit, or fits exactly, is cut to
/// size - 2 characters and two NULs, and returns size - 2; otherwise the characters copied without the last NUL.
template <class Char>
std::size_t CopyList(std::basic_string_view<Char> list, std::span<Char> buffer);

}  // namespace panelglow::platform::profile
