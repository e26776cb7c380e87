// The structured record of a run beside the line protocol: which subtest ran, when and for how long, its attempts and
// their error codes, and the run's parameters. Many runs write to one file; each adds an element and keeps the rest.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace panelglow::CDMUtil {

/// A measured value. Numbers are decimal text in all three records, as the file shows them.
struct SubtestResult {
  std::string description;
  std::string status;
  std::string actualmin;
  std::string actualmax;
  std::string expectedmin;
  std::string expectedmax;
  std::string timestamp;
};

struct SubtestAttempt {
  std::string number;
  std::string errorcode;
  std::string duration;  // ms; not written
  std::vector<SubtestResult> results;
};

struct SubtestDetails {
  std::string name;
  std::string duration;  // ms
  std::string status;
  std::string errorcode;
  std::string starttime;
  std::string endtime;
  std::string retriesspecified;
  std::string retriesattempted;
  std::vector<SubtestAttempt> attempts;
};

/// True when the file exists and cannot be added to without a loss; it must not be written to then. People are told
/// why; a file that is not what it should be is a debug line, too.
bool isXMLCorrupted(const std::string& path);

/// Adds an attempt to `details`, or another error code to the attempt of that number. `startTicks`: tick count at the
/// attempt's begin.
void PopulateAttemptInformation(int attemptNumber, const std::string& errorCode, SubtestDetails& details,
                                SubtestAttempt& current, std::uint32_t startTicks);

/// Fills times into a copy of `details` and adds the run to the file; to be called once on any way out. `startTicks`:
/// tick count at the subtest's begin. Nothing is written without a path, or when the file was found corrupted. A file
/// that cannot be written is a debug line and nothing more: the run's verdict does not depend on it.
void PopulateSubtestInfoAndWriteLog(const std::string& path, const std::string& diagnosticName,
                                    SubtestDetails details, std::uint32_t startTicks, bool corrupted);

}  // namespace panelglow::CDMUtil
