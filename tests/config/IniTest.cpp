#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <random>
#include <string>

#include "config/IniBase.h"
#include "config/IniFile.h"
#include "config/WIniFile.h"
#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

using platform::sim::MachineDescription;
using platform::sim::Simulation;

class Ini : public testing::Test {
 protected:
  void TearDown() override { IniBase::SetComment(";"); }

  Simulation machine_{MachineDescription{}, {}};
};

// ---- IniFile and WIniFile

TEST_F(Ini, FallsBackToTheEnglishSectionOnlyWhenSectionAndDefaultGiveNothing) {
  machine_.DiskFiles().Put("m.msg", "[de_DE]\n1=eins\nempty=\n[en_US]\n1=one\n2=two\nempty=full\n");
  const struct {
    const char *section, *key, *fallback, *value;
  } kCases[] = {
      {"de_DE", "1", "", "eins"},     {"DE_de", "1", "", "eins"},      {"de_DE", "2", "", "two"},
      {"de_DE", "2", "zwei", "zwei"}, {"de_DE", "3", "", ""},          {"fr_FR", "1", "", "one"},
      {"de_DE", "empty", "", "full"}, {"de_DE", "empty", "x", "full"}, {"fr_FR", "3", "trois", "trois"},
  };
  const IniFile file("m.msg");
  for (const auto& c : kCases) {
    EXPECT_EQ(file.GetValue(c.section, c.key, c.fallback), c.value) << c.section << ' ' << c.key << ' ' << c.fallback;
  }
  const WIniFile wide(u"m.msg");
  EXPECT_TRUE(wide.GetValue(u"de_DE", u"1") == u"eins");
  EXPECT_TRUE(wide.GetValue(u"de_DE", u"2") == u"two");
  EXPECT_TRUE(wide.GetValue(u"de_DE", u"3").empty());
}

TEST_F(Ini, ReadsNothingFromAMissingFileNotEvenTheDefault) {
  const IniFile file("none.ini");
  EXPECT_FALSE(file.Exists());
  EXPECT_EQ(file.GetValue("s", "k", "default"), "");
  EXPECT_TRUE(WIniFile(u"none.ini").GetValue(u"s", u"k").empty());
  EXPECT_EQ(IniFile().GetValue("s", "k", "default"), "");
}

TEST_F(Ini, CutsAValueAt254Characters) {
  machine_.DiskFiles().Put("l.ini",
                           "[s]\nfits=" + std::string(254, 'a') + "\nlong=" + std::string(1 << 20, 'b') + "\n");
  EXPECT_EQ(IniFile("l.ini").GetValue("s", "fits"), std::string(254, 'a'));
  EXPECT_EQ(IniFile("l.ini").GetValue("s", "long"), std::string(254, 'b'));
  EXPECT_TRUE(WIniFile(u"l.ini").GetValue(u"s", u"long") == wstring(254, u'b'));
}

TEST_F(Ini, GivesTheLinesOfASectionUpToItsBuffer) {
  machine_.DiskFiles().Put("s.ini", "[a]\nk = v\n; note\nplain\n\n[b]\n" + std::string(9000, 'x'));
  IniFile file("s.ini");
  EXPECT_EQ(file.GetSection("A", "default"), "k=v\nplain\n");
  EXPECT_EQ(file.GetSection("c", "default"), "default");
  EXPECT_EQ(file.GetSection("b", "").size(), 0x2004U - 2);
}

TEST_F(Ini, ExistsAfterASectionReadOrAWrite) {
  IniFile file("new.ini");
  IniFile other("new.ini");
  EXPECT_TRUE(file.SetValue("s", "k", "v"));
  EXPECT_TRUE(file.Exists());
  EXPECT_EQ(file.GetValue("s", "k"), "v");
  EXPECT_FALSE(other.Exists());
  EXPECT_EQ(other.GetSection("s", ""), "k=v\n");
  EXPECT_TRUE(other.Exists());
  WIniFile wide(u"wide.ini");
  EXPECT_TRUE(wide.SetValue(u"s", u"k", u"v"));
  EXPECT_TRUE(wide.Exists());
  machine_.DiskFiles().FillDisk();
  IniFile refused("full.ini");
  EXPECT_FALSE(refused.SetValue("s", "k", "v"));
  EXPECT_FALSE(refused.Exists());
}

// ---- IniBase

std::string TextOf(std::string_view text) {
  IniBase ini;
  ini.Parse(text);
  return ini.ToText();
}

