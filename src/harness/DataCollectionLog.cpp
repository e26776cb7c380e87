#include "harness/DataCollectionLog.h"

#include <algorithm>
#include <exception>

#include "config/XmlObject.h"
#include "harness/CmdLineParser.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "platform/Host.h"

namespace panelglow::CDMUtil {

namespace {

constexpr const char* kFormatVersion = "4.15.0";
constexpr unsigned int kLogMessage = 8;

XmlObject Element(const char* name) {
  XmlObject element;
  element.name = name;
  return element;
}

XmlObject ResultElement(const SubtestResult& result) {
  XmlObject element = Element("Result");
  element.SetAttribute("description", result.description);
  element.SetAttribute("status", result.status);
  element.SetAttribute("actualmin", result.actualmin);
  element.SetAttribute("actualmax", result.actualmax);
  element.SetAttribute("expectedmin", result.expectedmin);
  element.SetAttribute("expectedmax", result.expectedmax);
  element.SetAttribute("timestamp", result.timestamp);
  return element;
}

XmlObject AttemptElement(const SubtestAttempt& attempt) {
  XmlObject element = Element("Attempt");
  element.SetAttribute("number", attempt.number);
  element.SetAttribute("errorcode", attempt.errorcode);
  if (!attempt.results.empty()) {
    XmlObject results = Element("Results");
    for (const SubtestResult& result : attempt.results) {
      results.AddChild(ResultElement(result));
    }
    element.AddChild(std::move(results));
  }
  return element;
}

XmlObject AttemptsElement(const SubtestDetails& details) {
  XmlObject element = Element("Attempts");
  element.SetAttribute("retriesspecified", details.retriesspecified);
  element.SetAttribute("retriesattempted", details.retriesattempted);
  for (const SubtestAttempt& attempt : details.attempts) {
    element.AddChild(AttemptElement(attempt));
  }
  return element;
}

XmlObject ArgumentListElement() {
  XmlObject element = Element("ArgumentList");
  for (const auto& [name, value] : CmdLineParser::GetInstance().GetParameters()) {
    XmlObject argument = Element("Argument");
    argument.SetAttribute("name", name);
    argument.SetAttribute("value", value);
    element.AddChild(std::move(argument));
  }
  return element;
}

XmlObject DiagnosticElement(const std::string& diagnosticName, const SubtestDetails& details) {
  XmlObject subtest = Element("Subtest");
  subtest.SetAttribute("name", details.name);
  subtest.SetAttribute("duration", details.duration);
  subtest.SetAttribute("status", details.status);
  subtest.SetAttribute("errorcode", details.errorcode);
  subtest.SetAttribute("starttime", details.starttime);
  subtest.SetAttribute("endtime", details.endtime);
  subtest.AddChild(AttemptsElement(details));
  subtest.AddChild(ArgumentListElement());
  XmlObject diagnostic = Element("Diagnostic");
  diagnostic.SetAttribute("name", diagnosticName);
  diagnostic.AddChild(std::move(subtest));
  return diagnostic;
}

// The file's tree, or a new one when there is no file that loads.
XmlObject LoadLog(const std::string& path) {
  XmlObject root = Element("DiagnosticsData");
  root.SetAttribute("Version", kFormatVersion);
  try {
    XmlObject loaded;
    if (loaded.LoadFromFile(path, false, false, -1)) {
      root = std::move(loaded);
      if (root.GetAttributeValue("Version", "").empty()) {
        root.SetAttribute("Version", kFormatVersion);
      }
    }
  } catch (const std::exception&) {
    // Checked before the run: what has happened to the file since, it is replaced now.
  }
  return root;
}

bool WriteLog(const std::string& path, const std::string& diagnosticName, const SubtestDetails& details) {
  const std::string file = Trim(path);
  if (file.empty()) {
    return false;
  }
  XmlObject root = LoadLog(file);
  root.AddChild(DiagnosticElement(diagnosticName, details));
  return root.TrySaveToFile(file, false, false);
}

}  // namespace

// Of the file that will be written: its path without the blanks that a parameter may bring along.
bool isXMLCorrupted(const std::string& path) {
  const std::string file = Trim(path);
  if (!FileExists(file)) {
    return false;
  }
  const std::unique_ptr<platform::XmlDocument> document = platform::TheHost().xmlDocuments.Create();
  platform::XmlProblem problem;
  if (document != nullptr && document->Load(file, problem)) {
    return false;
  }
  CDMout::LogMessage(LogOptions::Debug, kLogMessage,
                     "XML file is corrupted! The subtest will continue without writing data to the XML file.");
  return true;
}

void PopulateAttemptInformation(int attemptNumber, const std::string& errorCode, SubtestDetails& details,
                                SubtestAttempt& current, std::uint32_t startTicks) {
  const std::string duration = ToString(platform::TheHost().clock.TickCount() - startTicks);
  const std::string number = ToString(attemptNumber);
  const auto known = std::find_if(details.attempts.begin(), details.attempts.end(),
                                  [&](const SubtestAttempt& attempt) { return attempt.number == number; });
  if (known != details.attempts.end()) {
    current = *known;
  }
  if (details.retriesattempted.empty() || ToInt(details.retriesattempted) < attemptNumber) {
    details.retriesattempted = number;
  }
  if (current.number != number) {
    current.errorcode = errorCode;
    details.errorcode = errorCode;
    current.number = number;
  } else {
    current.errorcode += (current.errorcode.empty() ? "" : ",") + errorCode;
    if (!details.attempts.empty()) {
      details.attempts.pop_back();
    }
  }
  current.duration = duration;
  details.attempts.push_back(current);
}

void PopulateSubtestInfoAndWriteLog(const std::string& path, const std::string& diagnosticName,
                                    SubtestDetails details, std::uint32_t startTicks, bool corrupted) {
  platform::Clock& clock = platform::TheHost().clock;
  const std::uint32_t duration_ms = clock.TickCount() - startTicks;
  const std::time_t end = clock.WallTime();
  details.duration = ToString(duration_ms);
  details.starttime = FormatTime(end - static_cast<std::time_t>(duration_ms / 1000));
  details.endtime = FormatTime(end);
  if (corrupted || path.empty()) {
    return;
  }
  if (WriteLog(path, diagnosticName, details)) {
    CDMout::LogMessage(LogOptions::Debug, kLogMessage, "DataCollection XML log written successfully");
  } else {
    CDMout::LogMessage(LogOptions::Debug, kLogMessage, "DataCollection XML log could not be written: " + path);
  }
}

}  // namespace panelglow::CDMUtil
