// What a process has only one of (the command line, message files) is tested in processes of their own.
#pragma once

#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <exception>
#include <functional>
#include <string>

namespace panelglow {

/// The text that `body` returns there. How the process ended stands behind it when that was not the ordinary way.
inline std::string InOwnProcess(const std::function<std::string()>& body) {
  std::FILE* file = std::tmpfile();
  const pid_t child = file == nullptr ? -1 : ::fork();
  if (child == 0) {
    std::string text;
    try {
      text = body();
    } catch (const std::exception& failure) {
      text = failure.what();
    }
    std::fwrite(text.data(), 1, text.size(), file);
    std::fflush(file);
    ::_exit(0);
  }
  int status = -1;
  ::waitpid(child, &status, 0);
  std::string text;
  std::rewind(file);
  for (int c = std::fgetc(file); c != EOF; c = std::fgetc(file)) {
    text += static_cast<char>(c);
  }
  std::fclose(file);
  return status == 0 ? text : text + "\nended with status " + std::to_string(status);
}

}  // namespace panelglow
