// Follows the line protocol of a run as a controller does: progress while it comes, and the verdict from the last
// lines and the exit code.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace panelglow::controller {

class ProtocolFollower {
 public:
  /// What a line said, for showing it.
  enum class Kind { kPercentage, kLog, kResult, kEnd, kOther };

  /// Takes a line without its line end.
  Kind Take(const std::string& line);

  [[nodiscard]] int Percentage() const { return percentage_; }
  [[nodiscard]] bool HasEnded() const { return ends_ > 0; }

  /// True when the lines keep the protocol's promises: exactly one EndOfTest, as the last line, and at most one
  /// "ReportFailure" and one "TestFailed". A run that answers a question prints none of them.
  [[nodiscard]] bool IsOrderly() const { return ends_ <= 1 && !linesBehindEnd_ && failures_ <= 1 && faults_ <= 1; }

  /// One line for people: passed or failed, why in words, and the codes behind them.
  [[nodiscard]] std::string Verdict(int exitCode) const;

 private:
  int percentage_ = 0;
  int ends_ = 0;
  int failures_ = 0;
  int faults_ = 0;
  bool linesBehindEnd_ = false;
  std::vector<std::string> results_;
};

}  // namespace panelglow::controller
