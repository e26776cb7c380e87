// The line protocol on standard output: the one place that writes what a controller reads.
#pragma once

#include <functional>
#include <string>
#include <string_view>

#include "harness/base/LogOptions.h"

namespace panelglow {

/// Every operation writes one line, whatever its text holds (line ends become blanks; nothing else is escaped), and
/// hands it on at once. May be called from any thread.
class CDMout {
 public:
  virtual ~CDMout() = default;

  /// `percent` is limited to 0 to 100.
  static void UpdatePercentage(int percent);

  /// The verdict of a subtest that failed.
  static void ReportFailure(std::string_view text);

  /// The verdict of the harness: a text, or a code in at least six digits with a text in quotation marks.
  static void TestFailed(std::string_view text);
  static void TestFailed(int code, std::string_view text);

  /// The last line of a run.
  static void EndOfTest();

  /// A log line.
  static void LogMessage(LogOptions option, unsigned int id, std::string_view text);
  static void LogMessage(LogOptions option, unsigned int id, const char* text);
  static void LogMessage(LogOptions option, unsigned int id, const std::string& text);
  static void LogMessage(LogOptions option, unsigned int id, int value);
  static void LogMessage(LogOptions option, unsigned int id, bool value);

  /// The text of a log line in debug mode. Without a resolver, or an entry in its files: the number, a blank, and the
  /// text in quotation marks.
  static std::string ResolveLogMessage(unsigned int id, const std::string& text);

  /// What this leaf needs of the layers above, handed in once at start-up, before any other thread exists. `debug`
  /// says whether debug mode is on; it is asked at each log line.
  static void SetDebugQuery(std::function<bool()> debug);
  static void SetMessageResolver(std::function<std::string(unsigned int id, const std::string& text)> resolver);
};

}  // namespace panelglow
