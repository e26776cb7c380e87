// The profile services as the programs that rely on them notice them: one table for each rule of reading, exact
// lengths at the buffer's end, and files that keep every byte that a write does not concern.
#include "platform/profile/ProfileFilesOnFiles.h"

#include <gtest/gtest.h>

#include <functional>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Text.h"

namespace panelglow::platform {
namespace {

using namespace std::string_literals;
using namespace std::string_view_literals;

constexpr const char* kPath = "test.ini";
constexpr std::string_view kNone = "(none)";

/// Files in memory; one that is in `unreadable` opens, but cannot be read.
class MemoryFiles : public Files {
 public:
  bool CanRead(std::string_view path) override { return content.count(std::string(path)) != 0; }
  std::optional<std::string> Read(std::string_view path) override {
    const auto found = content.find(std::string(path));
    return found == content.end() || unreadable ? std::nullopt : std::optional<std::string>(found->second);
  }
  std::optional<std::string> ReadLocked(std::string_view path) override { return Read(path); }
  bool Write(std::string_view path, std::string_view bytes) override {
    content[std::string(path)] = bytes;
    ++writes;
    return true;
  }
  bool WriteLocked(std::string_view path, std::string_view bytes) override { return Write(path, bytes); }
  bool Remove(std::string_view path) override { return content.erase(std::string(path)) != 0; }
  std::string FullPath(std::string_view path) override { return std::string(path); }
  std::string CurrentDirectory() override { return {}; }
  std::string FileName(std::string_view path) override { return std::string(path); }
  std::string ExecutablePath() override { return {}; }

  std::map<std::string, std::string> content;
  bool unreadable = false;
  int writes = 0;
};

std::string Utf16(std::u16string_view text) {
  std::string bytes = "\xFF\xFE";
  for (const char16_t c : text) {
    bytes.push_back(static_cast<char>(c & 0xFF));
    bytes.push_back(static_cast<char>(c >> 8U));
  }
  return bytes;
}

class ProfileFilesTest : public testing::Test {
 protected:
  std::string Value(std::string_view section, std::string_view key, std::string_view fallback = kNone) {
    std::string buffer(256, '#');
    buffer.resize(profiles.GetValue(section, key, fallback, buffer, kPath));
    return buffer;
  }
  std::string List(std::optional<std::string_view> section) {
    std::string buffer(256, '#');
    buffer.resize(profiles.GetValue(section, std::nullopt, kNone, buffer, kPath));
    return buffer;
  }
  std::string Lines(std::string_view section) {
    std::string buffer(256, '#');
    buffer.resize(profiles.GetSection(section, buffer, kPath));
    return buffer;
  }

