// The firmware's call interface behind the management service.
#include <gmock/gmock.h>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

using Bytes = std::vector<std::uint8_t>;

ManagementValue ArrayOf(const Bytes& bytes) { return {ManagementArray(bytes.begin(), bytes.end())}; }

// A call as a good caller makes it; each part can be spoilt.
struct Caller {
  std::int32_t command = 1;
  std::int32_t type = 0x1B;
  Bytes input = {};
  std::u16string method = u"tmbBIOSInt128";
  Bytes signature = {0x53, 0x45, 0x43, 0x55};
  std::int32_t sizeError = 0;
  bool active = true;
  std::u16string inputClass = u"tmbBDataIn";
  std::u16string pathEnd = {};

  [[nodiscard]] ManagementCallResult In(Simulation& machine) const {
    ManagementError error;
    const auto services = machine.TheMachine().management.Connect("\\\\.\\root\\wmi", error);
    const auto rows = services->Query(u"SELECT * FROM tmbBIntM");
    if (!rows || rows->size() != 1) {
      ADD_FAILURE() << "the class must have one instance";
      return {};
    }
    const auto& path = std::get<ManagementScalar>(rows->front().Find(u"__RELPATH")->content);
    ManagementRow row;
    row.Set(u"Sign", ArrayOf(signature));
    row.Set(u"Command", {ManagementScalar(command)});
    row.Set(u"CommandType", {ManagementScalar(type)});
    row.Set(u"Size", {ManagementScalar(static_cast<std::int32_t>(input.size()) + sizeError)});
    row.Set(u"Active", {ManagementScalar(active)});
    if (!input.empty()) {
      row.Set(u"tmbBData", ArrayOf(input));
    }
    return services->Call({u"tmbBIntM", std::get<wstring>(path) + pathEnd, method, inputClass, row});
  }
};

// The bytes of an answer's property; empty when there is none.
Bytes BytesOf(const ManagementCallResult& result, const char16_t* property) {
  Bytes bytes;
  if (const ManagementValue* value = result.output.Find(property)) {
    for (const ManagementScalar& element : std::get<ManagementArray>(value->content)) {
      bytes.push_back(std::get<std::uint8_t>(element));
    }
  }
  return bytes;
}

const Bytes kGood{0x50, 0x41, 0x53, 0x53};

TEST(FirmwareCall, SwitchesTheRadiosAndTheirLampForAProperCallAlone) {
  const Bytes off{2, 0, 0xFF, 0};
  struct Case {
    const char* what;
    Caller caller;
    bool goesDark;
  };
  const Case kCases[] = {
      {"right", {.command = 2, .input = off, .method = u"tmbBIOSInt0"}, true},
      {"one radio", {.command = 2, .input = {2, 0, 1, 0}, .method = u"tmbBIOSInt0"}, true},
      {"the other radio", {.command = 2, .input = {2, 0, 2, 0}, .method = u"tmbBIOSInt0"}, false},
      {"no such radio", {.command = 2, .input = {2, 0, 9, 0}}, false},
      {"another header", {.command = 2, .input = {1, 0, 0xFF, 0}}, false},
      {"signature", {.command = 2, .input = off, .signature = {0x53, 0x45, 0x43, 0x56}}, false},
      {"no signature", {.command = 2, .input = off, .signature = {}}, false},
      {"size", {.command = 2, .input = off, .sizeError = 1}, false},
      {"not active", {.command = 2, .input = off, .active = false}, false},
      {"command", {.command = 3, .input = off}, false},
      {"type", {.command = 2, .type = 0x1C, .input = off}, false},
      {"input class", {.command = 2, .input = off, .inputClass = u"tmbBDataOut0"}, false},
      {"method", {.command = 2, .input = off, .method = u"tmbBIOSInt8"}, false},
      {"another object", {.command = 2, .input = off, .pathEnd = u"1"}, false},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.what);
    Bench bench(MachineText("casl-notebook.toml"));
    const ManagementCallResult result = c.caller.In(bench.machine);
    EXPECT_EQ(bench.IsLit("wireless"), !c.goesDark);
    const bool isGood = BytesOf(result, u"Sign") == kGood;
    EXPECT_EQ(isGood, c.goesDark || c.what == std::string("the other radio"));
    EXPECT_TRUE(BytesOf(result, u"Data").empty() || !isGood);
  }
}

}  // namespace
}  // namespace panelglow::platform::sim
