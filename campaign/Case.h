// One run of a campaign, drawn from a seed.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace panelglow::campaign {

/// What is drawn beside machine, subtest and seed, and can be left out of a case.
enum class Part {
  kArguments,
  kOperator,
  kPanelFault,
  kBusFault,
  kFileFault,
  kLog,
  kStopFile,
  kConsole,
  kDisk,
  kPeer,
  kKill
};

struct PartName {
  Part part;
  const char* name;
};

/// All parts, by the names that the command line has for them.
const std::vector<PartName>& AllParts();

using Files = std::map<std::string, std::string>;  // content by name

struct Case {
  std::uint64_t seed = 0;
  std::string machineFile = {};  // of machines/
  std::string machine = {};      // its text, with what was drawn behind it
  std::string person = "perfect";
  std::string fault = {};  // "LED=KIND"; empty: the panel is healthy
  std::vector<std::string> arguments = {};
  Files files = {};                           // in place of the installation's
  std::vector<std::string> missing = {};      // files that are not there
  std::optional<std::uint64_t> kill_us = {};  // the program is killed at this time
  std::string peerLock = {};                  // that another process may still own at the end
  std::string mayLeave = {};                  // part of what this machine's registers may keep; "*": anything

  // What such a run has to come to. Neither: whatever it comes to is right.
  bool mustPass = false;
  std::vector<std::string> mustReport = {};  // codes of which ReportFailure has one
  std::string mustFail = {};                 // the code of TestFailed
  bool endsInLog = false;                    // it adds an element to the log
  bool leavesLog = false;                    // it writes none

  std::vector<Part> drawn = {};  // what can be left out
};

/// The same seed gives the same case; a part that is left out changes nothing else of it.
Case Draw(std::uint64_t seed, const std::vector<Part>& without, const Files& installation, const Files& machines);

/// For people: what the case is made of.
std::string Describe(const Case& drawn);

}  // namespace panelglow::campaign
