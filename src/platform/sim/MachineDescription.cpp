#include "platform/sim/MachineDescription.h"

#include <algorithm>
#include <charconv>
#include <sstream>

#include "platform/Text.h"
#include "platform/sim/ChipReader.h"
#include "platform/sim/DescriptionSection.h"
#include "platform/sim/DeviceReader.h"

namespace panelglow::platform::sim {

namespace {

Microseconds Milliseconds(Section& section, std::string_view key) {
  return Microseconds{section.Get<std::uint32_t>(key, 0)} * 1000;
}

ManagementScalar ScalarOf(const toml::node& node) {
  if (const auto text = node.value_exact<std::string>()) {
    return WideFromUtf8(*text);
  }
  if (const auto flag = node.value_exact<bool>()) {
    return *flag;
  }
  if (const auto number = node.value_exact<std::int64_t>()) {
    return *number < 0 ? ManagementScalar(static_cast<std::int32_t>(*number))
                       : ManagementScalar(static_cast<std::uint32_t>(*number));
  }
  return node.value<double>().value_or(0.0);
}

void ReadFirmware(Section& section, FirmwareDescription& firmware) {
  firmware.boardProduct = section.Get<std::string>("board_product", firmware.boardProduct);
  firmware.boardManufacturer = section.Get<std::string>("board_manufacturer", firmware.boardManufacturer);
  firmware.boardSerial = section.Get<std::string>("board_serial", firmware.boardSerial);
  firmware.systemProduct = section.Get<std::string>("system_product", firmware.systemProduct);
  firmware.inManagement = section.Get("in_management", firmware.inManagement);
  firmware.entryPoint = section.Get("entry_point", firmware.entryPoint);
  bool first = true;
  section.Each("processor", [&](Section& processor) {
    if (std::exchange(first, false)) {
      firmware.processors.clear();
    }
    ProcessorDescription description;
    description.manufacturer = processor.Get<std::string>("manufacturer", description.manufacturer);
    description.family = processor.Get("family", description.family);
    firmware.processors.push_back(description);
  });
  const std::vector<std::uint8_t> raw = section.Bytes("raw_table");
  if (!raw.empty()) {
    firmware.rawTable = raw;
  }
}

void ReadDriver(Section& section, DriverDescription& driver) {
  driver.present = section.Get("present", driver.present);
  driver.olderSet = section.Get("older_set", driver.olderSet);
  driver.link = section.Get("link", driver.link);
  driver.managerError = section.Get("manager_error", driver.managerError);
  driver.createError = section.Get("create_error", driver.createError);
  driver.startError = section.Get("start_error", driver.startError);
  driver.version = section.Get("version", driver.version);
  driver.registers = section.Addressed<std::uint32_t, std::uint64_t>("msr");
  section.Each("core",
               [&](Section& core) { driver.cores.push_back(core.Addressed<std::uint32_t, std::uint64_t>("msr")); });
  driver.refused = section.Numbers<std::uint32_t>("refused");
  section.Each("service", [&](Section& service) {
    driver.services.push_back(
        {service.Required("name"), service.Get("running", false), service.Get<std::uint32_t>("start_error", 0)});
  });
}

void ReadPci(Section& section, MachineDescription& machine) {
  PciFunction function;
  function.location = static_cast<std::uint16_t>(section.Get<std::uint8_t>("bus", 0) << 8U |
                                                 (section.Get<std::uint8_t>("device", 0) & 31U) << 3U |
                                                 (section.Get<std::uint8_t>("function", 0) & 7U));
  section.Each("registers", [&](Section& registers) {
    for (const auto& [key, node] : registers.Raw()) {
      std::uint16_t offset = 0;
      const std::string_view digits = key.str();
      const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), offset, 16);
      const std::optional<std::uint32_t> value = node.value<std::uint32_t>();
      if (error != std::errc() || end != digits.data() + digits.size() || !value || offset % 4 != 0) {
        registers.Fail(node, "a PCI register is a hexadecimal dword offset with a 32-bit value");
      }
      function.registers[offset] = *value;
    }
  });
  function.temperatures = section.Numbers<int>("temperatures");
  function.description = section.Get("description", function.description);
  machine.pci.push_back(function);
}

