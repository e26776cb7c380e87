// Detected devices, hood and buttons: which are there by the files, and how each is asked.
#include "board/sets/DeviceDetection.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "board/SetBench.h"
#include "board/sets/HoodLock.h"
#include "board/sets/HoodSwitch.h"
#include "board/sets/TestButtons.h"

namespace panelglow {
namespace {

using ::testing::HasSubstr;

TEST(DeviceDetection, EachKindIsLookedForByItsKeys) {
  struct Case {
    DeviceKind kind;
    const char* keys;  // "@" stands for "detect."
    const char* found;
  };
  constexpr const char* kFailed = "N=ERROR: device detection failed ";
  const Case kCases[] = {
      {DeviceKind::kJumpers, "@jumper.1.name=N\n@jumper.1.chip=a\n@jumper.1.gpio=1\n", "N=true "},
      {DeviceKind::kJumpers, "@jumpers=no\n@jumper.1.name=N\n", ""},
      {DeviceKind::kJumpers, "@jumper.1.name=N\n@jumper.1.chip=a\n@jumper.1.gpio=0x2\n", "N=false "},
      {DeviceKind::kJumpers,
       "@jumper.1.name=N\n@jumper.1.chip=a\n@jumper.1.gpio.offset=8\n@jumper.1.gpio.bit=3\n"
       "@jumper.1.gpio.clearbit=4\n@jumper.1.gpio=2\n",
       "N=true "},
      {DeviceKind::kJumpers, "@jumper.1.name=N\n@jumper.1.chip=a\n@jumper.1.gpio.offset=8\n",
       "N=ERROR: no detection performed "},
      {DeviceKind::kSecurityDevices, "@security.1.name=N\n@security.1.chip=a\n@security.1.gpio.bit=8\n",
       "N=ERROR: no detection performed "},
      {DeviceKind::kFrontPanel,
       "@frontpanel.1.name=N\n@frontpanel.1.chip=a\n@frontpanel.1.gpio=1\n@frontpanel.1.reversedlogic=yes\n"
       "@frontpanel.2.name=M\n@frontpanel.2=no\n@frontpanel.3.name=O\n@frontpanel.3.chip=a\n@frontpanel.3.gpio=2\n"
       "@frontpanel.3.reversedlogic=yes\n@frontpanel.5.name=P\n",
       "N=false O=true "},
      {DeviceKind::kFrontPanel, "@frontpanel.1.name=N\n@frontpanel.1.chip=a\n@frontpanel.1.gpio.offset=8\n", kFailed},
      {DeviceKind::kCables, "@cable.1.name=N\n@cable.1.chip=a\n@cable.1.gpio=7\n@cable.1.reversedlogic=yes\n",
       kFailed},
      {DeviceKind::kCables, "@cable.1.name=N\n@cable.1.chip=unknown\n@cable.1.gpio=1\n", "N=false "},
      {DeviceKind::kCables, "@cable.1.name=N\n@cable.1.chip=a\n@cable.1.gpio=caseopen\n", "N=true "},
      {DeviceKind::kPoweredDevices,
       "@powereddevice.1.name=N\n@powereddevice.1.chip=a\n@powereddevice.1.gpio=intruder\n", "N=true "},
      {DeviceKind::kPowerSupply, "", ""},
      {DeviceKind::kPowerSupply, "@powersupply.chip=a\n@powersupply.gpio=1\n", "PowerSupplyID=true "},
      {DeviceKind::kPowerSupply, "@powersupply=no\n@powersupply.chip=a\n@powersupply.gpio=1\n", ""},
      {DeviceKind::kHeatsink, "@heatsink.cpufanname=N\n@heatsink.chip=a\n@heatsink.gpio=20\n", "N=liquid "},
      {DeviceKind::kHeatsink, "@heatsink.cpufanname=N\n@heatsink.chip=a\n@heatsink.gpio=21\n", "N=low "},
      {DeviceKind::kHeatsink, "@heatsink.cpufanname=N\n@heatsink.chip=a\n@heatsink.gpio=22\n", "N=high "},
      {DeviceKind::kHeatsink, "@heatsink.cpufanname=N\n@heatsink.chip=a\n@heatsink.gpio=7\n", kFailed},
      {DeviceKind::kDashCable, "@dashcable.name=N\n@dashcable.chip=a\n@dashcable.gpio=5\n@dashcable.pciid=1 2 3 4\n",
       "N=true "},
      {DeviceKind::kDashCable, "@dashcable.name=N\n@dashcable.chip=a\n@dashcable.gpio=6\n", "N=false "},
      {DeviceKind::kDashCable,
       "@dashcable.name=N\n@dashcable.chip=a\n@dashcable.gpio=7\n@dashcable.reversedlogic=yes\n", kFailed},
      {DeviceKind::kRiser, "@riser.name=N\n@riser.chip=a\n@riser.reg=4\n", kFailed},
      {DeviceKind::kRiser, "@riser.name=N\n@riser.chip=unknown\n@riser.reg=4\n@riser.reg.value=0\n", kFailed},
      {DeviceKind::kRiser, "@riser.name=N\n@riser.chip=a\n@riser.reg=3\n@riser.reg.value=0x42\n", "N=true "},
      {DeviceKind::kRiser, "@riser.name=N\n@riser.chip=a\n@riser.reg=4\n@riser.reg.value=0x42\n", "N=false "},
      {DeviceKind::kInternalSpeaker, "@internalspeaker.is_present=yes\n", "internal speaker=unknown "},
      {DeviceKind::kInternalSpeaker, "@internalspeaker.is_present=no\n", ""},
      {DeviceKind::kTouchScreen, "@touchscreen.is_present=yes\n", "Touch Screen=unknown "},
      {DeviceKind::kTouchScreen, "", ""},
  };
  for (const Case& c : kCases) {
    std::string keys = c.keys;
    CDMUtil::ReplaceAll(keys, "@", "detect.");
    SCOPED_TRACE(keys);
    SetBench bench(keys);
    bench["a"].lines = {{1, 3}, {2, 4}, {20, -9}, {21, 0}, {22, 1}, {237, 3}, {238, 3}};
    DeviceDetection devices(bench.Finder());
    EXPECT_TRUE(devices.Detect(c.kind) && devices.Detect(c.kind));  // the second look replaces the first
    std::string found;
    for (const DEVICE_INFO& device : devices.List(c.kind)) {
      found += device.name + "=" + device.status + " ";
    }
    EXPECT_EQ(found, c.found);
  }
}

TEST(DeviceDetection, SaysWhatAPlaceLacksAndPassesOnWhatItHas) {
  SetBench bench(
      "detect.jumper.1.name=J\ndetect.jumper.1.gpio.bit=8\ndetect.security.1.name=S\n"
      "detect.security.1.gpio.offset=8\ndetect.security.2.name=T\ndetect.security.2.chip=a\n"
      "detect.security.2.gpio.offset=0xFFFFFFFF\ndetect.security.2.gpio.bit=3\ndetect.security.2.gpio.clearbit=5\n"
      "detect.riser.name=R\ndetect.riser.reg=3\ndetect.hoodswitch.gpio.offset=8\n");
  DeviceDetection devices(bench.Finder());
  devices.Detect(DeviceKind::kJumpers);
  devices.Detect(DeviceKind::kSecurityDevices);
  EXPECT_EQ(bench.bench.machine.Output(),
            "LogMessage 14 8 \"Jumper: Missing GPIO offset/bit information\" \"\"\n"
            "LogMessage 14 8 \"Security Devices: Missing GPIO offset/bit information\" \"\"\n");
  EXPECT_EQ(bench.Notes(), "a:bit 4294967295.3/5 ");
  devices.Detect(DeviceKind::kRiser);
  HoodSwitch(bench.Finder()).Load();
  EXPECT_THAT(bench.bench.machine.Errors(), HasSubstr("riser.reg\": it counts only with \"detect.riser.reg.value\""));
  EXPECT_THAT(bench.bench.machine.Errors(),
              HasSubstr("offset\": it counts only with \"detect.hoodswitch.gpio.bit\""));
}

TEST(HoodSwitch, IsReadAsALineAndAsALatch) {
  struct Case {
    const char* keys;
    const char* line;
    const char* latch;
    const char* notes;
  };
  const Case kCases[] = {
      {"detect.hoodswitch.gpio=-1\ntest.hoodswitch.gpio=-1\n", "none", "none", ""},
      {"detect.hoodswitch.gpio=1\n", "true", "none", "ich:line 1 "},
      {"detect.hoodswitch.gpio=1\ndetect.hoodswitch.reversedlogic=yes\n", "false", "none", "ich:line 1 "},
      {"detect.hoodswitch.gpio=7\n", "none", "none", "ich:line 7 "},
      {"detect.hoodswitch.chip=a\ndetect.hoodswitch.gpio.offset=4\ndetect.hoodswitch.gpio.bit=2\n", "true", "none",
       "a:bit 4.2/ "},
      {"test.hoodswitch.gpio=caseopen\n", "none", "true", "ich:latch 238 cleared "},
      {"test.hoodswitch.chip=b\ntest.hoodswitch.gpio=intruder\ntest.hoodswitch.reversedlogic=yes\n", "none", "false",
       "b:latch 237 cleared "},
      {"test.hoodswitch.gpio=9\n", "none", "none", "ich:latch 9 cleared "},
      {"test.hoodswitch.chip=b\ntest.hoodswitch.ldn=4\ntest.hoodswitch.reg=0x30\ntest.hoodswitch.bit=2\n", "none",
       "true", "b:config 4 48.2 "},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.keys);
    SetBench bench(c.keys);
    bench["ich"].lines = {{1, 3}};
    HoodSwitch hood(bench.Finder());
    bool value = false;
    EXPECT_FALSE(hood.Read(value) || hood.ReadLatch(true, value));  // not loaded
    hood.Load();
    const auto word = [&](bool done) { return std::string(!done ? "none" : value ? "true" : "false"); };
    EXPECT_EQ(word(hood.Read(value)), c.line);
    EXPECT_EQ(word(hood.ReadLatch(true, value)), c.latch);
    EXPECT_EQ(bench.bench.machine.Errors(), "");
    EXPECT_EQ(bench.Notes(), c.notes);
  }
}

TEST(HoodLock, MovesOnlyALockThatWasFoundAndCanBeUndone) {
  struct Case {
    const char* keys;
    int locked;
    int unlocked;
    const char* notes;
  };
  const std::string lines = "test.hoodlock.gpio.lock=4\ntest.hoodlock.gpio.unlock=5\n";
  const std::string there = "detect.hoodlock.gpio=1\n";
  const std::string kAll = there + lines;
  const std::string kUnchecked = kAll + "test.hoodlock.check=no\ntest.hoodlock.chip=b\n";
  const std::string kAbsent = kAll + "detect.hoodlock.reversedlogic=yes\n";
  const std::string kNowhere = lines + "detect.hoodlock.gpio=-1\n";
  const std::string kOneWay = there + "test.hoodlock.gpio.lock=4\ntest.hoodlock.gpio.unlock=-1\n";
  const Case kCases[] = {{lines.c_str(), 0, 0, ""},
                         {kAll.c_str(), 1, 1, "ich:line 1 ich:lock 4! ich:unlock 5! "},
                         {kUnchecked.c_str(), 1, 1, "ich:line 1 b:lock 4 b:unlock 5 "},
                         {kAbsent.c_str(), 0, 0, "ich:line 1 "},
                         {kNowhere.c_str(), 0, 0, ""},
                         {kOneWay.c_str(), -256, -256, "ich:line 1 "}};
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.keys);
    SetBench bench(c.keys);
    bench["ich"].lines = {{1, 3}};
    HoodLock lock(bench.Finder());
    lock.Load();
    EXPECT_EQ(lock.Lock(), 0);  // not looked for yet
    bool present = false;
    lock.Read(present);
    EXPECT_EQ(lock.Lock(), c.locked);
    EXPECT_EQ(lock.Unlock(), c.unlocked);
    EXPECT_EQ(bench.Notes(), c.notes);
  }
}

