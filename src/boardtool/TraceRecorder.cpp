#include <mutex>

#include "boardtool/HardwareAccess.h"
#include "boardtool/HostWith.h"
#include "boardtool/Installation.h"
#include "boardtool/Trace.h"
#include "boardtool/TraceText.h"

namespace panelglow::boardtool {

namespace {

// The file, line by line; shared by the devices, which may outlive the recorder.
class TraceFile {
 public:
  explicit TraceFile(const std::string& path) : file_(path, std::ios::binary | std::ios::trunc) {}

  void Add(const std::string& line) {
    const std::lock_guard<std::mutex> lock(guard_);
    file_ << line << '\n' << std::flush;
  }
  [[nodiscard]] bool IsGood() {
    const std::lock_guard<std::mutex> lock(guard_);
    return static_cast<bool>(file_);
  }

 private:
  std::mutex guard_;
  std::ofstream file_;
};

class TracedDevice : public platform::DriverDevice {
 public:
  TracedDevice(std::unique_ptr<platform::DriverDevice> device, std::shared_ptr<TraceFile> file)
      : device_(std::move(device)), file_(std::move(file)) {}

  std::uint32_t Control(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) override {
    const std::string request = HexBytes(in);  // `out` may be the same memory
    std::optional<HardwareAccess> access = DecodeRequest(code, in, {});
    const std::uint32_t result = device_->Control(code, in, out);
    if (access && IsRead(access->kind)) {
      access->value = DecodeRequest(code, in, out)->value;
    }
    std::string line = "control " + HexNumber(code) + " " + request + " " + HexNumber(result) + " " + HexBytes(out);
    if (access) {
      tracker_.Follow(*access);
      const std::string reg = RegisterOf(*access);
      line += " ; " + Describe(*access) +
              (IsRead(access->kind) ? ": " + Hex(access->value, static_cast<int>(2 * access->width)) : "") +
              (reg.empty() ? "" : ", " + reg);
    }
    file_->Add(line);
    return result;
  }
  std::uint32_t ReadMapped(std::uint64_t mapped, std::size_t width) override {
    const std::uint32_t value = device_->ReadMapped(mapped, width);
    file_->Add("read " + HexNumber(mapped) + " " + HexNumber(width) + " " + HexNumber(value));
    return value;
  }
  void WriteMapped(std::uint64_t mapped, std::size_t width, std::uint32_t value) override {
    device_->WriteMapped(mapped, width, value);
    file_->Add("write " + HexNumber(mapped) + " " + HexNumber(width) + " " + HexNumber(value));
  }

 private:
  std::unique_ptr<platform::DriverDevice> device_;
  std::shared_ptr<TraceFile> file_;
  IndexTracker tracker_;
};

class TracedDrivers : public platform::DriverDevices {
 public:
  TracedDrivers(platform::DriverDevices& drivers, std::shared_ptr<TraceFile> file)
      : drivers_(drivers), file_(std::move(file)) {}

  std::unique_ptr<platform::DriverDevice> Open(std::string_view linkName, std::uint32_t& error) override {
    std::unique_ptr<platform::DriverDevice> device = drivers_.Open(linkName, error);
    file_->Add("open " + std::string(linkName) + " " + HexNumber(device == nullptr ? error : 0));
    return device == nullptr ? nullptr : std::make_unique<TracedDevice>(std::move(device), file_);
  }

 private:
  platform::DriverDevices& drivers_;
  std::shared_ptr<TraceFile> file_;
};

class TracedClock : public platform::Clock {
 public:
  TracedClock(platform::Clock& clock, std::shared_ptr<TraceFile> file) : clock_(clock), file_(std::move(file)) {}

  std::uint32_t TickCount() override {
    const std::uint32_t ticks = clock_.TickCount();
    file_->Add("tick " + HexNumber(ticks));
    return ticks;
  }
  std::time_t WallTime() override {
    const std::time_t time = clock_.WallTime();
    file_->Add("time " + HexNumber(static_cast<std::uint64_t>(time)));
    return time;
  }
  std::tm LocalTime(std::time_t seconds) override { return clock_.LocalTime(seconds); }
  void Sleep(std::uint32_t milliseconds) override {
    file_->Add("sleep " + HexNumber(milliseconds) + " ; " + std::to_string(milliseconds) + " ms");
    clock_.Sleep(milliseconds);
  }

 private:
  platform::Clock& clock_;
  std::shared_ptr<TraceFile> file_;
};

}  // namespace

struct TraceRecorder::Parts {
  Parts(const std::string& filePath, platform::Host& machine)
      : path(filePath),
        file(std::make_shared<TraceFile>(filePath)),
        host(HostWith(machine, {.clock = &clock, .drivers = &drivers})),
        drivers(machine.drivers, file),
        clock(machine.clock, file) {}
  std::string path;
  std::shared_ptr<TraceFile> file;
  platform::Host host;
  TracedDrivers drivers;
  TracedClock clock;
};

TraceRecorder::TraceRecorder(const std::string& path, platform::Host& machine, bool isSimulated,
                             const std::string& systemId)
    : parts_(std::make_unique<Parts>(path, machine)) {
  parts_->file->Add(std::string(kTraceHead));
  parts_->file->Add("machine " + std::string(isSimulated ? kSimulated : kReal));
  parts_->file->Add("board " + (systemId.empty() ? std::string("-") : systemId));
  Close();
}

TraceRecorder::~TraceRecorder() = default;

platform::Host& TraceRecorder::TheHost() { return parts_->host; }

void TraceRecorder::Close() {
  if (!parts_->file->IsGood()) {
    throw CannotRun("the trace " + parts_->path + " cannot be written");
  }
}

}  // namespace panelglow::boardtool
