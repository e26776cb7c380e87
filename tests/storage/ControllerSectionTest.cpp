// The mass-storage INI file: its lines, its work file, and what is told of a file that cannot be used.
#include <gmock/gmock.h>

#include <list>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "harness/base/CDMException.h"
#include "storage/ControllerSection.h"
#include "storage/MSUtils.h"
#include "storage/StandIn.h"

namespace panelglow::storagetest {
namespace {

using testing::AllOf;
using testing::HasSubstr;

constexpr const char* kSata = "SATA CONTROLLERS";
constexpr const char* kSas = "SAS CONTROLLERS";
constexpr const char* kNvs = "NON VOLATILE STORAGE CONTROLLERS";
constexpr const char* kWorkFile = "C:\\bench\\tmpmsctrl.ini";

// Controllers 8086:2922 of subsystem vendor 5678 and device 1234, and 1000:0072.
constexpr const char* kTwoControllers = R"(
[[controller]]
name = "sata"
id = 'PCI\VEN_8086&DEV_2922&SUBSYS_12345678&REV_02\3&11583659&0&FA'
[[controller]]
name = "sas"
kind = "scsi"
id = 'PCI\VEN_1000&DEV_0072&SUBSYS_30201000&REV_03\3&11583659&0&08'
)";

std::list<CTRL_INFO> Load(const char* section, bool sataFlag = true) {
  std::list<CTRL_INFO> records;
  MSUtils::LoadInfoForControllersInSystem(records, ".\\msctrl.ini", section, sataFlag);
  return records;
}

// "kind:name;" of each, or what was thrown: the code and the texts of an exception, or the number.
std::string Loaded(const char* section) {
  std::string text;
  try {
    for (const CTRL_INFO& record : Load(section)) {
      text += std::to_string(record.interfaceKind) + ":" + record.name + ";";
    }
  } catch (CDMException* thrown) {
    const std::unique_ptr<CDMException> failure(thrown);
    text = std::to_string(failure->code);
    for (const auto& message : failure->GetMessages()) {
      EXPECT_EQ(message->id, -1);
      text += " " + message->GetText();
    }
  } catch (int code) {
    text = "thrown " + std::to_string(code);
  }
  return text;
}

TEST(ControllerSection, TakesTheLinesWhoseControllersAreInTheMachine) {
  const std::string ids = "0x8086,0x2922,0x5678,0x1234,";
  const std::string longName(255, 'n');
  struct Case {
    std::string lines;
    std::string records;
    bool hasLibraries = false;
  };
  const Case kCases[] = {
      {ids + "csmi,one", "1:one;"},
      {ids + "ScSi,\"a, b\" ; note", "2:a, b;"},
      {"32902,10530,0x5678,0x1234,WIND,one", "3:one;"},
      {ids + "stor,one", "4:one;", true},
      {ids + "sto2,one", "5:one;", true},
      {ids + "cssc,one\n" + ids + "cswn,one", "6:one;7:one;"},
      {ids + "wmi,one", "8:one;"},
      {ids + "unheard of,one", "1:one;"},
      {ids + std::string(600, 'w') + ",one", "1:one;"},
      {ids + "scsi", "2: ;"},
      {"0x8086,0x2922,0x5678,0x1234", "1: ;"},
      {ids + "scsi," + longName + "n", "2:" + longName + ";"},
      {"0x8086,0x2922,0x1234,0x5678,scsi,the subsystem's ids the other way round", ""},
      {"1,2,3,4,scsi,another\n" + ids + "scsi,one", "2:one;"},
      {"0x8086,0x2923,0x5678,0x1234,scsi,other\n0x8086,0x2922",
       "1: ;"},                               // lacking numbers are those of the line before
      {"\"" + ids + "scsi,one\"", "2:one;"},  // the two quotes are lost on the way
      {"\"\"\n" + ids + "scsi,one", "2:one;"},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.lines);
    Machine machine((c.hasLibraries ? "libraries = [\"storelib.dll\", \"storelibIR-2.dll\"]\n" : "") +
                        std::string(kTwoControllers),
                    "; ours\n[SATA CONTROLLERS]\n; note\n\n" + c.lines + "\n[SAS CONTROLLERS]\nx\n");
    EXPECT_EQ(Loaded(kSata), c.records);
    EXPECT_EQ(machine.sim.Output(), "");
    EXPECT_EQ(machine.sim.Errors().find("work file"), std::string::npos);
  }
}

