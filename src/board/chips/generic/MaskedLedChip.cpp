#include "board/chips/generic/MaskedLedChip.h"

#include <string_view>

#include "board/base/IniReader.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

// Keys of the lists, in the order of MaskedLedChip::List.
constexpr std::array<std::string_view, 12> kListKeys{
    "powerled.green.assert.sequence", "powerled.green.deassert.sequence", "powerled.red.assert.sequence",
    "powerled.red.deassert.sequence", "chargeled.white.assert.sequence",  "chargeled.white.deassert.sequence",
    "chargeled.red.assert.sequence",  "chargeled.red.deassert.sequence",  "hdled.red.assert.sequence",
    "hdled.red.deassert.sequence",    "wirelessled.assert.sequence",      "wirelessled.deassert.sequence"};

std::uint8_t MaskOf(const SequenceEntry& entry) { return entry.data.empty() ? std::uint8_t{0} : entry.data.front(); }

}  // namespace

// The sequences stand in the section of the chip's own name, whatever section its other keys are read from.
MaskedLedChip::MaskedLedChip(const std::string& chipName, unsigned addressBits) : GChip(chipName) {
  static_assert(kListKeys.size() == kListCount);
  LoadConfiguration();
  for (std::size_t i = 0; i < kListKeys.size(); ++i) {
    Setting setting = ReadChipSetting(name, std::string(kListKeys[i]), "");
    setting.text = CDMUtil::ToLower(setting.text);
    ParseSequence(setting, lists[i], addressBits);
  }
}

bool MaskedLedChip::Set(const Sequence& sequence) {
  for (const SequenceEntry& entry : sequence) {
    SetEntry(entry.command, MaskOf(entry));
  }
  return !sequence.empty();
}

bool MaskedLedChip::Keep(const Sequence& sequence) {
  for (const SequenceEntry& entry : sequence) {
    KeepEntry(entry.command, MaskOf(entry));
  }
  return !sequence.empty();
}

bool MaskedLedChip::Flip(const Sequence& sequence) {
  for (const SequenceEntry& entry : sequence) {
    FlipEntry(entry.command, MaskOf(entry));
  }
  return !sequence.empty();
}

bool MaskedLedChip::DeassertPowerLed() {
  if (list(kPowerGreenDeassert).empty() || list(kPowerRedDeassert).empty()) {
    return false;
  }
  return Keep(list(kPowerGreenDeassert)) && Keep(list(kPowerRedDeassert));
}

bool MaskedLedChip::Save(const Sequence& support, const Sequence& addresses, Sequence& saved) {
  if (support.empty()) {
    return false;
  }
  Sequence values;  // all or nothing: a save that is interrupted is none
  for (const SequenceEntry& entry : addresses) {
    values.push_back({entry.command, {ReadRegisterByte(entry.command)}});
  }
  saved.insert(saved.end(), values.begin(), values.end());
  return true;
}

bool MaskedLedChip::Restore(const Sequence& support, const Sequence& saved) {
  if (support.empty()) {
    return false;
  }
  for (const SequenceEntry& entry : saved) {
    WriteRegisterByte(entry.command, MaskOf(entry));
  }
  return true;
}

}  // namespace panelglow
