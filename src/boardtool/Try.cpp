#include "boardtool/Try.h"

#include <algorithm>
#include <array>
#include <functional>
#include <map>
#include <memory>
#include <utility>
#include <vector>

#include "board/MotherBoard.h"
#include "board/base/BoardDevio.h"
#include "board/parts/LedLineMap.h"
#include "boardtool/BoardLed.h"
#include "boardtool/BoardOnMachine.h"
#include "boardtool/HardwareAccess.h"
#include "boardtool/HostWith.h"
#include "boardtool/Installation.h"
#include "boardtool/MemoryFiles.h"
#include "boardtool/Output.h"
#include "boardtool/PresentSection.h"
#include "boardtool/RecordedProfiles.h"
#include "harness/base/CDMUtil.h"
#include "platform/HostInPlace.h"

namespace panelglow::boardtool {

namespace {

constexpr std::uint32_t kSlow_ms = 1000;
constexpr std::uint32_t kLook_ms = 50;
constexpr unsigned kBits = 8;

void Tell(const std::string& text) { platform::TheHost().console.WriteError(text); }

// How an LED's keys begin in the section of a chip with masks.
struct LedKeys {
  std::string_view led;
  std::string_view prefix;
  std::string_view chipKey;
};
constexpr std::array<LedKeys, 6> kLedKeys{{{"power-green", "powerled.green", "test.powerled.chip"},
                                           {"power-red", "powerled.red", "test.powerled.chip"},
                                           {"charge-white", "chargeled.white", "test.chargeled.chip"},
                                           {"charge-red", "chargeled.red", "test.chargeled.chip"},
                                           {"drive-red", "hdled.red", "test.hdled.chip"},
                                           {"wireless", "wirelessled", "test.wirelessled.chip"}}};

using Lines = std::vector<std::string>;

std::string Joined(const Lines& lines) {
  std::string text;
  for (const std::string& line : lines) {
    text += line + "\n";
  }
  return text;
}

std::pair<unsigned, unsigned> RangeOf(const std::string& text) {
  const std::size_t dash = text.find('-');
  const std::string first = text.substr(0, dash);
  const std::string last = dash == std::string::npos ? first : text.substr(dash + 1);
  if (!CDMUtil::IsInteger(first) || !CDMUtil::IsInteger(last) || CDMUtil::ToInt(first) < 0 ||
      CDMUtil::ToInt(last) < CDMUtil::ToInt(first)) {
    throw WrongCall("\"" + text + "\" is no range: write 0-7");
  }
  return {static_cast<unsigned>(CDMUtil::ToInt(first)), static_cast<unsigned>(CDMUtil::ToInt(last))};
}

// A chip that the walk knows how to walk through.
class Walk {
 public:
  explicit Walk(const TryOptions& options)
      : options_(options), hasMasks_(options.chip == "g_iospace" || options.chip == "g_memoryspace") {
    if (!hasMasks_ && options.chip != "g_ite" && options.chip != "g_it8702") {
      throw WrongCall(
          "the walk knows g_iospace and g_memoryspace with --at and --bits, g_ite and g_it8702 with --lines");
    }
    if (hasMasks_ && !options.lines.empty()) {
      throw WrongCall(options.chip + " has bits and no lines: name the register with --at, and its bits with --bits");
    }
    if (!hasMasks_ && (options.lines.empty() || !options.bits.empty() || !options.at.empty())) {
      throw WrongCall(options.chip + " has lines: name them with --lines, as 20-27, and no register");
    }
    range_ = RangeOf(!hasMasks_ ? options.lines : options.bits.empty() ? std::string("0-7") : options.bits);
    if (hasMasks_) {
      CheckPlace();
    } else if (constexpr unsigned kLastLine = 99; range_.second > kLastLine) {
      throw WrongCall("the lines of a chip are 10 to 57");
    }
  }

  [[nodiscard]] std::pair<unsigned, unsigned> Range() const { return range_; }
  [[nodiscard]] bool HasMasks() const { return hasMasks_; }

  [[nodiscard]] std::string NameOf(unsigned number) const {
    return hasMasks_ ? "bit " + std::to_string(number) + " of " + Place() : "line " + std::to_string(number);
  }

  [[nodiscard]] std::string Place() const {
    return options_.chip == "g_iospace" ? "port " + Hex(at_, 4) : "memory " + Hex(at_, 8);
  }

  /// Settings of the board under which its power LED is the bit or line.
  [[nodiscard]] Lines SettingsFor(unsigned number) const { return SettingsOf({{"power-green", number}}); }

