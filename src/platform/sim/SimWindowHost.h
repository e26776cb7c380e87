// What the window logic asks of the machine under it.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "platform/desktop/WindowSystem.h"
#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

class SimWindowHost : public desktop::WindowHost {
 public:
  explicit SimWindowHost(Scheduler& scheduler) : scheduler_(scheduler) {}
  std::uint32_t CurrentThread() override { return scheduler_.Current(); }
  std::uint64_t Now_ms() override { return scheduler_.Now() / 1000; }
  void Block(const void* key, const std::string& what, std::optional<std::uint64_t> deadline_ms) override {
    scheduler_.Block(key, what, deadline_ms ? std::optional<Microseconds>(*deadline_ms * 1000) : std::nullopt);
  }
  void Wake(const void* key) override { scheduler_.Wake(key); }
  void Spend() override { scheduler_.Spend(1); }

 private:
  Scheduler& scheduler_;
};

}  // namespace panelglow::platform::sim
