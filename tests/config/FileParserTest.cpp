// List-shaped files: fields, sections of any length, the copy with numbered keys, and the lock on the file.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <memory>
#include <string>
#include <vector>

#include "config/OrgFileParser.h"
#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

using platform::sim::MachineDescription;
using platform::sim::Simulation;
using testing::ElementsAre;
using testing::ElementsAreArray;

class FileParserTest : public testing::Test {
 protected:
  void Put(const char* path, const std::string& content) { machine_.DiskFiles().Put(path, content); }
  std::string ContentOf(const char* path) { return machine_.TheMachine().files.Read(path).value_or("none"); }

  Simulation machine_{MachineDescription{}, {}};
};

std::vector<std::string> FieldsOf(FileParser& parser) {
  std::vector<std::string> fields;
  for (std::string field; parser.NextFieldString(field);) {
    fields.push_back(field);
  }
  return fields;
}

// What is thrown, 0 for nothing.
template <class Call>
int Thrown(Call call) {
  try {
    call();
  } catch (int code) {
    return code;
  }
  return 0;
}

TEST_F(FileParserTest, SplitsALineAtCommasOutsideOfQuotesUpToItsComment) {
  const struct {
    std::string line;
    std::vector<std::string> fields;
    const char* currentValue;
  } kCases[] = {
      {"\"a,b\",c ; note", {"a,b", "c"}, "a,b"},
      {"a,", {"a"}, "a,"},
      {"a,,b", {"a"}, "a,,b"},
      {",a", {}, ",a"},
      {"a; b,c", {"a"}, "a"},
      {"a , \t b c\t,  ,d", {"a", "b c", "", "d"}, "a , \t b c\t,  ,d"},
      {"x\" y \"z, 1", {" y ", "1"}, " y "},
      {"a\"b\"c\"d\"e", {"b\"c\"d"}, "b\"c\"d"},
      {"'a;b'", {"'a"}, "'a"},
      {"\"a;b\";c", {"a;b"}, ""},
      {"\"\",b", {"", "b"}, ""},
  };
  std::string lines;
  for (const auto& c : kCases) {
    lines += c.line + "\n";
  }
  Put("l.ini", "[s]\n" + lines + "[t]\nk=; note, more\n");
  OrgFileParser parser("l.ini");
  EXPECT_EQ(parser.ReadSection("S"), static_cast<int>(std::size(kCases)));
  for (const auto& c : kCases) {
    ASSERT_TRUE(parser.NextLine());
    EXPECT_THAT(FieldsOf(parser), ElementsAreArray(c.fields)) << c.line;
    EXPECT_EQ(parser.GetCurrentValue(), c.currentValue) << c.line;
  }
  EXPECT_FALSE(parser.NextLine());
  EXPECT_TRUE(parser.ReadValue("t", "k"));
  EXPECT_EQ(parser.GetFieldCount(), 0);
}

TEST_F(FileParserTest, AQuoteThatIsNotClosedThrowsAndLeavesNoFieldToHandOut) {
  Put("l.ini", "[s]\ngood=a,b\n1=\"a\n2=a,b\"\n3=a,\"b,c\n");
  FileParser parser("l.ini");
  for (const char* key : {"1", "2", "3"}) {
    ASSERT_TRUE(parser.ReadValue("s", "good"));
    EXPECT_EQ(Thrown([&] { parser.ReadValue("s", key); }), -1) << key;
  }
  EXPECT_EQ(parser.GetFieldCount(), 1);  // of "3": what stood before the bad one
  EXPECT_THAT(FieldsOf(parser), ElementsAre("a"));
  EXPECT_FALSE(parser.ReadValue("s", "none"));
}

