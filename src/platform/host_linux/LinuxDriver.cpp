#include "platform/host_linux/LinuxDriver.h"

#include <fcntl.h>
#include <sched.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <vector>

#include "platform/DriverRecords.h"
#include "platform/host_linux/CurrentThread.h"
#include "platform/host_linux/KernelFiles.h"
#include "platform/host_linux/PortAccess.h"
#include "platform/posix/Descriptor.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::host_linux {

namespace {

using driver::NumberAt;
using driver::PutNumber;

constexpr ServiceHandle kManager = 1;
constexpr ServiceHandle kService = 2;
constexpr std::string_view kLink = "tmbhalcyon";

constexpr std::uint32_t kErrorInvalidFunction = 1;
constexpr std::uint32_t kErrorInvalidParameter = 87;
constexpr std::uint32_t kErrorGeneralFailure = 31;
constexpr std::uint8_t kPciNotFound = 0x86;
constexpr std::uint32_t kVersion = 100;  // 1.0, in the older form

constexpr std::uint16_t kClassAndRevision = 0x08;
constexpr std::uint64_t kPage = 4096;
constexpr unsigned kFreePciRegisters = 64;  // bytes that the kernel shows to everybody

// The kernel's lockdown, in its own word; empty where it does not tell.
std::string Lockdown() {
  std::ifstream file("/sys/kernel/security/lockdown");
  std::string line;
  std::getline(file, line);
  const std::size_t begin = line.find('[');
  const std::size_t end = line.find(']', begin);
  return begin == std::string::npos || end == std::string::npos ? "" : line.substr(begin + 1, end - begin - 1);
}

// Whether this thread holds CAP_SYS_RAWIO, by the mask that the kernel prints.
bool HasRawAccess() {
  constexpr std::string_view kField = "CapEff:";
  constexpr unsigned kRawIo = 17;
  std::ifstream file("/proc/thread-self/status");
  for (std::string line; std::getline(file, line);) {
    if (line.rfind(kField, 0) == 0) {
      return (std::strtoull(line.c_str() + kField.size(), nullptr, 16) >> kRawIo & 1U) != 0;
    }
  }
  return false;
}

std::string WhatToDo(int error) {
  const std::string lockdown = Lockdown();
  if (!lockdown.empty() && lockdown != "none") {
    return "the kernel is locked down (" + lockdown + "): switch secure boot off, or start it without lockdown";
  }
  if (error == ENOSYS || error == ENOENT) {
    return "this kernel has no such door: it needs one with I/O port access and /dev/mem";
  }
  if (HasRawAccess()) {
    return error == EACCES
               ? "CAP_SYS_RAWIO is there, but the file's mode or a security policy is in the way: let this "
                 "user read and write the file"
               : "the right is there, so the kernel itself forbids it: it may be locked down (secure boot), "
                 "which /sys/kernel/security/lockdown would tell, or a container's list of devices leaves "
                 "it out";
  }
  return ::geteuid() == 0 ? "it needs the capability CAP_SYS_RAWIO, which a container does not have"
                          : "start it as root, or give it CAP_SYS_RAWIO and the right to /dev/mem";
}

// Device memory by the number that a mapping request has answered with.
template <class Number>
volatile Number* At(std::uint64_t mapped) {
  return reinterpret_cast<volatile Number*>(mapped);  // NOLINT(performance-no-int-to-ptr): the records hold numbers
}

bool HasSizes(std::span<const std::byte> in, std::span<const std::byte> out, std::size_t size) {
  return in.size() == size && out.size() == size;
}

}  // namespace

std::uint32_t HomeErrorOf(int error) {
  switch (error) {
    case 0:
      return 0;
    case ENOENT:
    case ENXIO:
    case ENODEV:
      return kErrorFileNotFound;
    case EINVAL:
      return kErrorInvalidParameter;
    case EPERM:
    case EACCES:
    case ENOSYS:
      return kErrorAccessDenied;
    default:
      return kErrorGeneralFailure;
  }
}

class LinuxDriver::Device : public DriverDevice {
 public:
  explicit Device(LinuxDriver& owner) : owner_(owner) {}

