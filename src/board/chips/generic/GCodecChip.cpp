#include "board/chips/generic/GCodecChip.h"

#include "board/base/IniReader.h"
#include "board/base/mblib_exception.h"
#include "board/parts/Bits.h"
#include "board/parts/PhysicalRegisters.h"
#include "board/parts/Sequence.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// Immediate command status.
constexpr std::uint32_t kBusy = 0x01;   // also: send the command
constexpr std::uint32_t kValid = 0x02;  // a response is there; cleared by writing it
constexpr std::uint32_t kStatusBytes = 2;
constexpr std::uint32_t kVerbBytes = 4;

constexpr int kMostRereads = 4;  // of the status for one verb, all waits together
constexpr std::uint32_t kPause_ms = 10;

constexpr std::uint32_t kPinMask = 0xFF;  // of a response: eight GPIO pins
constexpr int kBlinkRounds = 51;          // an odd number: the last round leaves the pin asserted
constexpr std::uint32_t kBlinkPhase_ms = 500;

constexpr std::uint32_t kBaseAddressMask = ~15U;

void Pause() { platform::TheHost().clock.Sleep(kPause_ms); }

}  // namespace

GCodecChip::GCodecChip() : GChip("g_codec") {
  LoadConfiguration();
  hdaBar = FindController();
  icwReg = ReadChipWord(section, "codec.icw.reg", icwReg);
  irrReg = ReadChipWord(section, "codec.irr.reg", irrReg);
  icsReg = ReadChipWord(section, "codec.ics.reg", icsReg);
  speakerBit = ReadChipWord(section, "speakerled.gpio.ldn", speakerBit);
  microphoneBit = ReadChipWord(section, "microphoneled.gpio.ldn", microphoneBit);
  GCodecChip::LoadVerbLists();
}

// By the controller's PCI function (bus, device, function and register in one number), or as the file says.
std::uint32_t GCodecChip::FindController() {
  const std::uint32_t place = ReadIniUnsigned("chip.codec.pciloc", 0);
  if (place != 0) {
    const std::uint32_t bus = place >> 24U;
    const std::uint32_t pciDevice = place >> 16U & 0xFFU;
    const std::uint32_t function = place >> 8U & 0xFFU;
    std::uint64_t base = 0;
    devio.ReadPciBar(static_cast<std::uint16_t>(((bus << 5U) + pciDevice) * 8 + function),
                     static_cast<std::uint16_t>(place & 0xFFU), base);
    if (const auto low = static_cast<std::uint32_t>(base); low != 0) {
      return low;
    }
  }
  const std::uint32_t base = ReadIniUnsigned("chip.codec.hdabar", 0) & kBaseAddressMask;
  if (base == 0) {
    throw mblib_exception("mbdetec.ini missing mandatory entry for codec: chip.codec.hdabar");
  }
  return base;
}

void GCodecChip::LoadVerbLists() {
  GCodecChip::ParseVerbList(ReadChipSetting(section, "codecgpio.state.set.sequence", ""), stateSetVerbs);
  GCodecChip::ParseVerbList(ReadChipSetting(section, "codecgpio.state.save.sequence", ""), stateSaveVerbs);
  GCodecChip::ParseVerbList(ReadChipSetting(section, "codecgpio.state.restore.sequence", ""), stateRestoreVerbs);
}

void GCodecChip::ParseVerbList(const Setting& setting, std::vector<std::uint32_t>& list) {
  list.clear();
  for (const std::string& token : SplitList(setting)) {
    list.push_back(WideNumberIn(token, setting));
  }
}

// ---- immediate commands

// A read that fails is 0.
std::uint32_t GCodecChip::ReadRegister(std::uint16_t offset, std::uint32_t length) {
  return PhysicalRegisters(devio, hdaBar).Read(offset, length).value_or(0);
}

void GCodecChip::WriteRegister(std::uint16_t offset, std::uint32_t length, std::uint32_t value) {
  PhysicalRegisters(devio, hdaBar).Write(offset, length, value);
}

// Looks again while the controller is busy, as long as there are looks left.
bool GCodecChip::AwaitIdle(std::uint32_t& status, int& rereads) {
  while ((status & kBusy) != 0) {
    if (rereads == 0) {
      return false;
    }
    --rereads;
    Pause();
    status = ReadRegister(icsReg, kStatusBytes);
  }
  return true;
}

std::uint32_t GCodecChip::SendVerb(std::uint32_t verb) {
  int rereads = kMostRereads;
  WriteRegister(icwReg, kVerbBytes, 0);
  std::uint32_t status = ReadRegister(icsReg, kStatusBytes);
  if (!AwaitIdle(status, rereads)) {
    return 0;
  }
  if ((status & kValid) != 0) {
    WriteRegister(icsReg, kStatusBytes, kValid);
  }
  WriteRegister(icwReg, kVerbBytes, verb);
  Pause();
  WriteRegister(icsReg, kStatusBytes, kBusy);
  status = ReadRegister(icsReg, kStatusBytes);
  if (!AwaitIdle(status, rereads) || (status & kValid) == 0) {
    return 0;
  }
  return ReadRegister(irrReg, kVerbBytes);
}

// ---- LEDs

bool GCodecChip::SaveSpeakerLedState() {
  if (stateSaveVerbs.size() != kVerbs) {
    return false;
  }
  std::array<std::uint32_t, kVerbs> responses{};  // all or nothing: a save that is interrupted is none
  for (std::size_t i = 0; i < kVerbs; ++i) {
    responses[i] = SendVerb(stateSaveVerbs[i]);
  }
  savedResponses = responses;
  isStateSaved = true;
  return true;
}

bool GCodecChip::RestoreSpeakerLedState() {
  if (stateRestoreVerbs.size() != kVerbs) {
    return false;
  }
  for (std::size_t i = 0; isStateSaved && i < kVerbs; ++i) {
    SendVerb(savedResponses[i] | stateRestoreVerbs[i]);
  }
  return true;
}

// A set verb with the pins as they were saved, and this pin.
std::uint32_t GCodecChip::SetVerb(std::size_t index, std::uint32_t mask) const {
  return (savedResponses[index] & kPinMask) | stateSetVerbs[index] | mask;
}

// The LEDs are lit by a low pin.
bool GCodecChip::SetGpio(std::uint16_t bit, bool asserted) {
  if (stateSetVerbs.size() != kVerbs) {
    return false;
  }
  const std::uint32_t mask = MaskOfBit(bit, 32);
  SendVerb(SetVerb(0, mask));
  SendVerb(SetVerb(1, mask));
  SendVerb(SetVerb(2, mask) ^ (asserted ? mask : 0));
  Pause();
  return true;
}

bool GCodecChip::BlinkGpio(std::uint16_t bit) {
  if (stateSetVerbs.size() != kVerbs) {
    return false;
  }
  const std::uint32_t mask = MaskOfBit(bit, 32);
  SendVerb(SetVerb(0, mask));
  SendVerb(SetVerb(1, mask));
  std::uint32_t value = SetVerb(2, mask);
  for (int round = 0; round < kBlinkRounds; ++round) {
    value ^= mask;
    SendVerb(value);
    platform::TheHost().clock.Sleep(kBlinkPhase_ms);
  }
  return true;
}

}  // namespace panelglow
