// The arrows between the folders of src/, as docs/architecture.md allows them.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

using Arrows = std::map<std::string, std::set<std::string>>;  // folder to what it may include

const fs::path kRoot = PANELGLOW_SOURCE_DIR;

std::string TextOf(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

// What stands between pairs of backquotes.
std::vector<std::string> NamesIn(const std::string& cell) {
  std::vector<std::string> names;
  std::size_t open = cell.find('`');
  while (open != std::string::npos) {
    const std::size_t close = cell.find('`', open + 1);
    names.push_back(cell.substr(open + 1, close - open - 1));
    open = close == std::string::npos ? close : cell.find('`', close + 1);
  }
  return names;
}

// The header of an include line with its opening mark, as "<vector>" gives "<vector"; empty for other lines.
std::string HeaderOf(const std::string& line) {
  std::istringstream words(line);
  char hash = 0;
  std::string word;
  std::string header;
  words >> hash >> word >> header;
  if (hash != '#' || word != "include" || header.size() < 3) {
    return {};
  }
  return header.substr(0, header.find_first_of(">\"", 1));
}

// The rows between the header "| folder | may include |" and the first line that is no row.
Arrows ReadArrows(const std::string& page) {
  Arrows arrows;
  std::istringstream lines(page);
  bool inside = false;
  for (std::string line; std::getline(lines, line);) {
    if (line.rfind("| folder |", 0) == 0) {
      inside = true;
    } else if (inside && line.rfind('|', 0) != 0) {
      break;
    } else if (inside && line.find('`') != std::string::npos) {
      const std::size_t middle = line.find('|', 1);
      const std::vector<std::string> names = NamesIn(line.substr(middle));
      arrows[NamesIn(line.substr(0, middle)).at(0)] = {names.begin(), names.end()};
    }
  }
  return arrows;
}

std::string FolderOf(const std::string& path) {
  const std::size_t slash = path.rfind('/');
  return slash == std::string::npos ? "." : path.substr(0, slash);
}

bool MayUseSystem(const std::string& folder) {
  static const std::set<std::string> kOutside = {
      "platform/host_linux", "platform/sim", "platform/posix", "platform/drawingmodule",
      "platform/xmlmodule",  "controller",   "boardtool/main", "pages"};
  return kOutside.count(folder) != 0;
}

// The integrator's program writes JSON; it calls no system by itself.
bool MayUse(const std::string& folder, const std::string& header) {
  return MayUseSystem(folder) || (folder == "boardtool" && header.starts_with("nlohmann/"));
}

// What is wrong with the include lines of one file; `path` is relative to src/.
std::vector<std::string> Violations(const Arrows& arrows, const std::string& path, const std::string& text) {
  std::vector<std::string> found;
  const std::string folder = FolderOf(path);
  const auto allowed = arrows.find(folder);
  if (allowed == arrows.end()) {
    return {"folder " + folder + " has no row in docs/architecture.md"};
  }
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) {
    const std::string marked = HeaderOf(line);
    if (marked.empty()) {
      continue;
    }
    const std::string header = marked.substr(1);
    if (marked.front() == '<') {
      if (header.find_first_of("./") != std::string::npos && !MayUse(folder, header)) {
        found.push_back(path + " includes the system header <" + header + ">");
      }
      continue;
    }
    const std::string target = FolderOf(header);
    if (target != folder && allowed->second.count(target) == 0) {
      found.push_back(path + " includes \"" + header + "\"");
    }
  }
  return found;
}

TEST(Layering, NoIncludePointsUp) {
  const Arrows arrows = ReadArrows(TextOf(kRoot / "docs/architecture.md"));
  ASSERT_GT(arrows.size(), 15U);
  std::vector<std::string> found;
  std::size_t files = 0;
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(kRoot / "src")) {
    const fs::path extension = entry.path().extension();
    if (extension == ".h" || extension == ".cpp") {
      ++files;
      const std::string path = fs::relative(entry.path(), kRoot / "src").generic_string();
      const std::vector<std::string> more = Violations(arrows, path, TextOf(entry.path()));
      found.insert(found.end(), more.begin(), more.end());
    }
  }
  EXPECT_GT(files, 100U);
  EXPECT_EQ(found, std::vector<std::string>());
}

TEST(Layering, TheCheckSeesWhatItIsThereFor) {
  const Arrows arrows = {{"config", {"platform"}}};
  EXPECT_EQ(
      Violations(arrows, "config/A.cpp", "#include \"config/A.h\"\n#include <vector>\n#include \"platform/Text.h\""),
      std::vector<std::string>());
  EXPECT_EQ(Violations(arrows, "config/A.cpp", "#include \"board/MotherBoard.h\"").size(), 1U);
  EXPECT_EQ(Violations(arrows, "config/A.cpp", "  #  include <sys/stat.h>").size(), 1U);
  EXPECT_EQ(Violations(arrows, "elsewhere/A.cpp", "").size(), 1U);
}

}  // namespace
