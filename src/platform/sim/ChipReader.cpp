#include "platform/sim/ChipReader.h"

#include <algorithm>
#include <array>
#include <string_view>

#include "platform/sim/SouthbridgeReader.h"
#include "platform/sim/SuperIoReader.h"

namespace panelglow::platform::sim {

namespace {

LampNames NameSet(Section& section, std::string_view key) {
  const std::vector<std::string> names = section.Names(key);
  return {names.begin(), names.end()};
}

std::uint8_t BitNumber(Section& section, std::string_view key) {
  const auto bit = section.Get<std::uint8_t>(key, 0);
  if (bit > 7) {
    section.Refuse(key, "must be a bit of a byte, 0 to 7");
  }
  return bit;
}

// ---- Super-I/O

EnvironmentSetup ReadEnvironment(Section& section) {
  EnvironmentSetup setup;
  setup.device = section.Get("device", setup.device);
  setup.indexOffset = section.Get("index", setup.indexOffset);
  setup.dataOffset = section.Get("data", setup.dataOffset);
  setup.settings = section.AddressedBytes<std::uint8_t>("settings");
  setup.sensors = section.AddressedBytes<std::uint8_t>("sensors");
  section.Each("intrusion", [&](Section& intrusion) {
    IntrusionSetup& latch = setup.intrusion.emplace();
    latch.statusRegister = intrusion.Number<std::uint8_t>("status");
    latch.statusBit = BitNumber(intrusion, "status_bit");
    latch.clearRegister = intrusion.Get("clear", latch.statusRegister);
    latch.clearBit = BitNumber(intrusion, "clear_bit");
    latch.wasOpened = intrusion.Get("was_opened", false);
    latch.isOpen = intrusion.Get("is_open", false);
  });
  return setup;
}

SuperIoSetup ReadSuperIo(Section& section) {
  constexpr std::array<std::string_view, 3> kFamilies{"plain", "ite", "fintek"};
  constexpr std::size_t kMostSets = 5;
  SuperIoSetup setup;
  setup.family = static_cast<SuperIoFamily>(section.OneOf("family", kFamilies));
  const bool isIte = setup.family == SuperIoFamily::kIte;
  setup.indexPort = section.Get("base", setup.indexPort);
  setup.enterKeys = section.Bytes("enter");
  const bool isAlwaysOpen = !isIte && section.Get("always_open", false);
  if (section.Has("enter") && setup.enterKeys.empty()) {
    section.Refuse("enter", "must name at least one key");
  }
  if (isAlwaysOpen && section.Has("enter")) {
    section.Refuse("enter", "is for a part that is not always open");
  }
  if (!section.Has("enter") && !isAlwaysOpen) {
    const std::uint8_t lastIteKey = setup.indexPort == 0x2E ? 0x55 : 0xAA;  // the key says which place is meant
    setup.enterKeys =
        isIte ? std::vector<std::uint8_t>{0x87, 0x01, 0x55, lastIteKey} : std::vector<std::uint8_t>{0x87, 0x87};
  }
  if (!isIte && !isAlwaysOpen) {
    setup.exitKey = section.Get<std::uint8_t>("exit", 0xAA);
  }
  const std::vector<std::uint8_t> chipId = section.Bytes("chip_id");
  std::copy_n(chipId.begin(), std::min(chipId.size(), setup.chipId.size()), setup.chipId.begin());
  setup.globals = section.AddressedBytes<std::uint8_t>("registers");
  section.Each("device", [&](Section& device) {
    setup.devices[device.Number<std::uint8_t>("number")] = device.AddressedBytes<std::uint8_t>("registers");
  });
  section.Each("environment", [&](Section& environment) { setup.environment = ReadEnvironment(environment); });
  setup.gpioDevice = section.Get<std::uint8_t>("gpio_device", setup.family == SuperIoFamily::kFintek ? 6 : 7);
  section.Each("gpio", [&](Section& set) {
    setup.gpio.push_back(
        {setup.family == SuperIoFamily::kPlain ? set.Get<std::uint8_t>("outputs", 0) : std::uint8_t{0},
         set.Get<std::uint8_t>("inputs", 0), set.Get<std::uint8_t>("latch", 0)});
  });
  if (setup.gpio.size() > kMostSets) {
    section.Refuse("gpio", "must be at most five sets of lines");
  }
  if (setup.family == SuperIoFamily::kPlain) {
    setup.tables = ReadSuperIoTables(section);
  }
  return setup;
}

// ---- embedded controller

EcLedCommand ReadLedCommand(Section& section) {
  struct EffectName {
    std::string_view key;
    EcLedCommand::Effect effect;
  };
  constexpr std::array<EffectName, 3> kLampEffects{{{"stage", EcLedCommand::Effect::kStage},
                                                    {"light", EcLedCommand::Effect::kLight},
                                                    {"darken", EcLedCommand::Effect::kDarken}}};
  constexpr std::array<std::string_view, 2> kShown{"staged", "automatic"};
  EcLedCommand command;
  command.code = section.Number<std::uint8_t>("code");
  command.data = section.Bytes("data");
  for (const EffectName& name : kLampEffects) {
    if (section.Has(name.key)) {
      command.effect = name.effect;
      command.lamps = NameSet(section, name.key);
      return command;
    }
  }
  command.effect =
      section.OneOf("show", kShown) == 0 ? EcLedCommand::Effect::kShow : EcLedCommand::Effect::kAutomatic;
  return command;
}

EmbeddedControllerSetup ReadEmbeddedController(Section& section) {
  constexpr std::array<std::string_view, 3> kFaults{"", "stuck-ibf", "stuck-obf"};
  EmbeddedControllerSetup setup;
  setup.commandPort = section.Get("command_port", setup.commandPort);
  setup.dataPort = section.Get("data_port", setup.dataPort);
  setup.take_us = section.Get<std::uint32_t>("take_us", static_cast<std::uint32_t>(setup.take_us));
  setup.answer_us = section.Get<std::uint32_t>("answer_us", static_cast<std::uint32_t>(setup.answer_us));
  setup.wideAddresses = section.Get("wide_addresses", setup.wideAddresses);
  setup.readCommand = section.Get("read_command", setup.readCommand);
  setup.writeCommand = section.Get("write_command", setup.writeCommand);
  setup.queryCommand = section.Get("query_command", setup.queryCommand);
  if (section.Has("pwm_command")) {
    setup.pwmCommand = section.Number<std::uint8_t>("pwm_command");
  }
  setup.pwmRegisterBytes = section.Get("pwm_register_bytes", setup.pwmRegisterBytes);
  if (setup.pwmRegisterBytes > 2) {
    section.Refuse("pwm_register_bytes", "must be 0, 1 or 2");
  }
  setup.memory = section.AddressedBytes<std::uint16_t>("memory");
  setup.automatic = NameSet(section, "automatic");
  section.Each("command", [&](Section& entry) {
    setup.commands.push_back(ReadLedCommand(entry));
    const EcLedCommand& added = setup.commands.back();
    const auto first = std::find_if(setup.commands.begin(), setup.commands.end(),
                                    [&](const EcLedCommand& c) { return c.code == added.code; });
    if (first->data.size() != added.data.size()) {
      entry.Refuse("code", "has another number of data bytes elsewhere");
    }
  });
  section.Each("lamp", [&](Section& lamp) {
    setup.memoryLamps.push_back(
        {lamp.Required("name"), lamp.Number<std::uint16_t>("address"), BitNumber(lamp, "bit")});
  });
  setup.fault = static_cast<EmbeddedControllerSetup::Fault>(section.OneOf("fault", kFaults));
  return setup;
}

// ---- mailbox

MailboxControllerSetup ReadMailbox(Section& section) {
  constexpr std::array<std::string_view, 2> kFaults{"", "stuck-busy"};
  MailboxControllerSetup setup;
  setup.indexPort = section.Get("base", setup.indexPort);
  setup.step_us = section.Get<std::uint32_t>("step_us", static_cast<std::uint32_t>(setup.step_us));
  setup.configurationPort = section.Get("configuration_port", setup.configurationPort);
  setup.configuration = section.AddressedBytes<std::uint8_t>("configuration");
  setup.runtime = section.AddressedBytes<std::uint16_t>("runtime");
  setup.memory = section.AddressedBytes<std::uint32_t>("memory");
  section.Each("pin", [&](Section& entry) {
    MailboxPin pin;
    pin.name = entry.Required("name");
    if (entry.Has("port")) {
      pin.port = entry.Number<std::uint16_t>("port");
    } else {
      pin.address = entry.Number<std::uint32_t>("address");
    }
    pin.bit = BitNumber(entry, "bit");
    if (entry.Has("mux_address")) {
      pin.muxAddress = entry.Number<std::uint32_t>("mux_address");
      pin.muxMask = entry.Number<std::uint8_t>("mux_mask");
      pin.muxValue = entry.Number<std::uint8_t>("mux_value");
      pin.otherwise = entry.Get("otherwise", false);
    }
    setup.pins.push_back(std::move(pin));
  });
  setup.fault = static_cast<MailboxControllerSetup::Fault>(section.OneOf("fault", kFaults));
  return setup;
}

// ---- audio codec

HdaCodecSetup ReadHdaCodec(Section& section) {
  constexpr std::array<std::string_view, 2> kFaults{"", "stuck-busy"};
  HdaCodecSetup setup;
  setup.base = section.Number<std::uint64_t>("base");
  setup.codecAddress = section.Get("codec_address", setup.codecAddress);
  setup.pins = section.Get("pins", setup.pins);
  if (setup.pins > 8) {
    section.Refuse("pins", "must be at most 8");
  }
  setup.data = section.Get("data", setup.data);
  setup.enable = section.Get("enable", setup.enable);
  setup.direction = section.Get("direction", setup.direction);
  setup.inputs = section.Get("inputs", setup.inputs);
  setup.fault = static_cast<HdaCodecSetup::Fault>(section.OneOf("fault", kFaults));
  return setup;
}

// ---- floppy controller

FloppyControllerSetup ReadFloppyController(Section& section) {
  FloppyControllerSetup setup;
  setup.base = section.Get("base", setup.base);
  setup.digitalOutput = section.Get("output", setup.digitalOutput);
  return setup;
}

}  // namespace

ChipDescription ReadChip(Section& section) {
  ChipDescription chip;
  chip.name = section.Required("name");
  chip.kind = section.Required("kind");
  if (chip.kind == "super-io") {
    chip.setup = ReadSuperIo(section);
  } else if (chip.kind == "embedded-controller") {
    chip.setup = ReadEmbeddedController(section);
  } else if (chip.kind == "mailbox-controller") {
    chip.setup = ReadMailbox(section);
  } else if (chip.kind == "floppy-controller") {
    chip.setup = ReadFloppyController(section);
  } else if (chip.kind == "indexed-registers") {
    chip.setup = ReadIndexedRegisters(section);
  } else if (chip.kind == "port-registers") {
    chip.setup = ReadPortRegisters(section);
  } else if (chip.kind == "smbus-host") {
    chip.setup = ReadSmbusHost(section);
  } else if (chip.kind == "hda-codec") {
    chip.setup = ReadHdaCodec(section);
  } else {
    chip.base = section.Get("base", chip.base);
    chip.outputs = section.Get("outputs", chip.outputs);
    chip.inputs = section.Get("inputs", chip.inputs);
    chip.initial = section.Bytes("initial");
  }
  return chip;
}

FirmwareCallSetup ReadFirmwareCall(Section& section) {
  // The faults of the answer, then the steps of a call in their order.
  constexpr std::array<std::string_view, 14> kFaults{
      "",          "wrong-signature",  "short-data",      "stale-record", "get-method",
      "get-class", "spawn-parameters", "get-input-class", "spawn-input",  "populate-input",
      "put-input", "execute",          "get-output",      "query-output"};
  constexpr std::size_t kFirstStep = 4;
  constexpr std::uint8_t kRecordBytes = 128;
  FirmwareCallSetup setup;
  setup.path = section.Get("path", setup.path);
  if (section.Has("header")) {
    setup.header = section.Bytes("header");
    if (setup.header.size() != 2) {
      section.Refuse("header", "must be two bytes");
    }
  }
  section.Each("radio", [&](Section& radio) {
    setup.radios.push_back(
        {radio.Number<std::uint8_t>("number"), radio.Number<std::uint8_t>("offset"), radio.Get("on", true)});
    if (setup.radios.back().offset >= kRecordBytes) {
      radio.Refuse("offset", "lies behind the record of 128 bytes");
    }
  });
  section.Each("fan", [&](Section& fan) {
    setup.fans.push_back({fan.Get<std::uint8_t>("speed", 0), fan.Get<std::uint8_t>("duty", 0)});
  });
  setup.temperatures = section.Bytes("temperatures");
  if (setup.fans.size() > kRecordBytes - 2U || setup.temperatures.size() >= kRecordBytes) {
    section.Refuse(setup.fans.size() > kRecordBytes - 2U ? "fan" : "temperatures", "does not fit in a record");
  }
  const std::size_t fault = section.OneOf("fault", kFaults);
  if (fault >= kFirstStep) {
    setup.fault = FirmwareCallSetup::Fault::kFailingStep;
    setup.failingStep = static_cast<ManagementCallStep>(fault - kFirstStep + 1);
  } else {
    setup.fault = static_cast<FirmwareCallSetup::Fault>(fault);
  }
  return setup;
}

}  // namespace panelglow::platform::sim
