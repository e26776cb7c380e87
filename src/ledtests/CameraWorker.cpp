// The worker of a webcam's LED, which is lit while the camera captures: a capture graph is built once, and run and
// stopped in turn.
#include <memory>
#include <sstream>
#include <string>

#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "ledtests/BlinkLoop.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/PutBack.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

using platform::CapturePart;
using platform::CaptureResult;

bool HasFailed(CaptureResult result) { return result < 0; }

void Note(FrontPanelTest& test, const char* text, CaptureResult result) { test.webcamLog << text << result << '\n'; }

CaptureResult CustomGetInterfaces(FrontPanelTest& test, platform::CaptureGraph& graph) {
  struct Step {
    CapturePart part;
    const char* failure;
  };
  constexpr Step kSteps[] = {{CapturePart::kGraph, "CLSID_FilterGraph CoCreateInstance FAILED!! "},
                             {CapturePart::kBuilder, "CLSID_CaptureGraphBuilder2 CoCreateInstance FAILED!! "},
                             {CapturePart::kControl, "QueryInterface IID_IMediaControl FAILED!! "},
                             {CapturePart::kVideoWindow, "QueryInterface IID_IVideoWindow FAILED!! "}};
  for (const Step& step : kSteps) {
    const CaptureResult result = graph.Make(step.part);
    if (HasFailed(result)) {
      test.webcamLog << step.failure << '\n';
      return result;
    }
  }
  return 0;
}

// The first video device that can be bound is the one.
bool CustomGetBaseFilter(FrontPanelTest& test, platform::CaptureGraph& graph) {
  test.webcamLog << "Discovering video base filter...\n";
  if (!graph.MakeDeviceEnumerator()) {
    return false;
  }
  const std::unique_ptr<platform::CaptureDevices> devices = graph.OpenVideoInputs();
  if (!devices) {
    test.webcamLog << "No video capturing device found\n";
    return false;
  }
  while (devices->Next()) {
    if (devices->Bind()) {
      test.webcamLog << "    Acquired filter successfully\n";
      return true;
    }
  }
  return false;
}

CaptureResult CustomAddSampleGrabber(platform::CaptureGraph& graph) {
  const CaptureResult made = graph.MakeGrabber();
  return HasFailed(made) ? made : graph.AddGrabber();
}

// A window that cannot be hidden is no reason not to blink.
void CustomDisableWindow(FrontPanelTest& test, platform::CaptureGraph& graph) {
  const CaptureResult result = graph.HideVideoWindow();
  if (HasFailed(result)) {
    Note(test, "Failed to Disable the Window!  hr=", result);
  }
}

bool BuildGraph(FrontPanelTest& test, platform::CaptureGraph& graph) {
  const auto failed = [&](CaptureResult result, const char* text) {
    if (HasFailed(result)) {
      Note(test, text, result);
    }
    return HasFailed(result);
  };
  if (failed(graph.Initialize(), "Failed to init COM!  hr=") ||
      failed(CustomGetInterfaces(test, graph), "Failed to get video interfaces!  hr=") ||
      failed(graph.SetFilterGraph(), "Failed to set capture filter graph!  hr=")) {
    return false;
  }
  if (!CustomGetBaseFilter(test, graph)) {
    test.webcamLog << "No video capture device was detected on this system\n";
    return false;
  }
  return !failed(graph.AddCaptureFilter(), "Couldn't add the capture filter to the graph!  hr=") &&
         !failed(CustomAddSampleGrabber(graph), "Couldn't add the SampleGrabber filter to the graph!   hr=") &&
         !failed(graph.RenderStream(), "Couldn't render the video capture stream.  hr=");
}

// True after the blink, false on any failure.
bool CustomWebCamLedTest(FrontPanelTest& test, const LEDStruct& entry) {
  const std::unique_ptr<platform::CaptureGraph> graph = platform::TheHost().cameras.NewGraph();
  if (!graph || !BuildGraph(test, *graph)) {
    return false;
  }
  CustomDisableWindow(test, *graph);
  const PutBack stopped([&] { graph->Stop(); });
  BlinkLoop(
      entry, kPhase_ms, [&] { graph->Run(); }, [&] { graph->Stop(); });
  return true;
}

void LogStep(const FrontPanelTest& test, const char* text) {
  if (test.rules.writesLines) {
    CDMout::LogMessage(LogOptions::Status, kFreeText, text);
  }
}

}  // namespace

void CustomBlinkWebcamLED(FrontPanelTest& test, LEDStruct& entry) {
  LogStep(test, "BWL: Method Start");
  entry.workerStarted = true;
  CustomWebCamLedTest(test, entry);
  entry.workerFinished = true;
  LogStep(test, "BWL: Method End");
}

}  // namespace panelglow
