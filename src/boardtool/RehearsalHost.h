// The machine of a rehearsal: imagined hardware, files in memory, a clock that nobody waits for, and nothing else
// that could be changed. What the board library tells people is kept.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "boardtool/ImaginedHardware.h"
#include "boardtool/RecordedProfiles.h"
#include "platform/AbsentDevices.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

class RehearsalHost {
 public:
  /// `files` stay where they are while this object lives. `machine` lends the services that a rehearsal never calls.
  RehearsalHost(std::span<const IniOutline> files, platform::Host& machine);
  ~RehearsalHost();
  RehearsalHost(const RehearsalHost&) = delete;
  RehearsalHost& operator=(const RehearsalHost&) = delete;

  [[nodiscard]] platform::Host& TheHost();
  [[nodiscard]] RecordedProfiles& Profiles();

  /// Puts hardware in place that has not been touched.
  void NewHardware(std::uint8_t background);
  [[nodiscard]] ImaginedHardware& Hardware();

  /// What was told to people since the last call, a sentence each, without the program's name in front.
  [[nodiscard]] std::vector<std::string> TakeNotices();

  /// While it exists, nothing that is told is kept.
  class Hush {
   public:
    explicit Hush(RehearsalHost& host);
    ~Hush();
    Hush(const Hush&) = delete;
    Hush& operator=(const Hush&) = delete;

   private:
    RehearsalHost& host_;
  };

 private:
  struct Parts;
  std::unique_ptr<Parts> parts_;
};

}  // namespace panelglow::boardtool
