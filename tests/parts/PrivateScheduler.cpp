#include "tests/parts/PrivateScheduler.h"

#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <csignal>
#include <cstdlib>
#include <stdexcept>
#include <thread>

#include "tests/parts/ComesTrue.h"
#include "tests/parts/Loopback.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;

constexpr auto kStartLimit = 20s;
constexpr auto kGlance = 1ms;

std::string queueUri(const std::string& name) {
    std::array<char, HTTP_MAX_URI> uri{};
    httpAssembleURIf(HTTP_URI_CODING_ALL, uri.data(), static_cast<int>(uri.size()), "ipp", nullptr,
                     "localhost", 0, "/printers/%s", name.c_str());
    return uri.data();
}

IppPtr newRequest(ipp_op_t operation, const std::string& queue = {}) {
    IppPtr message{ippNewRequest(operation)};
    if (!queue.empty())
        ippAddString(message.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                     queueUri(queue).c_str());
    ippAddString(message.get(), IPP_TAG_OPERATION, IPP_TAG_NAME, "requesting-user-name", nullptr, cupsUser());
    return message;
}

// cupsDoFileRequest() names its requests after the thread's default server; a connection of our own leaves
// the settings of the code under test alone.
HttpPtr connect(const std::string& socket) {
    constexpr int kMilliseconds = 5000;
    HttpPtr http{httpConnect2(socket.c_str(), 0, nullptr, AF_UNSPEC, HTTP_ENCRYPTION_NEVER, 1, kMilliseconds,
                              nullptr)};
    return http;
}

std::vector<std::string> valuesOf(ipp_attribute_t* attribute) {
    std::vector<std::string> values;
    for (int i = 0; i < ippGetCount(attribute); ++i) {
        switch (ippGetValueTag(attribute)) {
            case IPP_TAG_INTEGER:
            case IPP_TAG_ENUM:
                values.push_back(std::to_string(ippGetInteger(attribute, i)));
                break;
            case IPP_TAG_BOOLEAN:
                values.emplace_back(ippGetBoolean(attribute, i) != 0 ? "true" : "false");
                break;
            default:
                if (const char* text = ippGetString(attribute, i, nullptr); text != nullptr)
                    values.emplace_back(text);
        }
    }
    return values;
}

}  // namespace

PrivateScheduler::PrivateScheduler(SchedulerOptions options)
    : options_(std::move(options)), folder_(options_.user), socket_(folder_ / "sock") {
    port_ = options_.listensOnTcp ? freePort() : 0;
    address_ = port_ == 0 ? socket_.string() : "127.0.0.1:" + std::to_string(port_);
    furnishSchedulerFolder(folder_.path(), options_, socket_, port_);
    start();
}

PrivateScheduler::~PrivateScheduler() = default;

void PrivateScheduler::start() {
    program_ = std::make_unique<RunningProgram>(
        std::vector<std::string>{"cupsd", "-f", "-c", folder_ / "etc/cupsd.conf", "-s",
                                 folder_ / "etc/cups-files.conf"},
        ProgramOptions{.environment = {{"HOME", folder_.path()}}, .user = options_.user});
    const auto giveUp = std::chrono::steady_clock::now() + kStartLimit;
    while (!answers()) {
        if (!program_->isRunning() || std::chrono::steady_clock::now() > giveUp)
            throw std::runtime_error("no scheduler: " + program_->standardError() + errorLog());
        std::this_thread::sleep_for(kGlance);
    }
    if (port_ != 0) {
        const int tcp = connectToLoopback(LoopbackAddress::v4, port_);
        if (tcp < 0)
            throw std::runtime_error("the scheduler does not listen on TCP: " + errorLog());
        close(tcp);
    }
}

bool PrivateScheduler::answers() const {
    std::error_code missing;
    return fs::exists(socket_, missing) && request(newRequest(IPP_OP_CUPS_GET_DEFAULT), "/") != nullptr;
}

Environment PrivateScheduler::environment() const {
    return {{"CUPS_SERVER", address_}, {"CUPS_SERVERROOT", folder_ / "etc"}};
}

IppPtr PrivateScheduler::request(IppPtr message, const char* resource, const char* ppdFile) const {
    const HttpPtr http = connect(socket_);
    if (!http)
        return nullptr;
    return IppPtr{cupsDoFileRequest(http.get(), message.release(), resource, ppdFile)};
}

void PrivateScheduler::requireSuccess(IppPtr message, const char* resource, const char* ppdFile) const {
    const IppPtr response = request(std::move(message), resource, ppdFile);
    if (!response || cupsLastError() > IPP_STATUS_OK_EVENTS_COMPLETE)
        throw std::runtime_error(std::string("the scheduler refused: ") + cupsLastErrorString() + "\n" +
                                 errorLog());
}

