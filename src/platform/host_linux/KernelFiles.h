// What the kernel tells of the machine in the files of sysfs and procfs. Every answer may be missing, malformed or
// gone a moment later: nothing here throws for that, waits for anybody, or reads more than it was told to.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace panelglow::platform::host_linux {

/// Where the kernel shows them.
struct KernelFolders {
  std::string sys = "/sys";
  std::string dev = "/dev";
  std::string proc = "/proc";
};

/// The first `most_bytes` of a regular file. Nothing when it is none, or cannot be read.
std::optional<std::string> ReadKernelBytes(const std::string& path, std::size_t most_bytes);

/// The text of an attribute without blanks and line ends around it, and with everything that does not print made '?'.
/// Empty when there is none.
std::string ReadKernelText(const std::string& path);

/// An attribute that is one number, decimal or with "0x". Nothing when it is no number, or above `largest`.
std::optional<std::uint64_t> ReadKernelNumber(const std::string& path, std::uint64_t largest);

/// The order of the kernel's counting: "host2" before "host10", "sdb" before "sdaa".
bool IsAheadOf(const std::string& one, const std::string& other);

/// The names in a folder, in that order. Empty when there is no such folder; one without end is cut.
std::vector<std::string> KernelNames(const std::string& folder);

/// Where a path leads, without links. Empty when it leads nowhere, or in a circle.
std::string RealPath(const std::string& path);

/// The last name of where a link leads; empty when there is none.
std::string LinkName(const std::string& path);

/// The names of a path.
std::vector<std::string> PathNames(const std::string& path);

}  // namespace panelglow::platform::host_linux
