// A network controller whose output pin can be driven, to see what is wired to it.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "hw/CDevio.h"

namespace panelglow {

class DashController {
 public:
  /// The controller of these ids: vendor, device, subsystem vendor, subsystem device as numbers, separated by blanks.
  /// Nothing when there is none, when it has no memory, or when the text is not four numbers of 16 bits.
  static std::optional<DashController> Find(CDevio& client, const std::string& idList);

  // False when the driver cannot reach the controller's memory.
  [[nodiscard]] bool EnableOutput() const;
  [[nodiscard]] bool SetOutput(bool high) const;

 private:
  DashController(CDevio& client, std::uint64_t address) : devio(&client), pins(address) {}
  [[nodiscard]] bool Change(std::uint32_t clear, std::uint32_t set) const;

  CDevio* devio;
  std::uint64_t pins;  // physical address of the pin control dword
};

}  // namespace panelglow
