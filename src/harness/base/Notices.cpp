#include "harness/base/Notices.h"

#include <mutex>
#include <set>
#include <string>

#include "platform/Host.h"

namespace panelglow {

namespace {

struct Told {
  std::mutex guard;
  std::set<std::string, std::less<>> sentences;  // by guard
};

Told& WhatWasTold() {
  static Told told;
  return told;
}

bool IsNew(std::string_view sentence) {
  Told& told = WhatWasTold();
  const std::lock_guard<std::mutex> lock(told.guard);
  return told.sentences.emplace(sentence).second;
}

bool IsControl(char c) {
  const auto byte = static_cast<unsigned char>(c);
  return byte < 0x20 || byte == 0x7F;
}

}  // namespace

void Notices::Tell(std::string_view sentence) {
  if (!IsNew(sentence)) {
    return;
  }
  std::string line = "panelglow-diags: ";
  for (const char c : sentence) {
    line += IsControl(c) ? ' ' : c;
  }
  line += '\n';
  platform::TheHost().console.WriteError(line);
}

void Notices::Forget() {
  Told& told = WhatWasTold();
  const std::lock_guard<std::mutex> lock(told.guard);
  told.sentences.clear();
}

}  // namespace panelglow