  /// Settings that light all that was found, by LED.
  /// `isThere` knows keys that the machine's section has already.
  [[nodiscard]] Lines SettingsOf(
      const std::map<std::string, unsigned>& found,
      const std::function<bool(const std::string&)>& isThere = [](const std::string&) { return false; }) const {
    Lines lines;
    const std::string chip = "chip." + options_.chip + ".";
    if (!hasMasks_) {
      for (const auto& [led, number] : found) {
        const char* const which = led == "power-red" ? "secondary" : "primary";
        lines.push_back(chip + "powerled.color." + which + ".gpio=" + std::to_string(number));
      }
      return lines;
    }
    for (const LedKeys& keys : kLedKeys) {
      const auto one = found.find(std::string(keys.led));
      if (one == found.end()) {
        continue;
      }
      const bool turns = keys.led == "wireless";  // the same mask, turned over each time
      const unsigned mask = 1U << one->second;
      lines.push_back(Sequence(chip, keys.prefix, "assert", mask));
      lines.push_back(Sequence(chip, keys.prefix, "deassert", turns ? mask : ~mask & 0xFFU));
    }
    // Darkening the power LED takes the lists of both colours.
    const auto green = found.find("power-green");
    const auto red = found.find("power-red");
    if ((green == found.end()) != (red == found.end())) {
      const bool hasGreen = green != found.end();
      const unsigned mask = 1U << (hasGreen ? green : red)->second;
      const char* const other = hasGreen ? "powerled.red" : "powerled.green";
      if (isThere(chip + other + ".assert.sequence")) {
        return lines;  // an earlier walk found it
      }
      lines.push_back(chip + other + ".assert.sequence=undef");
      lines.push_back(Sequence(chip, other, "deassert", ~mask & 0xFFU));
    }
    return lines;
  }

  /// Keeps the register's byte, and gives it back.
  [[nodiscard]] std::function<void()> Kept() const {
    if (!hasMasks_) {
      return [] {};  // the chip's own save does it
    }
    if (options_.chip == "g_iospace") {
      const auto port = static_cast<std::uint16_t>(at_);
      const std::uint8_t byte = BoardDevio().InportByte(port);
      return [port, byte] { BoardDevio().OutportByte(port, byte); };
    }
    std::array<std::byte, 1> byte{};
    BoardDevio().ReadPhysicalMemory(at_, 1, byte);
    return [address = at_, byte] { BoardDevio().WritePhysicalMemory(address, 1, byte); };
  }

  /// False for a line that the chip's map has no place for.
  [[nodiscard]] bool Has(unsigned number) const {
    return hasMasks_ || LedLineMap(static_cast<int>(number)) != kNoLedLineMap;
  }

 private:
  void CheckPlace() {
    if (!CDMUtil::IsInteger(options_.at) || range_.second >= kBits) {
      throw WrongCall("name the register with --at, as 0xA20, and bits of it, as 0-7");
    }
    constexpr std::int64_t kLastAddress = 0xFFFFFFFF;
    if (CDMUtil::ToInt64(options_.at) < 0 || CDMUtil::ToInt64(options_.at) > kLastAddress) {
      throw WrongCall("an address is 0 to 0xFFFFFFFF");
    }
    at_ = CDMUtil::ToUnsignedLong(options_.at);
    constexpr std::uint32_t kLastPort = 0xFFFE;
    if (options_.chip == "g_iospace" && (at_ == 0 || at_ > kLastPort)) {
      throw WrongCall("a port is 1 to 0xFFFE");
    }
  }

  [[nodiscard]] std::string Sequence(const std::string& chip, std::string_view prefix, const char* kind,
                                     unsigned mask) const {
    return chip + std::string(prefix) + "." + kind + ".sequence=" + Hex(at_) + ":" + Hex(mask);
  }

  const TryOptions& options_;
  std::pair<unsigned, unsigned> range_;
  bool hasMasks_ = false;
  std::uint32_t at_ = 0;
};

// The installation's board files, with settings of the walk in front of the machine's own.
class WalkFiles {
 public:
  WalkFiles(const TryOptions& options, const std::string& systemId, const Lines& settings)
      : names_(BoardFilesIn(options.folder)) {
    Add(names_.detectPath, systemId, "platform=generic\nchips=" + options.chip + "\n" + Joined(settings));
    Add(names_.testPath, systemId, "test.powerled.chip=" + options.chip + "\n" + Joined(settings));
    Add(names_.chipPath, "", "");
  }

