// Which of a board's files and sections answers a look-up, and how its text is read.
#include "board/base/IniReader.h"
#include "board/chips/ec/SmscMec1322Chip.h"

#include <gtest/gtest.h>

#include <climits>
#include <functional>

#include "board/BoardBench.h"
#include "board/base/mblib_exception.h"
#include "board/parts/Sequence.h"
#include "harness/base/Notices.h"

namespace panelglow {
namespace {

constexpr const char* kFiles[] = {".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini"};

IniReader Reader() { return IniReader("7D10", kFiles[0], kFiles[1], kFiles[2]); }

// Status and text of a look-up, with "dflt" as default.
std::string Read(IniReader& reader, const std::string& key, const char* chipSection = nullptr) {
  IniReader::status_t status = IniReader::kNotFound;
  const std::string text = chipSection == nullptr ? reader.ReadIniValue(key, status, "dflt")
                                                  : reader.ReadChipValue(chipSection, key, status, "dflt");
  return std::to_string(status) + " " + text;
}

TEST(IniReader, FilesComeBeforeSectionsAndUndefHidesWhatIsBehind) {
  BoardBench bench;
  bench.SetFiles("[7D10]\na=detect\nb=detect\nc=detect\ne=detect ; note\nf=;\nU=UNDEF\n[common]\nd=common\ng=x\n",
                 "[Common]\nb=test common\n[7d10]\na=undef\nc=\ng=\nh=undef ;\n[7D11]\nd=other\n[en_US]\ni=any\n",
                 "");
  IniReader reader = Reader();
  const std::pair<const char*, const char*> kCases[] = {
      {"a", "1 "},      {"b", "2 test common"}, {"c", "2 detect"}, {"d", "2 common"}, {"E", "2 detect "}, {"f", "2 "},
      {"u", "2 UNDEF"}, {"g", "2 x"},           {"h", "2 undef "}, {"i", "2 any"},    {"none", "0 dflt"},
  };
  for (const auto& [key, text] : kCases) {
    EXPECT_EQ(Read(reader, key), text) << key;
  }
  bench.SetFiles("[7D10]\nA=edited\n", "", "");
  EXPECT_EQ(Read(reader, "a"), "2 edited");
}

TEST(IniReader, AChipsSettingComesFromTheBoardThenFromItsSectionAndItsBases) {
  BoardBench bench;
  bench.SetFiles("[7D10]\nchip.g_sio.a=board\nchip.g_sio.b=undef\n", "",
                 "[g_sio]\na=chip\nb=chip\nbase=Middle\n[middle]\nc=middle;\nd=undef\nbase=g_root\n"
                 "[g_root]\nc=root\nd=root\ne=root\nbase=MIDDLE\n[self]\nbase=self\n[cut]\nbase=g_root;\n");
  IniReader reader = Reader();
  const std::tuple<const char*, const char*, const char*> kCases[] = {
      {"g_sio", "a", "2 board"}, {"g_sio", "b", "1 "},     {"G_SIO", "c", "2 middle"},
      {"g_sio", "d", "1 "},      {"g_sio", "e", "2 root"}, {"g_sio", "f", "0 dflt"},
      {"self", "a", "0 dflt"},   {"none", "a", "0 dflt"},  {"cut", "e", "0 dflt"},
  };
  for (const auto& [section, key, text] : kCases) {
    EXPECT_EQ(Read(reader, key, section), text) << section << " " << key;
  }
  bench.machine.DiskFiles().Hide(kFiles[2]);
  EXPECT_EQ(Read(reader, "e", "g_sio"), "0 dflt");
}

TEST(IniReader, NumbersAreDecimalOrPrefixedAndEveryReadIsRecorded) {
  BoardBench bench;
  bench.SetFiles("[7D10]\na= \v0x2E\b \nb=2E\nc=46 ; note\nd=undef\ne=0xFED80100\nf=-1\ng=\"0x10\"\nh=text\n", "",
                 "");
  IniReader reader = Reader();
  IniReader::status_t status = IniReader::kNotFound;
  const std::pair<const char*, int> kInts[] = {{"a", 46},         {"b", 0},  {"c", 46}, {"d", 0},
                                               {"e", 0x7FFFFFFF}, {"f", -1}, {"g", 16}, {"none", 255}};
  for (const auto& [key, value] : kInts) {
    EXPECT_EQ(reader.ReadIniInt(key, status, 255), value) << key;
  }
  EXPECT_EQ(reader.ReadIniUnsigned("e", status, 1), 0xFED80100U);
  EXPECT_EQ(status, IniReader::kFound);
  EXPECT_EQ(reader.ReadIniUnsigned("none2", status, 0xFFFFFFFF), 0xFFFFFFFFU);
  EXPECT_EQ(status, IniReader::kNotFound);
  EXPECT_EQ(reader.ReadChipInt("7D10", "none", status, 10), 10);
  EXPECT_EQ(Read(reader, "h") + Read(reader, "i"), "2 text0 dflt");
  reader.DumpLookups();
  EXPECT_EQ(bench.machine.Output(),
            "motherboard.lib input data (chip.ini:1):\n7D10 a = 2e\n7D10 b = 0\n7D10 c = 2e\n7D10 d = (undef)\n"
            "7D10 e = fed80100\n7D10 f = ffffffff\n7D10 g = 10\n7D10 h = text\n7D10 i = dflt (dflt)\n"
            "7D10 none = a (dflt)\n7D10 none2 = ffffffff (dflt)\n");
}

TEST(IniReader, AnAddressOfZeroIsNone) {
  BoardBench bench;
  bench.SetFiles("[7D10]\na=0\nb=1\nc=undef\n", "", "");
  IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
  for (const auto& [key, value] : {std::pair("a", 7U), {"b", 1U}, {"c", 7U}, {"none", 7U}}) {
    EXPECT_EQ(ReadIniWordUnlessZero(key, 7), value) << key;
    EXPECT_EQ(ReadIniUnsignedUnlessZero(key, 7), value) << key;
  }
}

TEST(IniReader, WhatIsNoNumberOrDoesNotFitIsToldWithItsPlace) {
  BoardBench bench;
  bench.SetFiles(
      "[7D10]\na=OxF9\nb=0xFFFFFFFF\nc=-1\nchip.g_ec.d=F8h\ngood=0x20\nempty=undef\nl=-2\n"
      "test.panelglow.waittime=-1\n",
      "",
      "[g_ec]\ne=0x1F9\nf=255\ng=-128\nh=0x10000\ni=0xFFFF\nj=0xF9 x\nk=-2147483649\nm=-0x3\n"
      "list=B40:1.300,0x10:-1,-0x10:undef\n[parts]\nbase=g_ce\n");
  IniReader& reader = IniReader::Instance("7D10", kFiles[0], kFiles[1], kFiles[2]);
  const std::string detect = ".\\mbdetect.ini, section [7D10], key ";
  const std::string chip = ".\\chip.ini, section [g_ec], key ";
  const std::string none = " is no number and counts as 0; numbers are decimal, or hexadecimal behind 0x";
  IniReader::status_t status = IniReader::kNotFound;
  Sequence sequence;
  const std::pair<std::function<void()>, std::string> kReads[] = {
      {[&] { reader.ReadIniInt("good", status, 0); }, ""},
      {[&] { reader.ReadIniInt("empty", status, 0); }, ""},
      {[&] { reader.ReadIniInt("none", status, 0); }, ""},
      {[&] { EXPECT_EQ(ReadIniInt("a", 5), 0); }, detect + "\"a\": \"OxF9\"" + none},
      {[&] { reader.ReadIniUnsigned("b", status, 0); }, ""},
      {[&] { EXPECT_EQ(ReadIniInt("b", 0), 0x7FFFFFFF); },
       detect + "\"b\": \"0xFFFFFFFF\" does not fit into 31 bits and counts as 0x7FFFFFFF"},
      {[&] { EXPECT_EQ(ReadIniInt("c", 0), -1); }, ""},
      {[&] { EXPECT_EQ(ReadChipByte("g_ec", "d", 1), 0); }, detect + "\"chip.g_ec.d\": \"F8h\"" + none},
      {[&] { EXPECT_EQ(ReadChipByte("g_ec", "e", 1), 0xF9); },
       chip + "\"e\": \"0x1F9\" does not fit into 8 bits and counts as 0xF9"},
      {[&] { EXPECT_EQ(ReadChipByte("g_ec", "f", 1), 255); }, ""},
      // A sign is for an int alone.
      {[&] { EXPECT_EQ(ReadChipInt("g_ec", "g", 1), -128); }, ""},
      {[&] { EXPECT_EQ(reader.ReadChipInt("g_ec", "k", status, 1), INT_MIN); },
       chip + "\"k\": \"-2147483649\" does not fit into 31 bits and counts as 0x80000000"},
      {[&] { EXPECT_EQ(ReadChipByte("g_ec", "g", 1), 128); },
       chip + "\"g\": \"-128\" does not fit into 8 bits and counts as 0x80"},
      {[&] { EXPECT_EQ(ReadIniWord("c", 1), 0xFFFF); },
       detect + "\"c\": \"-1\" does not fit into 16 bits and counts as 0xFFFF"},
      {[&] { EXPECT_EQ(reader.ReadIniUnsigned("l", status, 1), 0xFFFFFFFE); },
       detect + "\"l\": \"-2\" does not fit into 32 bits and counts as 0xFFFFFFFE"},
      {[&] { EXPECT_EQ(ReadChipDword("g_ec", "m", 1), 0xFFFFFFFD); },
       chip + "\"m\": \"-0x3\" does not fit into 32 bits and counts as 0xFFFFFFFD"},
      {[&] { EXPECT_EQ(ReadChipWord("g_ec", "h", 1), 0); },
       chip + "\"h\": \"0x10000\" does not fit into 16 bits and counts as 0x0"},
      {[&] { EXPECT_EQ(ReadChipWord("g_ec", "i", 1), 0xFFFF); }, ""},
      {[&] { ParseByteList(ReadChipSetting("g_ec", "j", "")); }, chip + "\"j\": \"x\"" + none},
      {[&] { ParseByteList("x"); }, ""},  // of no file
      {[&] { ParseSequence(ReadChipSetting("g_ec", "list", ""), sequence, 16); },
       chip + "\"list\": \"B40\"" + none + ".\npanelglow-diags: " + chip +
           "\"list\": \"300\" does not fit into 8 bits and counts as 0x2C.\npanelglow-diags: " + chip +
           "\"list\": \"-1\" does not fit into 8 bits and counts as 0xFF.\npanelglow-diags: " + chip +
           "\"list\": \"-0x10\" does not fit into 16 bits and counts as 0xFFF0"},
      {[&] { EXPECT_THROW(ParsePairs<std::uint8_t>(ReadChipSetting("g_ec", "i", "")), mblib_exception); },
       chip + "\"i\": malformed sequence entry: '0xFFFF'. should be: 'cmd:data[.data]*,...'"},
      {[] { const SmscMec1322Chip part; },
       "\"test.panelglow.waittime\" is -1 and counts as 0: it is the wait of each step in ms, 0 to 10000"},
      {[&] { ReadChipByte("parts", "x", 1); },
       ".\\chip.ini, section [parts], key \"base\": there is no section [g_ce]"},
  };
  for (const auto& [read, told] : kReads) {
    bench.machine.ClearOutput();
    read();
    EXPECT_EQ(bench.machine.Errors(), told.empty() ? "" : "panelglow-diags: " + told + ".\n");
  }
}

TEST(IniReader, WhichFilesThereAreIsKnownFromTheStartAndTheChipFileStaysTheFirst) {
  BoardBench bench;
  bench.machine.DiskFiles().Hide(kFiles[1]);
  bench.machine.DiskFiles().Put(".\\other.ini", "[7D10]\na=other\n");
  IniReader late = Reader();
  bench.SetFiles("", "[7D10]\na=too late\n", "");
  EXPECT_EQ(Read(late, "a"), "0 dflt");
  EXPECT_FALSE(IniReader("7D10", "", "", "").IsChipIniPresent());

  IniReader& shared = IniReader::Instance("7D10", kFiles[0], kFiles[1], kFiles[2]);
  bench.SetFiles("", "", "[7D10]\na=first\n");
  EXPECT_EQ(Read(shared, "a", "7D10"), "2 first");
  IniReader::Instance("7D11", ".\\other.ini", "", ".\\other.ini");
  EXPECT_EQ(Read(shared, "a", "7D10"), "2 first");
  EXPECT_EQ(Read(shared, "a"), "0 dflt");
  IniReader::Instance("7D10", ".\\other.ini", "", ".\\other.ini");
  EXPECT_EQ(Read(shared, "a"), "2 other");
}

}  // namespace
}  // namespace panelglow
