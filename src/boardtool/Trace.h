// What a run asked of the driver and the clock, in a file, and a machine that answers from such a file.
//
// A trace is text: a head that names the board and says whether the machine was a real one, then a line for each
// request in order, with its answer. What stands behind ";" is for people.
#pragma once

#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "platform/Host.h"

namespace panelglow::boardtool {

/// Writes a trace while it exists: stands in front of the machine's driver and clock.
class TraceRecorder {
 public:
  /// Throws CannotRun when the file cannot be written.
  TraceRecorder(const std::string& path, platform::Host& machine, bool isSimulated, const std::string& systemId);
  ~TraceRecorder();
  TraceRecorder(const TraceRecorder&) = delete;
  TraceRecorder& operator=(const TraceRecorder&) = delete;

  [[nodiscard]] platform::Host& TheHost();

  /// Throws CannotRun when not everything could be written.
  void Close();

 private:
  struct Parts;
  std::unique_ptr<Parts> parts_;
};

/// Answers from a trace, strictly in order. From a request on that is not the next one of the trace, nothing is
/// answered any more, and Check says where they part. No time passes.
class TracePlayer {
 public:
  /// Throws CannotRun for a file that is no trace, and for one of a simulated machine unless those are welcome.
  TracePlayer(const std::string& path, platform::Host& machine, bool mayBeSimulated);
  ~TracePlayer();
  TracePlayer(const TracePlayer&) = delete;
  TracePlayer& operator=(const TracePlayer&) = delete;

  [[nodiscard]] platform::Host& TheHost();
  [[nodiscard]] const std::string& SystemId() const;

  /// Throws CannotRun when a request was not the next one of the trace.
  void Check() const;

  /// How many requests of the trace were not asked for.
  [[nodiscard]] std::size_t Left() const;

 private:
  struct Parts;
  std::unique_ptr<Parts> parts_;
};

}  // namespace panelglow::boardtool