  [[nodiscard]] const BoardFiles& Names() const { return names_; }
  [[nodiscard]] const std::vector<IniOutline>& Files() const { return files_; }

 private:
  void Add(const std::string& path, const std::string& section, const std::string& keys) {
    const std::string own = ReadFile(path).value_or("");
    const IniOutline present(path, own);
    std::string text = section.empty() ? "" : "[" + section + "]\n" + keys;
    for (const IniEntry& entry : present.entries) {
      if (!section.empty() && LoweredName(entry.section) == LoweredName(section)) {
        text += entry.key + "=" + entry.value + "\n";
      }
    }
    files_.emplace_back(path, text + own);
  }

  BoardFiles names_;
  std::vector<IniOutline> files_;
};

// The machine with the files of the walk.
class WalkHost {
 public:
  WalkHost(const std::vector<IniOutline>& files, const platform::Host& machine)
      : profiles_(files),
        files_(profiles_),
        host_(HostWith(machine, {.files = &files_, .profiles = &profiles_})),
        inPlace_(host_) {}

 private:
  RecordedProfiles profiles_;
  MemoryFiles files_;
  platform::Host host_;
  platform::HostInPlace inPlace_;
};

bool WaitSlowly() {
  for (std::uint32_t waited_ms = 0; waited_ms < kSlow_ms && !StopRequest::IsMade(); waited_ms += kLook_ms) {
    platform::TheHost().clock.Sleep(kLook_ms);
  }
  return !StopRequest::IsMade();
}

// Puts everything back whatever happens.
class KeptBoard {
 public:
  KeptBoard(MotherBoard& board, std::function<void()> putBack) : board_(board), putBack_(std::move(putBack)) {}
  ~KeptBoard() {
    const std::string failure = FailureOf([&] {
      board_.RestorePowerLedState();
      putBack_();
    });
    if (!failure.empty()) {
      Tell("it could not be put back: " + failure + "\n");
    }
  }
  KeptBoard(const KeptBoard&) = delete;
  KeptBoard& operator=(const KeptBoard&) = delete;

