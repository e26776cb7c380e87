// Descriptions of machines that cannot be meant: what is said of them, and where.
#include <gmock/gmock.h>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

void ExpectRefused(const std::string& text, const std::string& problem) {
  SCOPED_TRACE(problem);
  try {
    const Simulation machine(text);
    ADD_FAILURE() << "accepted";
  } catch (const MachineError& error) {
    EXPECT_THAT(error.what(), ::testing::HasSubstr(problem));
  }
}

TEST(Descriptions, AMistakeIsNamedWithItsLine) {
  const std::string led = "[[led]]\nname = \"a\"\nsymbol = \"b\"\ncolor = \"c\"\npin = \"0\"\n";
  const std::string keyboard = "device = \"keyboard\"\npin = \"caps-lock\"\n";
  const std::string other = "[[led]]\nsymbol = \"b\"\ncolor = \"c\"\nname = \"a\"\n" + keyboard;
  const std::pair<std::string, const char*> kCases[] = {
      {"name = ", "machine:1: "},
      {"nmae = \"x\"", "machine:1: \"nmae\" is not a key"},
      {"\n[[chip]]\nname = \"a\"", "machine:2: \"chip.kind\" is missing"},
      {"[[chip]]\nname = \"a\"\nkind = \"toaster\"", "there is no kind \"toaster\""},
      {"[[chip]]\nname = \"a\"\nkind = \"gpio-block\"\nbase = \"x\"", "machine:4: \"chip.base\" has the wrong type"},
      {"[[chip]]\nname = \"a\"\nkind = \"memory-registers\"\ninitial = [256]", "machine:4: "},
      {led + "device = \"none\"", "no pin \"0\""},
      {"[[led]]\nname = \"a\"\nsymbol = \"b\"\ncolor = \"c\"\n" + keyboard + other,
       "machine:10: \"led.name\" is the name of another one, too: \"a\""},
      {"driver = {refused = [-1]}", "\"driver.refused\" holds a value that is no number of 32 bits"},
      {"driver = {msr = {\"1G\" = 1}}", "\"driver.msr\" holds hexadecimal addresses"},
      {"[[event]]\nat_ms = 5", "\"event.console\" is missing"},
      {"[pci]\n[pci.registers]\n3 = 1", "a PCI register is"},
  };
  for (const auto& [text, problem] : kCases) {
    ExpectRefused(text, problem);
  }
}

TEST(Descriptions, AChipThatNoPartFitsIsRefused) {
  struct Case {
    const char* file;
    const char* line;  // behind which `more` is put
    const char* more;
    const char* problem;
  };
  const Case kCases[] = {
      {"sio-ite.toml", "kind = \"super-io\"", "exit = 0xAA", "\"chip.exit\" is not a key"},
      {"sio-ite.toml", "kind = \"super-io\"", "enter = []", "\"chip.enter\" must name at least one key"},
      {"sio-ite.toml", "latch = 0x04", "[[chip.gpio]]\n[[chip.gpio]]\n[[chip.gpio]]\n[[chip.gpio]]", "at most five"},
      {"sio-fintek.toml", "status = 0x03", "clear_bit = 8", "must be a bit of a byte"},
      {"ec-notebook.toml", "kind = \"embedded-controller\"", "fault = \"stuck\"",
       "\"chip.fault\" must be one of \"\", \"stuck-ibf\", \"stuck-obf\""},
      {"ec-notebook.toml", "stage = []", "[[chip.command]]\ncode = 0xA2\nstage = []", "another number of data bytes"},
      {"casl-notebook.toml", "speed = 24", "[[firmware_call.radio]]\nnumber = 3\noffset = 128", "behind the record"},
  };
  for (const Case& c : kCases) {
    ExpectRefused(MachineText(c.file, c.line, c.more), c.problem);
  }
}

TEST(Descriptions, ADeviceThatFitsNoMachineIsRefused) {
  const auto controller = [](const std::string& name, const std::string& id, const std::string& more = {}) {
    return "[[controller]]\nname = \"" + name + "\"\nid = '" + id + "'\n" + more + "\n";
  };
  const auto disk = [](const std::string& name, const std::string& more) {
    return "[[disk]]\nname = \"" + name + "\"\nid = 'A\\1'\n" + more + "\n";
  };
  const std::string sata = controller("sata", R"(PCI\VEN_8086&DEV_2922&SUBSYS_0&REV_02\3&FA)", "scsi_ports = [3]");
  const std::pair<std::string, const char*> kCases[] = {
      {disk("x", "controller = \"sata\"\n[[chip]]\nname = \"x\"\nkind = \"floppy-controller\""),
       "\"disk.name\" is the name of another part"},
      {disk("x", "controller = \"none\""), "\"disk.controller\" names no [[controller]]"},
      {disk("x", "controller = \"sata\"\nfault = \"ill\""), "\"disk.fault\" must be one of"},
      {controller("z", "B\\1", "class = 0x1000000"), "must have 24 bits"},
      {controller("z", "PCI"), "must be an instance id"},
      {controller("z", R"(PCI\VEN_1&DEV_1&SUBSYS_1&REV_1\0&FA)"), "ends in the place of another PCI function"},
      {disk("x", "controller = \"sata\"") + "[[enumerated]]\nid = 'a\\1'", "two devices have the instance id a\\1"},
      {"[[enumerated]]\nid = 'A\\1'\nparent = 'B\\1'", "which is no device of this machine ahead of it"},
      {controller("z", "A\\1", "scsi_ports = [3]"), "two controllers have the SCSI port 3"},
  };
  for (const auto& [more, problem] : kCases) {
    ExpectRefused(sata + more, problem);
  }
}

}  // namespace
}  // namespace panelglow::platform::sim
