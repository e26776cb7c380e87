// A campaign: runs drawn from seeds, each held against what must be true of every run.
#include <sys/wait.h>
#include <unistd.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "Case.h"
#include "Run.h"
#include "platform/posix/ModuleLoader.h"

namespace {

namespace fs = std::filesystem;
using namespace panelglow::campaign;
using Clock = std::chrono::steady_clock;
using Strings = std::vector<std::string>;

constexpr int kBroken = 1;
constexpr int kWrongCall = 2;
constexpr std::uint64_t kMostSeedsOfASabotage = 2000;

Files FilesIn(const fs::path& folder) {
  Files files;
  for (const fs::directory_entry& entry : fs::directory_iterator(folder)) {
    std::ostringstream text;
    text << std::ifstream(entry.path(), std::ios::binary).rdbuf();
    files[entry.path().filename().string()] = text.str();
  }
  return files;
}

// What each child would load anew.
void LoadModules() {
  std::string error;
  for (const auto& [module, symbol] : {std::pair("panelglow-xml", "PanelglowXmlDocumentsOnFiles"),
                                       std::pair("panelglow-drawing", "PanelglowSceneDrawing")}) {
    if (panelglow::platform::posix::LoadSymbol(module, symbol, error) == nullptr) {
      throw std::runtime_error(error);
    }
  }
}

struct Options {
  std::uint64_t first = 1;
  std::uint64_t runs = 1000;
  unsigned jobs = 2;
  std::uint64_t seed = 0;
  Strings without;
  bool selfCheck = false;
  std::string source = ".";
};

class Campaign {
 public:
  explicit Campaign(const fs::path& source)
      : installation_(FilesIn(source / "installation")), machines_(FilesIn(source / "machines")) {}

  [[nodiscard]] Case Drawn(std::uint64_t seed, const std::vector<Part>& without = {}) const {
    return Draw(seed, without, installation_, machines_);
  }
  [[nodiscard]] Strings RunOf(std::uint64_t seed, const std::vector<Part>& without = {},
                              const std::string& sabotage = {}) const {
    return Run(Drawn(seed, without), installation_, sabotage);
  }

  /// The parts without which the case still fails in the same way.
  [[nodiscard]] std::vector<Part> Needless(std::uint64_t seed, const std::string& failure) const {
    const std::string checker = failure.substr(0, failure.find(':'));
    std::vector<Part> without;
    for (const Part part : Drawn(seed).drawn) {
      without.push_back(part);
      const Strings broken = RunOf(seed, without);
      if (std::none_of(broken.begin(), broken.end(),
                       [&](const std::string& line) { return line.compare(0, checker.size(), checker) == 0; })) {
        without.pop_back();
      }
    }
    return without;
  }

