#include "harness/base/CDMout.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <utility>

#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// By the value of LogOptions. A value outside 1 to 15 is printed as its number.
constexpr std::array<std::string_view, 16> kOptionWords{"Unknown",
                                                        "Other",
                                                        "Results",
                                                        "Subtests",
                                                        "Actions",
                                                        "Warnings",
                                                        "Status",
                                                        "DeviceErrors",
                                                        "ServiceErrors",
                                                        "SettingData",
                                                        "Statistics",
                                                        "HardwareConfiguration",
                                                        "SoftwareConfiguration",
                                                        "References",
                                                        "Debug",
                                                        "Invalid"};

// Handed in by main; made at first use, so that a line written before that is a plain one.
struct Hooks {
  std::function<bool()> debug;
  std::function<std::string(unsigned int, const std::string&)> resolver;
};

Hooks& TheHooks() {
  static Hooks hooks;
  return hooks;
}

// One call a line, so that the lines of two threads do not tear each other.
void WriteLine(std::string line) {
  line += '\n';
  platform::TheHost().console.Write(line);
}

std::string Quoted(std::string_view text) { return "\"" + std::string(text) + "\""; }

std::string WordOf(LogOptions option) {
  const auto number = static_cast<int>(option);
  if (number >= 1 && number < static_cast<int>(kOptionWords.size())) {
    return std::string(kOptionWords[static_cast<std::size_t>(number)]);
  }
  return CDMUtil::ToString(number);
}

}  // namespace

void CDMout::UpdatePercentage(int percent) {
  WriteLine("UpdatePercentage " + CDMUtil::ToString(std::clamp(percent, 0, 100)));
}

void CDMout::ReportFailure(std::string_view text) { WriteLine("ReportFailure " + CDMUtil::OnOneLine(text)); }

void CDMout::TestFailed(std::string_view text) { WriteLine("TestFailed " + CDMUtil::OnOneLine(text)); }

void CDMout::TestFailed(int code, std::string_view text) {
  std::array<char, 24> digits{};
  std::snprintf(digits.data(), digits.size(), "%06d", code);
  WriteLine("TestFailed " + std::string(digits.data()) + " " + Quoted(CDMUtil::OnOneLine(text)));
}

void CDMout::EndOfTest() { WriteLine("EndOfTest"); }

void CDMout::LogMessage(LogOptions option, unsigned int id, std::string_view text) {
  const std::string line = CDMUtil::OnOneLine(text);
  const Hooks& hooks = TheHooks();
  if (hooks.debug && hooks.debug()) {
    WriteLine("LogMessage " + WordOf(option) + " " + ResolveLogMessage(id, line) + " \"\"");
  } else {
    WriteLine("LogMessage " + CDMUtil::ToString(static_cast<int>(option)) + " " + CDMUtil::ToString(id) + " " +
              Quoted(line) + " \"\"");
  }
}

void CDMout::LogMessage(LogOptions option, unsigned int id, const char* text) {
  LogMessage(option, id, std::string_view(text == nullptr ? "" : text));
}

void CDMout::LogMessage(LogOptions option, unsigned int id, const std::string& text) {
  LogMessage(option, id, std::string_view(text));
}

void CDMout::LogMessage(LogOptions option, unsigned int id, int value) {
  LogMessage(option, id, CDMUtil::ToString(value));
}

void CDMout::LogMessage(LogOptions option, unsigned int id, bool value) {
  LogMessage(option, id, CDMUtil::ToString(value));
}

std::string CDMout::ResolveLogMessage(unsigned int id, const std::string& text) {
  const Hooks& hooks = TheHooks();
  return hooks.resolver ? hooks.resolver(id, text) : CDMUtil::ToString(id) + " " + Quoted(text);
}

void CDMout::SetDebugQuery(std::function<bool()> debug) { TheHooks().debug = std::move(debug); }

void CDMout::SetMessageResolver(std::function<std::string(unsigned int, const std::string&)> resolver) {
  TheHooks().resolver = std::move(resolver);
}

}  // namespace panelglow
