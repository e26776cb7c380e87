// The registers that a chip class reaches by two operations of its own, as a register file.
#pragma once

#include "board/parts/RegisterFile.h"

namespace panelglow {

/// A member of the chip that it is given.
template <class Part>
class RegistersOf : public RegisterFile {
 public:
  using Reader = std::uint8_t (Part::*)(std::uint8_t reg);
  using Writer = void (Part::*)(std::uint8_t reg, std::uint8_t value);

  RegistersOf(Part& owner, Reader reader, Writer writer) : part(&owner), read(reader), write(writer) {}

  std::uint8_t Read(RegisterId id) override { return (part->*read)(id.reg); }
  void Write(RegisterId id, std::uint8_t value) override { (part->*write)(id.reg, value); }

 private:
  Part* part;
  Reader read;
  Writer write;
};

}  // namespace panelglow
