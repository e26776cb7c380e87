#include "platform/sim/ChipMaker.h"

#include <variant>

#include "platform/sim/silicon/FintekSuperIo.h"
#include "platform/sim/silicon/GpioBlock.h"
#include "platform/sim/silicon/IteSuperIo.h"
#include "platform/sim/silicon/LegacyPanelBlock.h"
#include "platform/sim/silicon/MemoryRegisters.h"
#include "platform/sim/silicon/TableSuperIo.h"

namespace panelglow::platform::sim {

namespace {

// Builds the chips that have a setup of their own; null for the others.
struct DeviceMaker {
  const Scheduler& time;

  std::unique_ptr<Device> operator()(std::monostate /*none*/) const { return nullptr; }
  std::unique_ptr<Device> operator()(const SuperIoSetup& setup) const {
    switch (setup.family) {
      case SuperIoFamily::kIte:
        return std::make_unique<IteSuperIo>(setup, time);
      case SuperIoFamily::kFintek:
        return std::make_unique<FintekSuperIo>(setup, time);
      default:
        return std::make_unique<TableSuperIo>(setup, time);
    }
  }
  std::unique_ptr<Device> operator()(const EmbeddedControllerSetup& setup) const {
    return std::make_unique<EmbeddedController>(setup, time);
  }
  std::unique_ptr<Device> operator()(const MailboxControllerSetup& setup) const {
    return std::make_unique<MailboxController>(setup, time);
  }
  std::unique_ptr<Device> operator()(const HdaCodecSetup& setup) const {
    return std::make_unique<HdaCodec>(setup, time);
  }
  std::unique_ptr<Device> operator()(const IndexedRegistersSetup& setup) const {
    return std::make_unique<IndexedRegisters>(setup, time);
  }
  std::unique_ptr<Device> operator()(const PortRegistersSetup& setup) const {
    return std::make_unique<PortRegisters>(setup, time);
  }
  std::unique_ptr<Device> operator()(const SmbusHostSetup& setup) const {
    return std::make_unique<SmbusHost>(setup, time);
  }
  std::unique_ptr<Device> operator()(const FloppyControllerSetup& setup) const {
    return std::make_unique<FloppyController>(setup);
  }
};

}  // namespace

std::unique_ptr<Device> MakeChip(const ChipDescription& chip, const Scheduler& time) {
  if (std::unique_ptr<Device> device = std::visit(DeviceMaker{time}, chip.setup)) {
    return device;
  }
  if (chip.kind == "gpio-block") {
    return std::make_unique<GpioBlock>(static_cast<std::uint16_t>(chip.base), chip.outputs, chip.inputs,
                                       chip.initial.empty() ? std::uint8_t{0} : chip.initial.front());
  }
  if (chip.kind == "memory-registers") {
    return std::make_unique<MemoryRegisters>(chip.base, chip.initial);
  }
  if (chip.kind == "legacy-panel") {
    return std::make_unique<LegacyPanelBlock>(static_cast<std::uint16_t>(chip.base));
  }
  throw MachineError(
      "chip \"" + chip.name + "\": there is no kind \"" + chip.kind +
      "\" (gpio-block, memory-registers, legacy-panel, super-io, embedded-controller, "
      "mailbox-controller, hda-codec, floppy-controller, indexed-registers, port-registers, smbus-host)");
}

}  // namespace panelglow::platform::sim
