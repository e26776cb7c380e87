#include "hw/BiosCall.h"

#include <algorithm>
#include <array>
#include <memory>
#include <string>
#include <variant>

#include "harness/base/CDMException.h"
#include "hw/WMIDiscovery.h"

namespace panelglow {

namespace {

using platform::ManagementArray;
using platform::ManagementCallStep;
using platform::ManagementRow;
using platform::ManagementScalar;
using platform::ManagementValue;

constexpr const char* kNamespace = "\\\\.\\root\\wmi";
constexpr const char16_t* kInterfaceQuery = u"SELECT * FROM tmbBIntM";
constexpr const char* kQueryStep = "tmbBIntM Query";

struct Method {
  const char16_t* name;
  std::size_t answer_bytes;
};
constexpr std::array<Method, 5> kMethods{{{u"tmbBIOSInt0", 0},
                                          {u"tmbBIOSInt4", 4},
                                          {u"tmbBIOSInt128", 128},
                                          {u"tmbBIOSInt1024", 1024},
                                          {u"tmbBIOSInt4096", 4096}}};

constexpr std::array<std::uint8_t, 4> kCallerSign{0x53, 0x45, 0x43, 0x55};
constexpr std::array<std::uint8_t, 4> kFirmwareSign{0x50, 0x41, 0x53, 0x53};

// By ManagementCallStep.
constexpr std::array<const char*, 11> kStepNames{"",
                                                 "GetMethod",
                                                 "Get tmbBIntM",
                                                 "Spawn Parameters",
                                                 "Get tmbBDataIn",
                                                 "Spawn tmbBDataIn",
                                                 "Populate tmbBDataIn",
                                                 "Put tmbBDataIn",
                                                 "Execute Method",
                                                 "Get OutData",
                                                 "Query OutData"};

template <class Bytes>
ManagementValue ArrayOf(const Bytes& bytes) {
  ManagementArray array;
  for (const std::uint8_t byte : bytes) {
    array.emplace_back(byte);
  }
  return {std::move(array)};
}

ManagementValue NumberOf(std::uint32_t number) { return {ManagementScalar(static_cast<std::int32_t>(number))}; }

// The bytes of an array property; nothing when there is no such property or it is no array of bytes.
std::optional<std::vector<std::uint8_t>> BytesOf(const ManagementRow& row, std::u16string_view property) {
  const ManagementValue* value = row.Find(property);
  const auto* array = value == nullptr ? nullptr : std::get_if<ManagementArray>(&value->content);
  if (array == nullptr) {
    return std::nullopt;
  }
  std::vector<std::uint8_t> bytes;
  for (const ManagementScalar& element : *array) {
    const auto* byte = std::get_if<std::uint8_t>(&element);
    if (byte == nullptr) {
      return std::nullopt;
    }
    bytes.push_back(*byte);
  }
  return bytes;
}

// The connection and, by it, where the interface object of this machine is. Why a connection fails is a second
// message of the step that needs it.
std::unique_ptr<WMIDiscovery> Connect(wstring& path) {
  try {
    auto management = std::make_unique<WMIDiscovery>(kNamespace);
    std::string text;
    if (management->RunQuery(kInterfaceQuery) != 0 && management->GetCurrentValue(u"__RELPATH", text, 0) &&
        !text.empty()) {
      path = platform::WideFromCodePage(text);
      return management;
    }
  } catch (const std::string& reason) {
    InvalidTmbWMIException failure(kQueryStep);
    failure.addMessage(LogOptions::ServiceErrors, failure.code, reason);
    throw failure;
  }
  throw InvalidTmbWMIException(kQueryStep);
}

// The first four bytes as one number.
std::uint32_t StatusOf(const std::vector<std::uint8_t>& sign) {
  std::uint32_t status = 0;
  for (std::size_t i = std::min<std::size_t>(sign.size(), 4); i-- > 0;) {
    status = status << 8U | sign[i];
  }
  return status;
}

ManagementRow InputOf(std::uint32_t command, std::uint32_t commandType, const std::vector<std::uint8_t>& inputBytes) {
  ManagementRow input;
  input.Set(u"Sign", ArrayOf(kCallerSign));
  input.Set(u"Command", NumberOf(command));
  input.Set(u"CommandType", NumberOf(commandType));
  input.Set(u"Size", NumberOf(static_cast<std::uint32_t>(inputBytes.size())));
  if (!inputBytes.empty()) {
    input.Set(u"tmbBData", ArrayOf(inputBytes));
  }
  input.Set(u"Active", {ManagementScalar(true)});
  return input;
}

}  // namespace

std::vector<std::uint8_t> CallBios(std::uint32_t command, std::uint32_t commandType,
                                   const std::vector<std::uint8_t>& inputBytes, std::size_t sizeIndex) {
  const Method& method = kMethods.at(sizeIndex);
  wstring path;
  const std::unique_ptr<WMIDiscovery> management = Connect(path);
  const platform::ManagementCallResult result =
      management->Call({u"tmbBIntM", path, method.name, u"tmbBDataIn", InputOf(command, commandType, inputBytes)});
  if (result.failedAt != ManagementCallStep::kNone) {
    throw InvalidTmbWMIException(kStepNames.at(static_cast<std::size_t>(result.failedAt)));
  }
  const auto sign = BytesOf(result.output, u"Sign");
  if (!sign) {
    throw InvalidTmbWMIException("Get Sign");
  }
  if (!std::equal(sign->begin(), sign->end(), kFirmwareSign.begin(), kFirmwareSign.end())) {
    throw InvalidTmbWMICallException(command, StatusOf(*sign));
  }
  if (method.answer_bytes == 0) {
    return {};
  }
  auto data = BytesOf(result.output, u"Data");
  if (!data) {
    throw InvalidTmbWMIException("Get Data");
  }
  if (data->size() < method.answer_bytes) {
    throw InvalidTmbWMIException("Return Size Discovery");
  }
  data->resize(method.answer_bytes);
  return *data;
}

}  // namespace panelglow
