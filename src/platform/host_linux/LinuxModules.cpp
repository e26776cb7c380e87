#include "platform/host_linux/LinuxModules.h"

#include <dlfcn.h>

#include <array>
#include <cstdio>
#include <string>

#include "platform/AsciiCase.h"
#include "platform/host_linux/CurrentThread.h"
#include "platform/host_linux/NvidiaLibrary.h"
#include "platform/host_linux/PciInventory.h"

namespace panelglow::platform::host_linux {

namespace {

constexpr std::uint16_t kAmdGraphics = 0x1002;
constexpr std::uint16_t kNvidia = 0x10DE;
constexpr std::uint32_t kDisplayClass = 0x03;

bool EndsWith(std::string_view text, std::string_view end) {
  return text.size() >= end.size() && text.substr(text.size() - end.size()) == end;
}

// The files of a card's temperatures, in the order of their numbers.
std::vector<std::string> SensorsOf(const std::string& card) {
  std::vector<std::string> sensors;
  for (const std::string& monitor : KernelNames(card + "/hwmon")) {
    const std::string folder = card + "/hwmon/" + monitor + "/";
    for (const std::string& name : KernelNames(folder)) {
      if (name.compare(0, 4, "temp") == 0 && EndsWith(name, "_input")) {
        sensors.push_back(folder + name);
      }
    }
  }
  return sensors;
}

class MonitoredCards : public GraphicsLibrary {
 public:
  struct Card {
    GraphicsCard ids = {};
    std::vector<std::string> sensors = {};  // files
  };

  explicit MonitoredCards(std::vector<Card> cards) : cards_(std::move(cards)) {}

  std::vector<GraphicsCard> Cards() override {
    CurrentThread::CheckEndRequest();
    std::vector<GraphicsCard> ids;
    for (const Card& card : cards_) {
      ids.push_back(card.ids);
    }
    return ids;
  }

  std::optional<int> ReadTemperature(std::size_t card, unsigned sensor) override {
    CurrentThread::CheckEndRequest();
    constexpr std::uint64_t kMost_mC = 1'000'000;
    if (card >= cards_.size() || sensor >= cards_[card].sensors.size()) {
      return std::nullopt;
    }
    const auto read = ReadKernelNumber(cards_[card].sensors[sensor], kMost_mC);
    return read ? std::optional<int>(static_cast<int>(*read / 1000)) : std::nullopt;
  }

 private:
  std::vector<Card> cards_;
};

}  // namespace

bool LinuxModules::CanLoad(std::string_view file) {
  CurrentThread::CheckEndRequest();
  constexpr std::string_view kSuffix = ".dll";
  std::string name = Lowered(file);
  if (name.find('/') != std::string::npos || name.find('\0') != std::string::npos || !EndsWith(name, kSuffix)) {
    return false;
  }
  name = "lib" + name.substr(0, name.size() - kSuffix.size()) + ".so";
  void* const library = ::dlopen(name.c_str(), RTLD_LAZY | RTLD_LOCAL);
  if (library != nullptr) {
    ::dlclose(library);
  }
  return library != nullptr;
}

// Which of the makers' libraries is meant follows from the interface.
std::unique_ptr<GraphicsLibrary> LinuxModules::LoadGraphics(std::string_view /*file*/, GraphicsInterface interface) {
  CurrentThread::CheckEndRequest();
  const std::uint16_t vendor = interface == GraphicsInterface::kAdl ? kAmdGraphics : kNvidia;
  const PciInventory pci(folders_);
  std::vector<MonitoredCards::Card> cards;
  bool isMonitored = false;
  for (const SysfsPciFunction& function : pci.Functions()) {
    if (function.identity.vendorId != vendor || function.identity.classCode >> 16U != kDisplayClass) {
      continue;
    }
    MonitoredCards::Card card{{vendor, function.identity.deviceId},
                              SensorsOf(folders_.sys + "/bus/pci/devices/" + KernelName(function.location))};
    isMonitored = isMonitored || !card.sensors.empty();
    cards.push_back(std::move(card));
  }
  if (isMonitored) {
    return std::make_unique<MonitoredCards>(std::move(cards));
  }
  auto library =
      interface == GraphicsInterface::kNvApi && !cards.empty() ? LoadNvidiaLibrary(nvidiaLibrary_) : nullptr;
  if (!library && !cards.empty()) {
    teller_.Tell("The driver of a graphics card shows no temperature (hwmon): " +
                 (interface == GraphicsInterface::kAdl
                      ? std::string("load the kernel's driver of the card.")
                      : "load the kernel's driver of the card, or install " + nvidiaLibrary_ + " of NVIDIA's."));
  }
  return library;
}

}  // namespace panelglow::platform::host_linux
