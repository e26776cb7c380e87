// INI files as the profile services of the program's home system read and write them.
//
// Section and key names are compared without regard to ASCII case; the first section of a name and the first key in
// it win. Blanks and tabs around names and values are dropped; a value between two equal quotes loses that pair. A
// line whose first non-blank is ';' is a comment. A file that begins with the UTF-16LE mark is read as UTF-16, any
// other as code page 1252. A NUL ends a value. Nothing is cached: each call sees the file as it is then.
#pragma once

#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>

namespace panelglow::platform {

/// A key and its value.
using ProfileEntry = std::pair<std::string, std::string>;

/// Every read fills `buffer`, always ended by NUL, and returns the number of characters stored without the final
/// NUL. A text that does not fit is cut: a single value returns size - 1; a list (names separated by one NUL, ended
/// by two) returns size - 2, also when it fits exactly. An empty buffer gives 0.
class ProfileFiles {
 public:
  virtual ~ProfileFiles() = default;

  /// The value of `key` in `section`, or `fallback` without its trailing blanks when there is no such key. Without
  /// `key`: the list of the section's keys; without `section`: the list of the section names.
  virtual std::size_t GetValue(std::optional<std::string_view> section, std::optional<std::string_view> key,
                               std::string_view fallback, std::span<char> buffer, std::string_view path) = 0;
  virtual std::size_t GetValue(std::optional<std::u16string_view> section, std::optional<std::u16string_view> key,
                               std::u16string_view fallback, std::span<char16_t> buffer,
                               std::u16string_view path) = 0;

  /// The section's lines as a list, "key=value" with quotes kept, without comments and blank lines. 0 when there is
  /// no such section.
  virtual std::size_t GetSection(std::string_view section, std::span<char> buffer, std::string_view path) = 0;

  /// Sets a value, creating file, section and key as needed; without `value` deletes the key, without `key` the
  /// section. All other lines stay as they are. False when the file could not be written.
  virtual bool SetValue(std::string_view section, std::optional<std::string_view> key,
                        std::optional<std::string_view> value, std::string_view path) = 0;
  virtual bool SetValue(std::u16string_view section, std::optional<std::u16string_view> key,
                        std::optional<std::u16string_view> value, std::u16string_view path) = 0;

  /// Sets the values in turn, with the cost of one edit of the file. When it fails none is set.
  virtual bool SetValues(std::string_view section, std::span<const ProfileEntry> entries, std::string_view path) = 0;
};

}  // namespace panelglow::platform
