// In a file of its own, so that a program may link another one: a test that stands in for a service of the machine.
#include "platform/Host.h"
#include "platform/sim/Simulation.h"

namespace panelglow::platform {

Host& TheHost() { return sim::CurrentSimulation().TheMachine(); }

}  // namespace panelglow::platform
