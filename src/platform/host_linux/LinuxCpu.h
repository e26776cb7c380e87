// The processor's identification registers; zero on one that is no x86.
#pragma once

#include "platform/Cpu.h"

namespace panelglow::platform::host_linux {

class LinuxCpu : public Cpu {
 public:
  CpuidRegisters Cpuid(std::uint32_t leaf) override;
  bool Is64BitSystem() override;
};

}  // namespace panelglow::platform::host_linux
