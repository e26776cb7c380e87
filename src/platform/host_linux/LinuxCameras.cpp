#include "platform/host_linux/LinuxCameras.h"

#include <fcntl.h>
#include <linux/videodev2.h>
#include <sys/ioctl.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <utility>
#include <vector>

#include "platform/host_linux/CurrentThread.h"
#include "platform/posix/Descriptor.h"

namespace panelglow::platform::host_linux {

namespace {

constexpr CaptureResult kSuccess = 0;
constexpr auto kNotConnected = static_cast<CaptureResult>(0x8007048F);
constexpr std::uint32_t kBuffers = 4;

// A failed step, with the kernel's number in its low half.
CaptureResult Failed(int error) {
  return static_cast<CaptureResult>(0x80070000U | (static_cast<std::uint32_t>(error) & 0xFFFFU));
}

int Request(const posix::Descriptor& device, unsigned long request, void* argument) {
  int result = 0;
  do {
    result = ::ioctl(device.Get(), request, argument);
  } while (result < 0 && errno == EINTR);
  return result < 0 ? errno : 0;
}

// "video0", "video1", ... by their numbers.
std::vector<std::string> VideoDevices(const std::string& folder) {
  constexpr std::string_view kPrefix = "video";
  std::vector<std::pair<unsigned long, std::string>> found;
  std::error_code none;
  for (std::filesystem::directory_iterator it(folder, none), end; !none && it != end; it.increment(none)) {
    const std::string name = it->path().filename().string();
    if (name.rfind(kPrefix, 0) == 0 && name.size() > kPrefix.size() &&
        std::all_of(name.begin() + kPrefix.size(), name.end(), [](char c) { return c >= '0' && c <= '9'; })) {
      found.emplace_back(std::strtoul(name.c_str() + kPrefix.size(), nullptr, 10), it->path().string());
    }
  }
  std::sort(found.begin(), found.end());
  std::vector<std::string> paths;
  paths.reserve(found.size());
  for (auto& [number, path] : found) {
    paths.push_back(std::move(path));
  }
  return paths;
}

// A device of the video interface that streams captured pictures; the same camera has others, for its metadata.
bool IsCamera(const posix::Descriptor& device) {
  constexpr std::uint32_t kNeeded = V4L2_CAP_VIDEO_CAPTURE | V4L2_CAP_STREAMING;
  v4l2_capability capability{};
  if (Request(device, VIDIOC_QUERYCAP, &capability) != 0) {
    return false;
  }
  const std::uint32_t caps =
      (capability.capabilities & V4L2_CAP_DEVICE_CAPS) != 0 ? capability.device_caps : capability.capabilities;
  return (caps & kNeeded) == kNeeded;
}

class Graph : public CaptureGraph {
 public:
  Graph(std::string folder, posix::OnceTeller& teller) : folder_(std::move(folder)), teller_(teller) {}
  ~Graph() override { SwitchOff(); }
  Graph(const Graph&) = delete;
  Graph& operator=(const Graph&) = delete;

  // The kernel's interface needs none of these objects: what is asked for is there.
  CaptureResult Initialize() override { return Done(); }
  CaptureResult Make(CapturePart /*part*/) override { return Done(); }
  CaptureResult SetFilterGraph() override { return Done(); }
  CaptureResult AddCaptureFilter() override { return Done(); }
  CaptureResult MakeGrabber() override { return Done(); }
  CaptureResult AddGrabber() override { return Done(); }
  CaptureResult HideVideoWindow() override { return Done(); }

  bool MakeDeviceEnumerator() override {
    CurrentThread::CheckEndRequest();
    return true;
  }
  std::unique_ptr<CaptureDevices> OpenVideoInputs() override;

  // The format that the camera has now is the one that it keeps.
  CaptureResult RenderStream() override {
    CurrentThread::CheckEndRequest();
    v4l2_format format{};
    format.type = V4L2_BUF_TYPE_VIDEO_CAPTURE;
    int error = Request(device_, VIDIOC_G_FMT, &format);
    if (error == 0) {
      error = Request(device_, VIDIOC_S_FMT, &format);
    }
    return Told(error);
  }

