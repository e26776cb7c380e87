#include "boardtool/RehearsalHost.h"

#include <array>
#include <utility>

#include "boardtool/AlwaysRunningServices.h"
#include "boardtool/MemoryFiles.h"

namespace panelglow::boardtool {

namespace {

using platform::ManagementArray;
using platform::ManagementScalar;

class RehearsalClock : public platform::Clock {
 public:
  explicit RehearsalClock(std::shared_ptr<ImaginedHardware>& hardware) : hardware_(hardware) {}

  /// Every look at the clock takes a millisecond, so that a loop that watches it ends.
  std::uint32_t TickCount() override { return now_ms_++; }
  std::time_t WallTime() override { return 0; }
  std::tm LocalTime(std::time_t /*seconds*/) override {
    std::tm time{};
    time.tm_year = 70;
    time.tm_mday = 1;
    return time;
  }
  void Sleep(std::uint32_t milliseconds) override {
    now_ms_ += milliseconds;
    hardware_->AddWait(milliseconds);
  }

 private:
  std::shared_ptr<ImaginedHardware>& hardware_;
  std::uint32_t now_ms_ = 1;
};

class RehearsalConsole : public platform::Console {
 public:
  void Write(std::string_view /*bytes*/) override {}  // the protocol's lines mean nothing here
  void WriteError(std::string_view bytes) override { told += isHushed ? std::string_view() : bytes; }
  void SetControlHandler(std::function<bool(std::uint32_t type)> /*handler*/) override {}

  std::string told;
  bool isHushed = false;
};

/// A processor without anything to tell, in a system of 64 bits.
class RehearsalCpu : public platform::Cpu {
 public:
  platform::CpuidRegisters Cpuid(std::uint32_t /*leaf*/) override { return {}; }
  bool Is64BitSystem() override { return true; }
  std::uint64_t Affinity() override { return 1; }
  bool SetAffinity(std::uint64_t /*mask*/) override { return true; }
};

/// Nobody else is there to wait for.
class RehearsalMutexes : public platform::NamedMutexes {
 public:
  platform::MutexHandle Create(std::string_view /*name*/) override { return 1; }
  void WaitFor(platform::MutexHandle /*mutex*/) override {}
  bool Release(platform::MutexHandle /*mutex*/) override { return true; }
};

/// A firmware that takes every call and answers zeros.
class RehearsalFirmware : public platform::Management {
 public:
  explicit RehearsalFirmware(std::shared_ptr<ImaginedHardware>& hardware) : hardware_(hardware) {}
  std::unique_ptr<platform::ManagementConnection> Connect(std::string_view nameSpace,
                                                          platform::ManagementError& error) override;

 private:
  std::shared_ptr<ImaginedHardware>& hardware_;
};

class FirmwareConnection : public platform::ManagementConnection {
 public:
  explicit FirmwareConnection(ImaginedHardware& hardware) : hardware_(hardware) {}

  std::optional<std::vector<platform::ManagementRow>> Query(std::u16string_view query) override {
    if (query.find(u"tmbBIntM") == std::u16string_view::npos) {
      return std::nullopt;
    }
    platform::ManagementRow row;
    row.Set(u"__RELPATH", {ManagementScalar(wstring(u"tmbBIntM.InstanceName=\"0\""))});
    return std::vector{row};
  }

  platform::ManagementCallResult Call(const platform::ManagementCall& call) override {
    constexpr std::array<std::uint8_t, 4> kDone{0x50, 0x41, 0x53, 0x53};
    constexpr std::size_t kLongestAnswer = 4096;
    hardware_.AddFirmwareCall(call);
    platform::ManagementCallResult result;
    result.output.Set(u"Sign", {ManagementArray(kDone.begin(), kDone.end())});
    result.output.Set(u"Data", {ManagementArray(kLongestAnswer, ManagementScalar(std::uint8_t{0}))});
    return result;
  }

 private:
  ImaginedHardware& hardware_;
};

std::unique_ptr<platform::ManagementConnection> RehearsalFirmware::Connect(std::string_view /*nameSpace*/,
                                                                           platform::ManagementError& /*error*/) {
  return std::make_unique<FirmwareConnection>(*hardware_);
}

}  // namespace

struct RehearsalHost::Parts {
  Parts(std::span<const IniOutline> iniFiles, platform::Host& machine)
      : profiles(iniFiles),
        host{.cameras = absent,
             .clock = clock,
             .connections = absent,
             .console = console,
             .cpu = cpu,
             .desktop = machine.desktop,
             .deviceTree = absent,
             .drivers = drivers,
             .environment = machine.environment,
             .files = files,
             .images = machine.images,
             .keyboard = machine.keyboard,
             .management = firmware,
             .modules = absent,
             .mutexes = mutexes,
             .profiles = profiles,
             .rawDisks = absent,
             .registry = absent,
             .services = services,
             .threads = machine.threads,
             .touchpad = machine.touchpad,
             .xmlDocuments = machine.xmlDocuments} {}

  std::shared_ptr<ImaginedHardware> hardware = std::make_shared<ImaginedHardware>(std::uint8_t{0});
  RecordedProfiles profiles;
  RehearsalClock clock{hardware};
  RehearsalConsole console;
  MemoryFiles files{profiles};
  RehearsalCpu cpu;
  RehearsalMutexes mutexes;
  AlwaysRunningServices services;
  RehearsalFirmware firmware{hardware};
  ImaginedDrivers drivers{hardware};
  platform::AbsentDevices absent;
  platform::Host host;
};

RehearsalHost::RehearsalHost(std::span<const IniOutline> files, platform::Host& machine)
    : parts_(std::make_unique<Parts>(files, machine)) {}
RehearsalHost::~RehearsalHost() = default;

platform::Host& RehearsalHost::TheHost() { return parts_->host; }
RecordedProfiles& RehearsalHost::Profiles() { return parts_->profiles; }
ImaginedHardware& RehearsalHost::Hardware() { return *parts_->hardware; }

// The driver's device that the board library holds stays open: the hardware behind it changes.
void RehearsalHost::NewHardware(std::uint8_t background) { *parts_->hardware = ImaginedHardware(background); }

RehearsalHost::Hush::Hush(RehearsalHost& host) : host_(host) { host_.parts_->console.isHushed = true; }
RehearsalHost::Hush::~Hush() { host_.parts_->console.isHushed = false; }

std::vector<std::string> RehearsalHost::TakeNotices() {
  std::vector<std::string> notices;
  std::string_view rest = parts_->console.told;
  while (!rest.empty()) {
    const std::size_t end = std::min(rest.find('\n'), rest.size() - 1);
    std::string_view line = rest.substr(0, end);
    if (const std::size_t name = line.find(": "); name != std::string_view::npos) {
      line.remove_prefix(name + 2);
    }
    notices.emplace_back(line);
    rest.remove_prefix(end + 1);
  }
  parts_->console.told.clear();
  return notices;
}

}  // namespace panelglow::boardtool
