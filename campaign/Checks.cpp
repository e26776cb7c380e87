#include "Checks.h"

#include <algorithm>
#include <sstream>

namespace panelglow::campaign {

namespace {

using Strings = std::vector<std::string>;

Strings LinesOf(const std::string& text) {
  Strings lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) {
    lines.push_back(line);
  }
  return lines;
}

// The codes behind a tag at the beginning of lines.
Strings Codes(const Strings& lines, const std::string& tag) {
  Strings codes;
  for (const std::string& line : lines) {
    if (line.compare(0, tag.size() + 1, tag + " ") == 0) {
      codes.push_back(line.substr(tag.size() + 1, 6));
    }
  }
  return codes;
}

std::size_t Count(const std::string& text, const std::string& what) {
  std::size_t count = 0;
  for (std::size_t at = text.find(what); at != std::string::npos; at = text.find(what, at + what.size())) {
    ++count;
  }
  return count;
}

}  // namespace

bool IsWellFormed(const std::string& xml) {
  for (std::size_t at = xml.find('&'); at != std::string::npos; at = xml.find('&', at + 1)) {
    const std::size_t end = xml.find_first_not_of("#abcdefghijklmnopqrstuvwxyzABCDEF0123456789", at + 1);
    if (end == std::string::npos || end == at + 1 || xml[end] != ';') {
      return false;
    }
  }
  Strings open;
  std::size_t roots = 0;
  for (std::size_t at = xml.find('<'); at != std::string::npos; at = xml.find('<', at)) {
    const std::size_t end = xml.find('>', at);
    if (end == std::string::npos) {
      return false;
    }
    const std::string tag = xml.substr(at + 1, end - at - 1);
    at = end;
    if (tag.empty() || tag.find('<') != std::string::npos || std::count(tag.begin(), tag.end(), '"') % 2 != 0) {
      return false;
    }
    if (tag[0] == '?' || tag[0] == '!') {
      continue;
    }
    const std::string name = tag.substr(0, tag.find_first_of(" /\n\t", 1));
    if (tag[0] == '/') {
      if (open.empty() || "/" + open.back() != name) {
        return false;
      }
      open.pop_back();
    } else {
      roots += open.empty() ? 1 : 0;
      if (tag.back() != '/') {
        open.push_back(name);
      }
    }
  }
  return open.empty() && roots == 1;
}

Strings Check(const Case& drawn, const Seen& seen) {
  Strings broken;
  const auto require = [&](bool holds, const std::string& checker, const std::string& what) {
    if (!holds) {
      broken.push_back(checker + ": " + what);
    }
  };
  // A log that was whole is whole at any moment, with this run behind what was there or without; any other file of
  // its name is left alone.
  const bool logWasWhole = IsWellFormed(seen.logBefore);
  const std::string body = seen.logBefore.substr(0, seen.logBefore.rfind("</"));
  const std::size_t added = Count(seen.log, "<Subtest ") - Count(seen.logBefore, "<Subtest ");
  if (logWasWhole) {
    require(IsWellFormed(seen.log), "log", "it is not well formed any more");
    require(seen.log.starts_with(body) && added <= 1, "log",
            "what was there is not there any more, or more than once");
  }
  require((logWasWhole && !drawn.leavesLog) || seen.log == seen.logBefore, "log", "it was not to be written");
  if (seen.wasKilled) {
    return broken;
  }

  const Strings lines = LinesOf(seen.output);
  const Strings reports = Codes(lines, "ReportFailure");
  const Strings failures = Codes(lines, "TestFailed");
  require(std::count(lines.begin(), lines.end(), "EndOfTest") == 1 && lines.back() == "EndOfTest" &&
              seen.output.back() == '\n',
          "order", "not exactly one EndOfTest, as the last line");
  require(reports.size() <= 1 && failures.size() <= 1, "order", "more than one result line of a kind");
  require(seen.exitCode == 0 || seen.exitCode == 1, "exit code", "it is " + std::to_string(seen.exitCode));
  require((seen.exitCode == 0) == (reports.empty() && failures.empty()), "exit code",
          std::to_string(seen.exitCode) + " does not fit the result lines");
  if (drawn.mayLeave != "*") {
    for (const std::string& line : seen.changed) {
      require(!drawn.mayLeave.empty() && line.find(drawn.mayLeave) != std::string::npos, "as before", line);
    }
  }
  for (const std::string& lock : seen.locks) {
    require(lock == drawn.peerLock, "locks", lock + " is still held");
  }
  if (drawn.endsInLog && logWasWhole) {
    require(added == 1, "log", "it has not exactly one element more");
  }
  if (drawn.mustPass) {
    require(seen.exitCode == 0, "healthy panel", "a perfect operator does not pass");
  }
  if (!drawn.mustReport.empty()) {
    require(seen.exitCode == 1, "ill panel", "a perfect operator passes");
    require(std::any_of(drawn.mustReport.begin(), drawn.mustReport.end(),
                        [&](const std::string& code) { return reports == Strings{code}; }),
            "ill panel", "the code is " + (reports.empty() ? "none" : reports.front()));
    require(failures == Strings{drawn.mustFail}, "ill panel",
            "the button's code is " + (failures.empty() ? "none" : failures.front()));
  }
  return broken;
}

}  // namespace panelglow::campaign
