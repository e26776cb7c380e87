// One LED of a test: its kind, the command that starts its blink worker, the codes that its failure yields, and the
// flags by which dialog thread and worker thread talk to each other.
#pragma once

#include <atomic>
#include <cstdint>
#include <string>

namespace panelglow {

/// A flag shared by two threads, with one writer at a time. Copied like a plain bool.
class SharedFlag {
 public:
  SharedFlag(bool value = false) : value_(value) {}
  SharedFlag(const SharedFlag& other) : value_(other.value_.load()) {}
  SharedFlag& operator=(const SharedFlag& other) {
    value_ = other.value_.load();
    return *this;
  }
  SharedFlag& operator=(bool value) {
    value_ = value;
    return *this;
  }
  operator bool() const { return value_; }

 private:
  std::atomic<bool> value_;
};

/// Entry of the device array. As constructed it is an unused slot.
struct LEDStruct {
  std::int32_t deviceId = -1;      // LED kind, see LedKind; -1 in an unused slot
  std::uint32_t startCommand = 0;  // command that the dialog sends itself to start the worker
  std::string defaultErrorCode;    // six digits, fixed per kind
  std::uint8_t adapter = 255;      // storage address of a drive entry, otherwise the kind again
  std::uint8_t target = 255;
  std::uint8_t lun = 255;
  SharedFlag tested = true;          // the operator has confirmed this LED in this attempt; the dialog's
  SharedFlag running = false;        // the worker is to go on blinking; the dialog's
  bool cheatCheck = false;           // on the last entry only, when the repeat check is on
  SharedFlag workerStarted = false;  // the worker's
  SharedFlag workerFinished = true;  // the worker's last act
  std::string controllerId;          // device instance id of a drive LED's controller, else empty
  std::string errorCode;             // from the button definition; thrown at the end of a failed run
};

}  // namespace panelglow
