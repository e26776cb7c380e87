// List-shaped files, as such and as parameter files.
#include "FuzzTarget.h"
#include "config/OrgFileParser.h"
#include "harness/ParameterFile.h"

namespace panelglow::fuzz {
namespace {

void ReadLines(OrgFileParser& parser) {
  parser.ReadSection("s");
  while (parser.NextLine()) {
    unsigned number = 0;
    char text[4];
    std::string field;
    parser.NextFieldNumber(number, 0);
    parser.NextFieldText(text);
    while (parser.NextFieldString(field)) {
    }
  }
}

void Run(std::string_view bytes) {
  PutFile("f.ini", bytes);
  PutFile("t.ini", "");
  {
    OrgFileParser parser("f.ini");
    parser.SetTargetPath("t.ini");
    const auto attempt = [&](auto step) {
      try {
        step();
      } catch (int code) {
        Check(code == FileParser::kCannotRead, "a file that cannot be used is a failure to read");
      }
    };
    attempt([&] { ReadLines(parser); });
    attempt([&] { parser.CountSections(); });
    attempt([&] { parser.CountKeys("s"); });
    attempt([&] { parser.ReadValue("s", "k"); });
    attempt([&] { parser.AppendLines("all"); });
  }
  std::size_t lines = 0;
  const bool read = ParameterFile("f.ini", "s", [] {
                      return std::string("2A78");
                    }).Read([&](const std::string& line) { lines += line.empty() ? 0U : 1U; });
  Check(read || lines == 0, "a parameter file that fails gives no parameter");
}

const Registered kTarget("list_file", Run);

}  // namespace
}  // namespace panelglow::fuzz
