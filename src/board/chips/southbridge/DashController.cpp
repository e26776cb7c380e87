#include "board/chips/southbridge/DashController.h"

#include <array>
#include <cstddef>
#include <vector>

#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr std::uint32_t kNetworkClass = 0x20000;
constexpr std::uint16_t kMemoryBar = 0x18;
constexpr std::uint64_t kBarFlags = 15;
constexpr std::uint64_t kPinControl = 0xB8;
constexpr std::uint32_t kOutputEnabled = 0x80000;
constexpr std::uint32_t kOutputHigh = 0x800;
constexpr std::int64_t kLargestId = 0xFFFF;

using Dword = std::array<std::byte, 4>;

}  // namespace

std::optional<DashController> DashController::Find(CDevio& client, const std::string& idList) {
  std::vector<std::string> tokens;
  CDMUtil::Split(idList, tokens, " ");
  std::array<std::uint16_t, 4> ids{};
  if (tokens.size() != ids.size()) {
    return std::nullopt;
  }
  for (std::size_t i = 0; i < ids.size(); ++i) {
    const std::int64_t id = CDMUtil::IsInteger(tokens[i]) ? CDMUtil::ToInt64(tokens[i]) : -1;
    if (id < 0 || id > kLargestId) {
      return std::nullopt;
    }
    ids[i] = static_cast<std::uint16_t>(id);
  }
  std::uint16_t location = 0;
  std::uint64_t base = 0;
  if (!client.FindPciDeviceByIds(kNetworkClass, ids[0], ids[1], ids[2], ids[3], location) ||
      client.ReadPciBar(location, kMemoryBar, base) != 0 || (base & ~kBarFlags) == 0) {
    return std::nullopt;
  }
  return DashController(client, (base & ~kBarFlags) + kPinControl);
}

bool DashController::Change(std::uint32_t clear, std::uint32_t set) const {
  const auto low = static_cast<std::uint32_t>(pins);
  const auto high = static_cast<std::uint32_t>(pins >> 32U);
  Dword bytes{};
  if (devio->ReadPhysicalMemory64(low, high, sizeof bytes, bytes) == 0) {
    return false;
  }
  std::uint32_t value = 0;
  for (std::size_t i = bytes.size(); i-- > 0;) {
    value = value << 8U | std::to_integer<std::uint32_t>(bytes[i]);
  }
  value = (value & ~clear) | set;
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    bytes[i] = static_cast<std::byte>(value >> (8 * i));
  }
  // A base below 4 GB is all that a 32-bit system has, and the wide request is not for it.
  return (high == 0 ? devio->WritePhysicalMemory(low, sizeof bytes, bytes)
                    : devio->WritePhysicalMemory64(low, high, sizeof bytes, bytes)) != 0;
}

bool DashController::EnableOutput() const { return Change(0, kOutputEnabled); }

bool DashController::SetOutput(bool high) const { return Change(high ? 0 : kOutputHigh, high ? kOutputHigh : 0); }

}  // namespace panelglow
