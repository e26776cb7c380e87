#include "platform/sim/SimConnections.h"

namespace panelglow::platform::sim {

namespace {

constexpr Microseconds kEnumerationCost_us = 2000;
constexpr Microseconds kCallCost_us = 200;

}  // namespace

class SimConnections::Held : public Connection {
 public:
  Held(AdapterDevice& adapter, DoorContext& context) : adapter_(adapter), context_(context) {}

  std::optional<std::string> DeviceName() override {
    context_.scheduler.Spend(kCallCost_us);
    const AdapterSetup& setup = adapter_.Setup();
    return setup.fault == AdapterSetup::Fault::kNoProperties ? std::nullopt
                                                             : std::optional<std::string>(setup.deviceName);
  }
  bool Connect() override { return Order(true, AdapterSetup::Fault::kStaysDown); }
  bool Disconnect() override { return Order(false, AdapterSetup::Fault::kStaysUp); }

 private:
  bool Order(bool up, AdapterSetup::Fault failing) {
    const AdapterSetup& setup = adapter_.Setup();
    Scheduler& scheduler = context_.scheduler;
    if (setup.fault == failing || context_.Ignores(setup.name)) {
      scheduler.Spend(up ? setup.connect_us : setup.disconnect_us);
      return setup.fault != failing;
    }
    const Microseconds done = adapter_.Order(up);
    context_.moved();
    scheduler.Spend(done - scheduler.Now());
    return true;
  }

  AdapterDevice& adapter_;
  DoorContext& context_;
};

class SimConnections::List : public ConnectionList {
 public:
  explicit List(SimConnections& owner) : owner_(owner) {}

  std::unique_ptr<Connection> Next() override {
    owner_.context_.scheduler.Spend(kCallCost_us);
    while (next_ < owner_.adapters_.size()) {
      AdapterDevice& adapter = *owner_.adapters_[next_++];
      if (!owner_.context_.buses.IsRemoved(adapter.Setup().name)) {
        return std::make_unique<Held>(adapter, owner_.context_);
      }
    }
    return nullptr;
  }

 private:
  SimConnections& owner_;
  std::size_t next_ = 0;
};

std::unique_ptr<ConnectionList> SimConnections::Enumerate() {
  context_.scheduler.Spend(kEnumerationCost_us);
  return std::make_unique<List>(*this);
}

}  // namespace panelglow::platform::sim
