#include "platform/sim/silicon/IndexedRegisters.h"

#include <charconv>

#include "platform/sim/silicon/GpioBlock.h"

namespace panelglow::platform::sim {

namespace {

std::optional<std::uint8_t> HexByte(std::string_view text) {
  std::uint8_t value = 0;
  const char* const end = text.data() + text.size();
  const auto [stopped, error] = std::from_chars(text.data(), end, value, 16);
  return error == std::errc() && stopped == end ? std::optional(value) : std::nullopt;
}

}  // namespace

IndexedRegisters::IndexedRegisters(const IndexedRegistersSetup& setup, const Scheduler& time)
    : setup_(setup),
      time_(time),
      cooling_(setup.cooling, [this](std::uint8_t address) { return Register(address); }) {
  if (setup_.banks) {
    banks_.emplace(*setup_.banks);
  }
}

std::uint8_t IndexedRegisters::Register(std::uint8_t address) const {
  const auto found = setup_.registers.find(address);
  return found == setup_.registers.end() ? std::uint8_t{0xFF} : found->second;
}

std::uint8_t IndexedRegisters::ReadPort(std::uint16_t port) {
  if (port == setup_.indexPort) {
    return index_;
  }
  if (banks_ && banks_->Has(index_)) {
    return banks_->Read(index_);
  }
  cooling_.Advance(time_.Now(), [this](std::uint8_t address) { return Register(address); });
  return cooling_.Read(index_).value_or(Register(index_));
}

void IndexedRegisters::WritePort(std::uint16_t port, std::uint8_t value) {
  cooling_.Advance(time_.Now(), [this](std::uint8_t address) { return Register(address); });
  if (port == setup_.indexPort) {
    index_ = value;
  } else if (setup_.readOnly.count(index_) != 0) {
    return;
  } else if (banks_ && banks_->Has(index_)) {
    banks_->Write(index_, value);
  } else if (const auto found = setup_.registers.find(index_); found != setup_.registers.end()) {
    found->second = value;
  }
}

std::optional<bool> IndexedRegisters::Signal(std::string_view pin) const {
  const std::size_t dot = pin.find('.');
  const std::size_t colon = pin.find(':');
  if (dot == std::string_view::npos) {
    return std::nullopt;
  }
  const std::size_t first = colon == std::string_view::npos ? 0 : colon + 1;
  const auto address = HexByte(pin.substr(first, dot - first));
  const auto bit = PinNumber(pin.substr(dot + 1));
  if (!address || !bit) {
    return std::nullopt;
  }
  if (first == 0) {
    const auto found = setup_.registers.find(*address);
    return found == setup_.registers.end() ? std::nullopt : std::optional(((found->second >> *bit) & 1U) != 0);
  }
  const auto bank = HexByte(pin.substr(0, colon));
  if (!bank || !banks_ || !banks_->Has(*address)) {
    return std::nullopt;
  }
  return ((banks_->At(*bank, *address) >> *bit) & 1U) != 0;
}

std::optional<std::uint64_t> IndexedRegisters::RegisterOf(std::string_view pin) const {
  return Signal(pin) ? std::optional<std::uint64_t>(setup_.indexPort + 1U) : std::nullopt;
}

std::string IndexedRegisters::State() const {
  std::string text = RegisterRow("indexed", setup_.registers);
  return banks_ ? text + banks_->State("indexed") : text;
}

}  // namespace panelglow::platform::sim
