#include "platform/sim/SimCameras.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace panelglow::platform::sim {

namespace {

constexpr Microseconds kStepCost_us = 1000;

constexpr CaptureResult kSuccess = 0;
constexpr auto kFailure = static_cast<CaptureResult>(0x80004005);
constexpr auto kOutOfOrder = static_cast<CaptureResult>(0x8000FFFF);
constexpr auto kNotConnected = static_cast<CaptureResult>(0x8007048F);
constexpr auto kBusy = static_cast<CaptureResult>(0x800700AA);

}  // namespace

class SimCameras::Graph : public CaptureGraph {
 public:
  explicit Graph(SimCameras& owner) : owner_(owner) {}
  ~Graph() override {
    if (camera_ != nullptr) {
      camera_->Stop(this);
      owner_.context_.moved();
    }
  }
  Graph(const Graph&) = delete;
  Graph& operator=(const Graph&) = delete;

  CaptureResult Initialize() override { return Take(CaptureStep::kInitialize); }
  CaptureResult Make(CapturePart part) override {
    return Take(static_cast<CaptureStep>(static_cast<int>(CaptureStep::kMakeGraph) + static_cast<int>(part)));
  }
  CaptureResult SetFilterGraph() override { return Take(CaptureStep::kSetFilterGraph); }
  bool MakeDeviceEnumerator() override { return Take(CaptureStep::kMakeEnumerator) == kSuccess; }
  std::unique_ptr<CaptureDevices> OpenVideoInputs() override;
  CaptureResult AddCaptureFilter() override { return Take(CaptureStep::kAddCaptureFilter); }
  CaptureResult MakeGrabber() override { return Take(CaptureStep::kMakeGrabber); }
  CaptureResult AddGrabber() override { return Take(CaptureStep::kAddGrabber); }
  CaptureResult RenderStream() override {
    if (camera_ != nullptr) {
      owner_.context_.scheduler.Spend(camera_->Setup().build_us);
    }
    return Take(CaptureStep::kRender);
  }
  CaptureResult HideVideoWindow() override {
    const CaptureStep done = done_;
    const CaptureResult result = Take(CaptureStep::kHideWindow);
    done_ = done;  // with a window on the screen it captures all the same
    return result;
  }

  CaptureResult Run() override {
    const CaptureResult result = Control(CaptureStep::kRun);
    if (result == kSuccess && !owner_.context_.Ignores(camera_->Setup().name)) {
      if (!camera_->Start(this)) {
        return kBusy;
      }
      owner_.context_.moved();
    }
    return result;
  }
  CaptureResult Stop() override {
    const CaptureResult result = Control(CaptureStep::kStop);
    if (result == kSuccess) {
      camera_->Stop(this);
      owner_.context_.moved();
    }
    return result;
  }

  bool Bind(CameraDevice& camera) {
    CameraDevice* const former = std::exchange(camera_, &camera);
    const bool bound = owner_.IsThere(camera) && Take(CaptureStep::kBind) == kSuccess;
    camera_ = bound ? &camera : former;
    return bound;
  }

 private:
  // Whether this step fails: by the camera that is bound, and ahead of binding by any of the machine's.
  [[nodiscard]] bool Fails(CaptureStep step) const {
    if (step >= CaptureStep::kBind) {
      return camera_ != nullptr && camera_->Setup().fault == step;
    }
    return std::any_of(owner_.cameras_.begin(), owner_.cameras_.end(),
                       [&](const CameraDevice* camera) { return camera->Setup().fault == step; });
  }

  // A step of the way to a rendered graph; what it needs must have been done.
  CaptureResult Take(CaptureStep step) {
    owner_.context_.scheduler.Spend(kStepCost_us);
    const int ahead = static_cast<int>(step) - (begun_ ? static_cast<int>(done_) : -1);
    if (ahead > 1) {
      return kOutOfOrder;
    }
    if (Fails(step)) {
      return kFailure;
    }
    if (camera_ != nullptr && !owner_.IsThere(*camera_)) {
      return kNotConnected;
    }
    begun_ = true;
    done_ = std::max(done_, step);
    return kSuccess;
  }

  CaptureResult Control(CaptureStep step) {
    owner_.context_.scheduler.Spend(kStepCost_us);
    if (done_ < CaptureStep::kRender) {
      return kOutOfOrder;
    }
    if (!owner_.IsThere(*camera_)) {
      return kNotConnected;
    }
    return Fails(step) ? kFailure : kSuccess;
  }

  SimCameras& owner_;
  CameraDevice* camera_ = nullptr;  // that is bound
  bool begun_ = false;
  CaptureStep done_ = CaptureStep::kInitialize;
};

// The cameras as they were when the walk began.
class SimCameras::Inputs : public CaptureDevices {
 public:
  Inputs(Graph& graph, std::vector<CameraDevice*> cameras, DoorContext& context)
      : graph_(graph), cameras_(std::move(cameras)), context_(context) {}

  bool Next() override {
    context_.scheduler.Spend(kStepCost_us);
    next_ = std::min(next_ + 1, cameras_.size() + 1);
    return next_ <= cameras_.size();
  }
  bool Bind() override { return next_ >= 1 && next_ <= cameras_.size() && graph_.Bind(*cameras_[next_ - 1]); }

 private:
  Graph& graph_;
  std::vector<CameraDevice*> cameras_;
  DoorContext& context_;
  std::size_t next_ = 0;  // counts from 1; 0: ahead of the first
};

std::unique_ptr<CaptureDevices> SimCameras::Graph::OpenVideoInputs() {
  std::vector<CameraDevice*> present;
  std::copy_if(owner_.cameras_.begin(), owner_.cameras_.end(), std::back_inserter(present),
               [this](const CameraDevice* camera) { return owner_.IsThere(*camera); });
  if (Take(CaptureStep::kOpenInputs) != kSuccess || present.empty()) {
    return nullptr;  // a category without entries has no list
  }
  return std::make_unique<Inputs>(*this, std::move(present), owner_.context_);
}

std::unique_ptr<CaptureGraph> SimCameras::NewGraph() {
  context_.scheduler.Spend(1);
  return std::make_unique<Graph>(*this);
}

}  // namespace panelglow::platform::sim
