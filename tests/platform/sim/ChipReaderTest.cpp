// Descriptions of chips that cannot be meant.
#include <gmock/gmock.h>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

TEST(ChipReader, RefusesADescriptionThatNoPartFitsAndSaysWhere) {
  struct Case {
    const char* file;
    const char* line;
    const char* more;
    const char* problem;
  };
  const Case kCases[] = {
      {"sio-ite.toml", "kind = \"super-io\"", "exit = 0xAA", "\"chip.exit\" is not a key"},
      {"sio-ite.toml", "kind = \"super-io\"", "enter = []", "\"chip.enter\" must name at least one key"},
      {"sio-ite.toml", "latch = 0x04", "[[chip.gpio]]\n[[chip.gpio]]\n[[chip.gpio]]\n[[chip.gpio]]", "at most five"},
      {"sio-ite.toml", "latch = 0x04", "outputs = 1", "\"chip.gpio.outputs\" is not a key"},
      {"sio-ite.toml", "[chip.registers]", "\"0x25\" = 1", "hexadecimal addresses"},
      {"sio-fintek.toml", "status = 0x03", "clear_bit = 8", "must be a bit of a byte"},
      {"ec-notebook.toml", "kind = \"embedded-controller\"", "fault = \"stuck\"",
       "\"chip.fault\" must be one of \"\", \"stuck-ibf\", \"stuck-obf\""},
      {"ec-notebook.toml", "stage = []", "[[chip.command]]\ncode = 0xA2\nstage = []", "another number of data bytes"},
      {"mailbox-notebook.toml", "port = 0xA5D", "address = 0x1234", "\"chip.pin.address\" is not a key"},
      {"codec-notebook.toml", "base = 0xF7F10000", "direction = 0x100", "\"chip.direction\" has the wrong type"},
      {"casl-notebook.toml", "[[firmware_call.radio]]", "volume = 1", "\"firmware_call.radio.volume\" is not a key"},
      {"casl-notebook.toml", "speed = 24", "[[firmware_call.radio]]\nnumber = 3\noffset = 128", "behind the record"},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.more);
    try {
      const Simulation machine(MachineText(c.file, c.line, c.more));
      ADD_FAILURE() << "accepted";
    } catch (const MachineError& error) {
      EXPECT_THAT(error.what(), ::testing::ContainsRegex("^machine:[0-9]+: "));
      EXPECT_THAT(error.what(), ::testing::HasSubstr(c.problem));
    }
  }
}

}  // namespace
}  // namespace panelglow::platform::sim
