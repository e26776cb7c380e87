// The processor and the word size of the system.
#pragma once

#include <cstdint>

namespace panelglow::platform {

struct CpuidRegisters {
  std::uint32_t eax = 0;
  std::uint32_t ebx = 0;
  std::uint32_t ecx = 0;
  std::uint32_t edx = 0;
};

class Cpu {
 public:
  virtual ~Cpu() = default;

  /// The identification registers of a leaf; all zero on a processor without the instruction.
  virtual CpuidRegisters Cpuid(std::uint32_t leaf) = 0;

  /// True on a 64-bit system: the driver then takes the wide memory requests and the 64-bit driver binary.
  virtual bool Is64BitSystem() = 0;
};

}  // namespace panelglow::platform
