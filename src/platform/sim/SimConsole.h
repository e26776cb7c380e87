// The machine's console: kept for the simulation's maker, or the process's own.
#pragma once

#include <cstdint>
#include <cstdio>
#include <functional>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>

#include "platform/Console.h"
#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

class SimConsole : public Console {
 public:
  SimConsole(Scheduler& scheduler, bool capture) : scheduler_(scheduler), capture_(capture) {}
  void Write(std::string_view bytes) override;
  std::string OutputProblem() override {
    return outputError_ == 0 ? std::string() : std::generic_category().message(outputError_);
  }
  void WriteError(std::string_view bytes) override {
    if (capture_) {
      errors_ += bytes;
    } else {
      std::fwrite(bytes.data(), 1, bytes.size(), stderr);
    }
  }
  void SetControlHandler(std::function<bool(std::uint32_t)> handler) override { handler_ = std::move(handler); }

  void Raise(std::uint32_t type) {
    if (handler_) {
      scheduler_.Start("console control", [handler = handler_, type] { handler(type); });
    }
  }
  [[nodiscard]] bool IsHeard() const { return handler_ != nullptr; }
  [[nodiscard]] const std::string& Output() const { return output_; }
  [[nodiscard]] const std::string& Errors() const { return errors_; }
  void Clear() {
    output_.clear();
    errors_.clear();
  }

 private:
  Scheduler& scheduler_;
  bool capture_;
  std::string output_;
  std::string errors_;
  int outputError_ = 0;  // of the first write that failed
  std::function<bool(std::uint32_t)> handler_;
};

}  // namespace panelglow::platform::sim
