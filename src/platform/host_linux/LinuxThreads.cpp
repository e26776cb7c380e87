#include "platform/host_linux/LinuxThreads.h"

#include <pthread.h>

#include <chrono>
#include <cstdio>
#include <exception>
#include <optional>
#include <system_error>
#include <thread>
#include <utility>

#include "platform/host_linux/CurrentThread.h"

namespace panelglow::platform::host_linux {

namespace {

constexpr std::size_t kLongestName = 15;  // what the system keeps of a thread's name
constexpr std::chrono::seconds kLongestTermination{10};

// True when the thread has ended by the deadline.
bool AwaitEnd(const ThreadControl& control, std::optional<CurrentThread::Deadline> deadline) {
  CurrentThread::CheckEndRequest();
  while (!control.HasEnded()) {
    if (!CurrentThread::Await(control.EndDescriptor(), deadline)) {
      return control.HasEnded();
    }
  }
  return true;
}

void ReportException(const std::string& thread, const char* what) {
  std::fprintf(stderr, "the thread \"%s\" ended by an exception: %s\n", thread.c_str(), what);
}

}  // namespace

LinuxThreads::Control LinuxThreads::Find(ThreadHandle thread) {
  const std::lock_guard<std::mutex> lock(guard_);
  const auto found = running_.find(thread);
  return found == running_.end() ? nullptr : found->second;
}

void LinuxThreads::Forget(ThreadHandle thread) {
  const std::lock_guard<std::mutex> lock(guard_);
  running_.erase(thread);
}

ThreadHandle LinuxThreads::Start(const std::string& name, std::function<void()> body) {
  CurrentThread::CheckEndRequest();
  const auto control = std::make_shared<ThreadControl>();
  if (!control->IsUsable()) {
    return 0;
  }
  ThreadHandle handle = 0;
  {
    const std::lock_guard<std::mutex> lock(guard_);
    while (++last_ == 0 || running_.count(last_) != 0) {
    }
    handle = last_;
    running_[handle] = control;
  }
  try {
    std::thread([this, handle, name, control, body = std::move(body)]() mutable {
      RunThread(handle, name, *control, std::move(body));
    }).detach();
  } catch (const std::system_error&) {
    Forget(handle);
    return 0;
  }
  return handle;
}

void LinuxThreads::RunThread(ThreadHandle thread, const std::string& name, ThreadControl& control,
                             std::function<void()> body) {
  ::pthread_setname_np(::pthread_self(), name.substr(0, kLongestName).c_str());
  CurrentThread::Adopt(control);
  try {
    CurrentThread::CheckEndRequest();
    body();
  } catch (const ThreadTerminated&) {
    // the end that Terminate asked for
  } catch (const std::exception& failure) {
    ReportException(name, failure.what());
  } catch (...) {
    ReportException(name, "not a standard one");
  }
  // Who waits for the end may count on all of this being done.
  body = nullptr;
  CurrentThread::Finish();
  control.MarkEnded();
  Forget(thread);
}

bool LinuxThreads::Wait(ThreadHandle thread, std::uint32_t limit_ms) {
  const Control control = Find(thread);
  if (control == nullptr) {
    CurrentThread::CheckEndRequest();
    return true;
  }
  return AwaitEnd(*control, limit_ms == kNoLimit
                                ? std::nullopt
                                : std::optional<CurrentThread::Deadline>(std::chrono::steady_clock::now() +
                                                                         std::chrono::milliseconds(limit_ms)));
}

void LinuxThreads::Terminate(ThreadHandle thread) {
  if (const Control control = Find(thread)) {
    control->RequestEnd();
    AwaitEnd(*control, std::chrono::steady_clock::now() + kLongestTermination);
  }
}

}  // namespace panelglow::platform::host_linux