void ReadEvent(Section& section, MachineDescription& machine) {
  ScriptedEvent event;
  event.at = Milliseconds(section, "at_ms");
  const std::string write = section.Get<std::string>("write_file", "");
  const std::string remove = section.Get<std::string>("delete_file", "");
  event.content = section.Get<std::string>("content", "");
  if (!write.empty()) {
    event.kind = ScriptedEvent::Kind::kWriteFile;
    event.path = write;
  } else if (!remove.empty()) {
    event.kind = ScriptedEvent::Kind::kDeleteFile;
    event.path = remove;
  } else if (const std::string device = section.Get<std::string>("device", ""); !device.empty()) {
    event.kind = ScriptedEvent::Kind::kDevice;
    event.arrives = device == "arrives";
    if (!event.arrives && device != "leaves") {
      section.Refuse("device", "must be \"arrives\" or \"leaves\"");
    }
  } else if (section.Get("fill_disk", false)) {
    event.kind = ScriptedEvent::Kind::kFillDisk;
  } else if (section.Get("kill", false)) {
    event.kind = ScriptedEvent::Kind::kKill;
  } else {
    event.console = section.Number<std::uint32_t>("console");  // an event that does nothing is a mistake
  }
  machine.events.push_back(event);
}

// What a name stands for must be one thing: reports and faults go by it.
template <class Named>
void RefuseSecond(Section& section, const std::vector<Named>& earlier, const std::string& name) {
  if (std::any_of(earlier.begin(), earlier.end(), [&](const Named& other) { return other.name == name; })) {
    section.Refuse("name", "is the name of another one, too: \"" + name + "\"");
  }
}

void ReadLed(Section& section, MachineDescription& machine) {
  Led led;
  led.name = section.Required("name");
  RefuseSecond(section, machine.leds, led.name);
  led.symbol = section.Required("symbol");
  led.color = section.Required("color");
  led.device = section.Required("device");
  led.pin = section.Required("pin");
  led.activeLow = section.Get("active_low", false);
  machine.leds.push_back(led);
}

void ReadManagement(Section& section, MachineDescription& machine) {
  ManagementTable table;
  table.nameSpace = section.Get<std::string>("namespace", "ROOT\\CIMV2");
  table.className = section.Required("class");
  section.Each("row", [&](Section& row) {
    ManagementRow properties;
    for (const auto& [key, node] : row.Raw()) {
      ManagementValue value;
      if (const toml::array* array = node.as_array()) {
        ManagementArray elements;
        for (const toml::node& element : *array) {
          elements.push_back(ScalarOf(element));
        }
        value.content = std::move(elements);
      } else {
        value.content = ScalarOf(node);
      }
      properties.Set(WideFromUtf8(key.str()), std::move(value));
    }
    table.rows.push_back(std::move(properties));
  });
  machine.management.push_back(std::move(table));
}

}  // namespace

MachineDescription ParseMachine(std::string_view text, std::string_view source) {
  toml::table document;
  try {
    document = toml::parse(text, source);
  } catch (const toml::parse_error& error) {
    std::ostringstream problem;
    problem << source << ":" << error.source().begin.line << ": " << error.description();
    throw MachineError(problem.str());
  }
  MachineDescription machine;
  Section root(document, source, "");
  machine.name = root.Get<std::string>("name", std::string(source));
  machine.is64Bit = root.Get("is_64_bit", machine.is64Bit);
  machine.touchpad = root.Get("touchpad", machine.touchpad);
  machine.startTime = static_cast<std::time_t>(root.Get<std::int64_t>("start_time", machine.startTime));
  root.Each("screen", [&](Section& section) {
    machine.screenWidth = section.Get("width", machine.screenWidth);
    machine.screenHeight = section.Get("height", machine.screenHeight);
  });
  root.Each("environment", [&](Section& section) {
    for (const auto& [key, node] : section.Raw()) {
      machine.environment[std::string(key.str())] = node.value_or(std::string());
    }
  });
  root.Each("firmware", [&](Section& section) { ReadFirmware(section, machine.firmware); });
  root.Each("driver", [&](Section& section) { ReadDriver(section, machine.driver); });
  root.Each("pci", [&](Section& section) { ReadPci(section, machine); });
  root.Each("chip", [&](Section& section) {
    ChipDescription chip = ReadChip(section);
    RefuseSecond(section, machine.chips, chip.name);
    machine.chips.push_back(std::move(chip));
  });
  ReadDevices(root, machine);
  root.Each("firmware_call", [&](Section& section) { machine.firmwareCall = ReadFirmwareCall(section); });
  root.Each("led", [&](Section& section) { ReadLed(section, machine); });
  root.Each("event", [&](Section& section) { ReadEvent(section, machine); });
  root.Each("peer", [&](Section& section) {
    machine.peers.push_back(
        {section.Required("mutex"), Milliseconds(section, "from_ms"), Milliseconds(section, "until_ms")});
  });
  root.Each("management", [&](Section& section) { ReadManagement(section, machine); });
  root.RefuseUnknownKeys();
  return machine;
}

}  // namespace panelglow::platform::sim
