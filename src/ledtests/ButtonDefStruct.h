// One button of the dialog, as the button files define it.
#pragma once

#include <cstdint>
#include <string>

namespace panelglow {

struct ButtonDefStruct {
  std::string id;                 // the button's name in ui.xml
  std::string messageId;          // number of the caption in the message file
  std::string errorCode;          // six digits
  std::string caption;            // read, not shown: the caption comes from messageId
  std::string function;           // function key, case free
  std::string buttonIco;          // file of the icon beside the button
  std::string buttonLParam;       // the button's command id, decimal
  bool active = true;             // false only for the text "false": shown, but its LED is not tested
  std::string controller;         // drive controller selection of the hdgreen button
  std::string deviceDescription;  // read, not used further
  std::string connector;          // read, not used further
  std::int32_t ledOnTime = 0;     // ms
  std::int32_t ledOffTime = 0;    // ms
  std::int32_t ledBlinkTime = 0;  // read, not used further
};

/// The dialog's places for buttons.
inline constexpr std::size_t kMostButtons = 24;

}  // namespace panelglow
