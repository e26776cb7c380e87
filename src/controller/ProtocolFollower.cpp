#include "controller/ProtocolFollower.h"

#include <cstdlib>

namespace panelglow::controller {

ProtocolFollower::Kind ProtocolFollower::Take(const std::string& line) {
  linesBehindEnd_ = linesBehindEnd_ || ends_ > 0;
  const std::string tag = line.substr(0, line.find(' '));
  if (tag == "UpdatePercentage") {
    percentage_ = std::atoi(line.c_str() + tag.size());
    return Kind::kPercentage;
  }
  if (tag == "LogMessage") {
    return Kind::kLog;
  }
  if (tag == "ReportFailure" || tag == "TestFailed") {
    ++(tag == "TestFailed" ? faults_ : failures_);
    results_.push_back(line);
    return Kind::kResult;
  }
  if (line == "EndOfTest") {
    ++ends_;
    return Kind::kEnd;
  }
  return Kind::kOther;
}

std::string ProtocolFollower::Verdict(int exitCode) const {
  if (!HasEnded()) {
    return exitCode == 0 ? "ANSWERED: nothing was tested" : "REFUSED: nothing was tested";
  }
  std::string text = exitCode == 0 ? "PASSED" : "FAILED";
  for (const std::string& result : results_) {
    text += ": " + result;
  }
  return text + " (exit code " + std::to_string(exitCode) + ")";
}

}  // namespace panelglow::controller
