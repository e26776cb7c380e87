#include "config/FileParser.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <map>

#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::size_t kLineBuffer = 1024;
constexpr std::size_t kBufferStep = 10240;
constexpr std::size_t kSteps[] = {1, 2, 4, 8, 16, 31};  // a list of n bytes is read with a total of about 4 n
constexpr std::size_t kLargestNumbered = std::size_t{64} << 20U;
constexpr std::size_t kConversionBuffer = 4096;

platform::ProfileFiles& Profiles() { return platform::TheHost().profiles; }

// The texts of a list in which each is ended by a NUL.
std::vector<std::string> TextsOf(std::string_view list) {
  std::vector<std::string> texts;
  while (!list.empty()) {
    const std::size_t end = std::min(list.find('\0'), list.size());
    if (end == 0) {
      break;
    }
    texts.emplace_back(list.substr(0, end));
    list.remove_prefix(std::min(end + 1, list.size()));
  }
  return texts;
}

// A field's text: between its first and its last double quote as it stands, otherwise without blanks at both ends.
std::string Stripped(std::string_view field) {
  const std::size_t first = field.find('"');
  if (first != std::string_view::npos) {
    const std::size_t last = field.rfind('"');
    return std::string(field.substr(first + 1, last == first ? 0 : last - first - 1));
  }
  const std::size_t begin = field.find_first_not_of(" \t");
  if (begin == std::string_view::npos) {
    return {};
  }
  return std::string(field.substr(begin, field.find_last_not_of(" \t") - begin + 1));
}

}  // namespace

FileParser::FileParser(const std::string& file) : path(file), lock(file) {}

std::vector<std::string> FileParser::ReadList(const ListCall& call, bool mustHaveContent) {
  for (const std::size_t step : kSteps) {
    std::string room(step * kBufferStep, '\xFF');
    const std::size_t length = call(std::span<char>(room.data(), room.size()));
    if (length == 0 && mustHaveContent) {
      throw kCannotRead;
    }
    if (length != room.size() - 2) {
      return TextsOf(std::string_view(room).substr(0, length));
    }
  }
  throw kCannotRead;
}

// ---- lines and fields

bool FileParser::ReadValue(const std::string& section, const std::string& key) {
  std::array<char, kLineBuffer> line{};
  const std::size_t length = Profiles().GetValue(section, key, "", line, path);
  if (length == 0) {
    buffer.clear();
    return false;
  }
  SplitLine(std::string(line.data(), length));
  return true;
}

std::vector<std::string> FileParser::ReadNumberedValues(const std::string& section, const std::string& prefix) const {
  std::string room(kBufferStep, '\0');
  std::size_t length = 0;
  while ((length = Profiles().GetSection(section, std::span<char>(room.data(), room.size()), path)) + 2 ==
             room.size() &&
         room.size() < kLargestNumbered) {
    room.assign(room.size() * 2, '\0');
  }
  std::map<std::string, std::string> byKey;  // the first of a key counts
  int keys = 0;
  for (const std::string& line : TextsOf(std::string_view(room).substr(0, length))) {
    const std::size_t equals = line.find('=');
    if (equals != std::string::npos) {
      byKey.emplace(CDMUtil::ToUpper(line.substr(0, equals)), line.substr(equals + 1));
      ++keys;
    }
  }
  std::vector<std::string> values;
  for (int i = 0; i < keys; ++i) {
    const auto found = byKey.find(CDMUtil::ToUpper(prefix + CDMUtil::ToString(i)));
    values.push_back(found == byKey.end() ? std::string() : AsValue(found->second));
  }
  return values;
}

std::string FileParser::AsValue(std::string_view line) {
  const bool isQuoted =
      line.size() >= 2 && line.front() == line.back() && (line.front() == '"' || line.front() == '\'');
  return std::string((isQuoted ? line.substr(1, line.size() - 2) : line).substr(0, kLineBuffer - 1));
}

void FileParser::SplitLine(const std::string& line) {
  buffer = line.substr(0, kLineBuffer - 1);
  currentValue = Stripped(std::string_view(buffer).substr(0, buffer.find(';')));
  fields.clear();
  fieldIndex = 0;
  std::size_t cursor = 0;
  for (std::string field; NextField(cursor, field);) {
    fields.push_back(field);
  }
}

