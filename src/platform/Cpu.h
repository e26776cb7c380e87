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

  /// The logical processors that the calling thread may run on, a bit each; 0 when the system does not tell.
  virtual std::uint64_t Affinity() = 0;

  /// Lets the calling thread, or all of the process with it, run on these alone from now on. False when the system
  /// refuses, as it does for a mask without a processor that there is.
  virtual bool SetAffinity(std::uint64_t mask) = 0;
};

}  // namespace panelglow::platform