TEST(ControllerSection, CarriesItsFlagAndWarnsOfAMissingLibrary) {
  Machine machine(kTwoControllers,
                  "[SAS CONTROLLERS]\n0x1000,0x72,0x1000,0x3020,sto2,one\n4096,0x72,0x1000,0x3020,stor,two\n");
  const std::list<CTRL_INFO> records = Load(kSas, false);
  ASSERT_EQ(records.size(), 2U);
  EXPECT_EQ(records.front().interfaceKind + records.back().interfaceKind, 4);
  EXPECT_FALSE(records.front().sataFlag || records.back().sataFlag);
  EXPECT_EQ(records.front().productText, "");
  EXPECT_EQ(machine.sim.Output(),
            "LogMessage 14 20000 \"WARNING! Could not find storelibIR-2.dll, switching to scsi!\" \"\"\n"
            "LogMessage 14 20000 \"WARNING! Could not find storelib.dll, switching to scsi!\" \"\"\n");
}

TEST(ControllerSection, AsksTheManagementServiceForCards) {
  const std::string card = "[[controller]]\nkind = \"scsi\"\nname = \"";
  Machine machine(card + "a\"\nid = 'SD\\VID_15&OID_5344&PID_SD32G\\4&1'\n" + card +
                      "b\"\nid = 'SD\\VID_15&OID_5344&PID_SD32G\\4&2'\n" + card +
                      "c\"\nid = 'SD\\VID_15&OID_5344&PID_sd32g\\4&3'\n",
                  "[NON VOLATILE STORAGE CONTROLLERS]\n0x15,0x5344,SD32G,WMI,card\n0x16,0x5344,SD32G,wmi,other\n"
                  "0x15,0x5344,SD32G,scsi,by the inventory\n");
  const std::list<CTRL_INFO> records = Load(kNvs);
  EXPECT_EQ(Loaded(kNvs), "8:card;8: ;");  // the name is taken by the first
  EXPECT_EQ(records.front().productText, "SD32G");
}

TEST(ControllerSection, KeepsItsWorkFileInTheWayOfTheFirstLoadOfAProcess) {
  const std::string ini = "[SATA CONTROLLERS]\na,b\nk = \"v\"\n[SAS CONTROLLERS]\n1,2\n";
  const std::string sata = "[SATA CONTROLLERS]\r\nENTRY0=a,b\r\nENTRY1=k=\"v\"\r\n";
  const std::string sas = "[SAS CONTROLLERS]\r\nENTRY0=1,2\r\n";
  {
    Machine machine("", ini);  // the one that the first load makes is taken for an old one by the second
    Load(kSata);
    EXPECT_EQ(machine.ContentOf(kWorkFile), sata);
    Load(kSas);
    EXPECT_EQ(machine.ContentOf(kWorkFile), sas);
    Load(kSata);
    EXPECT_EQ(machine.ContentOf(kWorkFile), sas + sata);
    Load(kSas);
    EXPECT_EQ(machine.ContentOf(kWorkFile), sata + sas);
  }
  Machine machine("", ini);
  machine.Put(kWorkFile, "[SATA CONTROLLERS]\nENTRY0=of an earlier process\n[OTHER]\nENTRY9=\n");
  Load(kSata);
  EXPECT_EQ(machine.ContentOf(kWorkFile), sata);
  Load(kSas);
  EXPECT_EQ(machine.ContentOf(kWorkFile), sata + sas);
}

