#include "platform/sim/SouthbridgeReader.h"

#include <array>
#include <string_view>

#include "platform/sim/SuperIoReader.h"

namespace panelglow::platform::sim {

PortRegistersSetup ReadPortRegisters(Section& section) {
  constexpr std::uint16_t kLineBytes = 4;
  PortRegistersSetup setup;
  setup.base = section.Number<std::uint16_t>("base");
  setup.registers = section.AddressedBytes<std::uint16_t>("registers");
  setup.clearByOne = section.AddressedBytes<std::uint16_t>("clear_by_one");
  setup.readOnly = section.AddressedBytes<std::uint16_t>("read_only");
  setup.lasting = section.AddressedBytes<std::uint16_t>("lasting");
  section.Each("press", [&](Section& entry) {
    setup.presses.push_back({.offset = entry.Number<std::uint16_t>("register"),
                             .mask = entry.Number<std::uint8_t>("mask"),
                             .from_us = Microseconds{entry.Get<std::uint32_t>("from_ms", 0)} * 1000,
                             .until_us = Microseconds{entry.Number<std::uint32_t>("until_ms")} * 1000,
                             .isLow = entry.Get("low", false)});
  });
  section.Each("bolt", [&](Section& entry) {
    PortBolt bolt;
    bolt.command = entry.Number<std::uint16_t>("command");
    bolt.lock = entry.Get("lock", bolt.lock);
    bolt.unlock = entry.Get("unlock", bolt.unlock);
    bolt.level = entry.Number<std::uint16_t>("level");
    bolt.unlocked = entry.Number<std::uint8_t>("unlocked");
    for (const char* key : {"command", "level"}) {
      if (setup.registers.count(entry.Number<std::uint16_t>(key)) == 0) {
        entry.Refuse(key, "must be a register that is told");
      }
    }
    bolt.move_us = Microseconds{entry.Get<std::uint32_t>("move_ms", 8)} * 1000;
    setup.bolts.push_back(bolt);
  });
  section.Each("lines", [&](Section& entry) {
    const auto offset = [&](std::string_view key) {
      const auto first = entry.Number<std::uint16_t>(key);
      for (std::uint16_t byte = 0; byte < kLineBytes; ++byte) {
        if (setup.registers.count(static_cast<std::uint16_t>(first + byte)) == 0) {
          entry.Refuse(key, "is the first of four registers, which must all be told");
        }
      }
      return first;
    };
    PortLines& lines = setup.lines.emplace_back();
    lines.level = offset("level");
    if (entry.Has("select")) {
      lines.select = offset("select");
    }
    if (entry.Has("direction")) {
      lines.direction = offset("direction");
    }
    lines.outside = entry.Get("outside", lines.outside);
  });
  return setup;
}

SmbusHostSetup ReadSmbusHost(Section& section) {
  constexpr std::array<std::string_view, 2> kFaults{"", "stuck-busy"};
  SmbusHostSetup setup;
  setup.base = section.Number<std::uint16_t>("base");
  setup.transfer_us = section.Get<std::uint32_t>("transfer_us", static_cast<std::uint32_t>(setup.transfer_us));
  section.Each("device", [&](Section& entry) {
    SmbusDevice& device = setup.devices[entry.Number<std::uint8_t>("address")];
    device.registers = entry.AddressedBytes<std::uint8_t>("registers");
    const std::vector<std::uint8_t> readOnly = entry.Bytes("read_only");
    device.readOnly = {readOnly.begin(), readOnly.end()};
    entry.Each("lamp", [&](Section& lamp) { device.lamps.push_back(ReadLedPin(lamp)); });
  });
  setup.fault = static_cast<SmbusHostSetup::Fault>(section.OneOf("fault", kFaults));
  return setup;
}

}  // namespace panelglow::platform::sim
