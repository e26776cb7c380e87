// A hardware monitor whose registers are ports, in pages of which the last port selects one.
#pragma once

#include <cstdint>

#include "board/parts/ConfigMode.h"
#include "board/parts/RegisterFile.h"
#include "hw/CDevio.h"

namespace panelglow {

/// Places are pages.
class PagedPorts : public RegisterFile {
 public:
  /// Whether the part takes what is written as it comes, or has to be told before and after.
  enum class WriteLock : std::uint8_t { kNone, kHost };

  PagedPorts(CDevio& client, std::uint16_t basePort, WriteLock how) : devio(&client), base(basePort), lock(how) {}

  std::uint8_t Read(RegisterId id) override {
    SelectPage(id.place);
    return devio->InportByte(PortOf(id.reg));
  }

  void Write(RegisterId id, std::uint8_t value) override {
    if (lock == WriteLock::kNone) {
      Put(id, value);
      return;
    }
    HostWrite window{this};
    const ConfigMode mode(window);
    Put(id, value);
  }

 private:
  static constexpr std::uint8_t kPageSelect = 0xFF;
  static constexpr std::uint8_t kHostWriteControl = 0x04;  // in page 0
  static constexpr std::uint8_t kLocked = 0x01;            // set behind a write: the part takes it over

  /// Writing is open for its life.
  struct HostWrite {
    PagedPorts* ports;
    void EnterConfigMode() const { ports->SetControl(static_cast<std::uint8_t>(~kLocked), 0); }
    void ExitConfigMode() const { ports->SetControl(0xFF, kLocked); }
  };

  [[nodiscard]] std::uint16_t PortOf(std::uint8_t reg) const { return static_cast<std::uint16_t>(base + reg); }

  void SelectPage(std::uint8_t page) const { devio->OutportByte(PortOf(kPageSelect), page); }

  void Put(RegisterId id, std::uint8_t value) const {
    SelectPage(id.place);
    devio->OutportByte(PortOf(id.reg), value);
  }

  void SetControl(std::uint8_t keep, std::uint8_t set) const {
    SelectPage(0);
    const std::uint8_t control = devio->InportByte(PortOf(kHostWriteControl));
    devio->OutportByte(PortOf(kHostWriteControl), static_cast<std::uint8_t>((control & keep) | set));
  }

  CDevio* devio;
  std::uint16_t base;
  WriteLock lock;
};

}  // namespace panelglow
