// What the loader asks of the service manager, call by call, on every way that a load can take.
#include "hw/DriverLoader.h"

#include <gtest/gtest.h>

#include <map>

#include "harness/base/CDMUtil.h"

namespace panelglow {
namespace {

using platform::DriverDevice;
using platform::ServiceHandle;

// A service manager and device links that keep a log of what they are asked. Calls that are listed in `errors` fail.
class Services : public platform::ServiceManager, public platform::DriverDevices {
 public:
  std::map<std::string, std::uint32_t> errors;
  std::string log;

  ServiceHandle OpenManager(std::uint32_t access, std::uint32_t& error) override {
    return Handle("manager " + Hex(access), "manager", error);
  }
  ServiceHandle OpenService(ServiceHandle manager, std::string_view name, std::uint32_t access,
                            std::uint32_t& error) override {
    return Handle("open " + Of(manager) + " " + std::string(name) + " " + Hex(access), "open " + std::string(name),
                  error);
  }
  ServiceHandle CreateService(ServiceHandle manager, const platform::ServiceDefinition& d,
                              std::uint32_t& error) override {
    return Handle("create " + Of(manager) + " " + d.service_name + "/" + d.display_name + "/" + d.image_path + " " +
                      Hex(d.access) + " " + Hex(d.type) + " " + Hex(d.start_type) + " " + Hex(d.error_control),
                  "create " + d.service_name, error);
  }
  std::uint32_t Start(ServiceHandle service) override { return Call("start " + Of(service)); }
  std::uint32_t Delete(ServiceHandle service) override { return Call("delete " + Of(service)); }
  void Close(ServiceHandle handle) override { Call("close " + Of(handle)); }
  std::unique_ptr<DriverDevice> Open(std::string_view name, std::uint32_t& error) override {
    error = Call("link " + std::string(name));
    return error == 0 ? std::make_unique<Device>() : nullptr;
  }

 private:
  struct Device : DriverDevice {
    std::uint32_t Control(std::uint32_t, std::span<const std::byte>, std::span<std::byte>) override { return 0; }
    std::uint32_t ReadMapped(std::uint64_t, std::size_t) override { return 0; }
    void WriteMapped(std::uint64_t, std::size_t, std::uint32_t) override {}
  };

  static std::string Hex(std::uint32_t value) { return CDMUtil::ToUpper(CDMUtil::ToHexString(value)); }
  static std::string Of(ServiceHandle handle) { return "#" + std::to_string(handle); }
  std::uint32_t Call(const std::string& call) {
    log += call + "\n";
    return errors.contains(call) ? errors.at(call) : 0;
  }
  ServiceHandle Handle(const std::string& call, const std::string& name, std::uint32_t& error) {
    log += call + "\n";
    error = errors.contains(name) ? errors.at(name) : 0;
    return error == 0 ? ++last_ : 0;
  }
  ServiceHandle last_ = 0;
};

const DriverNames kNames{"svc", "Display name", "link", "drivers\\svc.sys"};
const std::string kOpen = "manager F003F\nopen #1 svc F01FF\n";
const std::string kCreate = "create #1 svc/Display name/drivers\\svc.sys F01FF 1 3 1\n";
const std::string kStart = "start #2\n";
const std::string kLink = "link link\n";
const std::string kClose = "close #2\nclose #1\n";

TEST(DriverLoader, TakesEachStepOnceAndClosesItsHandlesOnEveryWayOut) {
  using State = DriverLoadState;
  const struct {
    std::map<std::string, std::uint32_t> errors;
    std::string log;
    State state;
    bool loaded;
  } kCases[] = {
      {{}, kOpen + kStart + kLink + kClose, State::kRunning, true},
      {{{"start #2", 1056}}, kOpen + kStart + kLink + kClose, State::kRunning, true},
      {{{"open svc", 1060}}, kOpen + kCreate + kStart + kLink + kClose, State::kRunning, true},
      {{{"manager", 5}}, "manager F003F\n", State::kNotStarted, false},
      {{{"open svc", 5}}, kOpen + "close #1\n", State::kNotStarted, false},
      {{{"open svc", 1060}, {"create svc", 5}}, kOpen + kCreate + "close #1\n", State::kNotStarted, false},
      {{{"start #2", 2}}, kOpen + kStart + "delete #2\n" + kClose, State::kNoBinary, false},
      {{{"start #2", 3}}, kOpen + kStart + kClose, State::kStartFailed, false},
      {{{"link link", 2}}, kOpen + kStart + kLink + kClose, State::kRunning, false},
  };
  for (const auto& c : kCases) {
    Services services;
    services.errors = c.errors;
    State state = State::kNotStarted;
    EXPECT_EQ(DriverLoader(services, services).Load(kNames, state) != nullptr, c.loaded) << &c - kCases;
    EXPECT_EQ(services.log, c.log);
    EXPECT_EQ(state, c.state) << &c - kCases;
  }
}

TEST(DriverLoader, TriesTheOlderNamesOnlyWhenThePresentBinaryIsMissing) {
  using State = DriverLoadState;
  const std::string present =
      "manager F003F\nopen #1 tmbhalcyon F01FF\n"
      "create #1 tmbhalcyon/tmbhalcyon/system32\\drivers\\tmb64halcyon.sys F01FF 1 3 1\nstart #2\n";
  const std::string older =
      "manager F003F\nopen #3 Nvntsk F01FF\n"
      "create #3 Nvntsk/Norvane Tsk/System32\\drivers\\nvntsk.sys F01FF 1 3 1\n";
  const std::string both = present + "delete #2\n" + kClose + older;
  const struct {
    std::map<std::string, std::uint32_t> errors;
    std::string log;
    State state;
    const char* device;  // of the names tried last
  } kCases[] = {
      {{}, present + "link tmbhalcyon\n" + kClose, State::kRunning, "tmbhalcyon"},
      {{{"start #2", 3}}, present + kClose, State::kStartFailed, "tmbhalcyon"},
      {{{"start #2", 2}}, both + "start #4\nlink Nvntsk\nclose #4\nclose #3\n", State::kRunning, "Nvntsk"},
      {{{"start #2", 2}, {"start #4", 2}},
       both + "start #4\ndelete #4\nclose #4\nclose #3\n",
       State::kNoBinary,
       "Nvntsk"},
      {{{"start #2", 2}, {"create Nvntsk", 5}}, both + "close #3\n", State::kNoBinary, "Nvntsk"},
  };
  for (const auto& c : kCases) {
    Services services;
    services.errors = c.errors;
    services.errors["open tmbhalcyon"] = services.errors["open Nvntsk"] = 1060;
    State state = State::kNotStarted;
    DriverNames names;
    EXPECT_EQ(DriverLoader(services, services).LoadPresentOrOlder(true, names, state) != nullptr,
              c.state == State::kRunning);
    EXPECT_EQ(services.log, c.log);
    EXPECT_EQ(state, c.state) << &c - kCases;
    EXPECT_EQ(names.device, c.device) << &c - kCases;
  }
  EXPECT_EQ(DriverLoader::PresentNames(false).image, "system32\\drivers\\tmb32halcyon.sys");
}

}  // namespace
}  // namespace panelglow
