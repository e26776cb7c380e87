// What "explain" says of a board, and that the simulated machines see just that.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>

#include "board/MotherBoard.h"
#include "board/base/BoardDevio.h"
#include "boardtool/Explain.h"
#include "boardtool/Rehearsal.h"
#include "platform/sim/Simulation.h"

namespace panelglow::boardtool {
namespace {

const std::filesystem::path kTop = PANELGLOW_SOURCE_DIR;

std::string TextOf(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

const BoardFiles kNames = BoardFilesIn(".");

std::vector<IniOutline> Files(const std::string& detect, const std::string& test, const std::string& chip) {
  return {{kNames.detectPath, detect}, {kNames.testPath, test}, {kNames.chipPath, chip}};
}

std::string ExplainedLed(const std::vector<IniOutline>& files, const char* led) {
  platform::sim::Simulation machine("");
  RehearsalWish wish;
  wish.led = FindBoardLed(led);
  return ExplainText(Rehearse(files, kNames, "7D10", platform::TheHost(), wish), files, false);
}

TEST(Explain, TellsEachRequestAndTheLineThatItComesFrom) {
  const std::vector<IniOutline> files =
      Files("[7D10]\nplatform=generic\nchips=g_memoryspace\n",
            "[7D10]\ntest.chargeled.chip=g_memoryspace\nchip.g_memoryspace.chargeled.red.deassert.sequence=16:0xF0\n",
            "[g_memoryspace]\nbase=lamps\n[lamps]\nchargeled.red.assert.sequence=16:8,17:1\n");
  EXPECT_EQ(
      ExplainedLed(files, "charge-red"),
      "board 7D10: class generic  (mbdetect.ini:2 platform=generic)\n"
      "chips: g_memoryspace  (mbdetect.ini:3 chips=g_memoryspace)\n"
      "\n"
      "charge-red: charge LED, red or amber\n"
      "  chip                                                        mbtest.ini:2 test.chargeled.chip=g_memoryspace\n"
      "  save      no such thing on this board\n"
      "  blink     no such thing on this board\n"
      "  on        memory 0x00000010 is read                         chip.ini:4 chargeled.red.assert.sequence\n"
      "            memory 0x00000010 <- as read, bits 0x08 set       chip.ini:4 chargeled.red.assert.sequence\n"
      "            memory 0x00000011 is read                         chip.ini:4 chargeled.red.assert.sequence\n"
      "            memory 0x00000011 <- as read, bits 0x01 set       chip.ini:4 chargeled.red.assert.sequence\n"
      "  off       memory 0x00000010 is read                         mbtest.ini:3 "
      "chip.g_memoryspace.chargeled.red.deassert.sequence\n"
      "            memory 0x00000010 <- as read, bits 0x0F cleared   mbtest.ini:3 "
      "chip.g_memoryspace.chargeled.red.deassert.sequence\n"
      "  restore   no such thing on this board\n"
      "  It is blinked by \"on\" and \"off\" in turn.\n");
}

TEST(Explain, SaysWhyThereIsNoBoardOrNoLamp) {
  EXPECT_EQ(ExplainedLed(Files("[7D11]\n", "", "x"), "power-red").substr(0, 47),
            "board 7D10: the files select no board; a test w");
  EXPECT_EQ(ExplainedLed(Files("[7D10]\nplatform=generic\nchips=g_ec\n", "", "[g_ec]\n"), "power-red"),
            "board 7D10: cannot be built: chip.ini missing mandatory entry for EC: ec.set_pwm.cmd\n");
  const std::string dark = ExplainedLed(
      Files("[7D10]\nplatform=generic\nchips=g_iospace\n", "[7D10]\ntest.powerled.chip=g_iospace\n", "[g_iospace]\n"),
      "power-green");
  EXPECT_NE(dark.find("note: The power LED cannot be lit: the chip \"g_iospace\" (mbtest.ini, section [7D10], key "
                      "\"test.powerled.chip\") has nothing for it; without a value in [g_iospace]: powerled."),
            std::string::npos)
      << dark;
}

// ---- against simulated silicon

// Writes as "port 0x0A20 <- 31", in order.
std::string WritesOf(const std::vector<platform::sim::DriverRequest>& requests) {
  std::string text;
  for (const platform::sim::DriverRequest& request : requests) {
    if (request.code == platform::sim::DriverRequest::kMappedWrite) {
      HardwareAccess access;
      access.kind = HardwareAccess::Kind::kMemoryWrite;
      access.width = 1;
      std::istringstream words(platform::sim::Describe(request));
      std::string word;
      for (int i = 0; i < 6; ++i) {
        words >> word;  // simulated, time, us, thread, number, memory
      }
      words >> word;
      access.address = std::stoull(word, nullptr, 16);
      words >> word >> word;
      text += PlaceOf(access) + " <- " + std::to_string(std::stoul(word, nullptr, 16)) + "\n";
    } else if (const auto access = DecodeRequest(request.code, request.in, {}); access && IsWrite(access->kind)) {
      text += PlaceOf(*access) + " <- " + std::to_string(access->value) + "\n";
    }
  }
  return text;
}

// The plan's writes on hardware that held what the machine wrote where the plan keeps bits.
std::string WritesOf(const PlannedStep& step, const std::string& seen) {
  std::istringstream lines(seen);
  std::string text;
  for (const PlannedAccess& access : step.accesses) {
    std::string line;
    if (IsWrite(access.access.kind)) {
      std::getline(lines, line);
      const std::size_t at = line.rfind(' ');
      const std::uint64_t there = at == std::string::npos ? 0 : std::stoull(line.substr(at));
      text += PlaceOf(access.access) + " <- " + std::to_string(access.set | (there & access.kept)) + "\n";
    }
  }
  return text;
}

TEST(Explain, IsWhatTheSimulatedMachinesSee) {
  std::vector<IniOutline> files;
  for (const std::string& name : {kNames.detectPath, kNames.testPath, kNames.chipPath}) {
    files.emplace_back(name, TextOf(kTop / "installation" / name));
  }
  std::size_t steps = 0;
  // Machines whose boards look for no base address and ask no mailbox, whose answers nobody can imagine.
  for (const char* const name : {"desktop", "notebook", "ec-notebook", "ec16-notebook", "old-ec"}) {
    platform::sim::Simulation machine(TextOf(kTop / "machines" / (std::string(name) + ".toml")));
    for (const IniOutline& file : files) {
      machine.DiskFiles().Put(file.path, file.bytes);
    }
    const std::string id = machine.Description().firmware.boardProduct.substr(0, 4);
    RehearsalWish wish;
    wish.withSources = false;
    const BoardPlan plan = Rehearse(files, kNames, id, platform::TheHost(), wish);
    BoardDevio().LoadDriver();
    machine.Trace().Keep();
    for (const LedPlan& led : plan.leds) {
      if (!led.IsLit() || led.blinksByItself) {
        continue;
      }
      const auto board =
          MotherBoard::Instantiate(kNames.detectPath, kNames.testPath, kNames.chipPath, "platform", id);
      const std::pair<const char*, BoardOperation> operations[] = {
          {"save", led.led->save}, {"on", led.led->on}, {"off", led.led->off}, {"restore", led.led->restore}};
      for (const auto& [step, operation] : operations) {
        machine.Trace().Clear();
        EXPECT_EQ(((*board).*operation)(), led.Find(step)->answer) << name << " " << led.led->id << " " << step;
        const std::string seen = WritesOf(machine.Trace().Requests());
        EXPECT_EQ(WritesOf(*led.Find(step), seen), seen) << name << " " << led.led->id << " " << step;
        steps += seen.empty() ? 0 : 1;
      }
    }
  }
  EXPECT_GT(steps, 20U);
}

}  // namespace
}  // namespace panelglow::boardtool