TEST_F(Ini, ParsesAWholeFileByItsOwnRules) {
  const std::pair<std::string_view, const char*> kCases[] = {
      {"k=v\n[s]\nk=v", "[s]\nk = v\n"},
      {"[ s ] rest\r\n\t k\v=\f v \r\n", "[s]\nk = v\n"},
      {"[s]\nk=a=b\n=x\nplain\n = y", "[s]\nk = a=b\n"},
      {"[s]\nk=v ; note\n;k=w\n[t;]\nk=x", "[s]\nk = x\n"},
      {"[s]\nk=v\n[x\nl=w\n[]\nm=1", "[s]\nk = v\nl = w\nm = 1\n"},
      {"[s]\n[]=x\nk=v", "[s]\nk = v\n"},
      {"[s]\nk=\n", "[s]\nk = \n"},
      {"[ ]\nk=v", "[]\nk = v\n"},
      {"[s]\nk=1\nK=2\nk=3\n[S]\nk=4", "[S]\nk = 4\n[s]\nK = 2\nk = 3\n"},
      {"[s]\na=1\n[s]\nb=2\n", "[s]\nb = 2\n"},
      {"", ""},
      {"\n \n\xEF\xBB\xBF[s]\nk=v", ""},
  };
  for (const auto& [text, kept] : kCases) {
    EXPECT_EQ(TextOf(text), kept) << text;
  }
}

TEST_F(Ini, TakesAnyCommentMarkerOrNone) {
  IniBase::SetComment("//");
  EXPECT_EQ(TextOf("[s]\nk=a;b//c\n"), "[s]\nk = a;b\n");
  IniBase::SetComment("");
  EXPECT_EQ(TextOf("[s]\nk=a;b//c\n"), "[s]\nk = a;b//c\n");
}

TEST_F(Ini, LooksUpWithCaseAndNeverCreates) {
  machine_.DiskFiles().Put("d.ini", "[Colors]\nBack=12\n");
  IniBase ini("d.ini");
  ASSERT_NE(ini.GetSection("Colors"), nullptr);
  EXPECT_EQ(ini.GetSection("Colors")->GetRecord("Back")->GetValue(), "12");
  EXPECT_EQ(ini.GetSection("Colors")->GetRecord("back"), nullptr);
  EXPECT_EQ(ini.GetSection("colors"), nullptr);
  EXPECT_EQ(ini.ToText(), "[Colors]\nBack = 12\n");
  EXPECT_EQ(IniBase("none.ini").ToText(), "");
}

TEST_F(Ini, FillsASectionThatReplacedTheCurrentOne) {
  IniBase ini;
  ini.Parse("[s]\na=1\n");
  ini.AddSection(std::make_unique<Section>("s"));
  ini.Parse("b=2\n");
  EXPECT_EQ(ini.ToText(), "[s]\nb = 2\n");
}

TEST_F(Ini, ReadsAgainWhatItWrote) {
  std::mt19937 random(3);
  const auto word = [&](std::string_view alphabet) {
    std::string text(1, alphabet.front());
    for (std::size_t k = random() % 12; k > 0; --k) {
      text += alphabet[random() % alphabet.size()];
    }
    return text + alphabet.front();
  };
  IniBase ini;
  for (int i = 0; i < 50; ++i) {
    auto section = std::make_unique<Section>(word("sT [.\xE9"));
    for (std::size_t k = random() % 5; k > 0; --k) {
      section->AddRecord(std::make_unique<Record>(word("kK ]\t-"), word("v=[] \xFF")));
    }
    ini.AddSection(std::move(section));
  }
  ASSERT_TRUE(ini.Save("r.ini"));
  EXPECT_EQ(IniBase("r.ini").ToText(), ini.ToText());
}

TEST_F(Ini, ReadsLinesOfAMegabyteAndAMillionLines) {
  const std::string longLine = "[s]\n" + std::string(1 << 20, ' ') + "k" + std::string(1 << 20, '=') + "\n";
  EXPECT_EQ(TextOf(longLine).size(), std::string("[s]\nk = \n").size() + (1U << 20U) - 1);
  std::string many = "[s]\n";
  for (int i = 0; i < 1'000'000; ++i) {
    many += "k=v\n";
  }
  EXPECT_EQ(TextOf(many), "[s]\nk = v\n");
}

}  // namespace
}  // namespace panelglow
