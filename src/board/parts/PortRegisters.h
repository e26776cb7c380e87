// A register file of one place whose registers are ports from a base on, as the runtime registers of a Super-I/O are.
#pragma once

#include "board/parts/RegisterFile.h"
#include "hw/CDevio.h"

namespace panelglow {

class PortRegisters : public RegisterFile {
 public:
  PortRegisters(CDevio& client, std::uint16_t basePort) : devio(&client), base(basePort) {}

  std::uint8_t Read(RegisterId id) override { return devio->InportByte(PortOf(id)); }
  void Write(RegisterId id, std::uint8_t value) override { devio->OutportByte(PortOf(id), value); }

 private:
  [[nodiscard]] std::uint16_t PortOf(RegisterId id) const { return static_cast<std::uint16_t>(base + id.reg); }

  CDevio* devio;
  std::uint16_t base;
};

}  // namespace panelglow
