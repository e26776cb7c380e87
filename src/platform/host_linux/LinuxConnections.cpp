#include "platform/host_linux/LinuxConnections.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <tuple>
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
  bool isUp = false;
  unsigned index = 0;
  std::string name;
  fs::path folder;
};

class Link : public Connection {
 public:
  Link(Adapter adapter, posix::OnceTeller& teller) : adapter_(std::move(adapter)), teller_(teller) {}

  // It is as it was found, however the worker ends.
  ~Link() override {
    if (isDown_) {
      Raise();
    } else if (isRaised_) {
      socket_.SetUp(adapter_.index, false);
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
    if (!adapter_.isUp) {
      isRaised_ = false;
      return Told(socket_.SetUp(adapter_.index, false));
    }
    if (!isDown_) {
      hadLink_ = NumberIn(adapter_.folder / "carrier") == 1;
      auto lost = socket_.WhatGoesWithTheLink(adapter_.index);
      if (!lost) {
        return Told(EIO);  // what cannot be put back is not taken away
      }
      lost_.insert(lost_.end(), std::make_move_iterator(lost->begin()), std::make_move_iterator(lost->end()));
    }
    const int error = socket_.SetUp(adapter_.index, false);
    isDown_ = isDown_ || error == 0;
    return Told(error);
  }

  bool Connect() override {
    CurrentThread::CheckEndRequest();
    if (!isDown_) {
      const int error = socket_.SetUp(adapter_.index, true);
      isRaised_ = !adapter_.isUp && error == 0;
      return Told(error);
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
      lost_ = socket_.Restore(std::move(lost_));
      if (!lost_.empty()) {
        teller_.Tell("The adapter " + adapter_.name +
                     " is up again, but the kernel did not take back all of its "
                     "routes, addresses and neighbours: look with \"ip route\" and \"ip address\".");
      }
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
  bool isDown_ = false;    // by us
  bool isRaised_ = false;  // by us, though it was found switched off
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
    if (fs::exists(it->path() / "device", missing)) {
      adapters.push_back(
          {IsUp(it->path()), NumberIn(it->path() / "ifindex"), it->path().filename().string(), it->path()});
    }
  }
  // The last one is taken where none has the name that is looked for: rather one that is up.
  std::sort(adapters.begin(), adapters.end(),
            [](const Adapter& a, const Adapter& b) { return std::tie(a.isUp, a.index) < std::tie(b.isUp, b.index); });
  return std::make_unique<Walk>(std::move(adapters), teller_);
}

}  // namespace panelglow::platform::host_linux