 private:
  MotherBoard& board_;
  std::function<void()> putBack_;
};

// Lights one bit or line and asks. The answer: an LED, empty for none; nothing when the walk is to end.
std::optional<std::string> Ask(const Walk& walk, const TryOptions& options, const std::string& systemId,
                               unsigned number, const Person& person) {
  const WalkFiles files(options, systemId, walk.SettingsFor(number));
  const WalkHost host(files.Files(), platform::TheHost());
  std::unique_ptr<MotherBoard> board;
  const std::string failure = FailureOf([&] {
    board = MotherBoard::Instantiate(files.Names().detectPath, files.Names().testPath, files.Names().chipPath,
                                     "platform", systemId);
  });
  if (board == nullptr) {
    throw CannotRun("the board cannot be built" + (failure.empty() ? ": the files select none" : ": " + failure));
  }
  const KeptBoard kept(*board, walk.Kept());
  std::size_t mark = PanelMark();
  Tell(walk.NameOf(number) + ": ");
  board->SavePowerLedState();
  if (walk.HasMasks()) {
    board->AssertPowerLedGreen();
    if (!WaitSlowly()) {
      return std::nullopt;
    }
    mark = PanelMark();  // what goes dark for good with the first step is no lamp of this bit
    board->DeassertPowerLed();
    if (!WaitSlowly()) {
      return std::nullopt;
    }
    board->AssertPowerLedGreen();
  } else if (!board->BlinkPowerLedGreen()) {
    throw CannotRun(
        "the chip does not blink: its section needs powerled.green.blink.sequence with primary_led in it");
  } else {
    mark = PanelMark();
    if (!WaitSlowly() || !WaitSlowly()) {  // a period of the slowest blinker
      return std::nullopt;
    }
  }
  if (const std::string panel = PanelMoves(mark); !panel.empty() && !options.isReplayed) {
    Tell(panel + "; ");
  }
  for (;;) {
    Tell("which lamp moved? ");
    const std::optional<std::string> answer = person.answer();
    std::string word = answer ? CDMUtil::ToLower(CDMUtil::Trim(*answer)) : "q";
    if (const BoardLed* const led = FindBoardLed(word)) {
      word = led->id;  // of its other colour's name, too
    }
    if (word == "q" || word == "quit") {
      Tell("\n");
      return std::nullopt;
    }
    const auto known =
        std::find_if(kLedKeys.begin(), kLedKeys.end(), [&](const LedKeys& keys) { return keys.led == word; });
    const bool isPower = word == "power-green" || word == "power-red";
    if (word.empty() || (known != kLedKeys.end() && (walk.HasMasks() || isPower))) {
      return word;
    }
    Tell("\"" + word + "\" is no answer: press Enter for none, or type " +
         (walk.HasMasks() ? "power-green, power-red, charge-white, charge-red, drive-red, wireless"
                          : "power-green, power-red") +
         ", or q to end. ");
  }
}

Lines TestLines(const TryOptions& options, const std::map<std::string, unsigned>& found) {
  Lines lines;
  std::string last;
  for (const LedKeys& keys : kLedKeys) {
    if (found.contains(std::string(keys.led)) && keys.chipKey != last) {
      lines.push_back(std::string(keys.chipKey) + "=" + options.chip);
      last = keys.chipKey;
    }
  }
  const std::array<std::pair<const char*, const char*>, 4> supports{{{"power-red", "test.powerled.redled.support"},
                                                                     {"charge-red", "test.chargeled.redled.support"},
                                                                     {"drive-red", "test.hdled.red.support"},
                                                                     {"wireless", "test.wirelessled.support"}}};
  for (const auto& [led, key] : supports) {
    if (found.contains(led)) {
      lines.push_back(std::string(key) + "=yes");
    }
  }
  return lines;
}

std::string Sections(const TryOptions& options, const std::string& systemId, const Walk& walk,
                     const std::map<std::string, unsigned>& found) {
  const BoardFiles names = BoardFilesIn(options.folder);
  const PresentSection detect(names.detectPath, systemId);
  const PresentSection test(names.testPath, systemId);
  std::vector<std::string> chips;
  CDMUtil::Split(detect.Value("chips"), chips, ", ");
  if (std::find(chips.begin(), chips.end(), options.chip) == chips.end()) {
    chips.push_back(options.chip);
  }
  std::string list;
  for (const std::string& chip : chips) {
    list += (list.empty() ? "" : ",") + chip;
  }
  Lines lines{"platform=generic", "chips=" + list};
  const Lines settings = walk.SettingsOf(found, [&](const std::string& key) { return detect.IsThere(key); });
  lines.insert(lines.end(), settings.begin(), settings.end());
  return detect.With(lines, "mbdetect.ini") + "\n" + test.With(TestLines(options, found), "mbtest.ini");
}

// The sections are found by it.
std::string CheckedId(const std::string& systemId) {
  constexpr std::size_t kDigits = 4;
  if (systemId.size() != kDigits || systemId.find_first_not_of("0123456789ABCDEFabcdef") != std::string::npos) {
    throw WrongCall("\"" + systemId + "\" is no system id: one has four hexadecimal digits, as 7D10");
  }
  return systemId;
}

}  // namespace

int Try(const TryOptions& options, const Person& person) {
  const Walk walk(options);
  const std::string systemId = options.systemId.empty() ? MachineId() : CheckedId(options.systemId);
  if (systemId.empty()) {
    throw CannotRun("the firmware tells no system id: give one with --board");
  }
  if (!BoardDevio().LoadDriver()) {
    throw CannotRun("no driver on this machine, so that nothing can be tried");
  }
  const auto [first, last] = walk.Range();
  Tell("This walk changes " + std::string(walk.HasMasks() ? walk.Place() + ", bits " : "lines ") +
       std::to_string(first) + " to " + std::to_string(last) + (IsSimulated() ? " of a simulated machine" : "") +
       ", one at a time, and puts each back.\nWhat else hangs there moves, too. Ctrl-C or q ends it. For each, type "
       "the "
       "lamp that moved, or press Enter for none:\n" +
       (walk.HasMasks() ? "power-green, power-red, charge-white, charge-red, drive-red, wireless"
                        : "power-green, power-red") +
       "\n");
  if (options.isReplayed && IsSimulated()) {
    Tell("A trace has no panel, so that nothing can be shown of it.\n");
  }
  std::map<std::string, unsigned> found;
  for (unsigned number = first; number <= last && !StopRequest::IsMade(); ++number) {
    if (!walk.Has(number)) {
      Tell(walk.NameOf(number) + ": the chip has no such line\n");
      continue;
    }
    const std::optional<std::string> lamp = Ask(walk, options, systemId, number, person);
    if (!lamp) {
      break;
    }
    if (!lamp->empty()) {
      found.insert_or_assign(*lamp, number);
    }
  }
  if (found.empty()) {
    Tell("No lamp was found.\n");
    return 1;
  }
  Print(Sections(options, systemId, walk, found));
  return 0;
}

}  // namespace panelglow::boardtool
