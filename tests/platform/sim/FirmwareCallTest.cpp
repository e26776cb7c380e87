// The firmware's call interface behind the management service.
#include <gmock/gmock.h>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

using ::testing::Optional;
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

TEST(FirmwareCall, ReadsTheRecordsOfRadiosFansAndTemperatures) {
  Bench bench(MachineText("casl-notebook.toml"));
  const Bytes radios = BytesOf(Caller{}.In(bench.machine), u"Data");
  ASSERT_EQ(radios.size(), 128U);
  EXPECT_EQ(radios[0], 2);
  EXPECT_EQ(radios[6] & 1, 1);
  EXPECT_EQ(radios[18] & 1, 0);
  const auto thermal = [&](const Bytes& input, std::int32_t command) {
    Bytes data = BytesOf(Caller{.command = command, .type = 0x28, .input = input}.In(bench.machine), u"Data");
    data.resize(3);
    return data;
  };
  EXPECT_EQ(thermal({3, 0, 0, 0}, 1), (Bytes{1, 24, 0}));
  EXPECT_EQ(thermal({1, 0, 0, 0}, 1), (Bytes{2, 41, 38}));
  Bytes duties(128);
  duties[0] = 0x23;
  duties[1] = 1;
  duties[2] = 0xFE;
  thermal(duties, 2);
  EXPECT_EQ(thermal({0x23, 0, 0, 0}, 1), (Bytes{1, 0xFE, 0}));
}

TEST(FirmwareCall, FailsAsItsFileSays) {
  const auto faulty = [](const char* fault) {
    Bench bench(MachineText("casl-notebook.toml", "[firmware_call]", "fault = \"" + std::string(fault) + "\""));
    return Caller{}.In(bench.machine);
  };
  EXPECT_NE(BytesOf(faulty("wrong-signature"), u"Sign"), kGood);
  const ManagementCallResult shortened = faulty("short-data");
  EXPECT_EQ(BytesOf(shortened, u"Sign"), kGood);
  EXPECT_EQ(BytesOf(shortened, u"Data").size(), 1U);
  EXPECT_EQ(faulty("get-method").failedAt, ManagementCallStep::kGetMethod);
  EXPECT_EQ(faulty("execute").failedAt, ManagementCallStep::kExecute);
  EXPECT_EQ(faulty("query-output").failedAt, ManagementCallStep::kQueryOutput);
}

TEST(FirmwareCall, AMachineWithoutItHasNoSuchClass) {
  Bench bench(MachineText("codec-notebook.toml"));
  ManagementError error;
  const auto services = bench.machine.TheMachine().management.Connect("root\\wmi", error);
  EXPECT_FALSE(services->Query(u"SELECT * FROM tmbBIntM"));
  EXPECT_EQ(services->Call({u"tmbBIntM", u"", u"tmbBIOSInt0", u"tmbBDataIn", {}}).failedAt,
            ManagementCallStep::kGetMethod);
}

}  // namespace
}  // namespace panelglow::platform::sim
