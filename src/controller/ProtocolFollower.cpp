#include "controller/ProtocolFollower.h"

#include <cstdlib>

#include "controller/ResultWords.h"

namespace panelglow::controller {

namespace {

// "the red power LED was not recognised [ReportFailure 770134]".
std::string InWords(const std::string& result) {
  const std::size_t code = result.find(' ') + 1;
  const std::string words = WordsFor(result.substr(code, result.find(' ', code) - code));
  const bool isReport = result.rfind("ReportFailure ", 0) == 0;
  const std::string plain = isReport ? "the test failed" : "the code that the installation gives this button";
  return (words.empty() ? plain : words) + " [" + result + "]";
}

}  // namespace

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
  const char* separator = ": ";
  for (const std::string& result : results_) {
    text += separator + InWords(result);
    separator = "; ";
  }
  return text + " (exit code " + std::to_string(exitCode) + ")";
}

}  // namespace panelglow::controller
