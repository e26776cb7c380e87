// The structured log: a run is added to whatever is there, or leaves it alone.
#include "FuzzTarget.h"
#include "harness/DataCollectionLog.h"
#include "harness/base/Notices.h"

namespace panelglow::fuzz {
namespace {

constexpr const char* kLog = "log.xml";

void Run(std::string_view bytes) {
  PutFile(kLog, bytes);
  Notices::Forget();
  const bool corrupted = CDMUtil::isXMLCorrupted(kLog);
  CDMUtil::PopulateSubtestInfoAndWriteLog(kLog, "fuzz", {}, 0, corrupted);
  const std::string after = Machine().TheMachine().files.Read(kLog).value_or("");
  if (corrupted) {
    Check(after == bytes, "what cannot be added to stays as it is");
  } else {
    Check(after.find("<Diagnostic name=\"fuzz\">") != std::string::npos, "the run was added");
    Check(!CDMUtil::isXMLCorrupted(kLog), "what was written can be added to again");
  }
}

const Registered kTarget("structured_log", Run);

}  // namespace
}  // namespace panelglow::fuzz
