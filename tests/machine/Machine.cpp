#include "tests/machine/Machine.h"

#include <algorithm>
#include <sstream>
#include <string_view>

#include "tests/parts/Program.h"

namespace ventras::Machine {
namespace {

std::vector<std::string> linesIn(const std::string& text) {
    std::vector<std::string> lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);)
        lines.push_back(line);
    return lines;
}

std::vector<std::string> linesOf(const std::vector<std::string>& command) {
    return linesIn(runProgram(command).standardOutput);
}

}  // namespace

std::map<std::string, std::string> queues() {
    constexpr std::string_view kDevice = "device for ";
    constexpr std::string_view kColon = ": ";
    std::map<std::string, std::string> queues;
    for (const auto& line : linesOf({"lpstat", "-v"})) {
        const auto colon = line.find(kColon);
        if (line.starts_with(kDevice) && colon != std::string::npos)
            queues[line.substr(kDevice.size(), colon - kDevice.size())] = line.substr(colon + kColon.size());
    }
    return queues;
}

std::string queueOf(const std::string& deviceURI) {
    for (const auto& [name, uri] : queues())
        if (uri == deviceURI)
            return name;
    return "";
}

std::string journal() {
    return runProgram({"journalctl", "--boot", "--quiet", "--no-pager", "--output=cat",
                       "--unit=ventrasagent*", "--unit=ipp-usb.service"})
        .standardOutput;
}

long timesInJournal(const std::string& text) {
    return std::ranges::count_if(
        linesIn(journal()), [&](const std::string& line) { return line.find(text) != std::string::npos; });
}

std::vector<std::string> failedUnits() {
    return linesOf({"systemctl", "list-units", "--failed", "--plain", "--no-legend"});
}

}  // namespace ventras::Machine
