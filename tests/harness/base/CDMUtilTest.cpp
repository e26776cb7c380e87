#include "harness/base/CDMUtil.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <string>
#include <vector>

#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

using platform::sim::MachineDescription;
using platform::sim::Simulation;

TEST(CDMUtil, ReadsNumbersOfEveryFormIntoEveryType) {
  constexpr auto kIntMax = std::numeric_limits<std::int32_t>::max();
  constexpr auto kIntMin = std::numeric_limits<std::int32_t>::min();
  constexpr auto kLongMax = std::numeric_limits<std::int64_t>::max();
  constexpr auto kUnsignedMax = std::numeric_limits<std::uint32_t>::max();
  const struct {
    const char* text;
    std::int32_t asInt;
    std::uint32_t asUnsigned;
    std::int64_t asInt64;
  } kCases[] = {
      {"0", 0, 0, 0},
      {"0x1F", 31, 31, 31},
      {"0Xff", 255, 255, 255},
      {"-0x10", -16, 0xFFFFFFF0, -16},
      {"-5", -5, 0xFFFFFFFB, -5},
      {"2147483648", kIntMax, 2147483648, 2147483648},
      {"0xFFFFFFFF", kIntMax, kUnsignedMax, kUnsignedMax},
      {"-99999999999", kIntMin, kUnsignedMax, -99999999999},
      {"9223372036854775808", kIntMax, kUnsignedMax, kLongMax},
      {"0xFFFFFFFFFFFFFFFF", kIntMax, kUnsignedMax, -1},
      {"99999999999999999999999999", kIntMax, kUnsignedMax, kLongMax},
      {"", 0, 0, 0},
      {"-", 0, 0, 0},
      {"12a", 0, 0, 0},
      {" 1", 0, 0, 0},
      {"+1", 0, 0, 0},
      {"0x", 0, 0, 0},
  };
  for (const auto& c : kCases) {
    EXPECT_EQ(CDMUtil::ToInt(c.text), c.asInt) << c.text;
    EXPECT_EQ(CDMUtil::ToLong(c.text), c.asInt) << c.text;
    EXPECT_EQ(CDMUtil::ToUnsignedLong(c.text), c.asUnsigned) << c.text;
    EXPECT_EQ(CDMUtil::ToInt64(c.text), c.asInt64) << c.text;
  }
}

TEST(CDMUtil, TellsTheFormsOfNumberTextApart) {
  const struct {
    const char* text;
    const char* forms;  // d decimal, h hexadecimal, f double, b boolean
  } kCases[] = {
      {"", ""},   {"-", "d"},  {"0", "df"}, {"-12", "df"}, {"+12", "f"},   {"0x1f", "h"}, {"-0XA", "h"},
      {"0x", ""}, {"1.", ""},  {".5", "f"}, {"-.5", ""},   {"-1.5", "f"},  {"+0.5", "f"}, {"1.2.3", ""},
      {".", ""},  {"1e5", ""}, {" 1", ""},  {"TRUE", "b"}, {"false", "b"}, {"yes", ""},   {"tru", ""},
  };
  for (const auto& c : kCases) {
    std::string forms;
    forms += CDMUtil::IsDecimal(c.text) ? "d" : "";
    forms += CDMUtil::IsHexadecimal(c.text) ? "h" : "";
    forms += CDMUtil::IsDouble(c.text) ? "f" : "";
    forms += CDMUtil::IsBoolean(c.text) ? "b" : "";
    EXPECT_EQ(forms, c.forms) << c.text;
    EXPECT_EQ(CDMUtil::IsInteger(c.text), CDMUtil::IsDecimal(c.text) || CDMUtil::IsHexadecimal(c.text)) << c.text;
  }
}

TEST(CDMUtil, WritesNumbersByTheStreamDefaults) {
  EXPECT_EQ(CDMUtil::ToString(-7), "-7");
  EXPECT_EQ(CDMUtil::ToString(4294967295U), "4294967295");
  EXPECT_EQ(CDMUtil::ToString(std::numeric_limits<long long>::min()), "-9223372036854775808");
  EXPECT_EQ(CDMUtil::ToString(1234567.0), "1.23457e+06");
  EXPECT_EQ(CDMUtil::ToString(0.5), "0.5");
  EXPECT_EQ(CDMUtil::ToString(true), "true");
  EXPECT_EQ(CDMUtil::ToHexString(0x2A78), "2a78");
  EXPECT_EQ(CDMUtil::ToHexString(-1), "ffffffff");
}

