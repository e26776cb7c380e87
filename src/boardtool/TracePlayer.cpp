#include <charconv>
#include <chrono>
#include <optional>
#include <sstream>

#include "boardtool/AlwaysRunningServices.h"
#include "boardtool/HostWith.h"
#include "boardtool/Installation.h"
#include "boardtool/Trace.h"
#include "boardtool/TraceText.h"

namespace panelglow::boardtool {

namespace {

// The requests of a trace, in order.
class TraceScript {
 public:
  TraceScript(std::string path, const std::string& text) : path_(std::move(path)) {
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
      if (const std::size_t comment = line.find(" ;"); comment != std::string::npos) {
        line.resize(comment);
      }
      if (line.ends_with('\r')) {
        line.pop_back();
      }
      lines_.push_back(std::move(line));
    }
  }

  /// Only the first reason counts: from then on nothing is answered any more. Nothing is thrown, since requests are
  /// made while others unwind.
  void Refuse(const std::string& why) {
    if (failure_.empty()) {
      failure_ = path_ + ":" + std::to_string(next_) + ": " + why;
    }
  }
  [[nodiscard]] const std::string& Failure() const { return failure_; }

  /// What stands behind `request` in the next line; nothing when the trace has another request there.
  std::optional<std::string> Next(const std::string& request) {
    if (!failure_.empty()) {
      return std::nullopt;
    }
    const std::string line = next_ < lines_.size() ? lines_[next_] : std::string("its end");
    ++next_;
    if (!line.starts_with(request) || (line.size() > request.size() && line[request.size()] != ' ')) {
      constexpr std::size_t kLongest = 100;
      Refuse("the trace has \"" + line.substr(0, kLongest) + "\" where the program asks \"" +
             request.substr(0, kLongest) +
             "\": it was recorded by another verb, with other files or another version");
      return std::nullopt;
    }
    return line.size() > request.size() ? line.substr(request.size() + 1) : std::string();
  }

  /// The number that is the answer to `request`.
  std::optional<std::uint64_t> NextNumber(const std::string& request) {
    const std::optional<std::string> answer = Next(request);
    return answer ? Number(*answer) : std::nullopt;
  }

  std::optional<std::uint64_t> Number(const std::string& text) {
    std::uint64_t number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, 16);
    if (text.empty() || error != std::errc() || end != text.data() + text.size()) {
      Refuse("a number is missing or damaged");
      return std::nullopt;
    }
    return number;
  }

  bool Bytes(const std::string& text, std::span<std::byte> out) {
    if (text == "-" && out.empty()) {
      return true;
    }
    if (text.size() != 2 * out.size()) {
      Refuse("an answer of " + std::to_string(out.size()) + " bytes is needed here");
      return false;
    }
    for (std::size_t i = 0; i < out.size(); ++i) {
      const std::optional<std::uint64_t> byte = Number(text.substr(2 * i, 2));
      if (!byte) {
        return false;
      }
      out[i] = static_cast<std::byte>(*byte);
    }
    return true;
  }

  [[nodiscard]] std::size_t Left() const { return next_ < lines_.size() ? lines_.size() - next_ : 0; }

 private:
  std::string path_;
  std::vector<std::string> lines_;
  std::size_t next_ = 0;
  std::string failure_;
};

constexpr std::uint32_t kNoAnswer = 31;  // "a device attached to the system is not functioning"

class PlayedDevice : public platform::DriverDevice {
 public:
  explicit PlayedDevice(std::shared_ptr<TraceScript> script) : script_(std::move(script)) {}

  std::uint32_t Control(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) override {
    const std::string answer = script_->Next("control " + HexNumber(code) + " " + HexBytes(in)).value_or("");
    const std::size_t blank = answer.find(' ');
    if (blank == std::string::npos) {
      script_->Refuse("the answer lacks its bytes");
      return kNoAnswer;
    }
    const std::optional<std::uint64_t> result = script_->Number(answer.substr(0, blank));
    return result && script_->Bytes(answer.substr(blank + 1), out) ? static_cast<std::uint32_t>(*result) : kNoAnswer;
  }
  std::uint32_t ReadMapped(std::uint64_t mapped, std::size_t width) override {
    const auto value = script_->NextNumber("read " + HexNumber(mapped) + " " + HexNumber(width));
    return static_cast<std::uint32_t>(value.value_or(0));
  }
  void WriteMapped(std::uint64_t mapped, std::size_t width, std::uint32_t value) override {
    script_->Next("write " + HexNumber(mapped) + " " + HexNumber(width) + " " + HexNumber(value));
  }

