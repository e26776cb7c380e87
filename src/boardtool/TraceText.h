// The words of a trace.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

#include "platform/Host.h"

namespace panelglow::boardtool {

inline constexpr std::string_view kTraceHead = "panelglow-board trace 1";
inline constexpr std::string_view kReal = "real";
inline constexpr std::string_view kSimulated = "simulated";

/// Hexadecimal without a prefix.
std::string HexNumber(std::uint64_t number);

/// Two digits a byte; "-" for none.
std::string HexBytes(std::span<const std::byte> bytes);

/// The machine with another driver, clock and service manager.
inline platform::Host HostWith(const platform::Host& machine, platform::DriverDevices& drivers,
                               platform::Clock& clock, platform::ServiceManager& services) {
  return {.cameras = machine.cameras,
          .clock = clock,
          .connections = machine.connections,
          .console = machine.console,
          .cpu = machine.cpu,
          .desktop = machine.desktop,
          .deviceTree = machine.deviceTree,
          .drivers = drivers,
          .environment = machine.environment,
          .files = machine.files,
          .images = machine.images,
          .keyboard = machine.keyboard,
          .management = machine.management,
          .modules = machine.modules,
          .mutexes = machine.mutexes,
          .profiles = machine.profiles,
          .rawDisks = machine.rawDisks,
          .registry = machine.registry,
          .services = services,
          .threads = machine.threads,
          .touchpad = machine.touchpad,
          .xmlDocuments = machine.xmlDocuments};
}

}  // namespace panelglow::boardtool
