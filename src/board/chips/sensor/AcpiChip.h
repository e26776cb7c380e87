// The temperatures of the machine's processors, as the processors themselves tell them: in model-specific registers
// of each core, or in the configuration space of their northbridge. The test file lists which processor does what.
// Serves the chip name "acpi".
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "board/chips/Chip.h"

namespace panelglow {

class AcpiChip : public Chip {
 public:
  AcpiChip() : Chip("acpi") {}

  /// The highest temperature that the processor allows itself, of the core that asks. False where the processor is
  /// not listed or does not tell it. Throws a CDMException (990700) for a register that it does not have.
  bool ReadThreshold(int zone, int& value) override;

  /// `zone`: the processor, from 0. Throws as ReadThreshold. While it reads, the process runs on the core that it
  /// reads.
  bool ReadProcessorTemperature(int zone, int& value, bool allCores, const std::string& zoneName) override;
  [[nodiscard]] std::vector<int> GetCoreTemperatures() const override { return coreTemperatures; }

 private:
  enum class Mechanism { kModelRegisters, kPciConfiguration };

  struct Source {
    Mechanism mechanism = Mechanism::kModelRegisters;
    std::uint32_t maxTemperatureRegister = 0;
    std::uint32_t probeRegister = 0;
  };

  [[nodiscard]] static std::optional<Source> FindSource();
  std::optional<int> ReadModelByte(std::uint32_t index);
  bool ReadCores(const Source& source, int processor, int& value, bool allCores);
  bool ReadNorthbridge(const Source& source, int processor, int& value);
  std::size_t CountProcessors();

  std::optional<std::size_t> processors;  // asked for once
  std::vector<int> coreTemperatures;
};

}  // namespace panelglow
