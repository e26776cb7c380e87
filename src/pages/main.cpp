// Writes the manual pages and the completions of all programs, at build time, from the tables by which they read
// their command lines; the diagnostic tells its own by its catalogue and its usage.
//
//   panelglow-pages CATALOG USAGE GUIDE FOLDER
#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>

#include "Version.h"
#include "boardtool/main/CommandLine.h"
#include "controller/Options.h"
#include "pages/CatalogCommand.h"
#include "pages/CliCommand.h"
#include "pages/Completion.h"
#include "pages/ManPage.h"

namespace {

namespace fs = std::filesystem;
using namespace panelglow::pages;

constexpr const char* kFilesText =
    "It reads its files (XML for the buttons, INI for boards and chips) in the current folder; a complete set is in ";
constexpr const char* kDiagsTexts =
    "/installation, to be copied into a folder of one's own.\n\n"
    "A run writes its lines to standard output for a controller, and ends with EndOfTest. What people should know "
    "goes to standard error.";
constexpr const char* kDiagsCodes = "0: passed, or a question was answered\n1: failed, or the call is wrong";
constexpr const char* kBoardCodes =
    "0: done\n1: done, and something is wrong with what was looked at\n2: a wrong call\n3: it could not be done";
constexpr const char* kSimCodes = "0: passed\n1: failed\n2: a wrong call\n3: a run that could not be made";

std::string ReadFile(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  if (!(text << file.rdbuf())) {
    throw std::runtime_error(path.string() + " cannot be read, or is empty");
  }
  return text.str();
}

void WriteFile(const fs::path& path, const std::string& text) {
  fs::create_directories(path.parent_path());
  std::ofstream file(path, std::ios::binary);
  if (!(file << text) || !file.flush()) {
    throw std::runtime_error(path.string() + " cannot be written");
  }
}

void Write(const fs::path& folder, const Command& command, const PageTexts& texts) {
  WriteFile(folder / "man/man1" / (command.name + ".1"), ManPageOf(command, texts));
  WriteFile(folder / "bash-completion/completions" / command.name, BashCompletionOf(command));
  WriteFile(folder / "zsh/site-functions" / ("_" + command.name), ZshCompletionOf(command));
  WriteFile(folder / "fish/vendor_completions.d" / (command.name + ".fish"), FishCompletionOf(command));
}

// `data`: where installation and machines are going to be.
void WriteAll(const fs::path& catalog, const fs::path& usage, const fs::path& guide, const std::string& data,
              const fs::path& folder) {
  const std::string all = panelglow::kVersion;
  const std::string version = all.substr(0, all.find(','));
  for (const char* name : {"panelglow-diags", "panelglow-diags-sim"}) {
    const std::string simulated =
        name == std::string("panelglow-diags")
            ? ""
            : "\n\nThis one has a simulated machine in place of a real one, and is started by "
              "panelglow-sim.";
    Write(folder, CommandOfCatalog(name, ReadFile(catalog), ReadFile(usage)),
          {version, kFilesText + data + kDiagsTexts + simulated, kDiagsCodes,
           "panelglow-diags -subtest=CustomLEDTest -SectionID=Desktop\npanelglow-diags -help=true -subtest=LEDTest",
           "panelglow-sim(1), panelglow-board(1), panelglow-ini(5)"});
  }
  for (const auto& [name, isSimulated] :
       {std::pair("panelglow-board", false), std::pair("panelglow-board-sim", true)}) {
    const panelglow::boardtool::CommandLine line(name, isSimulated);
    Write(folder, CommandOf(line.App()),
          {version,
           isSimulated ? "The machine is a simulated one, of the file that --machine names."
                       : "The machine is the one that it runs on; panelglow-board-sim(1) takes a simulated one.",
           kBoardCodes,
           "panelglow-board check\npanelglow-board explain --board 7D10 power-green\n"
           "panelglow-board blink power-green --seconds 3",
           "panelglow-diags(1), panelglow-ini(5)"});
  }
  CLI::App app;
  panelglow::controller::Options options;
  panelglow::controller::AddOptions(app, options);
  Write(folder, CommandOf(app),
        {version, app.get_footer(), kSimCodes,
         "cp -r " + data + "/installation ~/bench && cd ~/bench\npanelglow-sim --machine " + data +
             "/machines/notebook.toml -- -subtest=CustomLEDTest -SectionID=Notebook",
         "panelglow-diags(1), panelglow-board-sim(1)"});
  WriteFile(folder / "man/man5/panelglow-ini.5",
            ManPageOfMarkdown("panelglow-ini", "the files that say which LEDs a board has and how they are driven",
                              ReadFile(guide), {version, "", "", "", "panelglow-board(1), panelglow-diags(1)"}));
}

}  // namespace

int main(int argc, char** argv) {
  constexpr int kArguments = 5;
  try {
    if (argc != kArguments + 1) {
      throw std::runtime_error("panelglow-pages CATALOG USAGE GUIDE DATA FOLDER");
    }
    WriteAll(argv[1], argv[2], argv[3], argv[4], argv[5]);
    return 0;
  } catch (const std::exception& problem) {
    std::fprintf(stderr, "panelglow-pages: %s\n", problem.what());
    return 1;
  }
}
