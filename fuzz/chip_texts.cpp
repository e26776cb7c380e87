// Sequences, byte lists and blink lists: the bytes as one text, and as the section of a chip that reads many of them,
// which the first byte picks.
#include <array>

#include "FuzzTarget.h"
#include "board/MotherBoard.h"
#include "board/base/mblib_exception.h"
#include "board/parts/Sequence.h"
#include "harness/base/CDMException.h"

namespace panelglow::fuzz {
namespace {

void ParseText(const std::string& text) {
  ParseByteList(text);
  Sequence sequence;
  try {
    const bool read = ParseSequence(text, sequence);
    Check(read == !sequence.empty(), "a sequence that was read has entries");
  } catch (const mblib_exception&) {
  }
}

void BuildBoard(std::size_t which, std::string_view section) {
  constexpr std::array<const char*, 6> kChips{"g_iospace", "g_memoryspace", "g_ite", "g_fintek", "g_codec", "g_ec"};
  const std::string chip = kChips[which % kChips.size()];
  PutFile(".\\mbdetect.ini", "[7D10]\nplatform=generic\nchips=" + chip + "\n");
  PutFile(".\\chip.ini", "[" + chip + "]\n" + std::string(section));
  try {
    const auto board =
        MotherBoard::Instantiate(".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini", "platform", "7D10");
    board->SavePowerLedState();
    board->AssertPowerLedGreen();
    board->RestorePowerLedState();
  } catch (const mblib_exception&) {
  } catch (const CDMException&) {
  }
}

void Run(std::string_view bytes) {
  ParseText(std::string(bytes));
  if (!bytes.empty()) {
    BuildBoard(static_cast<unsigned char>(bytes.front()), bytes.substr(1));
  }
}

const Registered kTarget("chip_texts", Run);

}  // namespace
}  // namespace panelglow::fuzz