TEST_F(FileParserTest, HandsFieldsOutInTurnAsNumbersAndTexts) {
  Put("l.ini", "[s]\nk=0x1F,12,-1,99999999999,-99999999999,x,long text,last\n");
  FileParser parser("l.ini");
  ASSERT_TRUE(parser.ReadValue("s", "k"));
  EXPECT_EQ(parser.GetFieldCount(), 8);
  EXPECT_EQ(parser.GetField(5), "x");
  std::vector<unsigned> numbers(6);
  for (std::size_t i = 0; i < numbers.size(); ++i) {
    EXPECT_TRUE(parser.NextFieldNumber(numbers[i], i == 1 ? 8 : 0));
  }
  EXPECT_THAT(numbers, ElementsAre(31U, 10U, 0xFFFFFFFFU, 0xFFFFFFFFU, 0xFFFFFFFFU, 0U));
  std::array<char, 5> text{};
  EXPECT_TRUE(parser.NextFieldText(text));
  EXPECT_STREQ(text.data(), "long");
  std::string last;
  EXPECT_TRUE(parser.NextFieldString(last));
  EXPECT_EQ(last, "last");
  EXPECT_FALSE(parser.NextFieldNumber(numbers[0], 0) || parser.NextFieldText(text) || parser.NextFieldString(last));
  EXPECT_EQ(numbers[0], 31U);
  EXPECT_EQ(last + text.data(), "lastlong");
}

TEST_F(FileParserTest, CountsSectionsAndKeysOnceAndFindsNamesWithoutCase) {
  Put("l.ini", "[One]\na=1\nno key\nb=\n[two]\n[Three]\n=x\n");
  FileParser parser("l.ini");
  EXPECT_TRUE(parser.HasSection("ONE") && parser.HasSection("Two"));
  EXPECT_FALSE(parser.HasSection("four") || parser.HasSection(""));
  EXPECT_EQ(parser.CountSections(), 3);
  EXPECT_EQ(parser.CountKeys("one"), 2);
  EXPECT_EQ(parser.CountKeys("one"), 2);
  for (const char* section : {"two", "four"}) {
    EXPECT_EQ(Thrown([&] { parser.CountKeys(section); }), -1) << section;
  }
  machine_.DiskFiles().Hide("l.ini");
  EXPECT_EQ(parser.CountSections(), 3);  // known from the first look
  EXPECT_EQ(FileParser("none.ini").CountSections(), 0);
}

TEST_F(FileParserTest, ListsGrowThroughAllBufferSizesAndBeyondTheLargestAreRefused) {
  // A list of 10238 bytes fills a buffer of the first size exactly, and reads like a cut one.
  for (const int bytes : {10237, 10238, 10239, 20478, 317437}) {
    Put("l.ini", "[s]\n" + std::string(static_cast<std::size_t>(bytes - 1), 'x') + "\n[t]\nk=v\n");
    OrgFileParser parser("l.ini");
    EXPECT_EQ(parser.ReadSection("s"), 1);
    EXPECT_EQ(static_cast<int>(parser.GetLines()[0].size()), bytes - 1);
  }
  Put("l.ini", "[s]\n" + std::string(317437, 'x'));
  OrgFileParser tooLong("l.ini");
  EXPECT_EQ(Thrown([&] { tooLong.ReadSection("s"); }), -1);
  std::string sections;
  std::string keys;
  for (int i = 0; i < 3000; ++i) {
    sections += "[section " + std::to_string(i) + "]\n";
    keys += "key" + std::to_string(i) + "=\n";
  }
  Put("l.ini", sections + keys);
  FileParser parser("l.ini");
  EXPECT_EQ(parser.CountSections(), 3000);
  EXPECT_EQ(parser.CountKeys("section 2999"), 3000);
}

