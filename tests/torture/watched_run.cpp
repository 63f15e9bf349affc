#include "watched_run.h"

#include <stdexcept>
#include <string>

namespace VANO::TORTURE {

std::vector<SystemCall> CallsOf(const Trial &trial) {
    std::vector<SystemCall> calls;
    const Shared<Disturbance> none;
    Hooks hooks;
    hooks.onEntry = [&](const SystemCall &call) {
        calls.push_back(call);
        return Decision{};
    };
    const std::string complaint = trial.Run(hooks, none);
    if (!complaint.empty()) {
        throw std::runtime_error(std::string(trial.Subject().name) + ", watched: " + complaint);
    }
    return calls;
}

bool IsSameCall(const SystemCall &call, const SystemCall &wanted) {
    return call.process == wanted.process && call.number == wanted.number && call.nth == wanted.nth;
}

} // namespace VANO::TORTURE
