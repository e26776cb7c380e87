// What a process has only one of (the command line, message files) is tested in processes of their own.
#pragma once

#include <exception>
#include <functional>
#include <string>

#include "platform/host_linux/ChildProcess.h"

namespace panelglow {

/// The text that `body` returns there. How the process ended stands behind it when that was not the ordinary way.
inline std::string InOwnProcess(const std::function<std::string()>& body) {
  platform::ChildProcess child([&](int pipe) {
    std::string text;
    try {
      text = body();
    } catch (const std::exception& failure) {
      text = failure.what();
    }
    for (const char c : text) {
      platform::Tell(pipe, c);
    }
    return 0;
  });
  constexpr std::size_t kMost = 1'000'000;
  const std::string text = child.Read(kMost);
  const int status = child.Wait();
  return status == 0 ? text : text + "\nended with status " + std::to_string(status);
}

}  // namespace panelglow
