// The lock keys' LEDs, on every keyboard that has them: a "press" toggles the LED by the input layer, for a real
// press of a synthetic device does not reach the Scroll LED on a text console.
//
// The first press turns each keyboard's own LED over and the second one puts it back as it was found, whatever it is
// by then: a real press of another lock key lets the kernel's console, or a graphical session, write all LEDs anew in
// between. So an even number of presses leaves all of them as they were. The lock state itself is not touched:
// nothing is typed in other letters.
#pragma once

#include <cstdint>
#include <map>
#include <mutex>
#include <set>
#include <string>
#include <utility>

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
  struct Device {
    posix::Descriptor file;
    std::map<std::uint16_t, bool> asFound;  // lit or not, of the LEDs that are turned over
  };

  /// 0 when the device has done its part, or has no such LED; else the kernel's error number. `isBack`: the press
  /// undoes the one before. `isDone` is set when the device has the LED.
  static int Press(Device& device, std::uint16_t led, bool isBack, bool& isDone);

  /// Opens what has come since the last press. The kernel's error number of the last refusal, or 0.
  int OpenNewDevices();

  std::string folder_;
  std::mutex guard_;
  std::map<std::string, Device> devices_;  // by path; kept, as closing one takes tens of milliseconds
  std::set<std::uint16_t> flipped_;        // LEDs after an odd number of presses
  posix::OnceTeller teller_;
};

}  // namespace panelglow::platform::host_linux
