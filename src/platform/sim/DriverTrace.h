// The one ordered list of driver requests of a run.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <string>
#include <vector>

#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

/// One request with its answer. Accesses to mapped memory stand between the requests, with the codes below.
struct DriverRequest {
  static constexpr std::uint32_t kMappedRead = 1;
  static constexpr std::uint32_t kMappedWrite = 2;

  Microseconds time = 0;
  ThreadId thread = 0;
  std::uint32_t code = 0;
  std::uint32_t result = 0;
  std::vector<std::byte> in;
  std::vector<std::byte> out;
};

/// A line for people: time, the request in words where it is a port or memory access, in bytes otherwise.
std::string Describe(const DriverRequest& request);

class DriverTrace {
 public:
  /// Keeps every request from now on in memory.
  void Keep() { keep_ = true; }

  /// Writes a line per request to a file, which the caller keeps open.
  void WriteTo(std::FILE* file) { file_ = file; }

  void Add(DriverRequest request);

  [[nodiscard]] bool IsWanted() const { return keep_ || file_ != nullptr; }
  [[nodiscard]] const std::vector<DriverRequest>& Requests() const { return requests_; }
  void Clear() { requests_.clear(); }

 private:
  bool keep_ = false;
  std::FILE* file_ = nullptr;
  std::vector<DriverRequest> requests_;
};

}  // namespace panelglow::platform::sim
