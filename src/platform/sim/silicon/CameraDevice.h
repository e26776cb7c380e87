// A camera whose lamp is lit while it captures.
#pragma once

#include <array>
#include <optional>
#include <string>
#include <string_view>

#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

/// The steps from nothing to a capture that runs, in their order.
enum class CaptureStep {
  kInitialize,
  kMakeGraph,
  kMakeBuilder,
  kMakeControl,
  kMakeVideoWindow,
  kSetFilterGraph,
  kMakeEnumerator,
  kOpenInputs,
  kBind,
  kAddCaptureFilter,
  kMakeGrabber,
  kAddGrabber,
  kRender,
  kHideWindow,
  kRun,
  kStop,
};

/// Names of the steps in a machine's file; the first is of no step.
inline constexpr std::array<std::string_view, 17> kCaptureFaults{"",
                                                                 "initialize",
                                                                 "make-graph",
                                                                 "make-builder",
                                                                 "make-control",
                                                                 "make-video-window",
                                                                 "set-filter-graph",
                                                                 "make-enumerator",
                                                                 "open-inputs",
                                                                 "bind",
                                                                 "add-capture-filter",
                                                                 "make-grabber",
                                                                 "add-grabber",
                                                                 "render",
                                                                 "hide-window",
                                                                 "run",
                                                                 "stop"};

struct CameraSetup {
  std::string name;
  Microseconds build_us = 0;  // how long rendering its stream takes
  std::optional<CaptureStep> fault;
  std::optional<Microseconds> goneAt;
};

/// One at a time can use it.
class CameraDevice : public Device {
 public:
  CameraDevice(CameraSetup setup, const Scheduler& time) : setup_(std::move(setup)), time_(time) {}

  [[nodiscard]] const CameraSetup& Setup() const { return setup_; }
  [[nodiscard]] bool IsGone() const { return setup_.goneAt && time_.Now() >= *setup_.goneAt; }

  /// False when another one captures from it.
  bool Start(const void* user);

  /// Nothing happens when the user does not capture.
  void Stop(const void* user);

  /// Pin "capture".
  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<Microseconds> NextEvent() const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  [[nodiscard]] bool IsCapturing() const { return user_ != nullptr && !IsGone(); }

  CameraSetup setup_;
  const Scheduler& time_;
  const void* user_ = nullptr;
};

}  // namespace panelglow::platform::sim