TEST_F(FileParserTest, CopiesLinesUnderNumberedKeys) {
  Put("l.ini", "[a]\nplain, line\nk = \"v\"\n; note\n[b]\nthird\n");
  Put("t.ini", "[a]\nENTRY7=old\nENTRY9=older\n[c]\nk=kept\n");
  OrgFileParser parser("l.ini");
  parser.SetTargetPath("t.ini");
  EXPECT_EQ(parser.ConvertToIni("a", "ENTRY", false, 7), 2);
  EXPECT_EQ(ContentOf("t.ini"), "[a]\nENTRY7=plain, line\nENTRY9=older\nENTRY8=k=\"v\"\n[c]\nk=kept\n");
  EXPECT_EQ(parser.ConvertToIni("a", "E", true, 1), 2);
  EXPECT_EQ(ContentOf("t.ini"), "[c]\nk=kept\n[a]\nE1=plain, line\nE2=k=\"v\"\n");
  EXPECT_EQ(parser.ConvertToIni("none", "E", true, 1), 0);
  parser.SetPrefix("N");
  EXPECT_EQ(parser.ReadSection("a"), 2);
  parser.AppendLines("all");
  EXPECT_EQ(parser.ReadSection("b"), 2);  // the lines that are there, until they are forgotten
  parser.Reset();
  EXPECT_EQ(parser.ReadSection("b"), 1);
  parser.AppendLines("all");
  FileParser copy("t.ini");
  EXPECT_TRUE(copy.ReadValue("all", "N0"));
  EXPECT_EQ(copy.GetCurrentValue(), "plain, line");
  EXPECT_TRUE(copy.ReadValue("all", "N2"));
  EXPECT_EQ(copy.GetCurrentValue(), "third");
  copy.SetTargetPath("t.ini");
  EXPECT_TRUE(copy.WriteBuffer("c", "k") && copy.EraseSection("all") && copy.EraseSection("a"));
  EXPECT_EQ(ContentOf("t.ini"), "[c]\nk=third\n");
}

TEST_F(FileParserTest, ACopyThatCannotBeMadeThrowsAndSaysSo) {
  Put("l.ini", "[s]\n" + std::string(4093, 'x') + "\n[fits]\n" + std::string(4092, 'x') + "\n");
  OrgFileParser parser("l.ini");
  parser.SetTargetPath("t.ini");
  EXPECT_EQ(parser.ConvertToIni("fits", "E", true, 1), 1);
  EXPECT_EQ(Thrown([&] { parser.ConvertToIni("s", "E", false, 1); }), -1);
  machine_.DiskFiles().FillDisk();
  EXPECT_EQ(Thrown([&] { parser.ConvertToIni("fits", "E", false, 2); }), -3);
  EXPECT_EQ(machine_.Errors(), "ConvertToIni Failed: -1\nConvertToIni Failed: -3\n");
  parser.ReadSection("fits");
  EXPECT_EQ(Thrown([&] { parser.AppendLines("all"); }), -1);
}

// ---- the lock

constexpr const char* kMutex = "C__bench_l_ini_HalcyonFileParser";

TEST_F(FileParserTest, AFileIsLockedForAllButTheThreadThatHoldsItWhateverItsSpelling) {
  platform::Threads& threads = machine_.TheMachine().threads;
  platform::Clock& clock = machine_.TheMachine().clock;
  std::string order;
  auto first = std::make_unique<FileParser>(".\\l.ini");
  EXPECT_TRUE(machine_.IsMutexOwned(kMutex));
  const platform::ThreadHandle thread = threads.Start("peer", [&] {
    const FileParser other("other.ini");
    order += "other ";
    const FileParser same("l.ini");
    order += "same ";
  });
  clock.Sleep(1000);
  auto second = std::make_unique<FileParser>("l.ini");
  first.reset();
  clock.Sleep(1000);
  order += "released ";
  second.reset();
  threads.Wait(thread, platform::Threads::kNoLimit);
  EXPECT_EQ(order, "other released same ");
  EXPECT_FALSE(machine_.IsMutexOwned(kMutex));
}

TEST(FileParser, WaitsForAnotherProcessThatHoldsTheFile) {
  MachineDescription description;
  description.peers.push_back({kMutex, 0, 5'000'000});
  Simulation machine(std::move(description), {});
  machine.TheMachine().clock.Sleep(1);
  const FileParser parser("l.ini");
  EXPECT_GE(machine.TheMachine().clock.TickCount(), 5000U);
}

}  // namespace
}  // namespace panelglow
