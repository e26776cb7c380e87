// A graphics maker's library with two cards, the second of which does not answer.
#include <cstdint>

extern "C" {

static int users = 0;

int nvmlInit_v2() { return users++ == 0 ? 0 : 999; }  // whoever loads it twice has not shut it down
int nvmlShutdown() { return --users; }
int nvmlDeviceGetCount_v2(unsigned* count) {
  *count = 2;
  return 0;
}
int nvmlDeviceGetHandleByIndex_v2(unsigned index, void** device) {
  *device = reinterpret_cast<void*>(static_cast<std::uintptr_t>(index + 1));
  return index == 0 ? 0 : 15;
}
int nvmlDeviceGetPciInfo_v3(void* /*device*/, char* info) {
  const std::uint32_t ids = 0x2204'10DE;
  __builtin_memcpy(info + 28, &ids, sizeof ids);
  info[67] = 1;  // the last byte of the record
  return 0;
}
int nvmlDeviceGetTemperature(void* device, int sensor, unsigned* temperature) {
  *temperature = 61;
  return device != nullptr && sensor == 0 ? 0 : 2;
}
}
