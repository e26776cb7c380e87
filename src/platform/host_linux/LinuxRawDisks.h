// Disks by their block devices, past the page cache.
//
// A disk that somebody uses (a mounted partition, swap, a volume on it) is opened for reading only: reading lights
// its LED, and writing back what was read could undo what another program wrote in between. The kernel tells the two
// apart by an exclusive opening, which also keeps others off while a disk is rewritten. It would keep us off as well:
// a phase that begins while a slow disk still serves the one before has the same opening. The last one is kept beyond
// its phase: after each closing, the system looks at the disk anew, and its LED would flicker in the dark phase.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>

#include "platform/RawDisks.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::host_linux {

class LinuxRawDisks : public RawDisks {
 public:
  std::unique_ptr<RawDisk> Open(std::string_view path) override;
  std::unique_ptr<DiskBlock> Allocate(std::size_t size_bytes) override;

 private:
  struct OpenDisk;
  class Disk;

  /// The disk as it is open by us already, or opened now; null with a word to people. `node` tells its device file
  /// from a later one of that name.
  std::shared_ptr<const OpenDisk> Find(const std::string& path, std::uint64_t node);

  // Every phase of a blink opens the disk anew.
  posix::OnceTeller teller_;
  std::mutex guard_;
  std::map<std::string, std::weak_ptr<const OpenDisk>> open_;
  std::shared_ptr<const OpenDisk> last_;
};

}  // namespace panelglow::platform::host_linux
