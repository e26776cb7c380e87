#include "harness/DataCollectionLog.h"

#include <algorithm>
#include <optional>
#include <stdexcept>
#include <utility>

#include "config/FileLock.h"
#include "config/XmlObject.h"
#include "harness/CmdLineParser.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "harness/base/Notices.h"
#include "platform/Host.h"

namespace panelglow::CDMUtil {

namespace {

constexpr const char* kFormatVersion = "4.15.0";
constexpr std::size_t kLongestReason = 200;

// Texts that are no UTF-8 are taken for the system's code page; no text may make the file one that is not well
// formed.
std::string Utf8(const std::string& text) {
  wstring wide = platform::WideFromUtf8(text);
  if (platform::Utf8FromWide(wide) != text) {
    wide = platform::WideFromCodePage(text);
  }
  constexpr char16_t kReplacement = 0xFFFD;
  std::replace_if(
      wide.begin(), wide.end(), [](char16_t c) { return c > kReplacement; }, kReplacement);
  return platform::Utf8FromWide(wide);
}

void Set(XmlObject& element, const char* name, const std::string& value) { element.SetAttribute(name, Utf8(value)); }

XmlObject Element(const char* name) {
  XmlObject element;
  element.name = name;
  return element;
}

XmlObject ResultElement(const SubtestResult& result) {
  XmlObject element = Element("Result");
  Set(element, "description", result.description);
  Set(element, "status", result.status);
  Set(element, "actualmin", result.actualmin);
  Set(element, "actualmax", result.actualmax);
  Set(element, "expectedmin", result.expectedmin);
  Set(element, "expectedmax", result.expectedmax);
  Set(element, "timestamp", result.timestamp);
  return element;
}

XmlObject AttemptElement(const SubtestAttempt& attempt) {
  XmlObject element = Element("Attempt");
  Set(element, "number", attempt.number);
  Set(element, "errorcode", attempt.errorcode);
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
  Set(element, "retriesspecified", details.retriesspecified);
  Set(element, "retriesattempted", details.retriesattempted);
  for (const SubtestAttempt& attempt : details.attempts) {
    element.AddChild(AttemptElement(attempt));
  }
  return element;
}

XmlObject ArgumentListElement() {
  XmlObject element = Element("ArgumentList");
  for (const auto& [name, value] : CmdLineParser::GetInstance().GetParameters()) {
    XmlObject argument = Element("Argument");
    Set(argument, "name", name);
    Set(argument, "value", value);
    element.AddChild(std::move(argument));
  }
  return element;
}

XmlObject DiagnosticElement(const std::string& diagnosticName, const SubtestDetails& details) {
  XmlObject subtest = Element("Subtest");
  Set(subtest, "name", details.name);
  Set(subtest, "duration", details.duration);
  Set(subtest, "status", details.status);
  Set(subtest, "errorcode", details.errorcode);
  Set(subtest, "starttime", details.starttime);
  Set(subtest, "endtime", details.endtime);
  subtest.AddChild(AttemptsElement(details));
  subtest.AddChild(ArgumentListElement());
  XmlObject diagnostic = Element("Diagnostic");
  Set(diagnostic, "name", diagnosticName);
  diagnostic.AddChild(std::move(subtest));
  return diagnostic;
}

// A log that is there, as far as it could be read.
struct OldLog {
  std::optional<XmlObject> root;
  bool damaged = false;  // read, and not fit to be added to
  std::string problem;
};

// A comment that came as an instruction, as what it was; anything else as it is.
std::string CommentOf(const std::string& instruction) {
  const std::string mark = "<?" + std::string(platform::kXmlComment);
  if (!instruction.starts_with(mark)) {
    return instruction;
  }
  std::string_view content = std::string_view(instruction).substr(mark.size());
  content.remove_prefix(content.starts_with(' ') ? 1 : 0);
  content.remove_suffix(std::string_view("?>").size());
  return "<!--" + std::string(content) + "-->";
}

void RestoreComments(XmlObject& element) {
  if (!std::as_const(element).GetProlog().instructions.empty()) {
    std::vector<std::string>& instructions = element.GetProlog().instructions;
    std::transform(instructions.begin(), instructions.end(), instructions.begin(), CommentOf);
  }
  for (XmlObject& child : element.children) {
    RestoreComments(child);
  }
}

// Strictly: whatever passes here can be added to and loses nothing by it, and whatever does not pass is not touched.
OldLog ReadLog(const std::string& file) {
  const std::unique_ptr<platform::XmlDocument> document = platform::TheHost().xmlDocuments.Create();
  if (document == nullptr) {
    return {{}, false, "the XML component, which reads it, is not there"};
  }
  platform::XmlProblem problem;
  std::optional<std::string> text;
  if (document->Load(file, problem)) {
    text = document->SimpleText(problem);
  }
  if (!text) {
    return {{}, !problem.unread, Trim(problem.reason)};
  }
  try {
    OldLog log{XmlObject(*text), false, {}};
    RestoreComments(*log.root);
    return log;
  } catch (const std::runtime_error& failure) {
    return {{}, true, failure.what()};  // a name that begins with a sign, as "_a"
  }
}

void TellThatItIsLeft(const std::string& file, const OldLog& log) {
  Notices::Tell("The structured log " + file + " is left as it is, without a record of this run: " +
                log.problem.substr(0, kLongestReason) + (log.damaged ? ". Mend it" : ". Make it readable") +
                ", or name another file by -DataCollectionFile.");
}

bool WriteLog(const std::string& path, const std::string& diagnosticName, const SubtestDetails& details) {
  const std::string file = Trim(path);
  if (file.empty()) {
    return false;
  }
  const FileLock turn(file);  // two runs at once both leave their record
  OldLog log{Element("DiagnosticsData"), false, {}};
  if (FileExists(file)) {
    log = ReadLog(file);
    if (!log.root) {
      TellThatItIsLeft(file, log);
      return false;
    }
  }
  if (log.root->GetAttributeValue("Version", "").empty()) {
    log.root->SetAttribute("Version", kFormatVersion);
  }
  log.root->AddChild(DiagnosticElement(diagnosticName, details));
  const bool saved = log.root->TrySaveToFile(file, false, false);
  if (!saved) {
    Notices::Tell(
        "The structured log " + file +
        " cannot be written, and has no record of this run: make room, or allow it, or name another file by "
        "-DataCollectionFile.");
  }
  return saved;
}

}  // namespace

// Of the file that will be written: its path without the blanks that a parameter may bring along.
bool isXMLCorrupted(const std::string& path) {
  const std::string file = Trim(path);
  if (!FileExists(file)) {
    return false;
  }
  const OldLog log = ReadLog(file);
  if (log.root) {
    return false;
  }
  TellThatItIsLeft(file, log);
  if (log.damaged) {
    CDMout::LogMessage(LogOptions::Debug, kNote,
                       "XML file is corrupted! The subtest will continue without writing data to the XML file.");
  }
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
    CDMout::LogMessage(LogOptions::Debug, kNote, "DataCollection XML log written successfully");
  } else {
    CDMout::LogMessage(LogOptions::Debug, kNote, "DataCollection XML log could not be written: " + path);
  }
}

}  // namespace panelglow::CDMUtil
