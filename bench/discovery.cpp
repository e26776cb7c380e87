// Which controllers a machine has and which of them have a disk, by their names in the mass-storage file: whole
// discoveries on machines of so many PCI functions, each a controller with a disk, with so many lines in the file.
// Linear in both, and at most 20 ms for 128 functions and 1000 lines.
#include <benchmark/benchmark.h>

#include <cstdio>
#include <string>
#include <utility>

#include "hw/PciDeviceList.h"
#include "hw/WMIDiscovery.h"
#include "ledtests/DriveSelection.h"
#include "platform/DeviceIds.h"
#include "platform/sim/DeviceInventory.h"
#include "platform/sim/Simulation.h"
#include "storage/MSUtils.h"

namespace {

namespace sim = panelglow::platform::sim;

std::string Text(const char* format, unsigned number) {
  char text[128];
  std::snprintf(text, sizeof text, format, number, number);
  return text;
}

sim::MachineDescription MachineOf(unsigned functions) {
  sim::MachineDescription machine;
  for (unsigned i = 0; i < functions; ++i) {
    sim::PciFunction function;
    function.location = static_cast<std::uint16_t>(i);
    function.registers = {{0x00, 0x00018086U + (i << 16U)}, {0x08, 0x01060100}, {0x2C, 0x00020003}};
    sim::ControllerDescription controller;
    controller.name = Text("c%u", i);
    controller.instanceId = sim::PciInstanceId(function);
    controller.kind = i % 2 == 0 ? sim::ControllerDescription::Kind::kIde : sim::ControllerDescription::Kind::kScsi;
    controller.driver = "storahci";
    if (i < 8) {
      controller.scsiPorts = {static_cast<std::uint8_t>(i)};
    }
    function.controller = controller.instanceId;
    sim::DiskSetup disk;
    disk.name = Text("d%u", i);
    disk.controller = controller.name;
    disk.instanceId = Text("IDE\\DISK%u\\0", i);
    disk.interfacePath = panelglow::platform::DiskInterfacePath(disk.instanceId);
    disk.path = Text("\\\\.\\PHYSICALDRIVE%u", i);
    machine.pci.push_back(std::move(function));
    machine.controllers.push_back(std::move(controller));
    machine.disks.push_back(std::move(disk));
  }
  return machine;
}

std::string ListOf(unsigned lines) {
  std::string list = "[SATA CONTROLLERS]\r\n";
  for (unsigned i = 0; i < lines; ++i) {
    list += i == lines / 2 ? "[SAS CONTROLLERS]\r\n" : "";
    list += Text("0x8086,0x%04X,0x0003,0x0002,wind,controller-%u ; a controller of the list\r\n", i + 1);
  }
  return list;
}

void Discovery(benchmark::State& state) {
  const auto functions = static_cast<unsigned>(state.range(0));
  sim::SimulationOptions options;
  options.timeLimit_us = 0;
  sim::Simulation machine(MachineOf(functions), options);
  machine.DiskFiles().Put("msctrl.ini", ListOf(static_cast<unsigned>(state.range(1))));
  std::size_t found = 0;
  for (auto _ : state) {
    panelglow::MSUtils::Forget();
    panelglow::PciDeviceList::Forget();
    panelglow::WMIDiscovery::Forget();
    found = panelglow::getCntrlListForHDD("controller-1,controller-12,controller-100", "msctrl.ini", false).size();
  }
  state.counters["found"] = static_cast<double>(found);
  panelglow::WMIDiscovery::Forget();
}

BENCHMARK(Discovery)
    ->ArgNames({"functions", "lines"})
    ->Args({64, 500})
    ->Args({128, 1000})
    ->Args({256, 2000})
    ->Unit(benchmark::kMillisecond);

}  // namespace
