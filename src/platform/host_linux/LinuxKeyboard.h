// The lock keys' LEDs, on every keyboard that has them: a "press" toggles the LED by the input layer, for a real
// press of a synthetic device does not reach the Scroll LED on a text console.
//
// What is toggled is each keyboard's own state, so that an even number of presses leaves all of them as they were.
// The lock state itself is not touched: nothing is typed in other letters.
#pragma once

#include <map>
#include <mutex>
#include <string>

#include "platform/Keyboard.h"
#include "platform/posix/Descriptor.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::host_linux {

class LinuxKeyboard : public Keyboard {
 public:
  /// `inputFolder`: where the event devices are.
  explicit LinuxKeyboard(std::string inputFolder = "/dev/input") : folder_(std::move(inputFolder)) {}

  /// Keys without a LED do nothing, and neither does a release. People are told once when no LED can be reached.
  void Event(std::uint8_t virtualKey, std::uint8_t scanCode, std::uint32_t flags) override;

 private:
  /// Opens what has come since the last press. The kernel's error number of the last refusal, or 0.
  int OpenNewDevices();

  std::string folder_;
  std::mutex guard_;
  std::map<std::string, posix::Descriptor> devices_;  // by path; kept, as closing one takes tens of milliseconds
  posix::OnceTeller teller_;
};

}  // namespace panelglow::platform::host_linux
