#include "boardtool/Check.h"

#include <algorithm>

#include "boardtool/BoardChecks.h"
#include "boardtool/ControllerChecks.h"
#include "boardtool/DialogChecks.h"
#include "boardtool/IniChecks.h"
#include "boardtool/Installation.h"

namespace panelglow::boardtool {

namespace {

std::string FileNameOf(const std::string& path) { return path.substr(path.find_last_of("/\\") + 1); }

std::string FolderOf(const std::string& path) {
  const std::size_t slash = path.find_last_of("/\\");
  return slash == std::string::npos ? "." : path.substr(0, slash);
}

bool IsSilenced(const Finding& finding, const std::vector<IniOutline>& files) {
  return std::any_of(files.begin(), files.end(), [&](const IniOutline& file) {
    return file.path == finding.path && file.IsSilenced(finding.line, finding.rule->name);
  });
}

}  // namespace

std::vector<Finding> FindingsOf(const CheckOptions& options, platform::Host& machine) {
  Findings findings;
  std::string folder = options.folder;
  if (!options.files.empty()) {
    folder = FolderOf(options.files.front());
    for (const std::string& path : options.files) {
      if (FolderOf(path) != folder) {
        throw WrongCall("the files of one installation lie in one folder: " + path + " does not lie in " + folder);
      }
    }
  }
  const BoardFiles names = BoardFilesIn(folder);
  std::vector<IniOutline> files;
  for (const std::string& path : {names.detectPath, names.testPath, names.chipPath}) {
    const std::optional<std::string> bytes = ReadFile(path);
    if (!bytes) {
      findings.Add("file-missing", path, 1, 1, FileNameOf(path) + " is missing or cannot be read");
    } else if (IsCheckableText(path, *bytes, true, findings)) {
      files.emplace_back(path, *bytes);
      CheckIniText(files.back(), false, findings);
    }
  }
  std::optional<BoardKnowledge> boards;
  if (files.size() == 3) {
    boards = CheckBoards(files, names, machine, findings);
  }
  CheckDialog(folder, machine, boards ? &*boards : nullptr, files, findings);
  const std::string controllers = PathIn(folder, "msctrl.ini");
  if (const std::optional<std::string> bytes = ReadFile(controllers);
      bytes && IsCheckableText(controllers, *bytes, false, findings)) {
    files.emplace_back(controllers, *bytes);
    CheckControllers(files.back(), findings);
  }
  std::vector<Finding> sorted = findings.Sorted();
  std::erase_if(sorted, [&](const Finding& finding) {
    const bool isAsked = options.files.empty() ||
                         std::find(options.files.begin(), options.files.end(), finding.path) != options.files.end();
    return !isAsked || IsSilenced(finding, files);
  });
  return sorted;
}

int Check(const CheckOptions& options) {
  platform::Host& machine = platform::TheHost();
  const std::vector<Finding> findings = FindingsOf(options, machine);
  machine.console.Write(options.format == "sarif"  ? FindingsSarif(findings)
                        : options.format == "json" ? FindingsJson(findings)
                                                   : FindingsText(findings));
  return findings.empty() ? 0 : 1;
}

}  // namespace panelglow::boardtool