TEST(ControllerSection, WithoutAWorkFileGivesTheSameAndSaysSoOnce) {
  const std::string ids = "0x8086,0x2922,0x5678,0x1234,";
  const std::string ini = "[SATA CONTROLLERS]\n" + ids + "scsi,one\n\"" + ids + "scsi,one\"\n '" + ids +
                          "wind,x' \n\"\"\n" + ids + "scsi," + std::string(1100, 'x') + "\n";
  std::string expected;
  {
    Machine machine(kTwoControllers, ini);
    expected = Loaded(kSata);
    EXPECT_THAT(expected, HasSubstr("2:one;2:one;3:x;2:xxx"));
  }
  Machine machine(kTwoControllers, ini);
  machine.sim.DiskFiles().FillDisk();
  EXPECT_EQ(Loaded(kSata), expected);
  const std::string told = machine.sim.Errors();
  EXPECT_THAT(told,
              AllOf(HasSubstr("work file C:\\bench\\tmpmsctrl.ini cannot be written"), HasSubstr(".\\msctrl.ini")));
  EXPECT_EQ(Loaded(kSata), expected);
  EXPECT_EQ(machine.sim.Errors(), told);
}

TEST(ControllerSection, OfAFileThatCannotBeUsedIsRefusedByName) {
  std::string binary;
  for (int i = 0; i < 5000; ++i) {
    binary += static_cast<char>(i * 7919 >> 3);
  }
  const std::string refused = "990294 .\\msctrl.ini SATA CONTROLLERS";
  struct Case {
    std::string ini;
    std::string result;
    const char* told;
  };
  const Case kCases[] = {
      {"", refused, "missing"},
      {"\n", refused, "no lines"},
      {binary, refused, "no lines"},
      {"[SATA CONTROLLERS]\n; nothing but this\n[SAS CONTROLLERS]\nx\n", refused, "no lines"},
      {"[SATA CONTROLLERS]\n1,2,3,4,scsi,x\nentry0 = y\n", refused, "ENTRY0"},
      {"[SATA CONTROLLERS]\n" + std::string(1U << 20U, '\n') + "1,2,3,4,scsi,x\n", "", nullptr},
      {"[SATA CONTROLLERS]\n" + std::string(1U << 20U, 'x') + "\n", "thrown -1", "longer than can be read"},
      {"[SATA CONTROLLERS]\n1,2,3,4,scsi,x\n1,\"2\n", "thrown -1",
       "line 2 (comments and blank lines not counted), 1,\"2, has a quotation mark"},
      {"[SATA CONTROLLERS]\n1,2,3,4,scsi,x\n1,2,3\n", "",
       "line 2 (comments and blank lines not counted), 1,2,3, has 3 fields and needs 6"},
      {"[SATA CONTROLLERS]\n1,0x2G,3,4,scsi,x\n", "",
       "line 1 (comments and blank lines not counted), 1,0x2G,3,4,scsi,x, has \"0x2G\" where a number"},
      {"[SATA CONTROLLERS]\n1,2,3,65536,scsi,x\n", "", "\"65536\" where a number of 16 bits"},
      {"[SATA CONTROLLERS]\n1,2,3,-4,scsi,x\n", "", "\"-4\" where a number of 16 bits"},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.ini.substr(0, 80));
    Machine machine("", c.ini);
    EXPECT_EQ(Loaded(kSata), c.result);
    if (c.told == nullptr) {
      EXPECT_EQ(machine.sim.Errors(), "");
    } else {
      EXPECT_THAT(machine.sim.Errors(),
                  AllOf(HasSubstr(".\\msctrl.ini, section [SATA CONTROLLERS]"), HasSubstr(c.told)));
    }
  }
}

// How often the file is read must depend neither on its lines nor on the controllers of the machine.
class CountedProfiles : public platform::ProfileFiles {
 public:
  explicit CountedProfiles(platform::ProfileFiles& own) : own_(own) {}
  std::size_t GetValue(std::optional<std::string_view> section, std::optional<std::string_view> key,
                       std::string_view fallback, std::span<char> buffer, std::string_view path) override {
    ++calls;
    return own_.GetValue(section, key, fallback, buffer, path);
  }
  std::size_t GetValue(std::optional<std::u16string_view> section, std::optional<std::u16string_view> key,
                       std::u16string_view fallback, std::span<char16_t> buffer, std::u16string_view path) override {
    return own_.GetValue(section, key, fallback, buffer, path);
  }
  std::size_t GetSection(std::string_view section, std::span<char> buffer, std::string_view path) override {
    ++calls;
    return own_.GetSection(section, buffer, path);
  }
  bool SetValue(std::string_view section, std::optional<std::string_view> key, std::optional<std::string_view> value,
                std::string_view path) override {
    ++calls;
    return !losesWrites && own_.SetValue(section, key, value, path);
  }
  bool SetValue(std::u16string_view section, std::optional<std::u16string_view> key,
                std::optional<std::u16string_view> value, std::u16string_view path) override {
    return own_.SetValue(section, key, value, path);
  }
  bool SetValues(std::string_view section, std::span<const platform::ProfileEntry> entries,
                 std::string_view path) override {
    ++calls;
    const bool isSet = losesWrites || own_.SetValues(section, entries, path);
    platform::TheHost().clock.Sleep(slowness_ms);
    return isSet;
  }

