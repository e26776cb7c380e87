#include "platform/host_linux/PciConfiguration.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <filesystem>
#include <system_error>

#include "platform/posix/Descriptor.h"

namespace panelglow::platform::host_linux {

std::string PciConfiguration::FileOf(std::uint16_t location) const {
  std::array<char, 32> name{};
  std::snprintf(name.data(), name.size(), "/0000:%02x:%02x.%u/config", static_cast<unsigned>(location >> 8U),
                static_cast<unsigned>(location >> 3U & 0x1FU), static_cast<unsigned>(location & 7U));
  return folder_ + name.data();
}

std::vector<std::uint16_t> PciConfiguration::Functions() const {
  std::vector<std::uint16_t> functions;
  std::error_code none;
  for (std::filesystem::directory_iterator it(folder_, none), end; !none && it != end; it.increment(none)) {
    unsigned domain = 0;
    unsigned bus = 0;
    unsigned device = 0;
    unsigned function = 0;
    if (std::sscanf(it->path().filename().c_str(), "%x:%x:%x.%x", &domain, &bus, &device, &function) == 4 &&
        domain == 0 && bus <= 0xFF && device <= 0x1F && function <= 7) {
      functions.push_back(static_cast<std::uint16_t>(bus << 8U | device << 3U | function));
    }
  }
  std::sort(functions.begin(), functions.end());
  return functions;
}

std::optional<std::uint32_t> PciConfiguration::Read(std::uint16_t location, std::uint16_t reg, unsigned width) const {
  const posix::Descriptor file(::open(FileOf(location).c_str(), O_RDONLY | O_CLOEXEC));
  std::array<std::uint8_t, 4> bytes{};
  if (file.Get() < 0 || ::pread(file.Get(), bytes.data(), width, reg) != static_cast<ssize_t>(width)) {
    return std::nullopt;
  }
  std::uint32_t value = 0;
  for (unsigned i = 0; i < width; ++i) {
    value |= std::uint32_t{bytes[i]} << (8 * i);
  }
  return value;
}

int PciConfiguration::Write(std::uint16_t location, std::uint16_t reg, unsigned width, std::uint32_t value) const {
  const posix::Descriptor file(::open(FileOf(location).c_str(), O_WRONLY | O_CLOEXEC));
  if (!file) {
    return errno;
  }
  std::array<std::uint8_t, 4> bytes{};
  for (unsigned i = 0; i < width; ++i) {
    bytes[i] = static_cast<std::uint8_t>(value >> (8 * i));
  }
  const ssize_t count = ::pwrite(file.Get(), bytes.data(), width, reg);
  return count == static_cast<ssize_t>(width) ? 0 : count < 0 ? errno : ENXIO;
}

}  // namespace panelglow::platform::host_linux
