// The worker of the network LED: a notebook's wireless LED hangs on the board; any other is lit by an adapter's link,
// which is taken down and up again.
#include <algorithm>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "board/MotherBoard.h"
#include "board/base/IniReader.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "hw/Tsk.h"
#include "ledtests/BlinkLoop.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/PutBack.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint32_t kWirelessPhase_ms = 1000;
constexpr const char* kDefaultName = "Wireless";

// The adapter's name, or several with "|" between them. The layered files are read with the chip file in the place of
// the test file: the key belongs into the detection file, or into a section of the chip file.
std::string ConfiguredName(const FrontPanelTest& test) {
  std::uint16_t systemId = 0;
  Tsk_GetSystemID(systemId);
  IniReader& reader = IniReader::Instance(CDMUtil::ToUpper(CDMUtil::ToHexString(systemId)), test.iniFile,
                                          test.chipIni, ".\\chip.ini");
  IniReader::status_t status{};
  return reader.ReadIniValue("test.panelglow.network.1.name", status, kDefaultName);
}

// The parts between the bars, the one behind the last bar too; without a bar the whole is one name.
std::vector<std::string> NamesIn(const std::string& text) {
  std::vector<std::string> names;
  std::size_t begin = 0;
  for (std::size_t bar = 0; (bar = text.find('|', begin)) != std::string::npos; begin = bar + 1) {
    names.push_back(text.substr(begin, bar - begin));
  }
  names.push_back(text.substr(begin));
  return names;
}

bool Matches(const std::string& deviceName, const std::vector<std::string>& names) {
  const std::string lowered = CDMUtil::ToLower(deviceName);
  return std::any_of(names.begin(), names.end(), [&](const std::string& name) {
    return lowered.find(CDMUtil::ToLower(name)) != std::string::npos;
  });
}

// The first connection of an adapter with one of the names; without any, the connection that was looked at last.
std::unique_ptr<platform::Connection> FindConnection(const FrontPanelTest& test, platform::ConnectionList& list,
                                                     const std::string& configured) {
  const auto log = [&](const std::string& text) {
    if (test.rules.writesLines) {
      CDMout::LogMessage(LogOptions::Debug, kFreeText, text);
    }
  };
  const std::vector<std::string> names = NamesIn(configured);
  std::unique_ptr<platform::Connection> inHand;
  bool matched = false;
  while (!matched) {
    std::unique_ptr<platform::Connection> next = list.Next();
    if (!next) {
      break;
    }
    inHand = std::move(next);
    const std::optional<std::string> deviceName = inHand->DeviceName();
    if (!deviceName) {
      break;
    }
    log("Network found: " + *deviceName);
    matched = Matches(*deviceName, names);
  }
  if (!matched) {
    log("Could not find network adapter " + configured);
  }
  return inHand;
}

void BlinkLink(FrontPanelTest& test, const LEDStruct& entry) {
  const std::string configured = ConfiguredName(test);
  const std::unique_ptr<platform::ConnectionList> list = platform::TheHost().connections.Enumerate();
  if (!list) {
    return;
  }
  const std::unique_ptr<platform::Connection> connection = FindConnection(test, *list, configured);
  if (!connection) {
    return;
  }
  // From the first cut on until it is back: a worker may be told to end in the middle of either.
  bool mayBeDown = false;
  const PutBack up([&] {
    if (mayBeDown) {
      connection->Connect();
    }
  });
  BlinkLoop(
      entry, kPhase_ms,
      [&] {
        mayBeDown = true;
        connection->Disconnect();
      },
      [&] { mayBeDown = !connection->Connect(); });
}

}  // namespace

bool CustomBlinkNotebookWirelessLed(FrontPanelTest& test, LEDStruct& entry) {
  std::unique_ptr<MotherBoard> board = test.MakeBoard();
  bool supported = false;
  if (!board || !board->IsWirelessLedSupported(supported) || !supported) {
    return false;
  }
  {
    const PutBack restore([&] { board->RestoreWirelessLedState(); });
    board->SaveWirelessLedState();
    entry.workerStarted = true;
    const bool selfBlink = board->BlinkWirelessLed();
    BlinkLoop(
        entry, kWirelessPhase_ms, [&] { selfBlink || board->AssertWirelessLed(); },
        [&] { selfBlink || board->DeassertWirelessLed(); });
  }
  entry.workerFinished = true;
  return true;
}

void CustomBlinkNetworkLED(FrontPanelTest& test, LEDStruct& entry) {
  if (CustomBlinkNotebookWirelessLed(test, entry)) {
    return;
  }
  entry.workerStarted = true;
  BlinkLink(test, entry);
  entry.workerFinished = true;
}

}  // namespace panelglow
