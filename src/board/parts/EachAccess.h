// A register file whose mode is entered and left around every single access, where a family does it so.
#pragma once

#include "board/parts/ConfigMode.h"
#include "board/parts/RegisterFile.h"

namespace panelglow {

/// The file within must live as long as this does.
class EachAccess : public RegisterFile {
 public:
  explicit EachAccess(RegisterFile& within) : file(&within) {}

  std::uint8_t Read(RegisterId id) override {
    const ConfigMode mode(*file);
    return file->Read(id);
  }
  void Write(RegisterId id, std::uint8_t value) override {
    const ConfigMode mode(*file);
    file->Write(id, value);
  }

 private:
  RegisterFile* file;
};

}  // namespace panelglow