// The field at the cursor, which moves behind its separator. False at an empty field, which ends the list.
bool FileParser::NextField(std::size_t& cursor, std::string& out) const {
  const std::size_t begin = std::min(cursor, buffer.size());
  std::size_t at = begin;
  while (at < buffer.size() && buffer[at] != ',' && buffer[at] != ';') {
    if (buffer[at] == '"') {
      at = at + 1 < buffer.size() ? buffer.find('"', at + 1) : std::string::npos;
      if (at == std::string::npos) {
        throw kCannotRead;
      }
    }
    ++at;
  }
  // Behind a comment's mark, or at the end, there is nothing further.
  cursor = at < buffer.size() && buffer[at] == ',' ? at + 1 : buffer.size();
  if (at == begin) {
    return false;
  }
  out = Stripped(std::string_view(buffer).substr(begin, at - begin));
  return true;
}

bool FileParser::NextFieldString(std::string& out) {
  if (fieldIndex >= fields.size()) {
    return false;
  }
  out = fields[fieldIndex++];
  return true;
}

bool FileParser::NextFieldText(std::span<char> out) {
  std::string text;
  if (out.empty() || !NextFieldString(text)) {
    return false;
  }
  const std::size_t length = std::min(text.size(), out.size() - 1);
  std::copy_n(text.begin(), length, out.begin());
  out[length] = '\0';
  return true;
}

bool FileParser::NextFieldNumber(unsigned int& out, int base) {
  std::string text;
  if (!NextFieldString(text)) {
    return false;
  }
  // The program's home system has a `long` of 32 bits.
  const unsigned long long number = std::strtoull(text.c_str(), nullptr, base);
  const std::size_t first = text.find_first_not_of(" \t\n\v\f\r");
  const bool isNegative = first != std::string::npos && text[first] == '-';
  const unsigned long long magnitude = isNegative ? 0 - number : number;
  const unsigned long long largest = std::numeric_limits<std::uint32_t>::max();
  out = static_cast<unsigned int>(magnitude > largest ? largest : number);
  return true;
}

// ---- sections and keys

const std::vector<std::string>& FileParser::SectionNames() {
  if (!sectionNames) {
    sectionNames = ReadList(
        [&](std::span<char> room) { return Profiles().GetValue(std::nullopt, std::nullopt, "", room, path); }, false);
  }
  return *sectionNames;
}

int FileParser::CountSections() { return static_cast<int>(SectionNames().size()); }

bool FileParser::HasSection(const std::string& name) {
  const std::vector<std::string>& names = SectionNames();
  return std::any_of(names.begin(), names.end(),
                     [&](const std::string& section) { return CDMUtil::EqualIgnoreCase(section, name); });
}

int FileParser::CountKeys(const std::string& section) {
  return static_cast<int>(
      ReadList([&](std::span<char> room) { return Profiles().GetValue(section, std::nullopt, "", room, path); }, true)
          .size());
}

// ---- the target file

bool FileParser::WriteBuffer(const std::string& section, const std::string& key) {
  return Profiles().SetValue(section, key, buffer, targetPath);
}

bool FileParser::EraseSection(const std::string& section) {
  return Profiles().SetValue(section, std::nullopt, std::nullopt, targetPath);
}

int FileParser::ConvertToIni(const std::string& section, const std::string& prefix, bool clear, int firstNumber) {
  try {
    return Convert(section, prefix, clear, firstNumber);
  } catch (int code) {
    platform::TheHost().console.WriteError("ConvertToIni Failed: " + CDMUtil::ToString(code) + "\n");
    throw;
  }
}

int FileParser::Convert(const std::string& section, const std::string& prefix, bool clear, int firstNumber) {
  std::array<char, kConversionBuffer> room{};
  const std::size_t length = Profiles().GetSection(section, room, path);
  if (length == room.size() - 2) {
    throw kCannotRead;
  }
  if (clear) {
    EraseSection(section);
  }
  int number = firstNumber;
  for (const std::string& line : TextsOf(std::string_view(room.data(), length))) {
    if (!Profiles().SetValue(section, prefix + CDMUtil::ToString(number), line, targetPath)) {
      throw kCannotWrite;
    }
    ++number;
  }
  return number - firstNumber;
}

}  // namespace panelglow