TEST(TestButtons, TheSelectedOneIsReadByLineOrStatus) {
  SetBench bench(
      "test.button.1.name=A\ntest.button.1.chip=a\ntest.button.1.gpio=1\ntest.button.1.reverse_logic=yes\n"
      "test.button.2.name=Off\ntest.button.2=no\n"
      "test.button.3.name=B\ntest.button.3.chip=b\ntest.button.3.address=0x100\ntest.button.3.offset=2\n"
      "test.button.3.mask=4\ntest.button.3.data_type=status\n"
      "test.button.4.name=C\ntest.button.4.chip=a\ntest.button.4.gpio=1\ntest.button.4.status_gpio=2\n"
      "test.button.4.state_gpio=7\ntest.button.4.data_type=status\n");
  bench["a"].lines = {{1, 3}, {2, 4}};
  TestButtons buttons(bench.Finder());
  bool value = false;
  EXPECT_FALSE(buttons.ReadDirect(value) || buttons.Read(value) || buttons.ReadLatch(value));
  buttons.Load();
  EXPECT_FALSE(buttons.Select("Off") || buttons.Read(value) || buttons.GetState("", value));
  EXPECT_EQ(bench.Notes(), "");
  const auto word = [&](bool done) { return std::string(!done ? "none" : value ? "true" : "false"); };
  struct Case {
    const char* name;
    const char* direct;
    const char* read;
    const char* state;
    const char* notes;
  };
  const Case kCases[] = {{"A", "true", "false", "false", "a:line 1 a:line 1 a:line 1 "},
                         {"B", "true", "true", "true", "b:status 258&4 b:status 258&4 b:latched 258&4 "},
                         {"C", "false", "false", "false", "a:line 2 a:line 2 a:line 2 "}};
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.name);
    EXPECT_TRUE(buttons.Select(c.name));
    EXPECT_EQ(word(buttons.ReadDirect(value)), c.direct);
    EXPECT_EQ(word(buttons.Read(value)), c.read);
    EXPECT_EQ(word(buttons.GetState(c.name, value)), c.state);
    EXPECT_EQ(bench.Notes(), c.notes);
  }
}

}  // namespace
}  // namespace panelglow