  std::uint32_t Control(std::uint32_t code, std::span<const std::byte> request, std::span<std::byte> out) override {
    CurrentThread::CheckEndRequest();
    const std::vector<std::byte> in(request.begin(), request.end());  // `out` may be the same memory
    switch (code) {
      case driver::kGetVersion:
        return out.size() < 4 ? kErrorInvalidParameter : (PutNumber(out, 0, 4, kVersion), 0U);
      case driver::kInportByte:
      case driver::kInportWord:
      case driver::kInportDword:
      case driver::kOutportByte:
      case driver::kOutportWord:
      case driver::kOutportDword:
        return Port(code, in, out);
      case driver::kReadPciConfigByte:
      case driver::kReadPciConfigWord:
      case driver::kReadPciConfigDword:
      case driver::kWritePciConfigByte:
      case driver::kWritePciConfigWord:
      case driver::kWritePciConfigDword:
        return Pci(code, in, out);
      case driver::kFindPciDevice:
      case driver::kFindPciClass:
        return Search(code, in, out);
      case driver::kMapPhysicalMemory:
        return Map(in, out);
      case driver::kUnmapPhysicalMemory:
        return in.size() == driver::kMapSize32 && owner_.memory_.Unmap(NumberAt(in, 8, 4)) ? 0
                                                                                           : kErrorInvalidParameter;
      case driver::kReadMsr:
        return Msr(in, out);
      case driver::kReadFirmwareByte:
      case driver::kReadFirmwareWord:
        return Firmware(code, in, out);
      default:
        return kErrorInvalidFunction;
    }
  }

  std::uint32_t ReadMapped(std::uint64_t mapped, std::size_t width) override {
    CurrentThread::CheckEndRequest();
    return width == 4 ? *At<std::uint32_t>(mapped) : *At<std::uint8_t>(mapped);
  }

  void WriteMapped(std::uint64_t mapped, std::size_t width, std::uint32_t value) override {
    CurrentThread::CheckEndRequest();
    if (width == 4) {
      *At<std::uint32_t>(mapped) = value;
    } else {
      *At<std::uint8_t>(mapped) = static_cast<std::uint8_t>(value);
    }
  }

 private:
  std::uint32_t Port(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) {
    constexpr std::array<unsigned, 3> kWidths{1, 2, 4};
    const bool isWrite = code >= driver::kOutportByte;
    if (in.size() != driver::kPortSize || (!isWrite && out.size() != 4)) {
      return kErrorInvalidParameter;
    }
    const unsigned width = kWidths[((code - driver::kInportByte) / 4) % 3];
    const auto port = static_cast<std::uint16_t>(NumberAt(in, driver::kPortNumber, 4));
    if (NumberAt(in, driver::kPortWidth, 4) != width) {
      return kErrorInvalidParameter;
    }
    if (const int error = owner_.Refusal().error; error != 0) {
      return HomeErrorOf(error);
    }
    if (isWrite) {
      PortAccess::Out(port, width, static_cast<std::uint32_t>(NumberAt(in, driver::kPortValue, 4)));
    } else {
      PutNumber(out, 0, 4, PortAccess::In(port, width));
    }
    return 0;
  }

  std::uint32_t Pci(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) const {
    if (!HasSizes(in, out, driver::kPciSize)) {
      return kErrorInvalidParameter;
    }
    std::copy(in.begin(), in.end(), out.begin());
    const bool isWrite = code >= driver::kWritePciConfigByte;
    const unsigned width = 1U << ((code - (isWrite ? driver::kWritePciConfigByte : driver::kReadPciConfigByte)) / 4);
    const auto location = static_cast<std::uint16_t>(NumberAt(in, driver::kPciLocation, 2));
    const auto reg = static_cast<std::uint16_t>(NumberAt(in, driver::kPciRegister, 2));
    bool isDone = false;
    if (isWrite) {
      const int refusal = owner_.Refusal().error;
      const auto value = static_cast<std::uint32_t>(NumberAt(in, driver::kPciValue, 4));
      const int error = refusal != 0 ? refusal : owner_.pci_.Write(location, reg, width, value);
      isDone = error == 0;
      if (error == EPERM || error == EACCES) {
        owner_.teller_.Tell("PCI configuration registers cannot be written (" + std::string(std::strerror(error)) +
                            "): " + WhatToDo(error) + ".");
      }
    } else if (const auto value = owner_.pci_.Read(location, reg, width)) {
      PutNumber(out, driver::kPciValue, 4, *value);
      isDone = true;
    } else if (reg + width > kFreePciRegisters && owner_.pci_.Read(location, 0, 1)) {
      owner_.teller_.Tell(
          "PCI configuration registers above 63 cannot be read: it needs CAP_SYS_ADMIN, as root has.");
    }
    PutNumber(out, driver::kPciStatus, 1, isDone ? 0 : kPciNotFound);
    return 0;
  }

