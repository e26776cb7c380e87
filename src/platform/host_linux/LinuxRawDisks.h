// Disks by their block devices, past the page cache.
//
// A disk that somebody uses (a mounted partition, swap, a volume on it) is opened for reading only: reading lights
// its LED, and writing back what was read could undo what another program wrote in between. The kernel tells the two
// apart by an exclusive opening, which also keeps others off while a disk is rewritten.
#pragma once

#include <mutex>
#include <set>
#include <string>

#include "platform/RawDisks.h"

namespace panelglow::platform::host_linux {

class LinuxRawDisks : public RawDisks {
 public:
  std::unique_ptr<RawDisk> Open(std::string_view path) override;
  std::unique_ptr<DiskBlock> Allocate(std::size_t size_bytes) override;

 private:
  /// Each sentence once, though every phase of a blink opens the disk anew.
  void TellOnce(const std::string& sentence);

  std::mutex guard_;
  std::set<std::string> told_;
};

}  // namespace panelglow::platform::host_linux
