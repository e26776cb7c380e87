// A simulated machine as its file describes it. machines/README.md holds the format.
#pragma once

#include <cstdint>
#include <ctime>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "platform/Management.h"
#include "platform/sim/ControllerDescription.h"
#include "platform/sim/base/MachineError.h"
#include "platform/sim/person/FrontPanel.h"
#include "platform/sim/silicon/AdapterDevice.h"
#include "platform/sim/silicon/CameraDevice.h"
#include "platform/sim/silicon/DiskDevice.h"
#include "platform/sim/silicon/EmbeddedController.h"
#include "platform/sim/silicon/FirmwareCall.h"
#include "platform/sim/silicon/FloppyController.h"
#include "platform/sim/silicon/HdaCodec.h"
#include "platform/sim/silicon/IndexedRegisters.h"
#include "platform/sim/silicon/MailboxController.h"
#include "platform/sim/silicon/PciFunction.h"
#include "platform/sim/silicon/PortRegisters.h"
#include "platform/sim/silicon/SmbusHost.h"
#include "platform/sim/silicon/SuperIo.h"

namespace panelglow::platform::sim {

struct ChipDescription {
  std::string name;
  std::string kind;

  // Of a kind that has a setup of its own; the others are told by the keys below.
  std::variant<std::monostate, SuperIoSetup, EmbeddedControllerSetup, MailboxControllerSetup, HdaCodecSetup,
               FloppyControllerSetup, IndexedRegistersSetup, PortRegistersSetup, SmbusHostSetup>
      setup;

  std::uint64_t base = 0;
  std::uint8_t outputs = 0xFF;
  std::uint8_t inputs = 0;
  std::vector<std::uint8_t> initial;
};

struct ServiceDescription {
  std::string name;
  bool running = false;
  std::uint32_t startError = 0;
};

struct DriverDescription {
  bool present = true;                       // the driver's binary is installed
  bool olderSet = false;                     // ... under the older names instead
  bool link = true;                          // its device link opens once the service runs
  std::uint32_t managerError = 0;            // error of opening the service manager
  std::uint32_t createError = 0;             // error of creating a service
  std::uint32_t startError = 0;              // error of every start, 0: by what is installed
  std::uint32_t version = 0x04010305;        // answer to the version request
  std::vector<ServiceDescription> services;  // registered before the run
  using Registers = std::map<std::uint32_t, std::uint64_t>;
  Registers registers = {};                 // model-specific ones of every core, by index
  std::vector<Registers> cores = {};        // those that each core has for itself; none: it has one core
  std::vector<std::uint32_t> refused = {};  // requests, by code, that it reports as failed
};

struct ProcessorDescription {
  std::string manufacturer = "Intel";
  std::uint8_t family = 0xCD;
};

struct FirmwareDescription {
  std::string boardProduct;
  std::string boardManufacturer = "Panelglow";
  std::string boardSerial = "PG0001";
  std::string systemProduct = "Simulated machine";
  std::vector<ProcessorDescription> processors{{}};
  std::optional<std::vector<std::uint8_t>> rawTable;  // instead of all the above
  bool inManagement = true;                           // the management service knows the table
  bool entryPoint = true;                             // the firmware segment holds the table
};

/// Something that happens at a moment of the run.
struct ScriptedEvent {
  enum class Kind { kWriteFile, kDeleteFile, kConsole, kFillDisk, kDevice, kKill };
  Microseconds at = 0;
  Kind kind = Kind::kConsole;
  std::string path;
  std::string content;
  std::uint32_t console = 0;
  bool arrives = false;  // of a device event; otherwise it is removed
};

/// Another process of the machine that holds a named mutex for a while. Whether it then releases the mutex or is
/// killed makes no difference to the one who waits.
struct Peer {
  std::string mutex;
  Microseconds from = 0;
  Microseconds until = 0;
};

struct ManagementTable {
  std::string nameSpace;
  std::string className;
  std::vector<ManagementRow> rows;
};

struct MachineDescription {
  std::string name = "bare machine";
  int screenWidth = 1280;
  int screenHeight = 1024;
  bool is64Bit = true;
  std::time_t startTime = 1'709'294'400;  // 2024-03-01 12:00 UTC
  bool touchpad = false;
  std::map<std::string, std::string> environment{{"ProgramData", "C:\\ProgramData"}};
  FirmwareDescription firmware;
  DriverDescription driver;
  std::vector<PciFunction> pci;
  std::vector<ChipDescription> chips;
  std::optional<FirmwareCallSetup> firmwareCall;
  std::vector<Led> leds;
  std::vector<ScriptedEvent> events;
  std::vector<Peer> peers;
  std::vector<ManagementTable> management;
  std::vector<ControllerDescription> controllers;
  std::vector<DiskSetup> disks;
  std::vector<CameraSetup> cameras;
  std::vector<AdapterSetup> adapters;
  std::vector<EnumeratedDescription> enumerated;
  std::vector<std::string> libraries;  // that can be loaded
};

/// Reads a machine's file. `source` names it in errors. Throws MachineError.
MachineDescription ParseMachine(std::string_view toml, std::string_view source);

}  // namespace panelglow::platform::sim
