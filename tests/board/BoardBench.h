// A simulated machine with its INI files, for what one process can do again and again.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "board/MotherBoard.h"
#include "board/base/BoardDevio.h"
#include "board/base/IniReader.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "hw/PciDeviceList.h"
#include "hw/WMIDiscovery.h"
#include "platform/Host.h"
#include "platform/sim/Simulation.h"

namespace panelglow {

class BoardBench {
 public:
  /// `chips` is the machine's hardware, in the words of a machine's file.
  explicit BoardBench(const std::string& chips = "") : machine(chips) {
    Forget();
    SetFiles("[7D10]\nplatform=generic\nchips=g_iospace,g_memoryspace\n", "", "");
    BoardDevio().LoadDriver();
    machine.Trace().Keep();
  }

  ~BoardBench() { Forget(); }
  BoardBench(const BoardBench&) = delete;
  BoardBench& operator=(const BoardBench&) = delete;

  void SetFiles(const std::string& detect, const std::string& test, const std::string& chip) {
    machine.DiskFiles().Put(".\\mbdetect.ini", detect);
    machine.DiskFiles().Put(".\\mbtest.ini", test);
    machine.DiskFiles().Put(".\\chip.ini", chip);
  }

  static std::unique_ptr<MotherBoard> Board(const std::string& systemId = "7D10") {
    return MotherBoard::Instantiate(".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini", "platform", systemId);
  }

  /// What an action does on the hardware, in order: "0A20<-31" and "0A21->30" for ports and memory (its bytes in the
  /// order of their addresses), "30ms" for a wait.
  template <class Action>
  std::string Traffic(Action action) {
    machine.Trace().Clear();
    platform::sim::Microseconds last = machine.Time().Now();
    std::string text;
    const auto wait = [&](platform::sim::Microseconds until) {
      text += until - last < 1000 ? "" : std::to_string((until - last) / 1000) + "ms ";
      last = until;
    };
    action();
    for (const platform::sim::DriverRequest& request : machine.Trace().Requests()) {
      wait(request.time);
      std::vector<std::string> words;  // simulated, time, us, thread, number, kind, address, direction, value
      CDMUtil::Split(Describe(request), words, " ");
      if (words[5] != "request") {  // mapping and unmapping say nothing here
        for (std::size_t i = 6; i < words.size(); ++i) {
          text += words[i];
        }
        text += " ";
      }
    }
    wait(machine.Time().Now());
    return text;
  }

  /// A worker that overruns: ended at the request at which it stands after this time. A request takes 2 us.
  void EndAfter(platform::sim::Microseconds time, const std::function<void()>& work) {
    const platform::ThreadHandle worker = platform::TheHost().threads.Start("worker", [&] {
      machine.Time().SleepFor(10);  // as long as the start takes
      work();
    });
    machine.Time().SleepFor(time);
    platform::TheHost().threads.Terminate(worker);
  }

  platform::sim::Simulation machine;

 private:
  // What one machine has told is no other machine's.
  static void Forget() {
    WMIDiscovery::Forget();
    PciDeviceList::Forget();
    Notices::Forget();
  }
};

}  // namespace panelglow
