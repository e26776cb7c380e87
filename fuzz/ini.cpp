// INI files in all their readers.
#include "FuzzTarget.h"
#include "config/IniBase.h"
#include "config/IniFile.h"
#include "config/WIniFile.h"

namespace panelglow::fuzz {
namespace {

void ParseWhole(std::string_view bytes) {
  const auto written = [](std::string_view text) {
    IniBase ini;
    ini.Parse(text);
    return ini.ToText();
  };
  // A section with an empty name and a key "[" can be read, but not back.
  const std::string once = written(written(bytes));
  Check(written(once) == once, "what was written and read is written the same");
}

void ReadThroughTheProfile(std::string_view bytes) {
  IniFile file(PutFile("f.ini", bytes));
  Check(file.GetSection("s", "none").size() <= 0x2002, "a section has its longest size");
  Check(file.GetValue("s", "k", "none").size() <= 254, "a value has its longest size");
  Check(WIniFile(u"f.ini").GetValue(u"s", u"k").size() <= 254, "a wide value has its longest size");
  Check(file.SetValue("s", "k", "value"), "a value can be set");
  Check(file.GetValue("s", "k") == "value", "a value that was set is read");
}

void Run(std::string_view bytes) {
  ParseWhole(bytes);
  ReadThroughTheProfile(bytes);
}

const Registered kTarget("ini", Run);

}  // namespace
}  // namespace panelglow::fuzz
