// The processor's identification registers, which are zero on one that is no x86, and where threads run.
#pragma once

#include "platform/Cpu.h"

namespace panelglow::platform::host_linux {

class LinuxCpu : public Cpu {
 public:
  CpuidRegisters Cpuid(std::uint32_t leaf) override;
  bool Is64BitSystem() override;
  std::uint64_t Affinity() override;
  bool SetAffinity(std::uint64_t mask) override;
};

}  // namespace panelglow::platform::host_linux
