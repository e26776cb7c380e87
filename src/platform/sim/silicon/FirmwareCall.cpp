#include "platform/sim/silicon/FirmwareCall.h"

#include <algorithm>
#include <array>
#include <cstdio>

namespace panelglow::platform::sim {

namespace {

using Bytes = std::vector<std::uint8_t>;

constexpr std::u16string_view kClass = u"tmbBIntM";
constexpr std::u16string_view kInputClass = u"tmbBDataIn";

struct Method {
  std::u16string_view name;
  std::size_t answerBytes;
};
constexpr std::array<Method, 5> kMethods{{{u"tmbBIOSInt0", 0},
                                          {u"tmbBIOSInt4", 4},
                                          {u"tmbBIOSInt128", 128},
                                          {u"tmbBIOSInt1024", 1024},
                                          {u"tmbBIOSInt4096", 4096}}};

constexpr std::array<std::uint8_t, 4> kCallersSignature{'S', 'E', 'C', 'U'};
constexpr std::array<std::uint8_t, 4> kGood{'P', 'A', 'S', 'S'};
constexpr std::array<std::uint8_t, 4> kBad{'F', 'A', 'I', 'L'};

constexpr std::uint32_t kWireless = 0x1B;
constexpr std::uint32_t kThermal = 0x28;
constexpr std::uint32_t kRead = 1;
constexpr std::uint32_t kWrite = 2;
constexpr std::size_t kRecordBytes = 128;

constexpr std::uint8_t kAllRadios = 0xFF;
constexpr std::uint8_t kOn = 0x01;
constexpr std::uint8_t kAllowedBySoftware = 0x02;
constexpr std::uint8_t kAllowedOtherwise = 0x0C;

constexpr std::uint8_t kStale = 0x55;  // a byte that no answer has set

constexpr std::uint8_t kFanSpeeds = 3;
constexpr std::uint8_t kFanDuties = 0x23;

Bytes BytesOf(const ManagementRow& row, std::u16string_view property) {
  Bytes bytes;
  const ManagementValue* value = row.Find(property);
  const auto* array = value == nullptr ? nullptr : std::get_if<ManagementArray>(&value->content);
  if (array != nullptr) {
    for (const ManagementScalar& element : *array) {
      const auto* byte = std::get_if<std::uint8_t>(&element);
      bytes.push_back(byte == nullptr ? std::uint8_t{0} : *byte);
    }
  }
  return bytes;
}

template <class Type>
std::optional<Type> ScalarOf(const ManagementRow& row, std::u16string_view property) {
  const ManagementValue* value = row.Find(property);
  const auto* scalar = value == nullptr ? nullptr : std::get_if<ManagementScalar>(&value->content);
  const auto* typed = scalar == nullptr ? nullptr : std::get_if<Type>(scalar);
  return typed == nullptr ? std::nullopt : std::optional<Type>(*typed);
}

template <class Container>
ManagementValue ArrayOf(const Container& bytes) {
  return {ManagementArray(bytes.begin(), bytes.end())};
}

Bytes CountedRecord(const Bytes& items) {
  Bytes record(items.size() + 1, static_cast<std::uint8_t>(items.size()));
  std::copy(items.begin(), items.end(), record.begin() + 1);
  return record;
}

}  // namespace

ManagementRow FirmwareCall::Instance() const {
  ManagementRow row;
  row.Set(u"__RELPATH", {ManagementScalar(WideFromUtf8(setup_.path))});
  row.Set(u"Active", {ManagementScalar(true)});
  return row;
}

ManagementCallResult FirmwareCall::Call(const ManagementCall& call) {
  if (setup_.fault == FirmwareCallSetup::Fault::kFailingStep) {
    return {setup_.failingStep, {}};
  }
  const auto method =
      std::find_if(kMethods.begin(), kMethods.end(), [&](const Method& m) { return wstring(m.name) == call.method; });
  if (call.className != kClass || method == kMethods.end()) {
    return {ManagementCallStep::kGetMethod, {}};
  }
  if (call.inputClass != kInputClass) {
    return {ManagementCallStep::kGetInputClass, {}};
  }
  if (isGone_ || Utf8FromWide(call.objectPath) != setup_.path) {
    return {ManagementCallStep::kExecute, {}};
  }

  const Bytes signature = BytesOf(call.input, u"Sign");
  const Bytes input = BytesOf(call.input, u"tmbBData");
  const std::optional<std::int32_t> size = ScalarOf<std::int32_t>(call.input, u"Size");
  const std::optional<std::int32_t> command = ScalarOf<std::int32_t>(call.input, u"Command");
  const std::optional<std::int32_t> type = ScalarOf<std::int32_t>(call.input, u"CommandType");
  std::optional<Bytes> answer;
  if (std::equal(signature.begin(), signature.end(), kCallersSignature.begin(), kCallersSignature.end()) && command &&
      type && size == static_cast<std::int32_t>(input.size()) && ScalarOf<bool>(call.input, u"Active") == true) {
    answer = Answer(static_cast<std::uint32_t>(*command), static_cast<std::uint32_t>(*type), input);
  }

  const bool isGood = answer && setup_.fault != FirmwareCallSetup::Fault::kWrongSignature;
  Bytes data = answer.value_or(Bytes());
  data.resize(setup_.fault == FirmwareCallSetup::Fault::kShortData ? std::min<std::size_t>(1, method->answerBytes)
                                                                   : method->answerBytes,
              setup_.fault == FirmwareCallSetup::Fault::kStaleRecord ? kStale : std::uint8_t{0});
  ManagementCallResult result;
  result.output.Set(u"Sign", ArrayOf(isGood ? kGood : kBad));
  if (!data.empty()) {
    result.output.Set(u"Data", ArrayOf(data));
  }
  return result;
}

std::optional<Bytes> FirmwareCall::Answer(std::uint32_t command, std::uint32_t type, const Bytes& input) {
  if (type == kWireless) {
    return AnswerWireless(command, input);
  }
  return type == kThermal ? AnswerThermal(command, input) : std::nullopt;
}

std::optional<Bytes> FirmwareCall::AnswerWireless(std::uint32_t command, const Bytes& input) {
  if (command == kRead) {
    Bytes record(kRecordBytes);
    std::copy(setup_.header.begin(), setup_.header.end(), record.begin());
    for (const FirmwareCallSetup::Radio& radio : setup_.radios) {
      record[radio.offset] = static_cast<std::uint8_t>(kAllowedOtherwise | (radio.on ? kOn | kAllowedBySoftware : 0));
    }
    return record;
  }
  const bool fits = command == kWrite && input.size() == 4 && input[3] <= 1 &&
                    std::equal(setup_.header.begin(), setup_.header.end(), input.begin());
  if (!fits) {
    return std::nullopt;
  }
  bool found = false;
  for (FirmwareCallSetup::Radio& radio : setup_.radios) {
    if (input[2] == kAllRadios || input[2] == radio.number) {
      radio.on = ignoresOrders_ ? radio.on : input[3] == 1;
      found = true;
    }
  }
  return found ? std::optional<Bytes>(Bytes()) : std::nullopt;
}

std::optional<Bytes> FirmwareCall::AnswerThermal(std::uint32_t command, const Bytes& input) {
  if (input.empty()) {
    return std::nullopt;
  }
  Bytes items;
  if (command == kRead && input.size() == 4) {
    for (const FirmwareCallSetup::Fan& fan : setup_.fans) {
      items.push_back(input[0] == kFanSpeeds ? fan.speed : fan.duty);
    }
    if (input[0] <= 1) {
      return CountedRecord(setup_.temperatures);
    }
    return input[0] == kFanSpeeds || input[0] == kFanDuties ? std::optional<Bytes>(CountedRecord(items))
                                                            : std::nullopt;
  }
  const bool fits =
      command == kWrite && input.size() == kRecordBytes && input[0] == kFanDuties && input[1] == setup_.fans.size();
  if (!fits) {
    return std::nullopt;
  }
  for (std::size_t i = 0; i < setup_.fans.size(); ++i) {
    setup_.fans[i].duty = input[i + 2];
  }
  return Bytes();
}

std::optional<bool> FirmwareCall::Signal(std::string_view pin) const {
  if (pin != "radio") {
    return std::nullopt;
  }
  return std::any_of(setup_.radios.begin(), setup_.radios.end(), [](const auto& radio) { return radio.on; });
}

std::string FirmwareCall::State() const {
  std::string text;
  char line[48];
  for (const FirmwareCallSetup::Radio& radio : setup_.radios) {
    std::snprintf(line, sizeof line, "radio %02X = %s\n", radio.number, radio.on ? "on" : "off");
    text += line;
  }
  for (std::size_t i = 0; i < setup_.fans.size(); ++i) {
    std::snprintf(line, sizeof line, "fan %u duty = %02X\n", static_cast<unsigned>(i), setup_.fans[i].duty);
    text += line;
  }
  return text;
}

}  // namespace panelglow::platform::sim
