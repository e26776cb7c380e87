// Byte registers by number, whatever way they are reached: a family says once how an access goes, and tables of
// registers and steps do the rest.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace panelglow {

/// Where a register stands. `place` is a logical device or a bank; 0 where there is but one.
struct RegisterId {
  std::uint8_t place = 0;
  std::uint8_t reg = 0;
  bool operator==(const RegisterId&) const = default;
};

/// Registers of one place, for the rows of a table.
inline std::vector<RegisterId> RegistersAt(std::uint8_t place, const std::vector<std::uint8_t>& regs) {
  std::vector<RegisterId> ids;
  ids.reserve(regs.size());
  for (const std::uint8_t reg : regs) {
    ids.push_back({place, reg});
  }
  return ids;
}

/// `count` registers from `first` on.
inline std::vector<RegisterId> RegisterRun(std::uint8_t place, std::uint8_t first, std::size_t count) {
  std::vector<RegisterId> ids;
  for (std::size_t i = 0; i < count; ++i) {
    ids.push_back({place, static_cast<std::uint8_t>(first + i)});
  }
  return ids;
}

class RegisterFile {
 public:
  virtual ~RegisterFile() = default;

  virtual std::uint8_t Read(RegisterId id) = 0;
  virtual void Write(RegisterId id, std::uint8_t value) = 0;

  /// What has to be done around the accesses of one operation, by ConfigMode. Nothing where the registers are always
  /// open, or open for each access on their own.
  virtual void EnterConfigMode() {}
  virtual void ExitConfigMode() {}

 protected:
  RegisterFile() = default;
  RegisterFile(const RegisterFile&) = default;
  RegisterFile& operator=(const RegisterFile&) = default;
};

}  // namespace panelglow
