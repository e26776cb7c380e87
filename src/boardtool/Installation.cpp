#include "boardtool/Installation.h"

#include <filesystem>
#include <set>
#include <system_error>

#include "platform/Host.h"

namespace panelglow::boardtool {

namespace {

constexpr const char* kCommon = "common";

}  // namespace

std::string PathIn(const std::string& folder, const std::string& name) {
  return folder.empty() || folder == "." ? name : folder + (folder.back() == '/' ? "" : "/") + name;
}

std::optional<std::string> ReadFile(const std::string& path) { return platform::TheHost().files.Read(path); }

BoardFiles BoardFilesIn(const std::string& folder) {
  return {PathIn(folder, "mbdetect.ini"), PathIn(folder, "mbtest.ini"), PathIn(folder, "chip.ini")};
}

void RequireReadable(const BoardFiles& names) {
  for (const std::string& path : {names.detectPath, names.testPath, names.chipPath}) {
    std::error_code none;
    if (!ReadFile(path) && std::filesystem::exists(path, none)) {
      throw CannotRun(path + " is there and cannot be read, and is no file that may be missing");
    }
  }
}

std::vector<IniOutline> ReadBoardFiles(const BoardFiles& names) {
  RequireReadable(names);
  std::vector<IniOutline> files;
  for (const std::string& path : {names.detectPath, names.testPath, names.chipPath}) {
    if (std::optional<std::string> bytes = ReadFile(path)) {
      files.emplace_back(path, std::move(*bytes));
    }
  }
  if (files.empty()) {
    throw CannotRun("none of " + names.detectPath + ", " + names.testPath + " and " + names.chipPath +
                    " can be read: start in the folder of the installation, or name it with --folder");
  }
  return files;
}

std::vector<std::string> MachinesOf(const std::vector<IniOutline>& files, const BoardFiles& names) {
  std::vector<std::string> machines;
  std::set<std::string> seen{kCommon};
  for (const IniOutline& file : files) {
    if (file.path == names.chipPath) {
      continue;
    }
    for (const IniSection& section : file.sections) {
      if (!section.name.empty() && seen.insert(LoweredName(section.name)).second) {
        machines.push_back(section.name);
      }
    }
  }
  return machines;
}

std::string PlaceOf(const std::vector<IniOutline>& files, const IniEntry& entry) {
  for (const IniOutline& file : files) {
    if (!file.entries.empty() && &entry >= &file.entries.front() && &entry <= &file.entries.back()) {
      return file.path + ":" + std::to_string(entry.line);
    }
  }
  return {};
}

}  // namespace panelglow::boardtool