TEST(CDMUtil, ChangesCaseOfAsciiLettersAndTrimsSevenKindsOfBlanks) {
  EXPECT_EQ(CDMUtil::ToUpper("az[\xE9"), "AZ[\xE9");
  EXPECT_EQ(CDMUtil::ToLower("AZ[\xC9"), "az[\xC9");
  EXPECT_TRUE(CDMUtil::ToUpper(u"a\u00E9") == u"A\u00E9");
  EXPECT_TRUE(CDMUtil::EqualIgnoreCase("aZ0", "Az0"));
  EXPECT_FALSE(CDMUtil::EqualIgnoreCase("@", "`") || CDMUtil::EqualIgnoreCase("a", "ab"));
  EXPECT_EQ(CDMUtil::Trim(" \b\f\n\r\t\va b \b\f\n\r\t\v"), "a b");
  EXPECT_EQ(CDMUtil::Trim(" \t "), "");
}

TEST(CDMUtil, ReplacesUntilNothingIsLeftToReplace) {
  const struct {
    std::string text;
    const char *from, *to;
    std::string result;
  } kCases[] = {
      {"a    b", "  ", " ", "a b"},
      {"aaabbb", "ab", "", ""},
      {"xaby", "ab", "", "xy"},
      {"aabb", "ab", "c", "acb"},
      {"a..b", ".", "..", "a....b"},
      {"abc", "", "x", "abc"},
      {"", "a", "b", ""},
      {std::string(1000, 'a'), "aa", "a", "a"},
  };
  for (const auto& c : kCases) {
    std::string text = c.text;
    CDMUtil::ReplaceAll(text, c.from, c.to);
    EXPECT_EQ(text, c.result);
  }
}

TEST(CDMUtil, SplitsWithoutEmptyPieces) {
  std::vector<std::string> pieces{"kept"};
  CDMUtil::Split(",a, b,,c ", pieces, ", ");
  EXPECT_EQ(pieces, (std::vector<std::string>{"kept", "a", "b", "c"}));
  pieces.clear();
  CDMUtil::Split("a b", pieces, "");
  EXPECT_EQ(pieces, std::vector<std::string>{"a b"});
}

TEST(CDMUtil, WidensAndNarrowsByteByByte) {
  EXPECT_TRUE(CDMUtil::ToWString("a\xE9") == u"a\u00E9");
  EXPECT_EQ(CDMUtil::ToString(std::u16string_view(u"a\u00E9")), "a\xE9");
  EXPECT_EQ(CDMUtil::ToString(std::u16string_view(u"ab\u0142c")), "ab");
  EXPECT_EQ(CDMUtil::ToString(std::u16string_view(u"a\0b", 3)), "a");
}

TEST(CDMUtil, EscapesForXml) {
  EXPECT_EQ(CDMUtil::EscapeXml("<a b='`\"&amp;'>\x92\x93\x94\x01\xE9"),
            "&lt;a b=&apos;&apos;&quot;&amp;amp;&apos;&gt;&apos;&quot;&quot;\x01\xE9");
  EXPECT_EQ(CDMUtil::EscapeXmlStrict(" \t<A&B>\x01\x80\x7F\xE9\x92 c\n "), "&lt;A&amp;B&gt;..... c");
}

TEST(CDMUtil, ReadsFilesToTheirFirstNul) {
  Simulation machine(MachineDescription{}, {});
  machine.DiskFiles().Put("a.txt", std::string("one\r\ntwo\0three", 14));
  machine.DiskFiles().Put("empty.txt", "");
  std::string text = "as it was";
  EXPECT_FALSE(CDMUtil::ReadFile("none.txt", text));
  EXPECT_EQ(text, "as it was");
  EXPECT_TRUE(CDMUtil::ReadFile(".\\a.txt", text));
  EXPECT_EQ(text, "one\r\ntwo");
  EXPECT_TRUE(CDMUtil::ReadFile("empty.txt", text));
  EXPECT_EQ(text, "");
  EXPECT_TRUE(CDMUtil::FileExists("empty.txt"));
  EXPECT_FALSE(CDMUtil::FileExists(""));
  EXPECT_EQ(CDMUtil::CurrentDirectoryPath(), "C:\\bench");
}

}  // namespace
}  // namespace panelglow
