#include "platform/profile/ProfileFilesOnFiles.h"

#include <string>
#include <vector>

#include "platform/Text.h"
#include "platform/profile/ProfileText.h"

namespace panelglow::platform::profile {

namespace {

constexpr std::string_view kWideMark = "\xFF\xFE";

bool IsWide(std::string_view bytes) { return bytes.starts_with(kWideMark); }

wstring WideOf(std::string_view bytes) {
  if (!IsWide(bytes)) {
    return WideFromCodePage(bytes);
  }
  wstring text;
  text.reserve(bytes.size() / 2);
  for (std::size_t i = kWideMark.size(); i + 1 < bytes.size(); i += 2) {
    text.push_back(
        static_cast<char16_t>(static_cast<unsigned char>(bytes[i]) | static_cast<unsigned char>(bytes[i + 1]) << 8U));
  }
  return text;
}

std::string WideBytes(std::u16string_view text) {
  std::string bytes(kWideMark);
  for (const char16_t c : text) {
    bytes.push_back(static_cast<char>(static_cast<unsigned char>(c & 0xFF)));
    bytes.push_back(static_cast<char>(static_cast<unsigned char>(c >> 8U)));
  }
  return bytes;
}

// `edited` in the form of the file that `bytes` are; just these when the text is the same.
std::string WideEdit(const std::string& bytes, const wstring& edited) {
  if (edited == WideOf(bytes)) {
    return bytes;
  }
  return IsWide(bytes) ? WideBytes(edited) : CodePageFromWide(edited);
}

std::optional<wstring> Widened(std::optional<std::string_view> text) {
  return text ? std::optional<wstring>(WideFromCodePage(*text)) : std::nullopt;
}

std::string NarrowOf(std::string bytes) {
  if (IsWide(bytes)) {
    return CodePageFromWide(WideOf(bytes));
  }
  return bytes;
}

// The three kinds of answer that one look-up can give.
template <class Char>
std::size_t Answer(std::basic_string_view<Char> text, std::optional<std::basic_string_view<Char>> section,
                   std::optional<std::basic_string_view<Char>> key, std::basic_string_view<Char> fallback,
                   std::span<Char> buffer) {
  if (!section) {
    const auto names = SectionNames<Char>(text);
    return CopyList<Char>(names, buffer);
  }
  if (!key) {
    const auto names = KeyNames<Char>(text, *section);
    return names.empty() ? CopyText<Char>(fallback, buffer) : CopyList<Char>(names, buffer);
  }
  if (const auto value = FindValue<Char>(text, *section, *key)) {
    return CopyText<Char>(*value, buffer);
  }
  while (!fallback.empty() && fallback.back() == Char(' ')) {
    fallback.remove_suffix(1);
  }
  return CopyText<Char>(fallback, buffer);
}

}  // namespace

std::size_t ProfileFilesOnFiles::GetValue(std::optional<std::string_view> section,
                                          std::optional<std::string_view> key, std::string_view fallback,
                                          std::span<char> buffer, std::string_view path) {
  const std::string text = NarrowOf(files_.Read(path).value_or(std::string()));
  return Answer<char>(text, section, key, fallback, buffer);
}

std::size_t ProfileFilesOnFiles::GetValue(std::optional<std::u16string_view> section,
                                          std::optional<std::u16string_view> key, std::u16string_view fallback,
                                          std::span<char16_t> buffer, std::u16string_view path) {
  const wstring text = WideOf(files_.Read(Utf8FromWide(path)).value_or(std::string()));
  return Answer<char16_t>(text, section, key, fallback, buffer);
}

std::size_t ProfileFilesOnFiles::GetSection(std::string_view section, std::span<char> buffer, std::string_view path) {
  const std::string text = NarrowOf(files_.Read(path).value_or(std::string()));
  return CopyList<char>(SectionLines<char>(text, section), buffer);
}

bool ProfileFilesOnFiles::SetValue(std::string_view section, std::optional<std::string_view> key,
                                   std::optional<std::string_view> value, std::string_view path) {
  const std::optional<wstring> wideKey = Widened(key);
  const std::optional<wstring> wideValue = Widened(value);
  const wstring wideSection = WideFromCodePage(section);
  return Edit(path, [&](const std::string& bytes) {
    return IsWide(bytes) ? WideEdit(bytes, WithValue<char16_t>(WideOf(bytes), wideSection, wideKey, wideValue))
                         : WithValue<char>(bytes, section, key, value);
  });
}

bool ProfileFilesOnFiles::SetValue(std::u16string_view section, std::optional<std::u16string_view> key,
                                   std::optional<std::u16string_view> value, std::u16string_view path) {
  return Edit(Utf8FromWide(path), [&](const std::string& bytes) {
    return WideEdit(bytes, WithValue<char16_t>(WideOf(bytes), section, key, value));
  });
}

bool ProfileFilesOnFiles::SetValues(std::string_view section, std::span<const ProfileEntry> entries,
                                    std::string_view path) {
  return Edit(path, [&](const std::string& bytes) {
    if (!IsWide(bytes)) {
      return WithValues<char>(bytes, section, entries);
    }
    std::vector<std::pair<wstring, wstring>> wideEntries;
    wideEntries.reserve(entries.size());
    for (const auto& [key, value] : entries) {
      wideEntries.emplace_back(WideFromCodePage(key), WideFromCodePage(value));
    }
    return WideEdit(bytes, WithValues<char16_t>(WideOf(bytes), WideFromCodePage(section), wideEntries));
  });
}

// An absent file is edited like an empty one, and made. One that is there but cannot be read must not be replaced by
// its one new line, and one that stays the same is not written.
bool ProfileFilesOnFiles::Edit(std::string_view path, const std::function<std::string(const std::string&)>& edit) {
  const std::optional<std::string> bytes = files_.ReadLocked(path);
  if (!bytes && files_.CanRead(path)) {
    return false;
  }
  const std::string edited = edit(bytes.value_or(std::string()));
  return (bytes && edited == *bytes) || files_.WriteLocked(path, edited);
}

}  // namespace panelglow::platform::profile
