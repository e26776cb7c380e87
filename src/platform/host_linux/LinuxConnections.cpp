#include "platform/host_linux/LinuxConnections.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <utility>
#include <vector>

#include "platform/host_linux/CurrentThread.h"
#include "platform/host_linux/RouteSocket.h"

namespace panelglow::platform::host_linux {

namespace {

namespace fs = std::filesystem;

// How long an adapter may take to find its link again: copper needs up to four seconds.
constexpr std::chrono::seconds kLinkPatience{5};
constexpr std::chrono::milliseconds kLinkPoll{20};

// 0 when the file has no number, as "carrier" of an adapter that is down.
unsigned NumberIn(const fs::path& file) {
  std::ifstream in(file);
  unsigned number = 0;
  return in >> number ? number : 0;
}

struct Adapter {
  unsigned index = 0;
  std::string name;
  fs::path folder;
};

class Link : public Connection {
 public:
  Link(Adapter adapter, posix::OnceTeller& teller) : adapter_(std::move(adapter)), teller_(teller) {}

  // What was up is up however the worker ends.
  ~Link() override {
    if (isDown_) {
      Raise();
    }
  }
  Link(const Link&) = delete;
  Link& operator=(const Link&) = delete;

  std::optional<std::string> DeviceName() override {
    CurrentThread::CheckEndRequest();
    std::error_code none;
    if (!fs::exists(adapter_.folder, none)) {
      return std::nullopt;
    }
    const bool hasRadio =
        fs::exists(adapter_.folder / "phy80211", none) || fs::exists(adapter_.folder / "wireless", none);
    const std::string driver = fs::read_symlink(adapter_.folder / "device/driver", none).filename().string();
    return adapter_.name + (driver.empty() ? "" : " " + driver) + (hasRadio ? " Wireless" : "");
  }

  bool Disconnect() override {
    CurrentThread::CheckEndRequest();
    if (!isDown_) {
      hadLink_ = NumberIn(adapter_.folder / "carrier") == 1;
      lost_ = socket_.WhatGoesWithTheLink(adapter_.index);
    }
    const int error = socket_.SetUp(adapter_.index, false);
    isDown_ = isDown_ || error == 0;
    return Told(error);
  }

  bool Connect() override {
    CurrentThread::CheckEndRequest();
    if (!isDown_) {
      return Told(socket_.SetUp(adapter_.index, true));
    }
    const int error = Raise();
    const auto end = std::chrono::steady_clock::now() + kLinkPatience;
    while (error == 0 && hadLink_ && NumberIn(adapter_.folder / "carrier") != 1 &&
           std::chrono::steady_clock::now() < end) {
      CurrentThread::SleepFor(kLinkPoll);
    }
    return Told(error);
  }

 private:
  int Raise() {
    const int error = socket_.SetUp(adapter_.index, true);
    if (error == 0) {
      isDown_ = false;
      socket_.Restore(lost_);
    }
    return error;
  }

  bool Told(int error) {
    if (error != 0) {
      teller_.Tell("The adapter " + adapter_.name + " cannot be switched (" + std::strerror(error) +
                   "), so its LED does not blink" +
                   (error == EPERM ? ": start the program as root, or give it CAP_NET_ADMIN." : "."));
    }
    return error == 0;
  }

  Adapter adapter_;
  posix::OnceTeller& teller_;  // the connections', which outlive every run
  RouteSocket socket_;
  std::vector<RouteSocket::Message> lost_;
  bool hadLink_ = false;
  bool isDown_ = false;  // by us
};

class Walk : public ConnectionList {
 public:
  Walk(std::vector<Adapter> adapters, posix::OnceTeller& teller) : adapters_(std::move(adapters)), teller_(teller) {}
  std::unique_ptr<Connection> Next() override {
    CurrentThread::CheckEndRequest();
    return next_ < adapters_.size() ? std::make_unique<Link>(adapters_[next_++], teller_) : nullptr;
  }

 private:
  std::vector<Adapter> adapters_;
  posix::OnceTeller& teller_;
  std::size_t next_ = 0;
};

// An adapter that is up: what its owner has switched off is no connection.
bool IsUp(const fs::path& folder) {
  constexpr unsigned kUp = 1;
  std::ifstream in(folder / "flags");
  unsigned flags = 0;
  return in >> std::hex >> flags && (flags & kUp) != 0;
}

}  // namespace

std::unique_ptr<ConnectionList> LinuxConnections::Enumerate() {
  CurrentThread::CheckEndRequest();
  std::vector<Adapter> adapters;
  std::error_code none;
  for (fs::directory_iterator it(folder_, none), end; !none && it != end; it.increment(none)) {
    std::error_code missing;
    if (fs::exists(it->path() / "device", missing) && IsUp(it->path())) {
      adapters.push_back({NumberIn(it->path() / "ifindex"), it->path().filename().string(), it->path()});
    }
  }
  std::sort(adapters.begin(), adapters.end(), [](const Adapter& a, const Adapter& b) { return a.index < b.index; });
  return std::make_unique<Walk>(std::move(adapters), teller_);
}

}  // namespace panelglow::platform::host_linux
