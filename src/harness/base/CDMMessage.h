// One log message that travels with a CDMException.
#pragma once

#include <string>
#include <utility>

#include "harness/base/LogOptions.h"

namespace panelglow {

class CDMMessage {
 public:
  /// A message that is not logged.
  CDMMessage() = default;
  CDMMessage(LogOptions messageOption, int messageId, std::string messageText)
      : option(messageOption), id(messageId), text(std::move(messageText)) {}
  virtual ~CDMMessage() = default;
  CDMMessage(const CDMMessage&) = default;
  CDMMessage& operator=(const CDMMessage&) = default;

  [[nodiscard]] std::string GetText() const { return text; }

  LogOptions option = LogOptions::Unknown;
  int id = -1;  // message number; -1: carried, not logged

 private:
  std::string text;
};

}  // namespace panelglow