std::vector<std::string> PrivateScheduler::queues() const {
    IppPtr message = newRequest(IPP_OP_CUPS_GET_PRINTERS);
    ippAddString(message.get(), IPP_TAG_OPERATION, IPP_TAG_KEYWORD, "requested-attributes", nullptr,
                 "printer-name");
    const IppPtr response = request(std::move(message), "/");
    if (!response)
        throw std::runtime_error("the scheduler is gone\n" + errorLog());
    std::vector<std::string> names;
    for (auto* attribute = ippFindAttribute(response.get(), "printer-name", IPP_TAG_NAME);
         attribute != nullptr; attribute = ippFindNextAttribute(response.get(), "printer-name", IPP_TAG_NAME))
        names.emplace_back(ippGetString(attribute, 0, nullptr));
    std::ranges::sort(names);
    return names;
}

std::map<std::string, std::vector<std::string>> PrivateScheduler::attributes(const std::string& queue) const {
    const IppPtr response = request(newRequest(IPP_OP_GET_PRINTER_ATTRIBUTES, queue), "/");
    std::map<std::string, std::vector<std::string>> all;
    for (auto* attribute = ippFirstAttribute(response.get()); attribute != nullptr;
         attribute = ippNextAttribute(response.get()))
        if (ippGetGroupTag(attribute) == IPP_TAG_PRINTER && ippGetName(attribute) != nullptr)
            all[ippGetName(attribute)] = valuesOf(attribute);
    return all;
}

std::string PrivateScheduler::attribute(const std::string& queue, const std::string& name) const {
    const auto all = attributes(queue);
    const auto found = all.find(name);
    return found == all.end() || found->second.empty() ? "" : found->second.front();
}

std::string PrivateScheduler::ppd(const std::string& queue) const {
    return readFile(folder_ / "etc/ppd" / (queue + ".ppd"));
}

void PrivateScheduler::addQueue(const std::string& name, const std::string& deviceURI,
                                std::string_view ppd) const {
    IppPtr message = newRequest(IPP_OP_CUPS_ADD_MODIFY_PRINTER, name);
    auto* ipp = message.get();
    ippAddString(ipp, IPP_TAG_PRINTER, IPP_TAG_URI, "device-uri", nullptr, deviceURI.c_str());
    ippAddInteger(ipp, IPP_TAG_PRINTER, IPP_TAG_ENUM, "printer-state", IPP_PSTATE_IDLE);
    ippAddBoolean(ipp, IPP_TAG_PRINTER, "printer-is-accepting-jobs", 1);
    const TemporaryFolder upload;
    const auto file = upload.write("queue.ppd", ppd);
    requireSuccess(std::move(message), "/admin/", ppd.empty() ? nullptr : file.c_str());
}

void PrivateScheduler::deleteQueue(const std::string& name) const {
    requireSuccess(newRequest(IPP_OP_CUPS_DELETE_PRINTER, name), "/admin/");
}

void PrivateScheduler::setDefault(const std::string& name) const {
    requireSuccess(newRequest(IPP_OP_CUPS_SET_DEFAULT, name), "/admin/");
}

int PrivateScheduler::print(const std::string& queue, const fs::path& file,
                            const std::vector<std::string>& options) const {
    std::vector<std::string> arguments{"lp", "-d", queue};
    for (const auto& option : options)
        arguments.insert(arguments.end(), {"-o", option});
    arguments.push_back(file.has_parent_path() ? file : testDocument(file.string()));
    auto environment = this->environment();
    environment["LC_ALL"] = "C";
    const auto run = runProgram(arguments, {.environment = environment});
    // "request id is QUEUE-7 (1 file(s))"
    const std::string before = "request id is " + queue + "-";
    if (run.exitStatus != 0 || !run.standardOutput.starts_with(before))
        throw std::runtime_error("lp: " + run.standardOutput + run.standardError);
    return std::stoi(run.standardOutput.substr(before.size()));
}

fs::path PrivateScheduler::sinkFile(const std::string& queue, int job) const {
    return folder_ / "spool/tmp" / ("sink-" + queue + "-" + std::to_string(job));
}

bool PrivateScheduler::appears(const fs::path& file, std::chrono::milliseconds limit) {
    return comesTrue([&] { return fs::exists(file); }, limit);
}

std::string PrivateScheduler::errorLog() const {
    return readFile(folder_ / "log/error_log");
}

std::string PrivateScheduler::accessLog() const {
    return readFile(folder_ / "log/access_log");
}

void PrivateScheduler::stop() {
    program_->end();
}

void PrivateScheduler::kill() {
    program_->signal(SIGKILL);
    program_->waitUntilEnded(kStartLimit);
}

void PrivateScheduler::suspend() {
    program_->signal(SIGSTOP);
}

void PrivateScheduler::resume() {
    program_->signal(SIGCONT);
}

UseScheduler::UseScheduler(const PrivateScheduler& scheduler) : UseScheduler(scheduler.address()) {
    setenv("CUPS_SERVERROOT", (scheduler.folder() / "etc").c_str(), 1);
}

UseScheduler::UseScheduler(const std::string& address) {
    setenv("CUPS_SERVER", address.c_str(), 1);
    cupsSetServer(address.c_str());
}

UseScheduler::~UseScheduler() {
    unsetenv("CUPS_SERVER");
    unsetenv("CUPS_SERVERROOT");
    cupsSetServer(nullptr);
}

}  // namespace ventras
