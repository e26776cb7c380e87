// The prompts in a colour of their own. Besides a button run control ends them; they have no time-out, no worker and
// no device events.
#pragma once

#include <cstdint>
#include <optional>

#include "prompts/PromptWindow.h"

namespace panelglow {

class ConfigurablePrompt : public PromptWindow {
 public:
  ConfigurablePrompt(platform::Color background, const PromptRequest& request);

 protected:
  [[nodiscard]] bool IsTopmost() const override { return topmost_; }
  void StartTimer() override;
  void OnTimer() override;
  void OnFocus() override;
  std::optional<std::intptr_t> HandleOwn(const platform::Message& message) override;

 private:
  platform::Color background_;
  bool topmost_;
};

}  // namespace panelglow