 private:
  Files installation_;
  Files machines_;
};

void ShowFailure(const Campaign& campaign, std::uint64_t seed, const Strings& broken) {
  const std::vector<Part> without = campaign.Needless(seed, broken.front());
  std::string command = "tools/campaign --seed " + std::to_string(seed);
  for (const PartName& row : AllParts()) {
    if (std::find(without.begin(), without.end(), row.part) != without.end()) {
      command += std::string(" --without ") + row.name;
    }
  }
  std::string text =
      "FAILED " + broken.front() + "\n  again: " + command + "\n  " + Describe(campaign.Drawn(seed, without)) + "\n";
  std::fputs(text.c_str(), stdout);
  std::fflush(stdout);
}

// One job: every `jobs`-th seed. A byte on the pipe for each run: '.', or 'F'.
void Work(const Campaign& campaign, const Options& options, unsigned job, int pipe) {
  for (std::uint64_t number = job; number < options.runs; number += options.jobs) {
    const Strings broken = campaign.RunOf(options.first + number);
    if (!broken.empty()) {
      ShowFailure(campaign, options.first + number, broken);
    }
    const char mark = broken.empty() ? '.' : 'F';
    if (::write(pipe, &mark, 1) != 1) {
      ::_exit(kBroken);
    }
  }
}

int RunAll(const Campaign& campaign, const Options& options) {
  int ends[2];
  if (::pipe(ends) != 0) {
    std::perror("panelglow-campaign: no pipe");
    return kBroken;
  }
  for (unsigned job = 0; job < options.jobs; ++job) {
    if (::fork() == 0) {
      ::close(ends[0]);
      Work(campaign, options, job, ends[1]);
      ::_exit(0);
    }
  }
  ::close(ends[1]);
  const bool isWatched = ::isatty(STDERR_FILENO) != 0;
  const auto begin = Clock::now();
  auto told = begin;
  std::uint64_t done = 0;
  std::uint64_t failed = 0;
  char marks[4096];
  for (ssize_t count = 0; (count = ::read(ends[0], marks, sizeof marks)) > 0;) {
    done += static_cast<std::uint64_t>(count);
    failed += static_cast<std::uint64_t>(std::count(marks, marks + count, 'F'));
    const auto now = Clock::now();
    if (now - told >= (isWatched ? std::chrono::seconds(1) : std::chrono::seconds(60))) {
      told = now;
      const double seconds = std::chrono::duration<double>(now - begin).count();
      std::fprintf(stderr, "%s%llu of %llu runs, %.0f a second, %llu failed%s", isWatched ? "\r" : "",
                   static_cast<unsigned long long>(done), static_cast<unsigned long long>(options.runs),
                   static_cast<double>(done) / seconds, static_cast<unsigned long long>(failed),
                   isWatched ? "" : "\n");
    }
  }
  while (::wait(nullptr) > 0) {
  }
  const double seconds = std::chrono::duration<double>(Clock::now() - begin).count();
  std::printf("%s%llu runs of seeds %llu to %llu in %.1f s, %.0f a second: %llu failed\n", isWatched ? "\n" : "",
              static_cast<unsigned long long>(done), static_cast<unsigned long long>(options.first),
              static_cast<unsigned long long>(options.first + options.runs - 1), seconds,
              static_cast<double>(done) / std::max(seconds, 0.001), static_cast<unsigned long long>(failed));
  if (done != options.runs) {
    std::fprintf(stderr, "panelglow-campaign: a job has ended early\n");
  }
  return failed == 0 && done == options.runs ? 0 : kBroken;
}

// Whether each checker notices what it is there for.
int CheckCheckers(const Campaign& campaign) {
  int code = 0;
  for (const Sabotage& sabotage : AllSabotages()) {
    const std::string begin = std::string(sabotage.checker) + ":";
    std::uint64_t seed = 1;
    bool isSeen = false;
    for (; !isSeen && seed <= kMostSeedsOfASabotage; ++seed) {
      const Case drawn = campaign.Drawn(seed);
      const bool concerns = sabotage.checker != std::string("ill panel") || !drawn.mustReport.empty();
      const bool isHealthy =
          sabotage.checker != std::string("healthy panel") || (drawn.mustPass && drawn.fault.empty());
      if (concerns && isHealthy) {
        const Strings broken = campaign.RunOf(seed, {}, sabotage.name);
        isSeen = std::any_of(broken.begin(), broken.end(),
                             [&](const std::string& line) { return line.compare(0, begin.size(), begin) == 0; });
      }
    }
    std::printf("%-14s %s \"%s\"\n", sabotage.name, isSeen ? "is noticed by" : "IS NOT NOTICED by", sabotage.checker);
    code = isSeen ? code : kBroken;
  }
  return code;
}

int RunOne(const Campaign& campaign, const Options& options) {
  std::vector<Part> without;
  for (const std::string& name : options.without) {
    for (const PartName& row : AllParts()) {
      if (name == row.name) {
        without.push_back(row.part);
      }
    }
  }
  std::printf("%s\n", Describe(campaign.Drawn(options.seed, without)).c_str());
  const Strings broken = campaign.RunOf(options.seed, without);
  for (const std::string& line : broken) {
    std::printf("FAILED %s\n", line.c_str());
  }
  return broken.empty() ? 0 : kBroken;
}

int Main(int argc, char** argv) {
  Options options;
  std::vector<std::string> names;
  for (const PartName& row : AllParts()) {
    names.emplace_back(row.name);
  }
  CLI::App app{
      "Runs drawn from seeds, each held against what must be true of every run. Exits with 0, 1 (something is "
      "broken) or 2 (a wrong call).",
      "panelglow-campaign"};
  app.add_option("--first", options.first, "first seed")->capture_default_str();
  app.add_option("--runs", options.runs, "how many seeds")->capture_default_str();
  app.add_option("--jobs", options.jobs, "processes at once")->capture_default_str()->check(CLI::Range(1, 256));
  app.add_option("--seed", options.seed, "this seed alone")->check(CLI::PositiveNumber);
  app.add_option("--without", options.without, "leave a part of its case out, repeatable")
      ->check(CLI::IsMember(names))
      ->allow_extra_args(false)
      ->needs("--seed");
  app.add_flag("--self-check", options.selfCheck,
               "break program and panel on purpose, and see each checker notice it");
  app.add_option("--source", options.source, "folder with installation/ and machines/")
      ->capture_default_str()
      ->check(CLI::ExistingDirectory)
      ->type_name("FOLDER");
  try {
    app.parse(argc, argv);
    LoadModules();
    const Campaign campaign(options.source);
    return options.selfCheck   ? CheckCheckers(campaign)
           : options.seed != 0 ? RunOne(campaign, options)
                               : RunAll(campaign, options);
  } catch (const CLI::ParseError& error) {
    return app.exit(error) == 0 ? 0 : kWrongCall;
  }
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return Main(argc, argv);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "panelglow-campaign: %s\n", error.what());
    return kWrongCall;
  }
}
