#include "boardtool/Check.h"

#include <algorithm>
#include <array>

#include "boardtool/BoardChecks.h"
#include "boardtool/ControllerChecks.h"
#include "boardtool/DialogChecks.h"
#include "boardtool/IniChecks.h"
#include "boardtool/Installation.h"
#include "boardtool/Output.h"

namespace panelglow::boardtool {

namespace {

std::string FileNameOf(const std::string& path) { return path.substr(path.find_last_of("/\\") + 1); }

std::string FolderOf(const std::string& path) {
  const std::size_t slash = path.find_last_of("/\\");
  return slash == std::string::npos ? "." : path.substr(0, slash);
}

constexpr std::array kFileNames{"mbdetect.ini",
                                "mbtest.ini",
                                "chip.ini",
                                "msctrl.ini",
                                "ui.xml",
                                "buttondefinition.xml",
                                "panelglow-diags.msg",
                                "nonui_panelglow-diags.msg",
                                "x_panelglow-diags.msg"};

// The files that are asked for, by the paths that findings have.
std::vector<std::string> PathsOf(const CheckOptions& options) {
  std::vector<std::string> paths;
  for (const std::string& path : options.files) {
    const std::string name = FileNameOf(path);
    if (std::find(kFileNames.begin(), kFileNames.end(), name) == kFileNames.end()) {
      std::string names;
      for (const char* const known : kFileNames) {
        names += (names.empty() ? "" : ", ") + std::string(known);
      }
      throw WrongCall("the files of an installation are called " + names + "; " + path + " is none of them");
    }
    if (FolderOf(path) != FolderOf(options.files.front())) {
      throw WrongCall("the files of one installation lie in one folder: " + path + " does not lie in " +
                      FolderOf(options.files.front()));
    }
    paths.push_back(PathIn(FolderOf(path), name));
  }
  return paths;
}

bool IsSilenced(const Finding& finding, const std::vector<IniOutline>& files) {
  return std::any_of(files.begin(), files.end(), [&](const IniOutline& file) {
    return file.path == finding.path && file.IsSilenced(finding.line, finding.rule->name);
  });
}

}  // namespace

std::vector<Finding> FindingsOf(const CheckOptions& options, platform::Host& machine) {
  Findings findings;
  const std::vector<std::string> asked = PathsOf(options);
  const std::string folder = options.files.empty() ? options.folder : FolderOf(options.files.front());
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
    const bool isAsked = asked.empty() || std::find(asked.begin(), asked.end(), finding.path) != asked.end();
    return !isAsked || IsSilenced(finding, files);
  });
  return sorted;
}

int Check(const CheckOptions& options) {
  platform::Host& machine = platform::TheHost();
  const std::vector<Finding> findings = FindingsOf(options, machine);
  Print(options.format == "sarif"  ? FindingsSarif(findings)
        : options.format == "json" ? FindingsJson(findings)
                                   : FindingsText(findings));
  return findings.empty() ? 0 : 1;
}

}  // namespace panelglow::boardtool
