#include "platform/host_linux/LinuxWindowHost.h"

#include <sys/eventfd.h>
#include <unistd.h>

#include <chrono>

#include "platform/host_linux/CurrentThread.h"

namespace panelglow::platform::host_linux {

namespace {

// An event of the calling thread's own, for as long as the thread lives.
int OwnEvent() {
  struct Event {
    int fd = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    ~Event() { ::close(fd); }
  };
  static thread_local const Event event;
  return event.fd;
}

}  // namespace

class LinuxWindowHost::Outside {
 public:
  explicit Outside(LinuxWindowHost& host) : host_(host) {
    const std::lock_guard<std::mutex> lock(host_.guard_);
    if (host_.owner_ == host_linux::CurrentThread::Id()) {
      depth_ = host_.depth_;
      host_.depth_ = 0;
      host_.owner_ = 0;
      host_.free_.notify_one();
    }
  }
  ~Outside() {
    if (depth_ != 0) {
      host_.Enter();
      const std::lock_guard<std::mutex> lock(host_.guard_);
      host_.depth_ = depth_;
    }
  }
  Outside(const Outside&) = delete;
  Outside& operator=(const Outside&) = delete;

 private:
  LinuxWindowHost& host_;
  unsigned depth_ = 0;
};

void LinuxWindowHost::Enter() {
  const std::uint64_t self = host_linux::CurrentThread::Id();
  std::unique_lock<std::mutex> lock(guard_);
  free_.wait(lock, [&] { return depth_ == 0 || owner_ == self; });
  owner_ = self;
  ++depth_;
}

void LinuxWindowHost::Leave() {
  const std::lock_guard<std::mutex> lock(guard_);
  if (--depth_ == 0) {
    owner_ = 0;
    free_.notify_one();
  }
}

std::uint32_t LinuxWindowHost::CurrentThread() { return static_cast<std::uint32_t>(host_linux::CurrentThread::Id()); }

std::uint64_t LinuxWindowHost::Now_ms() {
  const auto now = std::chrono::steady_clock::now().time_since_epoch();
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::milliseconds>(now).count());
}

void LinuxWindowHost::Block(const void* key, const std::string& /*what*/, std::optional<std::uint64_t> deadline_ms) {
  std::optional<host_linux::CurrentThread::Deadline> deadline;
  if (deadline_ms) {
    deadline = host_linux::CurrentThread::Deadline(std::chrono::milliseconds(*deadline_ms));
  }
  // The waiter is taken off the list again under the lock, also when the thread is told to end while it waits.
  struct Listed {
    std::list<Waiter>& list;
    std::list<Waiter>::iterator place;
    ~Listed() { list.erase(place); }
  };
  const Listed listed{waiters_, waiters_.insert(waiters_.end(), {key, OwnEvent()})};
  const Outside outside(*this);
  std::uint64_t count = 0;
  if (host_linux::CurrentThread::Await(OwnEvent(), deadline) && ::read(OwnEvent(), &count, sizeof count) < 0) {
    return;  // cannot be: nobody but this thread empties its event
  }
}

void LinuxWindowHost::Wake(const void* key) {
  for (const Waiter& waiter : waiters_) {
    const std::uint64_t one = 1;
    if (waiter.key == key && ::write(waiter.event, &one, sizeof one) < 0) {
      continue;  // its counter is full: it is awake
    }
  }
}

void LinuxWindowHost::Spend() { host_linux::CurrentThread::CheckEndRequest(); }

void LinuxWindowHost::RunProcedure(const std::function<void()>& procedure) {
  const Outside outside(*this);
  procedure();
}

void LinuxWindowHost::RunInside(const std::function<void()>& action) {
  const Guard inside(*this);
  action();
}

}  // namespace panelglow::platform::host_linux
