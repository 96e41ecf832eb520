#include "tests/agent/Agent.h"

#include <array>
#include <sstream>
#include <utility>

namespace ventras {
namespace {

constexpr std::string_view kQueueLine = "Queue ID:";

// Change by themselves.
constexpr std::array kClocks{"printer-current-time", "printer-up-time", "printer-state-change-time",
                             "printer-state-change-date-time"};

std::vector<std::string> commandLine(const std::vector<std::string>& arguments) {
    std::vector<std::string> all{VENTRAS_AGENT};
    all.insert(all.end(), arguments.begin(), arguments.end());
    return all;
}

}  // namespace

std::vector<std::string> AgentRun::queueIDs() const {
    std::vector<std::string> ids;
    std::istringstream lines(standardOutput);
    for (std::string line; std::getline(lines, line);)
        if (line.starts_with(kQueueLine))
            ids.push_back(line.substr(kQueueLine.size()));
    return ids;
}

std::string AgentRun::queueID() const {
    const auto ids = queueIDs();
    return ids.size() == 1 ? ids.front() : "";
}

std::string AgentRun::story() const {
    return "exit status " + std::to_string(exitStatus) + ", signal " + std::to_string(signal) + ", after " +
           std::to_string(wallTime.count()) + " ms\n" + standardOutput + standardError;
}

Agent::Agent(Environment environment, std::optional<uid_t> user) : home_(user), temporary_(user) {
    environment["HOME"] = home_.path();
    environment["XDG_CONFIG_HOME"] = home_ / "config";
    environment["TMPDIR"] = temporary_.path();
    environment.try_emplace("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=" + (home_ / "no-bus").string());
    environment["LC_ALL"] = "C.UTF-8";
    options_ = {.environment = std::move(environment), .user = user, .errorsGoToJournal = true};
}

AgentRun Agent::run(const std::vector<std::string>& arguments, std::chrono::milliseconds limit) const {
    return {runProgram(commandLine(arguments), options_, limit)};
}

std::unique_ptr<RunningProgram> Agent::start(const std::vector<std::string>& arguments) const {
    return std::make_unique<RunningProgram>(commandLine(arguments), options_);
}

AgentRun Agent::resultOf(const RunningProgram& program) {
    return {program.result()};
}

std::vector<std::string> Agent::leftovers() const {
    std::vector<std::string> files;
    for (const auto& entry : std::filesystem::directory_iterator(temporary_.path()))
        files.push_back(entry.path().filename());
    return files;
}

std::string stateOfQueues(const PrivateScheduler& scheduler, const std::vector<std::string>& queues) {
    std::ostringstream state;
    for (const auto& queue : queues) {
        auto attributes = scheduler.attributes(queue);
        for (const auto* clock : kClocks)
            attributes.erase(clock);
        for (const auto& [name, values] : attributes)
            for (const auto& value : values)
                state << queue << ' ' << name << '=' << value << '\n';
        state << scheduler.ppd(queue) << '\n';
    }
    return state.str();
}

}  // namespace ventras
