#include "platform/host_linux/LinuxCpu.h"

#include <sched.h>
#include <sys/utsname.h>

#include <string_view>

#if defined(__x86_64__) || defined(__i386__)
#include <cpuid.h>
#endif

namespace panelglow::platform::host_linux {

namespace {

constexpr unsigned kMaskBits = 64;

// The processors of this thread when it was last asked for them: those that a mask has no bits for go back with it.
thread_local cpu_set_t lastSet{};

std::uint64_t MaskOf(const cpu_set_t& set) {
  std::uint64_t mask = 0;
  for (unsigned cpu = 0; cpu < kMaskBits; ++cpu) {
    mask |= CPU_ISSET(cpu, &set) ? std::uint64_t{1} << cpu : 0;
  }
  return mask;
}

}  // namespace

// A leaf that the processor does not have gives zeros, not the contents of another one.
CpuidRegisters LinuxCpu::Cpuid([[maybe_unused]] std::uint32_t leaf) {
  CpuidRegisters registers;
#if defined(__x86_64__) || defined(__i386__)
  __get_cpuid(leaf, &registers.eax, &registers.ebx, &registers.ecx, &registers.edx);
#endif
  return registers;
}

bool LinuxCpu::Is64BitSystem() {
  if (sizeof(void*) == 8) {
    return true;
  }
  // A 32-bit program may run on a 64-bit system, whose machine names all say so.
  utsname system{};
  return ::uname(&system) == 0 && std::string_view(system.machine).find("64") != std::string_view::npos;
}

// A machine with more than 64 logical processors shows its first 64.
std::uint64_t LinuxCpu::Affinity() {
  cpu_set_t set;
  CPU_ZERO(&set);
  if (::sched_getaffinity(0, sizeof set, &set) != 0) {
    return 0;
  }
  lastSet = set;
  return MaskOf(set);
}

bool LinuxCpu::SetAffinity(std::uint64_t mask) {
  if (mask == MaskOf(lastSet)) {
    return ::sched_setaffinity(0, sizeof lastSet, &lastSet) == 0;
  }
  cpu_set_t set;
  CPU_ZERO(&set);
  for (unsigned cpu = 0; cpu < kMaskBits; ++cpu) {
    if ((mask >> cpu & 1U) != 0) {
      CPU_SET(cpu, &set);
    }
  }
  return ::sched_setaffinity(0, sizeof set, &set) == 0;
}

}  // namespace panelglow::platform::host_linux
