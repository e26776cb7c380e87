#include "platform/host_linux/LinuxCpu.h"

#include <sys/utsname.h>

#include <string_view>

#if defined(__x86_64__) || defined(__i386__)
#include <cpuid.h>
#endif

namespace panelglow::platform::host_linux {

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

}  // namespace panelglow::platform::host_linux
