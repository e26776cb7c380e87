// A machine with some of its services replaced.
#pragma once

#include "platform/Host.h"

namespace panelglow::boardtool {

/// The services that stand in place of the machine's; null: the machine's own.
struct HostChanges {
  platform::Clock* clock = nullptr;
  platform::Console* console = nullptr;
  platform::DriverDevices* drivers = nullptr;
  platform::Files* files = nullptr;
  platform::ProfileFiles* profiles = nullptr;
  platform::ServiceManager* services = nullptr;
};

inline platform::Host HostWith(const platform::Host& machine, const HostChanges& changes) {
  const auto pick = [](auto* changed, auto& own) -> auto& { return changed == nullptr ? own : *changed; };
  return {.cameras = machine.cameras,
          .clock = pick(changes.clock, machine.clock),
          .connections = machine.connections,
          .console = pick(changes.console, machine.console),
          .cpu = machine.cpu,
          .desktop = machine.desktop,
          .deviceTree = machine.deviceTree,
          .drivers = pick(changes.drivers, machine.drivers),
          .environment = machine.environment,
          .files = pick(changes.files, machine.files),
          .images = machine.images,
          .keyboard = machine.keyboard,
          .management = machine.management,
          .modules = machine.modules,
          .mutexes = machine.mutexes,
          .profiles = pick(changes.profiles, machine.profiles),
          .rawDisks = machine.rawDisks,
          .registry = machine.registry,
          .services = pick(changes.services, machine.services),
          .threads = machine.threads,
          .touchpad = machine.touchpad,
          .xmlDocuments = machine.xmlDocuments};
}

}  // namespace panelglow::boardtool
