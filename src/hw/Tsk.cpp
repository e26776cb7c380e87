#include "hw/Tsk.h"

#include <algorithm>
#include <cstdlib>
#include <limits>

#include "harness/base/CDMException.h"
#include "hw/CDevio.h"
#include "hw/SMBIOSDiscovery.h"
#include "hw/SmbiosScanner.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kBaseBoardType = 2;
constexpr std::size_t kBaseBoardProduct = 5;

const SmbiosScanner& TheScanner() {
  static const SmbiosScanner scanner = [] {
    CDevio devio;
    SmbiosScanner scan;
    if (!devio.IsDriverLoaded()) {
      return scan;  // every byte would read as 0: there is nothing to look for
    }
    scan.Scan({[&](std::uint16_t segment, std::uint16_t offset) { return devio.ReadFirmwareByte(segment, offset); },
               [&](std::uint16_t segment, std::uint16_t offset) { return devio.ReadFirmwareWord(segment, offset); }});
    return scan;
  }();
  return scanner;
}

// This is asked for while the subtests are built, on every start and outside any guard: a machine whose management
// service does not answer is a machine without a product text, not the end of the program.
std::string ProductText() {
  try {
    return SMBIOSDiscovery::Instance().GetProductText();
  } catch (const std::string&) {
  } catch (const CDMException&) {
  }
  return {};
}

}  // namespace

// The program's home system has a `long` of 32 bits: a text of more digits than that stands for its largest value.
std::uint16_t SystemIdOf(std::string_view productText) {
  constexpr int kHexadecimal = 16;
  const long long number = std::strtoll(std::string(productText).c_str(), nullptr, kHexadecimal);
  return static_cast<std::uint16_t>(std::clamp<long long>(number, std::numeric_limits<std::int32_t>::min(),
                                                          std::numeric_limits<std::int32_t>::max()));
}

bool Tsk_GetSystemID(std::uint16_t& id) {
  id = SystemIdOf(ProductText());
  if (id != 0) {
    return true;
  }
  const std::span<const std::uint8_t> board = Tsk_FindSmbiosStructure(kBaseBoardType);
  if (board.size() <= kBaseBoardProduct) {
    return false;
  }
  id = SystemIdOf(Tsk_GetSmbiosString(board, board[kBaseBoardProduct]));
  return id != 0;
}

std::span<const std::uint8_t> Tsk_FindSmbiosStructure(std::uint8_t type) {
  const SmbiosScanner& scanner = TheScanner();
  return scanner.At(scanner.Find(type));
}

std::string Tsk_GetSmbiosString(std::span<const std::uint8_t> structure, std::uint8_t index) {
  return SmbiosScanner::StringOf(structure, index);
}

}  // namespace panelglow
