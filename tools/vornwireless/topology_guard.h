#ifndef VORN_TOOLS_VORNWIRELESS_TOPOLOGY_GUARD_H
#define VORN_TOOLS_VORNWIRELESS_TOPOLOGY_GUARD_H

#include <string>

// A topology switch that undoes itself unless it is confirmed in time: the way back for a person
// whom the new topology cut off from the appliance.
namespace vorn {
namespace tools {

// Switches the whole appliance to topology, then waits up to seconds for ConfirmSwitch; without
// it, switches back to the topology before. The wait survives the loss of the terminal. 0 when
// confirmed; otherwise the exit status, explained on standard error.
int GuardedSwitch(const std::string& topology, int seconds);
// Confirms the switch that waits: 0, or 1 when none waits.
int ConfirmSwitch();

}  // namespace tools
}  // namespace vorn

#endif
