// The class of a log line on standard output.
#pragma once

namespace panelglow {

enum class LogOptions : int {
  Unknown = 0,
  Other = 1,
  Results = 2,
  Subtests = 3,
  Actions = 4,
  Warnings = 5,
  Status = 6,
  DeviceErrors = 7,
  ServiceErrors = 8,
  SettingData = 9,
  Statistics = 10,
  HardwareConfiguration = 11,
  SoftwareConfiguration = 12,
  References = 13,
  Debug = 14,
  Invalid = 15,
};

// Message numbers that several parts of the program use.

/// A text that needs no entry in the message files.
inline constexpr unsigned int kFreeText = 20000;

/// What the program notes about its own files and parameters.
inline constexpr unsigned int kNote = 8;

}  // namespace panelglow
