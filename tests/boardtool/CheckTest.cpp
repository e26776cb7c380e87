// What "check" finds in broken installations, and that it finds nothing in a sound one.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>

#include "boardtool/Check.h"
#include "boardtool/Installation.h"
#include "platform/HostInPlace.h"
#include "platform/sim/Simulation.h"

namespace panelglow::boardtool {
namespace {

using InstallationFiles = std::map<std::string, std::string>;

// A board with LEDs on ports and one whose part blinks by itself, and the buttons for both.
const InstallationFiles& Sound() {
  static const InstallationFiles kSound{
      {"mbdetect.ini", "[7D10]\nplatform=generic\nchips=g_iospace\n[7C20]\nplatform=generic\nchips=g_fintek\n"},
      {"mbtest.ini",
       "[7D10]\ntest.powerled.chip=g_iospace\ntest.powerled.redled.support=yes\ntest.hdled.chip=g_iospace\n"
       "[7C20]\ntest.powerled.chip=g_fintek\n"},
      {"chip.ini",
       "[g_iospace]\npowerled.green.assert.sequence=0xA20:0x01\npowerled.green.deassert.sequence=0xA20:0xFC\n"
       "powerled.red.assert.sequence=0xA20:0x02\npowerled.red.deassert.sequence=0xA20:0xFC\n"
       "hdled.red.assert.sequence=0xA28:0x08\nhdled.red.deassert.sequence=0xA28:0xF7\n"
       "[lpc]\nconfig.index.port=0x4E\nconfig.data.port=0x4F\nconfig.mode.enter.sequence=0x87,0x87\n"
       "config.mode.exit.sequence=0xAA\n"
       "[g_fintek]\nbase=lpc\nhwmbar.bar.ldn=4\nhwmbar.bar.reg=0x6061\ngpiobar.bar.ldn=6\ngpiobar.bar.reg=0x6061\n"
       "powerled.ldn=0x0A\npowerled.state.regs=0xF8,0xF9\npowerled.green.blink.sequence=0xF9:0x00,0xF8:0x03\n"
       "powerled.red.blink.sequence=0xF8:0x00,0xF9:0x03\n"},
      {"ui.xml",
       "<UI>\n<Section ID='Default'>\n<Button ID='PowerGreen'/>\n<Button ID='DriveRed' Active='true'/>\n"
       "<Button ID='HardDrive'>\n<Config Controller='all' LEDOnTime='500'/>\n</Button>\n</Section>\n</UI>\n"},
      {"buttondefinition.xml",
       "<Buttons>\n<Button ID='powergreen' Function='powergreen' ButtonIco='p.ico' ButtonLParam='1017' "
       "ErrorCode='771017' MessageID='42'/>\n<Button ID='drivered' Function='hdred' ButtonIco='p.ico' "
       "ButtonLParam='1016' ErrorCode='771016' MessageID='41'/>\n<Button ID='harddrive' Function='hdgreen' "
       "ButtonIco='p.ico' ButtonLParam='1013' ErrorCode='771013' MessageID='38'/>\n</Buttons>\n"},
      {"panelglow-diags.msg", "[en_US]\n38=Drive\n41=Red\n42=Power\n[de_DE]\n38=Platte\n41=Rot\n42=Strom\n"},
      {"nonui_panelglow-diags.msg", "[en_US]\n8=%s\n"},
      {"msctrl.ini", "[SATA CONTROLLERS]\n0x8086,0xA282,0x8086,0x7D10,wind,onboard\n"},
      {"p.ico", std::string("\0\0\1\0", 4)}};
  return kSound;
}

std::string TextOf(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

const std::filesystem::path kShipped = std::filesystem::path(PANELGLOW_SOURCE_DIR) / "installation";

std::string FindingsIn(InstallationFiles files, CheckOptions options = {}) {
  platform::sim::Simulation machine("");
  for (const char* const schema : {"ui.xsd", "buttondefinition.xsd"}) {
    files.try_emplace(schema, TextOf(kShipped / schema));
  }
  for (const auto& [name, text] : files) {
    machine.DiskFiles().Put(name, text);
  }
  return FindingsText(FindingsOf(options, platform::TheHost()));
}

struct BrokenCase {
  const char* file;
  const char* from;  // "": the text is put in front
  std::string to;
  const char* finding;
};

std::string Broken(const std::string& text, const BrokenCase& broken) {
  const std::size_t at = text.find(broken.from);
  EXPECT_NE(at, std::string::npos) << broken.from;
  return std::string(text).replace(at, std::string(broken.from).size(), broken.to);
}

const std::string kNul(1, '\0');

const BrokenCase kBroken[] = {
    // keys
    {"mbtest.ini", "test.hdled.chip=", "test.hdld.chip=",
     "mbtest.ini:4:1: warning: nothing reads a key \"test.hdld.chip\"; is \"test.hdled.chip\" meant? [unknown-key]"},
    {"chip.ini",
     "powerled.ldn=", "powerled.lnd=", "chip.ini:19:1: warning: nothing reads a key \"powerled.lnd\"; is "},
    {"mbdetect.ini", "chips=g_iospace\n", "chips=g_iospace\nchip.g_fintek.powerled.ldn=1\n",
     "mbdetect.ini:4:1: note: the board of [7D10] does not read \"chip.g_fintek.powerled.ldn\" [unused-key]"},
    {"chip.ini", "", "[old]\npowerled.ldn=1\n", "chip.ini:2:1: note: no board of the files uses section [old]"},
    {"chip.ini", "hdled.red.assert.sequence=0xA28:0x08\n",
     "hdled.red.assert.sequence=0xA28:0x08\n"
     "hdled.red.assert.sequence=1:1\n",
     "chip.ini:7:1: warning: key \"hdled.red.assert.sequence\" stands in line 6"},
    {"mbtest.ini", "[7C20]", "[7D10]", "mbtest.ini:5:1: warning: section [7D10] stands in line 1 already"},
    // chips, classes, sections
    {"mbdetect.ini", "chips=g_iospace", "chips=g_iospce",
     "mbdetect.ini:3:7: error: there is no chip \"g_iospce\"; is \"g_iospace\" meant? [unknown-chip]"},
    {"mbdetect.ini", "chips=g_iospace", "chips=g_fintek",
     "mbtest.ini:2:20: error: [7D10] has no chip \"g_iospace\": it is not in the list of the key \"chips\""},
    {"mbtest.ini", "test.hdled.chip=g_iospace", "test.hdled.chip=g_oispace",
     "mbtest.ini:4:17: error: there is no chip \"g_oispace\"; is \"g_iospace\" meant? [unknown-chip]"},
    {"mbtest.ini", "[7C20]\ntest.powerled.chip=g_fintek", "[7C20]\ntest.chargeled.chip=g_fintek",
     "mbtest.ini:6:21: error: [7C20] chip \"g_fintek\" lights no charge LED, white: "},
    {"mbdetect.ini", "platform=generic", "platform=generik", "mbdetect.ini:2:10: error: there is no board class"},
    {"mbdetect.ini", "chips=g_fintek", "chips=g_fintek\nchip.g_fintek.data=g_fintec",
     "mbdetect.ini:7:20: error: chip.ini has no section [g_fintec]; is \"g_fintek\" meant? [unknown-section]"},
    {"chip.ini", "base=lpc", "base=lcp", "chip.ini:14:6: error: there is no section [lcp]; is \"lpc\" meant?"},
    {"chip.ini", "[lpc]\n", "[lpc]\nbase=g_fintek\n", "error: the chain of base sections comes back to [g_fintek]"},
    {"mbdetect.ini", "chips=g_fintek", "chips=g_ec",
     "mbdetect.ini:5:10: error: [7C20] cannot be built: chip.ini missing mandatory entry for EC: ec.set_pwm.cmd"},
    {"mbdetect.ini", "chips=g_iospace", "chips=g_sio;g_iospace",
     "mbdetect.ini:3:12: error: \";\" begins a comment, so that nothing behind it counts: a list has commas"},
    {"chip.ini", "[g_fintek]", "[g_fintec]",
     "chip.ini:13:1: warning: no board of the files uses section [g_fintec]; is [g_fintek] meant? "
     "[misspelt-section]"},
    {"mbdetect.ini", "[7C20]", "[7C2O]",
     "mbtest.ini:5:1: warning: no file selects a board for [7C20] by \"platform\"; is [7C2O] meant?"},
    // values
    {"chip.ini", "powerled.ldn=0x0A", "powerled.ldn=A", "chip.ini:19:14: error: \"A\" is no number and counts as 0"},
    {"chip.ini", "config.index.port=0x4E", "config.index.port=0x4E4E4",
     "error: \"0x4E4E4\" does not fit into 8 bits"},
    {"chip.ini", "0xA28:0xF7", "0xA28", "chip.ini:7:29: error: malformed sequence entry: '0xa28'. should be: "},
    {"mbtest.ini", "support=yes", "support=ja", "mbtest.ini:3:30: warning: \"ja\" is neither yes nor no"},
    {"mbtest.ini", "test.hdled.chip=g_iospace", "test.hdled.chip=g_iospace ; red",
     "mbtest.ini:4:27: warning: the blank in front of \";\" is a part of the value"},
    {"chip.ini", "0xA28:0xF7", "0xA28:0xF7," + std::string(300, ' ') + "0xA28:0xF7",
     "chip.ini:7:29: error: only the first 254 of 321 characters count [value-too-long]"},
    // LEDs
    {"chip.ini", "hdled.red.deassert.sequence=0xA28:0xF7\n", "",
     "mbtest.ini:4:17: error: [7D10] drive LED, red can be lit and not darkened"},
    {"chip.ini", "hdled.red.deassert.sequence=0xA28:0xF7", "hdled.red.deassert.sequence=undef",
     "chip.ini:7:29: error: [7D10] drive LED, red can be lit and not darkened"},
    {"chip.ini", "hdled.red.assert.sequence=0xA28:0x08", "hdled.red.assert.sequence=undef",
     "chip.ini:6:27: error: [7D10] chip \"g_iospace\" lights no drive LED, red"},
    {"chip.ini", "0xA28:0xF7", "0xA28:0x08",
     "chip.ini:7:29: error: a deassert mask keeps its bits and clears all others, and this one keeps the LED's; is "
     "0xF7 meant for 0x08? [inverted-mask]"},
    {"chip.ini", "0xA28:0x08", "0xA28:0xF7", "chip.ini:6:27: error: an assert mask sets its bits, and this one sets"},
    {"mbtest.ini", "test.powerled.chip=g_fintek", "test.powerled.redled.support=yes",
     "mbtest.ini:6:30: error: [7C20] has no key \"test.powerled.chip\", so that nothing drives this LED"},
    {"mbtest.ini", "test.hdled.chip=g_iospace\n", "chip.g_iospace.hdled.red.assert.sequence=0xA28:0x08\n",
     "mbtest.ini:4:42: error: [7D10] has no key \"test.hdled.chip\""},
    {"chip.ini", "config.mode.exit.sequence=0xAA\n", "",
     "chip.ini:12:1: error: [g_fintek] and its bases lack config.mode.exit.sequence:"},
    {"chip.ini", "gpiobar.bar.ldn=6\ngpiobar.bar.reg=0x6061", "gpiobar.bar.ldn=6\ngpiobar.bar.reg=0x606",
     "chip.ini:18:17: error: [7C20] cannot be built: could not read GPIOBAR from SIO [board-fails]"},
    {"mbtest.ini", "test.hdled.chip=g_iospace\n",
     "test.hdled.chip=g_iospace\ntest.fan.1.full.min=900\ntest.fan.1.full.max=90\n",
     "mbtest.ini:5:21: error: 900 is above the highest value that is allowed, 90: nothing passes [crossed-limits]"},
    {"chip.ini", "0xA28:0x08", "0xA20:0x01",
     "chip.ini:6:27: error: [7D10] power LED, green or white and drive LED, red hang on the same bit, 0x01 of port "
     "0x0A20 [same-bit]"},
    {"chip.ini", "0xF8,0xF9", "0xF8",
     "chip.ini:20:21: warning: [7C20] power LED, red or amber: the blink changes 0xF9, which no save list has"},
    // files
    {"mbtest.ini", "", "\xEF\xBB\xBF", "mbtest.ini:1:1: error: the file begins with a UTF-8 mark"},
    {"mbtest.ini", "", "\xFE\xFF", "mbtest.ini:1:1: error: UTF-16 with the high byte first is read by nothing"},
    {"chip.ini", "[lpc]", "x" + kNul + "y", "chip.ini:8:1: error: a zero byte ends the value that it stands in"},
    {"chip.ini", "[lpc]", "[lpc", "chip.ini:8:1: warning: a section's name lacks its \"]\""},
    {"mbdetect.ini", "", "platform=generic\n", "mbdetect.ini:1:1: warning: key \"platform\" stands in front of"},
    {"mbdetect.ini", "chips=g_fintek", "chips g_fintek", "mbdetect.ini:6:1: warning: neither a section, nor"},
    {"chip.ini", "", std::string(std::size_t{5} << 20U, ';'), "chip.ini:1:1: error: 5243"},
    // buttons
    {"ui.xml", "ID='DriveRed'", "ID='DriverRed'",
     "ui.xml:4:1: error: the button \"DriverRed\" is left out: buttondefinition.xml does not have it; is "
     "\"drivered\""},
    {"ui.xml", "ID='DriveRed'", "ID='PowerGreen'", "ui.xml:4:1: warning: the button \"PowerGreen\" stands twice"},
    {"ui.xml", "'true'", "'False'", "ui.xml:4:1: warning: Active=\"False\" leaves the LED in the test"},
    {"ui.xml", "Controller='all'", "Controller='onboard,onbord'",
     "ui.xml:6:1: error: msctrl.ini has no controller \"onbord\"; is \"onboard\" meant? [unknown-controller]"},
    {"ui.xml", "LEDOnTime='500'", "LEDOnTime='5'", "ui.xml:6:1: warning: LEDOnTime of 5 ms is faster than an eye"},
    {"ui.xml", "LEDOnTime='500'", "LEDOnTime='0.5 s'", "ui.xml:6:1: error: LEDOnTime=\"0.5 s\" is no number"},
    {"ui.xml", "Active='true'", "Aktive='true'", "ui.xml:4:1: error: "},
    {"ui.xml", "</Section>", "", "ui.xml:9:1: error: Opening and ending tag mismatch"},
    {"ui.xml", "<Section", "<Section ID='Default'/>\n<Section",
     "ui.xml:3:1: warning: section \"Default\" stands above already"},
    {"buttondefinition.xml", "Function='hdred'", "Function='hdread'",
     "buttondefinition.xml:3:1: error: \"drivered\" has the function \"hdread\", which no LED has; is \"hdred\" "
     "meant?"},
    {"buttondefinition.xml", "'1016'", "'1017'",
     "\"drivered\" has the command \"1017\"; the answer to this LED is 1016"},
    {"buttondefinition.xml", "'p.ico'", "'q.ico'",
     "buttondefinition.xml:2:1: error: the icon \"q.ico\" of \"powergre"},
    {"buttondefinition.xml", "'drivered'", "'powergreen'",
     "buttondefinition.xml:3:1: warning: the definition of \"powergreen\" stands above already"},
    {"p.ico", "", "none", "the icon \"p.ico\" of \"powergreen\" is no picture [icon-missing]"},
    {"panelglow-diags.msg", "42=Strom", "43=Strom",
     "buttondefinition.xml:2:1: warning: the caption of \"powergreen\", text 42, is not in [de_DE]"},
    {"panelglow-diags.msg", "42=Strom", "42=%s %s", "panelglow-diags.msg:8:4: error: the program gives one text"},
    {"panelglow-diags.msg", "42=Strom", "42=50 % an",
     "panelglow-diags.msg:8:7: error: \"%\" begins the place of a text"},
    {"panelglow-diags.msg", "[de_DE]", "[de-DE]",
     "panelglow-diags.msg:5:1: error: no run finds [de-DE]: a language is called as \"de_DE\"; is [de_DE] meant?"},
    {"panelglow-diags.msg", "[en_US]", "[en_GB]", "panelglow-diags.msg:1:1: error: the file has no section [en_US]"},
    {"panelglow-diags.msg", "42=Strom", "42=Leistungsl\xC3\xA4mpchen",
     "panelglow-diags.msg:8:1: error: the texts are UTF-8, and each of their bytes is shown as a character"},
    {"nonui_panelglow-diags.msg", "[en_US]\n8=%s\n", "",
     "nonui_panelglow-diags.msg:1:1: error: the file has no texts, so that numbers stand for them [message-texts]"},
    {"msctrl.ini", "[SATA", "[SATTA", "msctrl.ini:1:1: error: [SATTA CONTROLLERS] is no section of controllers"},
    {"msctrl.ini", ",wind", "", "msctrl.ini:2:1: error: a line of this section has 6 fields, this one has 5"},
    {"msctrl.ini", "0xA282", "A282", "msctrl.ini:2:1: error: \"A282\" stands where an id belongs [not-a-number]"},
    {"msctrl.ini", "onboard", "Onboard", "\"Onboard\" is found by no test: a name stands in lower case"},
};

TEST(Check, FindsWhatIsBroken) {
  ASSERT_EQ(FindingsIn(Sound()), "");
  for (const BrokenCase& broken : kBroken) {
    InstallationFiles files = Sound();
    files[broken.file] = Broken(files[broken.file], broken);
    EXPECT_NE(FindingsIn(files).find(broken.finding), std::string::npos)
        << broken.file << ": " << std::string(broken.to).substr(0, 60) << "\n"
        << FindingsIn(files);
  }
  for (const auto& [name, text] : Sound()) {
    InstallationFiles files = Sound();
    files.erase(name);
    EXPECT_EQ(FindingsIn(files).empty(), name == "msctrl.ini") << name;
  }
}

// A controller of 0.4 s a byte.
TEST(Check, FindsABlinkThatNoEyeTakesForOne) {
  InstallationFiles files = Sound();
  files["mbdetect.ini"] += "[7C40]\nplatform=generic\nchips=g_ec\n";
  files["mbtest.ini"] += "[7C40]\ntest.powerled.chip=g_ec\n";
  files["chip.ini"] +=
      "[g_ec]\nec.set_pwm.cmd=1\nec.ibf.sleeptime=400\npowerled.green.assert.sequence=0xA2:2,0xEE:0\n"
      "powerled.red.assert.sequence=0xA2:1\npowerled.deassert.sequence=0xA2:0\n";
  EXPECT_EQ(
      FindingsIn(files),
      "mbtest.ini:8:20: warning: [7C40] power LED, green or white: switching it \"on\" takes 1600 ms, which no eye "
      "takes for blinking [blink-rate]\n");
}

// A code page's own letters are no UTF-8; of a machine without a board nothing more is told than that.
TEST(Check, TellsNoMoreThanThereIs) {
  InstallationFiles files = Sound();
  files["panelglow-diags.msg"].replace(files["panelglow-diags.msg"].find("Strom"), 5, "L\xE4mpchen");
  EXPECT_EQ(FindingsIn(files), "");
  files["mbdetect.ini"].replace(files["mbdetect.ini"].find("[7C20]"), 6, "[7C2O]");
  const std::string findings = FindingsIn(files);
  EXPECT_EQ(findings.rfind("mbtest.ini:5:1: warning: no file selects a board", 0), 0U) << findings;
  EXPECT_EQ(findings.find("unused-key"), std::string::npos) << findings;
}

TEST(Check, IsSilencedByACommentInTheLineOrAboveIt) {
  InstallationFiles files = Sound();
  const auto with = [&](const std::string& lines) {
    files["chip.ini"] = "[g_iospace]\n" + lines + Sound().at("chip.ini").substr(12);
    return FindingsIn(files);
  };
  EXPECT_NE(with("colour=red\n"), "");
  EXPECT_EQ(with("; check: off unknown-key\ncolour=red\n"), "");
  EXPECT_EQ(with("colour=red;check: off unknown-key\n"), "");
  EXPECT_NE(with("; check: off unused-key\ncolour=red\n"), "");
  EXPECT_NE(with("; check: off unknown-key\n\ncolour=red\n"), "");
}

// Of many findings of a kind the first fifty are told.
TEST(Check, TellsOfTheFilesThatItIsAskedForAndNotTooMuch) {
  InstallationFiles files = Sound();
  for (int i = 0; i < 60; ++i) {
    files["mbtest.ini"] += "nonsense " + std::to_string(i) + "\n";
  }
  files["p.ico"] = "none";
  CheckOptions options;
  options.files = {"mbtest.ini"};
  const std::string findings = FindingsIn(files, options);
  EXPECT_EQ(std::count(findings.begin(), findings.end(), '\n'), 50);
  EXPECT_NE(findings.find("(and 10 more like this in the file)"), std::string::npos);
  EXPECT_EQ(findings.find("icon"), std::string::npos);
  options.files = {"./mbtest.ini", "./chip.ini"};
  EXPECT_EQ(FindingsIn(files, options), findings);
  for (const std::vector<std::string>& wrong :
       {std::vector<std::string>{"mbtset.ini"}, {"mbtest.ini", "a/chip.ini"}}) {
    options.files = wrong;
    EXPECT_THROW(FindingsIn(files, options), WrongCall);
  }
}

TEST(Check, FindsNothingInWhatIsShipped) {
  InstallationFiles files;
  for (const auto& entry : std::filesystem::directory_iterator(kShipped)) {
    files[entry.path().filename().string()] = TextOf(entry.path());
  }
  EXPECT_EQ(FindingsIn(files), "");
}

// The page says what each rule means; a rule without its heading there, or a heading without a rule, is out of date.
TEST(Rules, HaveTheirPage) {
  std::istringstream page(TextOf(std::filesystem::path(PANELGLOW_SOURCE_DIR) / "docs" / "check-rules.md"));
  std::string headings;
  for (std::string line; std::getline(page, line);) {
    headings += line.starts_with("## ") ? line.substr(3) + "\n" : "";
  }
  std::string names;
  for (const Rule& rule : Rules()) {
    names += std::string(rule.name) + "\n";
  }
  EXPECT_EQ(headings, names);
}

TEST(Nearest, IsNoNameOfAnotherKind) {
  const std::vector<std::string> known{"powerled.ldn", "gpiobar", "hwmbar"};
  EXPECT_EQ(Nearest("powerled.lnd", known), "powerled.ldn");
  EXPECT_EQ(Nearest("gpiobr", known), "gpiobar");
  EXPECT_EQ(Nearest("colour", known), "");
  EXPECT_EQ(Nearest("HwmBar", known), "");
}

}  // namespace
}  // namespace panelglow::boardtool
