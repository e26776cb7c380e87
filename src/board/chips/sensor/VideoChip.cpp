#include "board/chips/sensor/VideoChip.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <string_view>
#include <utility>

#include "board/base/IniReader.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "harness/base/Notices.h"
#include "hw/WMIDiscovery.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint32_t kAmdGraphics = 0x1002;
constexpr std::uint32_t kNvidia = 0x10DE;

// The hexadecimal number behind a mark of a device instance id; 0 when there is none.
std::uint32_t NumberBehind(std::string_view id, std::string_view mark) {
  std::uint32_t number = 0;
  if (const std::size_t at = id.find(mark); at != std::string_view::npos) {
    std::from_chars(id.data() + at + mark.size(), id.data() + id.size(), number, 16);
  }
  return number;
}

}  // namespace

void VideoChip::FindCards() {
  cards.emplace();
  constexpr const char* kNone = "No Video Card information found in the System !!!! WMI Query Failed.";
  try {
    WMIDiscovery& management = WMIDiscovery::Instance();
    const int rows = management.RunQuery(u"SELECT * FROM Win32_VideoController");
    std::string id;
    for (int row = 0; row < rows; ++row) {
      if (management.GetCurrentValue(u"PNPDeviceID", id, row)) {
        const std::uint32_t subsystem = NumberBehind(id, "SUBSYS_");
        Card card{NumberBehind(id, "VEN_"), NumberBehind(id, "DEV_"), subsystem & 0xFFFFU, subsystem >> 16U, 0};
        card.earlierEqual =
            static_cast<std::size_t>(std::count_if(cards->begin(), cards->end(), [&](const Card& other) {
              return other.vendorId == card.vendorId && other.deviceId == card.deviceId;
            }));
        cards->push_back(card);
      }
    }
  } catch (const std::string&) {  // no management service
    cards->clear();
  }
  if (cards->empty()) {
    CDMout::LogMessage(LogOptions::Debug, kNote, kNone);
  }
}

int VideoChip::CountCards() {
  if (!cards) {
    FindCards();
  }
  return static_cast<int>(cards->size());
}

const VideoChip::Card* VideoChip::CardAt(int zone) {
  return zone >= 0 && zone < CountCards() ? &(*cards)[static_cast<std::size_t>(zone)] : nullptr;
}

platform::GraphicsLibrary* VideoChip::LibraryOf(const Card& card) {
  platform::Modules& modules = platform::TheHost().modules;
  if (card.vendorId == kAmdGraphics) {
    for (const char* file : {"atiadlxx.dll", "atiadlxy.dll"}) {
      adl = adl ? std::move(adl) : modules.LoadGraphics(file, platform::GraphicsInterface::kAdl);
    }
    if (!adl) {
      Notices::Tell(
          "The temperature of AMD graphics cards is not read: neither atiadlxx.dll nor atiadlxy.dll can be loaded; "
          "both come with the card's driver.");
    }
    return adl.get();
  }
  if (card.vendorId == kNvidia) {
    nvApi = nvApi ? std::move(nvApi) : modules.LoadGraphics("nvapi.dll", platform::GraphicsInterface::kNvApi);
    if (!nvApi) {
      Notices::Tell(
          "The temperature of NVIDIA graphics cards is not read: nvapi.dll cannot be loaded; it comes with the "
          "card's "
          "driver.");
    }
    return nvApi.get();
  }
  return nullptr;
}

// Where the test file has the card: its keys' beginning, or nothing. Two ids are a card's vendor and device, four its
// subsystem, too.
std::string VideoChip::FindEntry(const Card& card) {
  for (int n = 1;; ++n) {
    std::string prefix = "test.graphics." + CDMUtil::ToString(n) + ".";
    const Setting ids = IniReader::Instance().ReadIniSetting(prefix + "PCI_IDS", "");
    if (ids.text.empty()) {
      return "";
    }
    std::vector<std::string> words;
    CDMUtil::Split(ids.text, words, " ");
    const std::array<std::uint32_t, 4> own{card.vendorId, card.deviceId, card.subVendorId, card.subDeviceId};
    if (words.size() != 2 && words.size() != own.size()) {
      TellOf(ids, "\"" + ids.text + "\" does not say which card; it is two or four hexadecimal ids between blanks");
      continue;
    }
    const bool isThis =
        std::equal(words.begin(), words.end(), own.begin(),
                   [](const std::string& word, std::uint32_t id) { return NumberBehind(word, "") == id; });
    if (isThis) {
      return prefix;
    }
  }
}

bool VideoChip::ReadTemperature(int zone, int& value) {
  const Card* const card = CardAt(zone);
  platform::GraphicsLibrary* const library = card == nullptr ? nullptr : LibraryOf(*card);
  if (library == nullptr) {
    return false;
  }
  const std::vector<platform::GraphicsCard> known = library->Cards();
  std::size_t ahead = card->earlierEqual;
  const auto found = std::find_if(known.begin(), known.end(), [&](const platform::GraphicsCard& candidate) {
    return candidate.vendorId == card->vendorId && candidate.deviceId == card->deviceId && ahead-- == 0;
  });
  if (found == known.end()) {
    return false;
  }
  constexpr unsigned kMostSensors = 8;
  const std::string entry = FindEntry(*card);
  const unsigned sensors = entry.empty() ? 1 : std::min(ReadIniUnsigned(entry + "Temp_Zones", 1), kMostSensors);
  std::optional<int> hottest;
  for (unsigned sensor = 0; sensor < sensors; ++sensor) {
    const std::optional<int> read = library->ReadTemperature(static_cast<std::size_t>(found - known.begin()), sensor);
    hottest = read && (!hottest || *read > *hottest) ? read : hottest;
  }
  value = hottest.value_or(value);
  return hottest.has_value();
}

bool VideoChip::ReadLimit(int zone, const char* key, int& value) {
  const Card* const card = CardAt(zone);
  const std::string entry = card == nullptr ? "" : FindEntry(*card);
  if (entry.empty()) {
    return false;
  }
  IniReader::status_t status = IniReader::kNotFound;
  const int limit = IniReader::Instance().ReadIniInt(entry + key, status, 0);
  value = status == IniReader::kFound ? limit : value;
  return status == IniReader::kFound;
}

bool VideoChip::ReadThreshold(int zone, int& value) { return ReadLimit(zone, "Upper_Threshold", value); }

bool VideoChip::ReadLowLimitTemperature(int zone, int& value) { return ReadLimit(zone, "Lower_Threshold", value); }

}  // namespace panelglow
