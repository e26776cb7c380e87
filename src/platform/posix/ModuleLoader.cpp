#include "platform/posix/ModuleLoader.h"

#include <dlfcn.h>

#include "platform/posix/PosixFiles.h"

namespace panelglow::platform::posix {

void* LoadSymbol(const std::string& module, const char* symbol, std::string& error) {
  const std::string executable = PosixFiles().ExecutablePath();
  if (executable.empty()) {
    error = "the program's own folder is not known";
    return nullptr;
  }
  const std::string folder = executable.substr(0, executable.find_last_of('/') + 1);
  void* library = nullptr;
  for (const char* place : {"../lib/", "../lib/panelglow-diags/", ""}) {
    // The whole path is given, so that nothing but our own folders is searched.
    library = ::dlopen((folder + place + "lib" + module + ".so").c_str(), RTLD_NOW | RTLD_LOCAL);
    if (library != nullptr) {
      break;
    }
    const char* reason = ::dlerror();
    error += (error.empty() ? "" : "; ") + std::string(reason == nullptr ? "unknown" : reason);
  }
  if (library == nullptr) {
    return nullptr;
  }
  void* address = ::dlsym(library, symbol);
  if (address == nullptr) {
    error = "the module " + module + " has no " + symbol;
  }
  return address;
}

}  // namespace panelglow::platform::posix
