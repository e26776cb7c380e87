#include "platform/sim/silicon/EmbeddedController.h"

#include <algorithm>
#include <cstdio>

namespace panelglow::platform::sim {

namespace {

constexpr std::uint8_t kOutputFull = 0x01;
constexpr std::uint8_t kInputFull = 0x02;
constexpr std::uint8_t kLastWasCommand = 0x08;

std::string Joined(const LampNames& names) {
  std::string text;
  for (const std::string& name : names) {
    text += " " + name;
  }
  return text;
}

}  // namespace

EmbeddedController::EmbeddedController(const EmbeddedControllerSetup& setup, const Scheduler& time)
    : setup_(setup), time_(time), lamps_(setup.automatic), memory_(setup.memory) {
  for (const EcLedCommand& command : setup_.commands) {
    lamps_.insert(command.lamps.begin(), command.lamps.end());
  }
  for (const EcMemoryLamp& lamp : setup_.memoryLamps) {
    memory_.try_emplace(lamp.address);
  }
}

// ---- the host's side

std::uint8_t EmbeddedController::ReadPort(std::uint16_t port) {
  Advance();
  if (port == setup_.dataPort) {
    outputFull_ = false;
    return output_;
  }
  return static_cast<std::uint8_t>((outputFull_ ? kOutputFull : 0U) | (input_ ? kInputFull : 0U) |
                                   (lastWasCommand_ ? kLastWasCommand : 0U));
}

void EmbeddedController::WritePort(std::uint16_t port, std::uint8_t value) {
  Advance();
  lastWasCommand_ = port == setup_.commandPort;
  input_ = Written{value, lastWasCommand_, time_.Now() + setup_.take_us};
}

// ---- the firmware's side

std::optional<Microseconds> EmbeddedController::NextEvent() const {
  const bool hangs = setup_.fault == EmbeddedControllerSetup::Fault::kStuckInput;
  return input_ && !hangs ? std::optional<Microseconds>(input_->taken) : std::nullopt;
}

void EmbeddedController::Advance() {
  const Microseconds now = time_.Now();
  if (NextEvent() && now >= input_->taken) {
    const Written byte = *input_;
    input_.reset();
    Take(byte);
  }
  if (answer_ && now >= answer_->ready) {
    if (setup_.fault != EmbeddedControllerSetup::Fault::kStuckOutput) {
      output_ = answer_->value;
      outputFull_ = true;
    }
    answer_.reset();
  }
}

std::optional<std::size_t> EmbeddedController::DataBytesOf(std::uint8_t command) const {
  const std::size_t addressBytes = setup_.wideAddresses ? 2 : 1;
  if (command == setup_.readCommand) {
    return addressBytes;
  }
  if (command == setup_.writeCommand) {
    return addressBytes + 1;
  }
  if (command == setup_.queryCommand) {
    return 0;
  }
  if (command == setup_.pwmCommand) {
    return setup_.pwmRegisterBytes + std::size_t{1};
  }
  for (const EcLedCommand& row : setup_.commands) {
    if (row.code == command) {
      return row.data.size();
    }
  }
  return std::nullopt;
}

void EmbeddedController::Take(const Written& byte) {
  if (byte.isCommand) {
    answer_.reset();
    command_ = byte.value;
    data_.clear();
  } else if (command_) {
    data_.push_back(byte.value);
  }
  if (!command_) {
    return;
  }
  const std::optional<std::size_t> wanted = DataBytesOf(*command_);
  if (!wanted) {
    command_.reset();
  } else if (data_.size() == *wanted) {
    Execute(byte.taken);
    command_.reset();
  }
}

std::uint16_t EmbeddedController::Address() const {
  return setup_.wideAddresses ? static_cast<std::uint16_t>(data_[0] << 8U | data_[1]) : data_[0];
}

void EmbeddedController::Execute(Microseconds now) {
  if (command_ == setup_.readCommand) {
    const auto found = memory_.find(Address());
    answer_ = Answer{found == memory_.end() ? std::uint8_t{0} : found->second, now + setup_.answer_us};
  } else if (command_ == setup_.writeCommand) {
    memory_[Address()] = data_.back();
  } else if (command_ == setup_.queryCommand) {
    answer_ = Answer{0, now + setup_.answer_us};  // no event is pending
  } else if (command_ == setup_.pwmCommand) {
    std::uint16_t fan = 0;
    for (std::size_t i = 0; i + 1 < data_.size(); ++i) {
      fan = static_cast<std::uint16_t>(fan << 8U | data_[i]);
    }
    duties_[fan] = data_.back();
  } else {
    RunLedCommand();
  }
}

void EmbeddedController::RunLedCommand() {
  const auto row = std::find_if(setup_.commands.begin(), setup_.commands.end(),
                                [&](const EcLedCommand& c) { return c.code == *command_ && c.data == data_; });
  if (row == setup_.commands.end()) {
    return;
  }
  if (row->effect == EcLedCommand::Effect::kStage) {
    staged_ = row->lamps;
    return;
  }
  if (row->effect == EcLedCommand::Effect::kAutomatic) {
    held_ = false;
    return;
  }
  if (!held_) {
    shown_ = setup_.automatic;
    held_ = true;
  }
  if (row->effect == EcLedCommand::Effect::kShow) {
    shown_ = staged_;
  }
  for (const std::string& lamp : row->lamps) {
    if (row->effect == EcLedCommand::Effect::kLight) {
      shown_.insert(lamp);
    } else {
      shown_.erase(lamp);
    }
  }
}

// ---- what it drives

std::optional<bool> EmbeddedController::Signal(std::string_view pin) const {
  for (const EcMemoryLamp& lamp : setup_.memoryLamps) {
    if (lamp.name == pin) {
      return ((memory_.at(lamp.address) >> lamp.bit) & 1U) != 0;
    }
  }
  if (!lamps_.contains(pin)) {
    return std::nullopt;
  }
  return (held_ ? shown_ : setup_.automatic).contains(pin);
}

std::string EmbeddedController::State() const {
  std::string text = "ec lamps =" + (held_ ? Joined(shown_) + " (held)" : Joined(setup_.automatic)) + "\n";
  text += "ec staged =" + Joined(staged_) + "\nec duties =";
  char part[32];
  for (const auto& [fan, duty] : duties_) {
    std::snprintf(part, sizeof part, " %04X:%02X", fan, duty);
    text += part;
  }
  text += "\nec memory =";
  for (const auto& [address, value] : memory_) {
    std::snprintf(part, sizeof part, " %04X:%02X", address, value);
    text += part;
  }
  return text + "\n";
}

}  // namespace panelglow::platform::sim