  MemoryFiles files;
  profile::ProfileFilesOnFiles profiles{files};
  std::string& text = files.content[kPath];
};

TEST_F(ProfileFilesTest, OneLineOfASectionGivesTheValueOfItsKey) {
  struct Case {
    std::string line;
    std::string_view expected;
  };
  const std::vector<Case> cases{
      {"key=value", "value"},
      {"KeY=Value", "Value"},
      {" \tkey\t = \t a b \t", "a b"},
      {"key=\"a b\"", "a b"},
      {"key='a b'", "a b"},
      {"key = \" a \" ", " a "},
      {"key=\"\"a\"\"", "\"a\""},
      {"key=\"a'", "\"a'"},
      {"key=a \"b\" c", "a \"b\" c"},
      {"key=\"", "\""},
      {"key=\"\"", ""},
      {"key=", ""},
      {"key=a=b", "a=b"},
      {"key=a;b ; c", "a;b ; c"},
      {"key=a\0b"s, "a"},
      {";key=a", kNone},
      {"key", kNone},
      {"other=a", kNone},
      {"key2=a\rkey=b\rkey=c", "b"},
      {"key=a\nkey=b", "a"},
      {"[open\nkey=a", "a"},
  };
  for (const Case& one : cases) {
    text = "[s]\n" + one.line;  // a last line needs no end
    EXPECT_EQ(Value("s", "key"), one.expected) << one.line;
    text = Utf16(WideFromCodePage("[s]\r\n" + one.line + "\r\n[t]\r\nkey=t"));
    EXPECT_EQ(Value("s", "key"), one.expected) << one.line << " (wide file)";
  }
}

TEST_F(ProfileFilesTest, TheFirstSectionOfANameIsTheOneThatCounts) {
  text = "key=outside\n[ First ] behind\nkey=1\n[SECOND]\nkey=2\n[first]\nonly=3\nkey=3\n";
  EXPECT_EQ(Value("first", "key"), "1");
  EXPECT_EQ(Value(" FIRST\t", "key"), "1");
  EXPECT_EQ(Value("first", "only"), kNone);
  EXPECT_EQ(Value("second", " KEY "), "2");
  EXPECT_EQ(Value("third", "key"), kNone);
  EXPECT_EQ(List(std::nullopt), "First\0SECOND\0first\0"s);
}

TEST_F(ProfileFilesTest, AByteOrderMarkOfUtf8HidesTheFirstHeader) {
  text = "\xEF\xBB\xBF[s]\nkey=1\n[t]\nkey=2\n";
  EXPECT_EQ(Value("s", "key"), kNone);
  EXPECT_EQ(Value("t", "key"), "2");
}

TEST_F(ProfileFilesTest, ADefaultLosesItsTrailingBlanksOnlyWhereAKeyWasAskedFor) {
  text = "[s]\nempty=\n";
  EXPECT_EQ(Value("s", "missing", " a b  "), " a b");
  EXPECT_EQ(Value("s", "empty", "a"), "");
  std::string buffer(16, '#');
  EXPECT_EQ(profiles.GetValue("missing"sv, std::nullopt, "a  ", buffer, kPath), 3U);
  EXPECT_EQ(profiles.GetValue("s"sv, "key"sv, "a", buffer, "missing.ini"), 1U);
}

TEST_F(ProfileFilesTest, TheListsOfASectionHaveItsLinesAndItsKeys) {
  text = "[s]\n a = 1 \n\n ; note\nb\n c=\"x\"\nd=\n[t]\n";
  EXPECT_EQ(Lines("S"), "a=1\0b\0c=\"x\"\0d=\0"s);
  EXPECT_EQ(List("S"), "a\0c\0d\0"s);
  EXPECT_EQ(Lines("t"), "");
  EXPECT_EQ(Lines("u"), "");
  // What has no name is in no list: an empty text would end it.
  text = "[]\nx=1\n[s]\na=1\n\0\n=2\nb\0c=3\nd=4\n[ \0]\n[t]\n\0"s;
  EXPECT_EQ(List(std::nullopt), "s\0t\0"s);
  EXPECT_EQ(Lines("s"), "a=1\0=2\0b\0d=4\0"s);
  EXPECT_EQ(List("s"), "a\0d\0"s);
  EXPECT_EQ(Lines("t"), "");
}

TEST_F(ProfileFilesTest, WhatDoesNotFitIsCutAndItsLengthTellsSo) {
  text = "[s]\nab=1234\nc=2\n";
  const auto value = [&](std::span<char> buffer) { return profiles.GetValue("s"sv, "ab"sv, "", buffer, kPath); };
  const auto keys = [&](std::span<char> buffer) { return profiles.GetValue("s"sv, std::nullopt, "", buffer, kPath); };
  const auto names = [&](std::span<char> buffer) {
    return profiles.GetValue(std::nullopt, "x"sv, "", buffer, kPath);
  };
  const auto lines = [&](std::span<char> buffer) { return profiles.GetSection("s", buffer, kPath); };
  struct Case {
    std::function<std::size_t(std::span<char>)> read;
    std::size_t size;
    std::size_t length;
    std::string stored;
  };
  const std::vector<Case> cases{
      {value, 5, 4, "1234\0"s},
      {value, 4, 3, "123\0"s},
      {value, 1, 0, "\0"s},
      {value, 0, 0, ""},
      {keys, 7, 5, "ab\0c\0\0"s},
      {keys, 6, 4, "ab\0c\0\0"s},
      {keys, 4, 2, "ab\0\0"s},
      {keys, 2, 0, "\0\0"s},
      {keys, 1, 0, "\0"s},
      {keys, 0, 0, ""},
      {names, 3, 1, "s\0\0"s},
      {lines, 13, 11, "ab=1234\0c=2\0\0"s},
      {lines, 12, 10, "ab=1234\0c=\0\0"s},
      {lines, 8, 6, "ab=123\0\0"s},
  };
  for (const Case& one : cases) {
    std::string buffer(one.size + 1, '#');
    EXPECT_EQ(one.read(std::span<char>(buffer.data(), one.size)), one.length) << one.size << " " << one.stored;
    EXPECT_EQ(buffer.substr(0, one.stored.size()), one.stored) << one.size;
    EXPECT_EQ(buffer.back(), '#') << "written behind the buffer of " << one.size;
  }
}

TEST_F(ProfileFilesTest, TheWideFormReadsBothKindsOfFile) {
  const auto wideValue = [&](std::size_t size) {
    wstring buffer(size, u'#');
    buffer.resize(profiles.GetValue(u"s"sv, u"key"sv, u"none", std::span<char16_t>(buffer), u"test.ini"));
    return buffer;
  };
  text = "[s]\nkey=\x80uro \xE4\n";
  EXPECT_EQ(wideValue(20), u"\u20ACuro \u00E4");
  text = Utf16(u"[s]\nkey=\u4E2D\u20AC\n");
  EXPECT_EQ(wideValue(20), u"\u4E2D\u20AC");
  EXPECT_EQ(wideValue(2), u"\u4E2D");
  EXPECT_EQ(Value("s", "key"), "?\x80");
}

TEST_F(ProfileFilesTest, WritingLeavesAllOtherLinesAsTheyWere) {
  struct Case {
    std::string before;
    std::string section;
    std::optional<std::string_view> key;
    std::optional<std::string_view> value;
    std::string after;
  };
  const std::string file = "; top\r\n\r\n[a]\r\n x = 1 ; n\r\n;x=2\r\nplain\r\n\r\n[b]\r\ny=\"2\"";
  const std::vector<Case> cases{
      {file, "A", "X", "new ", "; top\r\n\r\n[a]\r\n x = new \r\n;x=2\r\nplain\r\n\r\n[b]\r\ny=\"2\""},
      {file, "a", "z", "3", "; top\r\n\r\n[a]\r\n x = 1 ; n\r\n;x=2\r\nplain\r\nz=3\r\n\r\n[b]\r\ny=\"2\""},
      {file, "b", "z", "3", file + "\r\nz=3\r\n"},
      {file, "c", "z", " 'q' ", file + "\r\n[c]\r\nz= 'q' \r\n"},
      {file, "a", "x", std::nullopt, "; top\r\n\r\n[a]\r\n;x=2\r\nplain\r\n\r\n[b]\r\ny=\"2\""},
      {file, "a", std::nullopt, "ignored", "; top\r\n\r\n[b]\r\ny=\"2\""},
      {file, "b", "missing", std::nullopt, file},
      {file, "c", std::nullopt, std::nullopt, file},
      {"[a]\nx=1\nx=2\n[a]\nx=3\n", "a", "x", std::nullopt, "[a]\nx=2\n[a]\nx=3\n"},
      {"[a]\nKey =\n", "a", "key", "1", "[a]\nKey =1\n"},
      {"[a]\nKey=\t \nb=", "a", "key", "1", "[a]\nKey=\t 1\nb="},
      {"[a]", "a", "y", "2", "[a]\r\ny=2\r\n"},
      {"", "a", "y", "\xE4", "[a]\r\ny=\xE4\r\n"},
      {Utf16(u"[\u4E2D]\nx=\u4E2D\n[a]\n"), "a", "y", "\x80", Utf16(u"[\u4E2D]\nx=\u4E2D\n[a]\ny=\u20AC\n")},
  };
  for (const Case& one : cases) {
    text = one.before;
    EXPECT_TRUE(profiles.SetValue(one.section, one.key, one.value, kPath));
    EXPECT_EQ(text, one.after);
    // The wide form edits alike.
    const auto widen = [](std::optional<std::string_view> narrow) {
      return narrow ? std::optional<wstring>(WideFromCodePage(*narrow)) : std::nullopt;
    };
    text = one.before;
    EXPECT_TRUE(profiles.SetValue(WideFromCodePage(one.section), widen(one.key), widen(one.value), u"test.ini"));
    EXPECT_EQ(text, one.after) << "by the wide form";
  }
}

TEST_F(ProfileFilesTest, EveryByteOfANarrowFileSurvivesAWideWrite) {
  for (int byte = 1; byte < 256; ++byte) {
    text.push_back(static_cast<char>(byte));
  }
  const std::string before = text;
  EXPECT_TRUE(profiles.SetValue(u"s"sv, u"key"sv, u"\u20AC\u4E2D"sv, u"test.ini"sv));
  EXPECT_EQ(text.substr(0, before.size()), before);
  EXPECT_EQ(Value("s", "key"), "\x80?");
}

TEST_F(ProfileFilesTest, AMissingFileIsCreatedByADeletionTooAndOneThatStaysTheSameIsNotWritten) {
  EXPECT_TRUE(profiles.SetValue("s", "key", std::nullopt, "new.ini"));
  EXPECT_EQ(files.content.at("new.ini"), "");
  EXPECT_EQ(files.writes, 1);
  for (const std::string& same : {"[s]\nkey=1\n"s, "[s]\nKEY = 1"s, Utf16(u"[s]\nkey=1\n") + "!"}) {
    text = same;
    EXPECT_TRUE(profiles.SetValue("s", "key", "1", kPath));
    EXPECT_TRUE(profiles.SetValue(u"s"sv, u"other"sv, std::nullopt, u"test.ini"sv));
    EXPECT_EQ(files.writes, 1) << same;
  }
}

TEST_F(ProfileFilesTest, AFileThatCannotBeReadIsNotReplaced) {
  text = "[s]\nkey=1\n";
  files.unreadable = true;
  EXPECT_FALSE(profiles.SetValue("s", "key", "2", kPath));
  EXPECT_FALSE(profiles.SetValue(u"s"sv, u"key"sv, u"2"sv, u"test.ini"sv));
  EXPECT_EQ(text, "[s]\nkey=1\n");
}

TEST_F(ProfileFilesTest, APathThatIsNoUtf8NamesTheSameFileForReadingAndWriting) {
  const std::string path = "caf\xE9.ini";
  files.content[path] = Utf16(u"[s]\r\n");
  EXPECT_TRUE(profiles.SetValue("s", "key", "1", path));
  EXPECT_EQ(files.content.at(path), Utf16(u"[s]\r\nkey=1\r\n"));
}

// Whatever stands in the file and in the values, in either kind of file, with one edit.
TEST_F(ProfileFilesTest, ValuesThatAreSetTogetherComeOutAsOneByOne) {
  const std::string pieces[] = {"[s]", "[t]", "K0", "k1 ", "=", " = ", ";", "\r\n", "\n", "v", "\"", " ", "\0"s};
  std::uint32_t random = 1;
  const auto next = [&](std::size_t bound) {
    random = random * 1664525U + 1013904223U;
    return (random >> 16U) % bound;
  };
  const auto draw = [&](std::size_t most) {
    std::string drawn;
    for (std::size_t i = next(most + 1); i > 0; --i) {
      drawn += pieces[next(std::size(pieces))];
    }
    return drawn;
  };
  for (int run = 0; run < 3000; ++run) {
    const std::string content = draw(12);
    std::vector<ProfileEntry> entries;
    for (const char* key : {"K0", "k1", "K2", "k0 "}) {
      entries.emplace_back(run % 3 == 0 ? key + draw(2) : key, draw(3));
    }
    const std::string start = run % 2 == 0 ? content : Utf16(WideFromCodePage(content));
    files.content[kPath] = start;
    for (const auto& [key, value] : entries) {
      profiles.SetValue("s"sv, std::string_view(key), std::string_view(value), kPath);
    }
    const std::string expected = files.content[kPath];
    files.content[kPath] = start;
    files.writes = 0;
    EXPECT_TRUE(profiles.SetValues("s", entries, kPath));
    ASSERT_EQ(files.content[kPath], expected) << "run " << run << " of\n" << content;
    EXPECT_LE(files.writes, 1);
  }
}

}  // namespace
}  // namespace panelglow::platform
