// Linked with one target and libFuzzer.
#include <cstddef>
#include <cstdint>

#include "FuzzTarget.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  panelglow::fuzz::Machine();  // answers what a reader asks of the machine that it runs on
  panelglow::fuzz::Targets().front().body({reinterpret_cast<const char*>(data), size});
  return 0;
}
