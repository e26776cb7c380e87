// The machine's processors, as its firmware describes them, and on which of their cores the program runs.
#pragma once

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <string>

#include "platform/Cpu.h"
#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

class SimCpu : public Cpu {
 public:
  explicit SimCpu(const MachineDescription& machine)
      : machine_(machine), all_(MaskOf(std::max<std::size_t>(machine.driver.cores.size(), 1))), mask_(all_) {}
  CpuidRegisters Cpuid(std::uint32_t leaf) override {
    const bool amd = !machine_.firmware.processors.empty() &&
                     machine_.firmware.processors.front().manufacturer.find("AMD") != std::string::npos;
    if (leaf == 0) {
      return amd ? CpuidRegisters{13, 0x68747541, 0x444D4163, 0x69746E65}
                 : CpuidRegisters{13, 0x756E6547, 0x6C65746E, 0x49656E69};
    }
    constexpr std::uint32_t kLongMode = 1U << 29U;
    switch (leaf) {
      case 1:
        return {0x000306A9, 0, 0, 0};
      case 0x80000001:
        return {0, 0, 0, machine_.is64Bit ? kLongMode : 0};
      default:
        return {};
    }
  }
  bool Is64BitSystem() override { return machine_.is64Bit; }
  std::uint64_t Affinity() override { return mask_; }
  bool SetAffinity(std::uint64_t mask) override {
    if ((mask & all_) == 0) {
      return false;
    }
    mask_ = mask & all_;
    return true;
  }

  /// The core that the program runs on: the first that it may.
  [[nodiscard]] std::size_t Core() const { return static_cast<std::size_t>(std::countr_zero(mask_)); }

  [[nodiscard]] std::string State() const {
    return std::string("processor affinity = ") + (mask_ == all_ ? "all cores\n" : "narrowed\n");
  }

 private:
  static constexpr std::size_t kMaskBits = 64;
  static constexpr std::uint64_t MaskOf(std::size_t cores) {
    return ~std::uint64_t{0} >> (kMaskBits - std::min(cores, kMaskBits));
  }

  const MachineDescription& machine_;
  std::uint64_t all_;
  std::uint64_t mask_;
};

}  // namespace panelglow::platform::sim
