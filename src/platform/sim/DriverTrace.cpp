#include "platform/sim/DriverTrace.h"

#include <array>

#include "platform/DriverRecords.h"

namespace panelglow::platform::sim {

namespace {

// A field of a record, 0 where the record is too short for it.
std::uint64_t Number(const std::vector<std::byte>& bytes, std::size_t offset, std::size_t width) {
  return offset + width <= bytes.size() ? driver::NumberAt(bytes, offset, width) : 0;
}

std::string Hex(std::uint64_t value, int digits) {
  std::array<char, 24> text{};
  std::snprintf(text.data(), text.size(), "%0*llX", digits, static_cast<unsigned long long>(value));
  return text.data();
}

std::string Bytes(const std::vector<std::byte>& bytes) {
  std::string text;
  for (const std::byte byte : bytes) {
    text += " " + Hex(std::to_integer<std::uint64_t>(byte), 2);
  }
  return text;
}

}  // namespace

std::string Describe(const DriverRequest& request) {
  const std::string head =
      "simulated " + std::to_string(request.time) + " us thread " + std::to_string(request.thread) + " ";
  const std::string failed = request.result == 0 ? "" : " error " + std::to_string(request.result);
  switch (request.code) {
    case driver::kInportByte:
    case driver::kInportWord:
    case driver::kInportDword: {
      const auto width = static_cast<int>(Number(request.in, driver::kPortWidth, 4));
      return head + "in" + std::to_string(8 * width) + " " + Hex(Number(request.in, driver::kPortNumber, 4), 4) +
             " -> " + Hex(Number(request.out, 0, 4), 2 * width) + failed;
    }
    case driver::kOutportByte:
    case driver::kOutportWord:
    case driver::kOutportDword: {
      const auto width = static_cast<int>(Number(request.in, driver::kPortWidth, 4));
      return head + "out" + std::to_string(8 * width) + " " + Hex(Number(request.in, driver::kPortNumber, 4), 4) +
             " <- " + Hex(Number(request.in, driver::kPortValue, 4), 2 * width) + failed;
    }
    case DriverRequest::kMappedRead:
      return head + "memory " + Hex(Number(request.in, 0, 8), 8) + " ->" + Bytes(request.out);
    case DriverRequest::kMappedWrite:
      return head + "memory " + Hex(Number(request.in, 0, 8), 8) + " <-" + Bytes(request.out);
    default:
      return head + "request " + Hex(request.code, 6) + Bytes(request.in) + " ->" + Bytes(request.out) + failed;
  }
}

void DriverTrace::Add(DriverRequest request) {
  if (file_ != nullptr) {
    std::fprintf(file_, "%s\n", Describe(request).c_str());
  }
  if (keep_) {
    requests_.push_back(std::move(request));
  }
}

}  // namespace panelglow::platform::sim