  std::uint32_t Search(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) const {
    if (!HasSizes(in, out, driver::kSearchSize)) {
      return kErrorInvalidParameter;
    }
    std::copy(in.begin(), in.end(), out.begin());
    auto index = static_cast<unsigned>(NumberAt(in, driver::kSearchIndex, 2));
    const auto ids = static_cast<std::uint32_t>(NumberAt(in, driver::kSearchVendor, 2) |
                                                NumberAt(in, driver::kSearchDevice, 2) << 16U);
    for (const std::uint16_t location : owner_.pci_.Functions()) {
      const bool byClass = code == driver::kFindPciClass;
      const auto value = owner_.pci_.Read(location, byClass ? kClassAndRevision : 0, 4);
      const bool matches = value && (byClass ? *value >> 8U == NumberAt(in, driver::kSearchClass, 4) : *value == ids);
      if (matches && index-- == 0) {
        PutNumber(out, driver::kSearchLocation, 2, location);
        PutNumber(out, driver::kSearchStatus, 1, 0);
        return 0;
      }
    }
    PutNumber(out, driver::kSearchStatus, 1, kPciNotFound);
    return 0;
  }

  std::uint32_t Map(std::span<const std::byte> in, std::span<std::byte> out) {
    const bool isWide = in.size() == driver::kMapSize64;
    if (in.size() != out.size() || (!isWide && in.size() != driver::kMapSize32)) {
      return kErrorInvalidParameter;
    }
    std::copy(in.begin(), in.end(), out.begin());
    const std::size_t field = isWide ? 8 : 4;
    const std::uint64_t address = NumberAt(in, 0, field);
    int error = 0;
    const std::uint64_t length = NumberAt(in, field, field);
    const MemoryOwner owner = owner_.OwnerOf(address, length);
    std::uint64_t mapped = 0;
    if (owner == MemoryOwner::kRam) {
      error = EPERM;  // the kernel would let us write the first megabyte's, which it uses
    } else {
      mapped = owner_.memory_.Map(address, length, isWide ? Reach::kAll : Reach::kNarrow, error);
    }
    constexpr std::uint64_t kNarrow = 0xFFFFFFFF;
    if (error == 0 && !isWide && mapped > kNarrow) {
      owner_.memory_.Unmap(mapped);
      error = ENOMEM;  // no place for it in the narrow record
    }
    owner_.TellOfMemory(address, owner, error);
    if (error != 0) {
      return HomeErrorOf(error);
    }
    PutNumber(out, 2 * field, field, mapped);
    return 0;
  }

  std::uint32_t Msr(std::span<const std::byte> in, std::span<std::byte> out) const {
    if (!HasSizes(in, out, driver::kMsrSize)) {
      return kErrorInvalidParameter;
    }
    const int core = ::sched_getcpu();
    const std::string path = "/dev/cpu/" + std::to_string(core < 0 ? 0 : core) + "/msr";
    const posix::Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (!file) {
      const int error = errno;
      owner_.teller_.Tell(
          "The processor's own registers cannot be read (/dev/cpu/*/msr: " + std::string(std::strerror(error)) +
          "): " + (error == ENOENT ? "load the kernel module \"msr\"." : WhatToDo(error) + "."));
      return HomeErrorOf(error);
    }
    std::uint64_t value = 0;
    if (::pread(file.Get(), &value, sizeof value, static_cast<off_t>(NumberAt(in, driver::kMsrIndex, 4))) !=
        static_cast<ssize_t>(sizeof value)) {
      return kErrorInvalidParameter;  // the processor has no such register
    }
    PutNumber(out, 0, driver::kMsrSize, value);
    return 0;
  }

