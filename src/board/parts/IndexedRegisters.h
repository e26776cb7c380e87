// A register file of one place behind an index and a data port, as most hardware monitors are.
#pragma once

#include "board/parts/IndexedPorts.h"
#include "board/parts/RegisterFile.h"

namespace panelglow {

class IndexedRegisters : public RegisterFile {
 public:
  explicit IndexedRegisters(const IndexedPorts& at) : ports(at) {}

  std::uint8_t Read(RegisterId id) override { return ports.Read(id.reg); }
  void Write(RegisterId id, std::uint8_t value) override { ports.Write(id.reg, value); }

 private:
  IndexedPorts ports;
};

}  // namespace panelglow
