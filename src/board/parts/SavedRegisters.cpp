#include "board/parts/SavedRegisters.h"

namespace panelglow {

const std::uint8_t* SavedRegisters::Find(RegisterId id) const {
  for (const auto& [held, value] : values) {
    if (held == id) {
      return &value;
    }
  }
  return nullptr;
}

void SavedRegisters::SaveOnce(RegisterFile& file, std::span<const RegisterId> ids) {
  if (Holds()) {
    return;
  }
  std::vector<std::pair<RegisterId, std::uint8_t>> taken;
  for (const RegisterId id : ids) {
    taken.emplace_back(id, file.Read(id));
  }
  values = std::move(taken);
}

void SavedRegisters::Keep(RegisterFile& file, RegisterId id) {
  if (Find(id) == nullptr) {
    values.emplace_back(id, file.Read(id));
  }
}

void SavedRegisters::Restore(RegisterFile& file, std::span<const RegisterId> order) const {
  for (const RegisterId id : order) {
    if (const std::uint8_t* value = Find(id); value != nullptr) {
      file.Write(id, *value);
    }
  }
}

std::uint8_t SavedRegisters::At(RegisterId id) const {
  const std::uint8_t* value = Find(id);
  return value == nullptr ? std::uint8_t{0} : *value;
}

void SavedRegisters::Set(RegisterId id, std::uint8_t value) {
  for (auto& [held, kept] : values) {
    if (held == id) {
      kept = value;
    }
  }
}

}  // namespace panelglow
