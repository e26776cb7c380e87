#include "system/SystemRun.h"

#include <sys/wait.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <numeric>
#include <sstream>
#include <stdexcept>

namespace panelglow::systemtest {

namespace fs = std::filesystem;

namespace {

const fs::path kSource = PANELGLOW_SOURCE_DIR;
const fs::path kPrograms = PANELGLOW_BINARY_DIR;

// For the shell, whatever the text holds.
std::string Quoted(const std::string& text) {
  std::string quoted = "'";
  for (const char c : text) {
    quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
  }
  return quoted + "'";
}

std::vector<std::string> LinesOf(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);) {
    lines.push_back(line);
  }
  return lines;
}

void ReadReport(const fs::path& path, Outcome& outcome) {
  std::vector<std::string> leds;
  for (const std::string& line : LinesOf(TextOf(path))) {
    std::istringstream words(line);
    std::string word;
    words >> word;
    if (word == "led") {
      std::size_t index = 0;
      leds.emplace_back();
      words >> index >> leds.back();
    } else if (word == "edge") {
      Edge edge;
      std::size_t led = 0;
      words >> edge.time_us >> led >> edge.lit;
      edge.led = leds.at(led);
      outcome.edges.push_back(edge);
    } else if (word == "before" || word == "after" || word == "owned") {
      outcome.leftBehind.push_back(line);
    } else if (word == "end") {
      words >> outcome.end_us;
    }
  }
}

}  // namespace

std::string TextOf(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

Installation::Installation() {
  std::string pattern = (fs::temp_directory_path() / "panelglow-test-XXXXXX").string();
  if (::mkdtemp(pattern.data()) == nullptr) {
    throw std::runtime_error("no temporary folder");
  }
  folder_ = pattern;
  fs::copy(kSource / "installation", folder_, fs::copy_options::recursive);
}

Installation::~Installation() {
  std::error_code ignored;  // what cannot be removed is the system's to clean up
  fs::remove_all(folder_, ignored);
}

void Installation::Write(const std::string& name, const std::string& content) const {
  std::ofstream(folder_ / name, std::ios::binary) << content;
}

void Installation::Replace(const std::string& name, const std::string& right, const std::string& wrong) const {
  std::string text = Read(name);
  std::size_t at = text.find(right);
  if (at == std::string::npos) {
    throw std::runtime_error(name + " has no \"" + right + "\"");
  }
  for (; at != std::string::npos; at = text.find(right, at + wrong.size())) {
    text.replace(at, right.size(), wrong);
  }
  Write(name, text);
}

std::string Installation::Read(const std::string& name) const { return TextOf(folder_ / name); }

std::string Installation::Machine(const std::string& base, const std::string& more) const {
  if (more.empty()) {
    return (kSource / "machines" / base).string();
  }
  Write("machine.toml", TextOf(kSource / "machines" / base) + more);
  return (folder_ / "machine.toml").string();
}

std::vector<std::string> Outcome::Tagged(const std::string& tag) const {
  std::vector<std::string> found;
  std::copy_if(lines.begin(), lines.end(), std::back_inserter(found),
               [&](const std::string& line) { return line.rfind(tag + " ", 0) == 0; });
  return found;
}

std::size_t Outcome::TimesLit(const std::string& led) const {
  return static_cast<std::size_t>(std::count_if(
      edges.begin(), edges.end(), [&](const Edge& edge) { return edge.led == led && edge.lit && edge.time_us > 0; }));
}

std::set<std::string> Outcome::LeftChanged() const {
  std::map<std::string, bool> before;
  std::set<std::string> changed;
  for (const Edge& edge : edges) {
    if (edge.time_us == 0) {
      before[edge.led] = edge.lit;
    }
    if (edge.lit == before[edge.led]) {
      changed.erase(edge.led);
    } else {
      changed.insert(edge.led);
    }
  }
  return changed;
}

bool Outcome::IsOrderly() const {
  return std::count(lines.begin(), lines.end(), "EndOfTest") == 1 && lines.back() == "EndOfTest" &&
         output.back() == '\n' && Tagged("ReportFailure").size() <= 1 && Tagged("TestFailed").size() <= 1;
}

Outcome RunProgram(const std::string& program, const std::vector<std::string>& arguments, const fs::path& folder,
                   const std::map<std::string, std::string>& environment) {
  const fs::path out = folder / "stdout.txt";
  const fs::path err = folder / "stderr.txt";
  std::string command = "cd " + Quoted(folder.string()) + " && exec env";
  for (const auto& [name, value] : environment) {
    command += " " + Quoted(name + "=" + value);
  }
  command += " " + Quoted((kPrograms / program).string());
  for (const std::string& argument : arguments) {
    command += " " + Quoted(argument);
  }
  command += " </dev/null >" + Quoted(out.string()) + " 2>" + Quoted(err.string());
  const int status = std::system(command.c_str());
  Outcome outcome;
  outcome.exitCode = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  outcome.output = TextOf(out);
  outcome.errors = TextOf(err);
  outcome.lines = LinesOf(outcome.output);
  return outcome;
}

Outcome SimulatedRun::In(const Installation& installation) const {
  const fs::path report = installation.Path("report.txt");
  fs::remove(report);
  const std::string allFaults =
      std::accumulate(faults.begin(), faults.end(), std::string(),
                      [](const std::string& all, const std::string& fault) { return all + fault + ";"; });
  std::map<std::string, std::string> variables{{"PANELGLOW_SIM_MACHINE", machine},
                                               {"PANELGLOW_SIM_OPERATOR", person},
                                               {"PANELGLOW_SIM_SEED", std::to_string(seed)},
                                               {"PANELGLOW_SIM_FAULTS", allFaults},
                                               {"PANELGLOW_SIM_REPORT", report.string()}};
  variables.insert(environment.begin(), environment.end());
  Outcome outcome = RunProgram("panelglow-diags-sim", arguments, installation.Path(""), variables);
  ReadReport(report, outcome);
  return outcome;
}

SimulatedRun LedRun(const std::string& machine, const std::string& section, const std::vector<std::string>& more,
                    const std::string& person, unsigned seed) {
  SimulatedRun run{machine, person, seed, {}, {"-subtest=CustomLEDTest", "-SectionID=" + section}};
  run.arguments.insert(run.arguments.end(), more.begin(), more.end());
  return run;
}

std::string SimulatedRun::Describe() const {
  std::string text =
      "panelglow-sim --machine " + machine + " --operator " + person + " --seed " + std::to_string(seed);
  for (const std::string& fault : faults) {
    text += " --fault " + fault;
  }
  text += " --";
  for (const std::string& argument : arguments) {
    text += " " + argument;
  }
  return text;
}

std::string Golden(const std::string& name) { return TextOf(kSource / "tests/data" / name); }

std::vector<unsigned> Seeds(unsigned usual) {
  const char* wanted = std::getenv("PANELGLOW_CAMPAIGN_SEEDS");
  std::vector<unsigned> seeds(wanted == nullptr ? usual : static_cast<unsigned>(std::strtoul(wanted, nullptr, 10)));
  std::iota(seeds.begin(), seeds.end(), 1U);
  return seeds;
}

}  // namespace panelglow::systemtest
