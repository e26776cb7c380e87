#include "config/FileLock.h"

#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::size_t kLongestPath = 1024;
constexpr const char* kSuffix = "_HalcyonFileParser";

}  // namespace

std::string FileLockName(const std::string& file) {
  std::string name = platform::TheHost().files.FullPath(file).substr(0, kLongestPath);
  for (char& c : name) {
    if (c == '\\' || c == ':' || c == '.' || c == '/') {
      c = '_';
    }
  }
  return name + kSuffix;
}

FileLock::FileLock(const std::string& file) : mutex_(platform::TheHost().mutexes, FileLockName(file)) {}

}  // namespace panelglow
