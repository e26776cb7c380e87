// An Intel chipset whose GPIO words are read in physical memory. Serves the chip name "intelc200".
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "board/base/IniReader.h"
#include "board/chips/Chip.h"
#include "board/parts/BitName.h"
#include "board/parts/PhysicalRegisters.h"

namespace panelglow {

class IntelC200Chip : public Chip {
 public:
  IntelC200Chip() : Chip("intelc200"), words(devio, ReadBase()) {}

  /// A bit of the word at `offset`, named by its number.
  int ReadLineByNames(std::uint32_t offset, const std::string& bitName,
                      const std::string& /*clearBitName*/) override {
    const std::optional<std::uint32_t> word = words.Read(offset, 2);
    return word ? LineState((*word & MaskOfBitName(bitName, 16)) != 0) : kNoSuchLine;
  }

 private:
  static std::uint32_t ReadBase() {
    const std::uint32_t rcrbbar = ReadIniUnsigned("chip.intelc200.rcrbbar", 0);
    return rcrbbar + ReadIniUnsigned("chip.intelc200.spibar", 0);
  }

  PhysicalRegisters words;
};

}  // namespace panelglow
