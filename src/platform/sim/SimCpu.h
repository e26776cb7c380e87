// The machine's processor, as its firmware describes it.
#pragma once

#include <cstdint>
#include <string>

#include "platform/Cpu.h"
#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

class SimCpu : public Cpu {
 public:
  explicit SimCpu(const MachineDescription& machine) : machine_(machine) {}
  CpuidRegisters Cpuid(std::uint32_t leaf) override {
    const bool amd = !machine_.firmware.processors.empty() &&
                     machine_.firmware.processors.front().manufacturer.find("AMD") != std::string::npos;
    if (leaf == 0) {
      return amd ? CpuidRegisters{13, 0x68747541, 0x444D4163, 0x69746E65}
                 : CpuidRegisters{13, 0x756E6547, 0x6C65746E, 0x49656E69};
    }
    return leaf == 1 ? CpuidRegisters{0x000306A9, 0, 0, 0} : CpuidRegisters{};
  }
  bool Is64BitSystem() override { return machine_.is64Bit; }

 private:
  const MachineDescription& machine_;
};

}  // namespace panelglow::platform::sim