  std::uint32_t Firmware(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) {
    if (in.size() != driver::kFirmwareSize || out.size() != driver::kFirmwareAnswerSize) {
      return kErrorInvalidParameter;
    }
    const std::uint64_t address = NumberAt(in, 0, 2) * 16 + NumberAt(in, 2, 2);
    const unsigned width = code == driver::kReadFirmwareWord ? 2 : 1;
    int error = 0;
    const std::uint64_t mapped = owner_.memory_.Map(address, width, Reach::kAll, error);
    if (error != 0) {
      owner_.TellOfMemory(address, MemoryOwner::kUnknown, error);
      return HomeErrorOf(error);
    }
    std::uint64_t value = 0;
    for (unsigned i = 0; i < width; ++i) {
      value |= std::uint64_t{*At<std::uint8_t>(mapped + i)} << (8 * i);
    }
    PutNumber(out, 0, 2, value);
    owner_.memory_.Unmap(mapped);
    return 0;
  }

  LinuxDriver& owner_;
};

std::unique_ptr<DriverDevice> LinuxDriver::Open(std::string_view linkName, std::uint32_t& error) {
  if (linkName != kLink) {
    error = kErrorFileNotFound;
    return nullptr;
  }
  error = 0;
  return std::make_unique<Device>(*this);
}

LinuxDriver::Refused LinuxDriver::Refusal() {
  if (const int error = PortAccess::Allow(); error != 0) {
    return {"I/O ports", error};
  }
  return {"/dev/mem", memory_.Open()};
}

MemoryOwner LinuxDriver::OwnerOf(std::uint64_t address, std::uint64_t length) {
  constexpr std::uint64_t kConventionalEnd = 0xA0000;  // RAM on every PC
  constexpr std::size_t kList_bytes = std::size_t{1} << 20U;
  if (length != 0 && address < kConventionalEnd) {
    return MemoryOwner::kRam;
  }
  const std::lock_guard<std::mutex> lock(guard_);
  const auto [known, isNew] = owners_.try_emplace(address / kPage, MemoryOwner::kUnknown);
  if (isNew) {
    known->second = MemoryMap(ReadKernelBytes("/proc/iomem", kList_bytes).value_or("")).OwnerOf(address, length);
  }
  return known->second;
}

void LinuxDriver::TellOfMemory(std::uint64_t address, MemoryOwner owner, int error) {
  const bool isRefused = error == EPERM || error == EACCES || error == EAGAIN;
  if (error != 0 && !isRefused) {
    return;  // what is wrong with the request is the caller's
  }
  {
    const std::lock_guard<std::mutex> lock(guard_);
    if (!toldPages_.insert(address / kPage).second) {
      return;
    }
  }
  if (const std::string remark = RemarkOn(owner, address); !remark.empty() || !isRefused) {
    if (!remark.empty()) {
      posix::TellPeople(remark);
    }
    return;
  }
  std::array<char, 32> text{};
  std::snprintf(text.data(), text.size(), "0x%llX", static_cast<unsigned long long>(address));
  posix::TellPeople("The kernel refuses the memory at " + std::string(text.data()) + " (" + std::strerror(error) +
                    "), and nothing was written there: a kernel driver has it; unbind that driver, or start the "
                    "kernel with iomem=relaxed.");
}

// ---- service manager

ServiceHandle LinuxDriver::OpenManager(std::uint32_t /*access*/, std::uint32_t& error) {
  error = 0;
  return kManager;
}

ServiceHandle LinuxDriver::OpenService(ServiceHandle manager, std::string_view name, std::uint32_t /*access*/,
                                       std::uint32_t& error) {
  error = manager != kManager ? kErrorInvalidHandle : name == kLink ? 0 : kErrorServiceDoesNotExist;
  return error == 0 ? kService : 0;
}

ServiceHandle LinuxDriver::CreateService(ServiceHandle /*manager*/, const ServiceDefinition& /*definition*/,
                                         std::uint32_t& error) {
  error = kErrorAccessDenied;
  return 0;
}

std::uint32_t LinuxDriver::Start(ServiceHandle service) {
  if (service != kService) {
    return kErrorInvalidHandle;
  }
  const auto [door, error] = Refusal();
  if (error == 0) {
    return 0;
  }
  teller_.Tell("There is no way to the hardware (" + std::string(door) + ": " + std::strerror(error) +
               "): " + WhatToDo(error) + ". Without the hardware, try panelglow-diags-sim.");
  return kErrorAccessDenied;
}

std::uint32_t LinuxDriver::Delete(ServiceHandle /*service*/) { return 0; }

void LinuxDriver::Close(ServiceHandle /*handle*/) {}

}  // namespace panelglow::platform::host_linux
