// A disk: its content, its activity lamp, and a watch over what is written to it.
#pragma once

#include <cstddef>
#include <cstdio>
#include <map>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

struct DiskSetup {
  enum class Fault { kNone, kNoOpen, kReadError, kWriteError, kSlow };

  std::string name;
  std::string controller;  // name of the controller that it hangs on
  std::string instanceId;
  std::string path;           // of the drive, as \\.\PHYSICALDRIVE0
  std::string interfacePath;  // empty: a device that is no disk to the system
  std::string description;
  std::string file;  // that holds its content, of its size; empty: the content lives in memory
  std::uint64_t size_bytes = 0;
  Microseconds latency_us = 0;  // of a request
  Microseconds glow_us = 0;     // how long its lamp outlasts a request
  Fault fault = Fault::kNone;
  std::optional<Microseconds> goneAt;
};

/// The lamp is lit while a request is under way and a little longer. Of content in memory nothing is stored before it
/// is read or written: an untouched page holds numbers that follow from its place.
class DiskDevice : public Device {
 public:
  /// The one place of a disk that a test may write: outside of it lie a stranger's data.
  static constexpr AddressRange kTestBlock{0x100000, 0x8000};

  /// Throws MachineError when its file cannot be used.
  DiskDevice(DiskSetup setup, const Scheduler& time);

  [[nodiscard]] const DiskSetup& Setup() const { return setup_; }
  [[nodiscard]] bool IsGone() const { return setup_.goneAt && time_.Now() >= *setup_.goneAt; }

  // Around the time that a request takes.
  void BeginRequest() { ++underWay_; }
  void EndRequest();

  // The range must lie on the disk. False when the file behind it does not take the request.
  [[nodiscard]] bool Load(std::uint64_t position, std::span<std::byte> bytes);
  [[nodiscard]] bool Store(std::uint64_t position, std::span<const std::byte> bytes);

  /// Notes a write that no test may make.
  void NoteForbiddenWrite(std::uint64_t position, std::size_t size_bytes);

  /// Pin "activity".
  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<Microseconds> NextEvent() const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  static constexpr std::size_t kPageBytes = 0x8000;
  using Page = std::vector<std::byte>;

  [[nodiscard]] Page OriginalPage(std::uint64_t number) const;
  [[nodiscard]] bool SeekFile(std::uint64_t position) const;
  [[nodiscard]] Page PageInFile(std::uint64_t number) const;
  Page& PageAt(std::uint64_t number);
  [[nodiscard]] std::uint64_t ContentHash() const;

  DiskSetup setup_;
  const Scheduler& time_;
  unsigned underWay_ = 0;
  Microseconds litUntil_ = 0;
  struct CloseFile {
    void operator()(std::FILE* file) const { std::fclose(file); }
  };
  std::unique_ptr<std::FILE, CloseFile> file_;  // without a buffer; none: the content is in pages_
  std::map<std::uint64_t, Page> pages_;         // by number, those that were touched; of a file as they were before
  std::size_t forbiddenWrites_ = 0;
  std::string firstForbidden_;
};

}  // namespace panelglow::platform::sim
