#include <atomic>

#include "boardtool/Machine.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

namespace {

std::atomic<bool> g_stop{false};

}  // namespace

StopRequest::StopRequest() {
  platform::TheHost().console.SetControlHandler([](std::uint32_t /*type*/) {
    g_stop = true;
    return true;
  });
}

bool StopRequest::IsMade() { return g_stop; }

}  // namespace panelglow::boardtool
