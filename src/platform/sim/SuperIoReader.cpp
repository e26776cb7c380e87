#include "platform/sim/SuperIoReader.h"

namespace panelglow::platform::sim {

namespace {

std::set<std::uint8_t> ByteSet(Section& section, std::string_view key) {
  const std::vector<std::uint8_t> bytes = section.Bytes(key);
  return {bytes.begin(), bytes.end()};
}

std::optional<std::uint8_t> OptionalByte(Section& section, std::string_view key) {
  return section.Has(key) ? std::optional(section.Number<std::uint8_t>(key)) : std::nullopt;
}

SuperIoField ReadField(Section& section) {
  SuperIoField field;
  if (const std::optional<std::uint8_t> runtime = OptionalByte(section, "runtime")) {
    field.isRuntime = true;
    field.address = *runtime;
  } else {
    field.device = OptionalByte(section, "device");
    field.bank = OptionalByte(section, "bank");
    field.address = section.Number<std::uint8_t>("register");
  }
  field.mask = section.Get("mask", field.mask);
  return field;
}

SuperIoCondition ReadCondition(Section& section) {
  const SuperIoField field = ReadField(section);
  return {field, section.Get("value", field.mask)};
}

BankSetup ReadBanks(Section& section) {
  BankSetup setup;
  setup.select = section.Number<std::uint8_t>("select");
  setup.mask = section.Get("mask", setup.mask);
  section.Each("bank", [&](Section& bank) {
    setup.banks[bank.Number<std::uint8_t>("number")] = bank.AddressedBytes<std::uint8_t>("registers");
  });
  return setup;
}

SuperIoLines ReadLines(Section& section) {
  SuperIoLines lines;
  lines.number = section.Number<std::uint8_t>("number");
  lines.device = section.Number<std::uint8_t>("device");
  lines.enableBit = OptionalByte(section, "enable_bit");
  if (lines.enableBit.value_or(0) > 7) {
    section.Refuse("enable_bit", "must be a bit of a byte, 0 to 7");
  }
  lines.direction = section.Number<std::uint8_t>("direction");
  lines.outputIsSet = section.Get("output_is_set", lines.outputIsSet);
  lines.data = section.Number<std::uint8_t>("data");
  lines.inversion = OptionalByte(section, "inversion");
  lines.status = OptionalByte(section, "status");
  lines.function = OptionalByte(section, "function");
  lines.inputs = section.Get("inputs", lines.inputs);
  return lines;
}

FanSetup ReadFan(Section& section) {
  FanSetup fan;
  fan.isPlugged = section.Get("plugged", fan.isPlugged);
  fan.tachHigh = section.Number<std::uint8_t>("tach_high");
  fan.tachLow = section.Number<std::uint8_t>("tach_low");
  fan.clock = section.Get("clock", fan.clock);
  fan.stopped = section.Get("stopped", fan.stopped);
  fan.duty = OptionalByte(section, "duty");
  fan.stall = section.Get("stall", fan.stall);
  fan.full_rpm = section.Get<std::uint16_t>("full_rpm", static_cast<std::uint16_t>(fan.full_rpm));
  fan.ramp_rpm = section.Get<std::uint16_t>("ramp_rpm", static_cast<std::uint16_t>(fan.ramp_rpm));
  fan.mode = OptionalByte(section, "mode");
  fan.manual = section.Get("manual", fan.manual);
  fan.automatic = section.Get("automatic", fan.automatic);
  return fan;
}

CoolingSetup ReadCooling(Section& section) {
  CoolingSetup cooling;
  section.Each("fan", [&](Section& fan) { cooling.fans.push_back(ReadFan(fan)); });
  section.Each("sensor", [&](Section& entry) {
    SensorSetup sensor;
    sensor.address = entry.Number<std::uint8_t>("register");
    sensor.still = entry.Get("still", sensor.still);
    sensor.cooled = entry.Get("cooled", sensor.cooled);
    const auto fan = entry.Number<std::uint8_t>("fan");
    if (fan == 0 || fan > cooling.fans.size()) {
      entry.Refuse("fan", "must be the number of a fan of this chip, from 1");
    }
    sensor.fan = fan - std::size_t{1};
    sensor.ramp_mdeg = entry.Get<std::uint16_t>("ramp_mdeg", static_cast<std::uint16_t>(sensor.ramp_mdeg));
    cooling.sensors.push_back(sensor);
  });
  return cooling;
}

}  // namespace

SuperIoLed ReadLedPin(Section& section) {
  SuperIoLed led;
  led.name = section.Required("name");
  led.mode = ReadField(section);
  led.high = ByteSet(section, "high");
  for (const auto& [value, half_ms] : section.Addressed<std::uint8_t, std::uint16_t>("blinks")) {
    if (half_ms == 0) {
      section.Refuse("blinks", "holds halves of a period, at least 1 ms");
    }
    led.half_us[value] = Microseconds{half_ms} * 1000;
  }
  section.Each("needs", [&](Section& need) { led.needs.push_back(ReadCondition(need)); });
  led.otherwise = section.Get("otherwise", false);
  return led;
}

SuperIoTables ReadSuperIoTables(Section& section) {
  SuperIoTables tables;
  section.Each("runtime", [&](Section& runtime) {
    tables.runtimeDevice = runtime.Number<std::uint8_t>("device");
    tables.runtime = runtime.AddressedBytes<std::uint8_t>("registers");
  });
  section.Each("led", [&](Section& led) { tables.leds.push_back(ReadLedPin(led)); });
  section.Each("lines", [&](Section& lines) { tables.lines.push_back(ReadLines(lines)); });
  section.Each("lock", [&](Section& lock) { tables.locks.push_back({ReadCondition(lock), ByteSet(lock, "stops")}); });
  section.Each("banks",
               [&](Section& banks) { tables.banks[banks.Number<std::uint8_t>("device")] = ReadBanks(banks); });
  return tables;
}

IndexedRegistersSetup ReadIndexedRegisters(Section& section) {
  IndexedRegistersSetup setup;
  setup.indexPort = section.Number<std::uint16_t>("base");
  setup.registers = section.AddressedBytes<std::uint8_t>("registers");
  section.Each("banks", [&](Section& banks) { setup.banks = ReadBanks(banks); });
  setup.readOnly = ByteSet(section, "read_only");
  setup.cooling = ReadCooling(section);
  return setup;
}

}  // namespace panelglow::platform::sim
