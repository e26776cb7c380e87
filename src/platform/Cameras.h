// Video capture: a graph of filters from the first capture device to a grabber that nobody reads, with no window on
// the screen.
#pragma once

#include <cstdint>
#include <memory>

namespace panelglow::platform {

/// A result of the capture service: 0 or above is success, below 0 a failure's number.
using CaptureResult = std::int32_t;

/// What is made for a capture graph one after the other.
enum class CapturePart { kGraph, kBuilder, kControl, kVideoWindow };

/// The devices of the video input category; walked once from the first on.
class CaptureDevices {
 public:
  virtual ~CaptureDevices() = default;

  /// Moves on to the next device. False behind the last.
  virtual bool Next() = 0;

  /// Binds the present device's capture filter to the graph that the list came from. False when that cannot be.
  virtual bool Bind() = 0;
};

/// One capture graph, and the thread's use of the service. Each step can fail by itself, and none is called before
/// those ahead of it have succeeded. Everything is released with the object, a capture that runs is stopped.
class CaptureGraph {
 public:
  virtual ~CaptureGraph() = default;

  virtual CaptureResult Initialize() = 0;
  virtual CaptureResult Make(CapturePart part) = 0;
  virtual CaptureResult SetFilterGraph() = 0;

  // The search for a device: null where there is no enumerator service, or no device category with entries.
  virtual bool MakeDeviceEnumerator() = 0;
  virtual std::unique_ptr<CaptureDevices> OpenVideoInputs() = 0;

  virtual CaptureResult AddCaptureFilter() = 0;
  virtual CaptureResult MakeGrabber() = 0;
  virtual CaptureResult AddGrabber() = 0;
  virtual CaptureResult RenderStream() = 0;

  /// Takes the video window off the screen: owner, style, place, extended style, hidden; the last step's result.
  virtual CaptureResult HideVideoWindow() = 0;

  virtual CaptureResult Run() = 0;
  virtual CaptureResult Stop() = 0;
};

class Cameras {
 public:
  virtual ~Cameras() = default;
  virtual std::unique_ptr<CaptureGraph> NewGraph() = 0;
};

}  // namespace panelglow::platform