  int calls = 0;
  std::uint32_t slowness_ms = 0;  // of writing several values
  bool losesWrites = false;

 private:
  platform::ProfileFiles& own_;
};

TEST(ControllerSection, ReadsItsFileAFixedNumberOfTimes) {
  const auto calls = [](int lines) {
    std::string ini = "[SATA CONTROLLERS]\n";
    for (int i = 0; i < lines; ++i) {
      ini += "1,2,3,4,x,y\n";
    }
    Machine machine("", ini);
    CountedProfiles profiles(machine.sim.TheMachine().profiles);
    machine.Use({.profiles = &profiles});
    Load(kSata);
    return profiles.calls;
  };
  EXPECT_EQ(calls(400), calls(3));

  // Nor on how many controllers of the machine it does not know, where it knows none.
  const auto callsOf = [](std::uint32_t unknown) {
    Machine machine("", "[SATA CONTROLLERS]\n1,2,3,4,x,y\n[SAS CONTROLLERS]\n1,2,3,5,x,y\n[" +
                            std::string(panelglow::kNvsSection) + "]\n1,2,z,x,y\n");
    CountedProfiles profiles(machine.sim.TheMachine().profiles);
    machine.Use({.profiles = &profiles});
    for (std::uint32_t device = 0; device < unknown; ++device) {
      EXPECT_EQ(MSUtils::LookupController(9, device, 9, 9, "msctrl.ini"), nullptr);
      EXPECT_EQ(MSUtils::LookupNvsController(9, device, "z", "msctrl.ini"), nullptr);
    }
    return profiles.calls;
  };
  EXPECT_EQ(callsOf(20), callsOf(1));
}

TEST(ControllerSection, IsRefusedByItsWorkFileWhenNothingIsFoundThere) {
  Machine machine("", "[SATA CONTROLLERS]\n1,2,3,4,scsi,x\n");
  CountedProfiles profiles(machine.sim.TheMachine().profiles);
  profiles.losesWrites = true;
  machine.Use({.profiles = &profiles});
  EXPECT_EQ(Loaded(kSata), "990294 C:\\bench\\tmpmsctrl.ini SATA CONTROLLERS");
}

// The work file is one for all that run in a folder, whichever file they read: the second waits for the first.
TEST(ControllerSection, TwoReadersInOneFolderTakeTurns) {
  Machine machine(kTwoControllers);
  CountedProfiles profiles(machine.sim.TheMachine().profiles);
  profiles.slowness_ms = 100;
  machine.Use({.profiles = &profiles});
  platform::Threads& threads = platform::TheHost().threads;
  const char* const kFiles[] = {".\\a.ini", ".\\b.ini"};
  std::vector<std::string> names(2);
  std::vector<platform::ThreadHandle> readers;
  for (std::size_t i = 0; i < 2; ++i) {
    machine.Put(kFiles[i], "[SATA CONTROLLERS]\n0x8086,0x2922,0x5678,0x1234,stor,name-" + std::to_string(i) + "\n");
    readers.push_back(threads.Start("reader", [&, i] {
      std::list<CTRL_INFO> records;
      bool removesOld = i == 0;
      ControllerSection(kFiles[i], kSata, true).Load(records, removesOld);
      for (const CTRL_INFO& record : records) {
        names[i] += record.name + ";";
      }
    }));
  }
  for (const platform::ThreadHandle reader : readers) {
    threads.Wait(reader, platform::Threads::kNoLimit);
  }
  EXPECT_THAT(names, testing::ElementsAre("name-0;", "name-1;"));
}

}  // namespace
}  // namespace panelglow::storagetest
