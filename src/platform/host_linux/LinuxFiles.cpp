#include "platform/host_linux/LinuxFiles.h"

#include "platform/host_linux/CurrentThread.h"

namespace panelglow::platform::host_linux {

bool LinuxFiles::CanRead(std::string_view path) {
  CurrentThread::CheckEndRequest();
  return PosixFiles::CanRead(path);
}

std::optional<std::string> LinuxFiles::Read(std::string_view path) {
  CurrentThread::CheckEndRequest();
  return PosixFiles::Read(path);
}

std::optional<std::string> LinuxFiles::ReadLocked(std::string_view path) {
  CurrentThread::CheckEndRequest();
  return PosixFiles::ReadLocked(path);
}

bool LinuxFiles::Write(std::string_view path, std::string_view bytes) {
  CurrentThread::CheckEndRequest();
  return PosixFiles::Write(path, bytes);
}

bool LinuxFiles::WriteLocked(std::string_view path, std::string_view bytes) {
  CurrentThread::CheckEndRequest();
  return PosixFiles::WriteLocked(path, bytes);
}

bool LinuxFiles::Remove(std::string_view path) {
  CurrentThread::CheckEndRequest();
  return PosixFiles::Remove(path);
}

void LinuxFiles::Pause(std::chrono::milliseconds duration) { CurrentThread::SleepFor(duration); }

}  // namespace panelglow::platform::host_linux