  CaptureResult Run() override {
    CurrentThread::CheckEndRequest();
    if (isOn_) {
      return kSuccess;
    }
    v4l2_requestbuffers wanted{};
    wanted.count = kBuffers;
    wanted.type = V4L2_BUF_TYPE_VIDEO_CAPTURE;
    wanted.memory = V4L2_MEMORY_MMAP;
    int error = Request(device_, VIDIOC_REQBUFS, &wanted);
    for (std::uint32_t i = 0; error == 0 && i < wanted.count; ++i) {
      v4l2_buffer buffer{};
      buffer.index = i;
      buffer.type = wanted.type;
      buffer.memory = wanted.memory;
      error = Request(device_, VIDIOC_QBUF, &buffer);
    }
    if (error == 0) {
      int type = V4L2_BUF_TYPE_VIDEO_CAPTURE;
      error = Request(device_, VIDIOC_STREAMON, &type);
    }
    isOn_ = true;  // also a start that failed half way is taken back
    if (error != 0) {
      SwitchOff();
    }
    return Told(error);
  }

  CaptureResult Stop() override {
    CurrentThread::CheckEndRequest();
    return device_ ? Told(SwitchOff()) : kNotConnected;
  }

  bool Bind(const std::string& path) {
    CurrentThread::CheckEndRequest();
    posix::Descriptor device(::open(path.c_str(), O_RDWR | O_NONBLOCK | O_CLOEXEC));
    if (!device) {
      const int error = errno;
      teller_.Tell("The camera " + path + " cannot be opened (" + std::strerror(error) + "), so its LED stays dark" +
                   (error == EACCES || error == EPERM
                        ? ": start the program as root, or as a member of the group \"video\"."
                        : "."));
      return false;
    }
    if (!IsCamera(device)) {
      return false;
    }
    device_ = std::move(device);
    path_ = path;
    return true;
  }

 private:
  static CaptureResult Done() {
    CurrentThread::CheckEndRequest();
    return kSuccess;
  }

  // Nothing of it throws: it is also what the end of the graph does.
  int SwitchOff() {
    if (!std::exchange(isOn_, false)) {
      return 0;
    }
    int type = V4L2_BUF_TYPE_VIDEO_CAPTURE;
    const int error = Request(device_, VIDIOC_STREAMOFF, &type);
    v4l2_requestbuffers none{};
    none.type = V4L2_BUF_TYPE_VIDEO_CAPTURE;
    none.memory = V4L2_MEMORY_MMAP;
    Request(device_, VIDIOC_REQBUFS, &none);
    return error;
  }

  CaptureResult Told(int error) {
    if (error == 0) {
      return kSuccess;
    }
    teller_.Tell("The camera " + path_ + " does not capture (" + std::strerror(error) + "), so its LED stays dark" +
                 (error == EBUSY ? ": another program has it; close that one." : "."));
    return Failed(error);
  }

  std::string folder_;
  posix::OnceTeller& teller_;  // the cameras', which outlive every run
  std::string path_;
  posix::Descriptor device_;
  bool isOn_ = false;
};

class Devices : public CaptureDevices {
 public:
  Devices(Graph& graph, std::vector<std::string> paths) : graph_(graph), paths_(std::move(paths)) {}
  bool Next() override {
    CurrentThread::CheckEndRequest();
    return next_ < paths_.size() && ++next_ > 0;
  }
  bool Bind() override { return next_ > 0 && graph_.Bind(paths_[next_ - 1]); }

 private:
  Graph& graph_;
  std::vector<std::string> paths_;
  std::size_t next_ = 0;  // behind the present one
};

std::unique_ptr<CaptureDevices> Graph::OpenVideoInputs() {
  CurrentThread::CheckEndRequest();
  std::vector<std::string> paths = VideoDevices(folder_);
  return paths.empty() ? nullptr : std::make_unique<Devices>(*this, std::move(paths));
}

}  // namespace

std::unique_ptr<CaptureGraph> LinuxCameras::NewGraph() { return std::make_unique<Graph>(folder_, teller_); }

}  // namespace panelglow::platform::host_linux
