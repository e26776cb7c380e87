#include "platform/host_linux/NvidiaLibrary.h"

#include <dlfcn.h>

#include <utility>

#include "platform/host_linux/CurrentThread.h"

namespace panelglow::platform::host_linux {

namespace {

// The library's published interface.
constexpr int kSuccess = 0;
constexpr int kTemperatureOfGpu = 0;  // its only sensor
using Device = void*;
struct PciInfo {
  char formerBusId[16];
  unsigned domain;
  unsigned bus;
  unsigned device;
  unsigned ids;  // device above vendor
  unsigned subsystemIds;
  char busId[32];
};
using Initialize = int();
using Shutdown = int();
using GetCount = int(unsigned*);
using GetHandle = int(unsigned, Device*);
using GetPciInfo = int(Device, PciInfo*);
using GetTemperature = int(Device, int, unsigned*);

constexpr unsigned kMostCards = 64;

struct Closer {
  void operator()(void* library) const { ::dlclose(library); }
};
using Library = std::unique_ptr<void, Closer>;

template <class Function>
Function* Symbol(const Library& library, const char* name) {
  return reinterpret_cast<Function*>(::dlsym(library.get(), name));
}

class NvidiaLibrary : public GraphicsLibrary {
 public:
  explicit NvidiaLibrary(Library library)
      : library_(std::move(library)),
        shutdown_(Symbol<Shutdown>(library_, "nvmlShutdown")),
        getCount_(Symbol<GetCount>(library_, "nvmlDeviceGetCount_v2")),
        getHandle_(Symbol<GetHandle>(library_, "nvmlDeviceGetHandleByIndex_v2")),
        getPciInfo_(Symbol<GetPciInfo>(library_, "nvmlDeviceGetPciInfo_v3")),
        getTemperature_(Symbol<GetTemperature>(library_, "nvmlDeviceGetTemperature")) {
    Initialize* const initialize = Symbol<Initialize>(library_, "nvmlInit_v2");
    isReady_ = shutdown_ != nullptr && getCount_ != nullptr && getHandle_ != nullptr && getPciInfo_ != nullptr &&
               getTemperature_ != nullptr && initialize != nullptr && initialize() == kSuccess;
  }
  ~NvidiaLibrary() override {
    if (isReady_) {
      shutdown_();
    }
  }
  NvidiaLibrary(const NvidiaLibrary&) = delete;
  NvidiaLibrary& operator=(const NvidiaLibrary&) = delete;

  [[nodiscard]] bool IsReady() const { return isReady_; }

  std::vector<GraphicsCard> Cards() override {
    CurrentThread::CheckEndRequest();
    unsigned count = 0;
    std::vector<GraphicsCard> cards;
    if (getCount_(&count) != kSuccess) {
      return cards;
    }
    for (unsigned i = 0; i < count && i < kMostCards; ++i) {
      Device device = nullptr;
      PciInfo info{};
      const bool isKnown = getHandle_(i, &device) == kSuccess && getPciInfo_(device, &info) == kSuccess;
      // One that tells nothing keeps its place, under ids that no card has.
      cards.push_back(
          isKnown ? GraphicsCard{static_cast<std::uint16_t>(info.ids), static_cast<std::uint16_t>(info.ids >> 16U)}
                  : GraphicsCard{});
    }
    return cards;
  }

  std::optional<int> ReadTemperature(std::size_t card, unsigned sensor) override {
    CurrentThread::CheckEndRequest();
    Device device = nullptr;
    unsigned temperature = 0;
    constexpr unsigned kMostDegrees = 1000;
    if (sensor != kTemperatureOfGpu || card >= kMostCards ||
        getHandle_(static_cast<unsigned>(card), &device) != kSuccess ||
        getTemperature_(device, kTemperatureOfGpu, &temperature) != kSuccess || temperature > kMostDegrees) {
      return std::nullopt;
    }
    return static_cast<int>(temperature);
  }

 private:
  Library library_;
  Shutdown* shutdown_;
  GetCount* getCount_;
  GetHandle* getHandle_;
  GetPciInfo* getPciInfo_;
  GetTemperature* getTemperature_;
  bool isReady_ = false;
};

}  // namespace

std::unique_ptr<GraphicsLibrary> LoadNvidiaLibrary(const std::string& file) {
  Library library(::dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL));
  if (!library) {
    return nullptr;
  }
  auto loaded = std::make_unique<NvidiaLibrary>(std::move(library));
  return loaded->IsReady() ? std::move(loaded) : nullptr;
}

}  // namespace panelglow::platform::host_linux