 private:
  std::shared_ptr<TraceScript> script_;
};

class PlayedDrivers : public platform::DriverDevices {
 public:
  explicit PlayedDrivers(std::shared_ptr<TraceScript> script) : script_(std::move(script)) {}

  std::unique_ptr<platform::DriverDevice> Open(std::string_view linkName, std::uint32_t& error) override {
    error = static_cast<std::uint32_t>(script_->NextNumber("open " + std::string(linkName)).value_or(kNoAnswer));
    return error == 0 ? std::make_unique<PlayedDevice>(script_) : nullptr;
  }

 private:
  std::shared_ptr<TraceScript> script_;
};

class PlayedClock : public platform::Clock {
 public:
  explicit PlayedClock(std::shared_ptr<TraceScript> script) : script_(std::move(script)) {}

  std::uint32_t TickCount() override {
    // Behind a failure it runs on, so that who watches it ends.
    last_ = static_cast<std::uint32_t>(script_->NextNumber("tick").value_or(last_ + 1));
    return last_;
  }
  std::time_t WallTime() override { return static_cast<std::time_t>(script_->NextNumber("time").value_or(0)); }
  // Without the zone of the machine, which a trace does not tell.
  std::tm LocalTime(std::time_t seconds) override {
    const std::chrono::sys_seconds moment{std::chrono::seconds(seconds)};
    const auto day = std::chrono::floor<std::chrono::days>(moment);
    const std::chrono::year_month_day date(day);
    const std::chrono::hh_mm_ss clock(moment - day);
    std::tm time{};
    time.tm_year = static_cast<int>(date.year()) - 1900;
    time.tm_mon = static_cast<int>(static_cast<unsigned>(date.month())) - 1;
    time.tm_mday = static_cast<int>(static_cast<unsigned>(date.day()));
    time.tm_hour = static_cast<int>(clock.hours().count());
    time.tm_min = static_cast<int>(clock.minutes().count());
    time.tm_sec = static_cast<int>(clock.seconds().count());
    return time;
  }
  void Sleep(std::uint32_t milliseconds) override { script_->Next("sleep " + HexNumber(milliseconds)); }

 private:
  std::shared_ptr<TraceScript> script_;
  std::uint32_t last_ = 0;
};

std::shared_ptr<TraceScript> ScriptIn(const std::string& path) {
  const std::optional<std::string> text = ReadFile(path);
  if (!text) {
    throw CannotRun("the trace " + path + " cannot be read");
  }
  if (!text->starts_with(kTraceHead)) {
    throw CannotRun(path + " is no trace of panelglow-board");
  }
  return std::make_shared<TraceScript>(path, *text);
}

}  // namespace

struct TracePlayer::Parts {
  Parts(const std::string& path, platform::Host& machine)
      : script(ScriptIn(path)),
        host(HostWith(machine, {.clock = &clock, .drivers = &drivers, .services = &services})) {}
  std::shared_ptr<TraceScript> script;
  PlayedDrivers drivers{script};
  PlayedClock clock{script};
  AlwaysRunningServices services;
  platform::Host host;
  std::string systemId;
};

TracePlayer::TracePlayer(const std::string& path, platform::Host& machine, bool mayBeSimulated)
    : parts_(std::make_unique<Parts>(path, machine)) {
  parts_->script->Next(std::string(kTraceHead));
  if (parts_->script->Next("machine").value_or("") != kReal && !mayBeSimulated) {
    throw CannotRun(path + " was recorded on a simulated machine: play it with panelglow-board-sim");
  }
  parts_->systemId = parts_->script->Next("board").value_or("");
  Check();
  if (parts_->systemId == "-") {
    parts_->systemId.clear();
  }
}

TracePlayer::~TracePlayer() = default;

platform::Host& TracePlayer::TheHost() { return parts_->host; }
const std::string& TracePlayer::SystemId() const { return parts_->systemId; }
std::size_t TracePlayer::Left() const { return parts_->script->Left(); }

void TracePlayer::Check() const {
  if (!parts_->script->Failure().empty()) {
    throw CannotRun(parts_->script->Failure());
  }
}

}  // namespace panelglow::boardtool
