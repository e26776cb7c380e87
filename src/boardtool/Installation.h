// The files of an installation as the tool reads them.
#pragma once

#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "boardtool/IniOutline.h"
#include "boardtool/Rehearsal.h"

namespace panelglow::boardtool {

/// What the tool was asked cannot be done: exit code 3.
class CannotRun : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// The call itself is wrong: exit code 2.
class WrongCall : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// `name` in `folder`, as it is shown to people; `name` alone in the current folder.
std::string PathIn(const std::string& folder, const std::string& name);

/// A file's bytes, or nothing when it cannot be read.
std::optional<std::string> ReadFile(const std::string& path);

/// The names of the three board files in a folder.
BoardFiles BoardFilesIn(const std::string& folder);

/// Throws CannotRun for a board file that is there and cannot be read: it would count as one without keys.
void RequireReadable(const BoardFiles& names);

/// Those of the board files that are there. Throws CannotRun when none is, or one cannot be read.
std::vector<IniOutline> ReadBoardFiles(const BoardFiles& names);

/// The sections of machines in the detection and test files, each once: all but [Common]. In the order of the files.
std::vector<std::string> MachinesOf(const std::vector<IniOutline>& files, const BoardFiles& names);

/// Where an entry stands, as "chip.ini:28".
std::string PlaceOf(const std::vector<IniOutline>& files, const IniEntry& entry);

}  // namespace panelglow::boardtool
