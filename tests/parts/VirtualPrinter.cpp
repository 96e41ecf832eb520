#include "tests/parts/VirtualPrinter.h"

#include <array>
#include <sstream>
#include <stdexcept>
#include <thread>
#include <utility>

#include "platform/Handles.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/Loopback.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using namespace std::string_view_literals;

constexpr auto kStartLimit = 20s;
constexpr auto kGlance = 2ms;
constexpr int kStartAttempts = 5;

constexpr std::array kSignatures{
    std::pair{"UNIRAST\0"sv, "image/urf"sv},
    std::pair{"RaS2"sv, "image/pwg-raster"sv},
    std::pair{"%PDF"sv, "application/pdf"sv},
};

std::string contentType(const fs::path& file) {
    const auto content = readFile(file);
    for (const auto& [signature, type] : kSignatures)
        if (content.starts_with(signature))
            return std::string(type);
    return {};
}

// Another program may have taken the port first, so a mere connection proves nothing.
bool answersAs(const std::string& name, std::uint16_t port) {
    constexpr int kMilliseconds = 2000;
    const HttpPtr http{httpConnect2("127.0.0.1", port, nullptr, AF_INET, HTTP_ENCRYPTION_IF_REQUESTED, 1,
                                    kMilliseconds, nullptr)};
    if (!http)
        return false;
    IppPtr request{ippNewRequest(IPP_OP_GET_PRINTER_ATTRIBUTES)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 "ipp://localhost/ipp/print");
    const IppPtr response{cupsDoRequest(http.get(), request.release(), "/ipp/print")};
    auto* reported = ippFindAttribute(response.get(), "printer-name", IPP_TAG_NAME);
    return reported != nullptr && name == ippGetString(reported, 0, nullptr);
}

}  // namespace

VirtualPrinter::VirtualPrinter(VirtualPrinterOptions options) : options_(std::move(options)) {
    fs::create_directories(folder_ / "documents");
    fs::create_directories(folder_ / "keys");
    // Runs when a document is complete; a printer without such a command pretends to print for many seconds.
    const auto script =
        folder_.write("done.sh", "#!/bin/sh\necho \"$1\" >> '" + (folder_ / "done").string() + "'\n");
    fs::permissions(script, fs::perms{0755});
    for (int attempt = 0; attempt < kStartAttempts; ++attempt)
        if (start())
            return;
    throw std::runtime_error("no virtual printer: " + log());
}

VirtualPrinter::~VirtualPrinter() = default;

std::vector<std::string> VirtualPrinter::arguments() const {
    std::vector<std::string> all{"ippeveprinter",
                                 "-r",
                                 "off",
                                 "-n",
                                 "localhost",
                                 "-k",
                                 "-p",
                                 std::to_string(port_),
                                 "-d",
                                 folder_ / "documents",
                                 "-K",
                                 folder_ / "keys",
                                 "-c",
                                 folder_ / "done.sh",
                                 "-M",
                                 options_.make,
                                 "-m",
                                 options_.model,
                                 "-l",
                                 options_.location,
                                 "-f",
                                 options_.formats,
                                 "-s",
                                 options_.colour ? "20,10" : "20"};
    if (options_.duplex)
        all.emplace_back("-2");
    all.insert(all.end(), options_.moreArguments.begin(), options_.moreArguments.end());
    all.push_back(options_.name);
    return all;
}

bool VirtualPrinter::start() {
    port_ = freePort();
    program_ = std::make_unique<RunningProgram>(
        arguments(),
        ProgramOptions{.environment = {{"LD_PRELOAD", VENTRAS_TEST_NO_AVAHI}, {"HOME", folder_.path()}}});
    const auto giveUp = std::chrono::steady_clock::now() + kStartLimit;
    while (std::chrono::steady_clock::now() < giveUp && program_->isRunning()) {
        if (answersAs(options_.name, port_))
            return true;
        std::this_thread::sleep_for(kGlance);
    }
    return false;
}

std::string VirtualPrinter::uri(std::string_view scheme, std::string_view host) const {
    std::string uri(scheme);
    return uri.append("://").append(host).append(":").append(std::to_string(port_)).append("/ipp/print");
}

std::vector<ReceivedDocument> VirtualPrinter::received() const {
    std::vector<ReceivedDocument> documents;
    std::istringstream done(readFile(folder_ / "done"));
    for (std::string line; std::getline(done, line);)
        documents.push_back({line, contentType(line)});
    return documents;
}

bool VirtualPrinter::receivedWithin(std::chrono::milliseconds limit, std::size_t count) const {
    return comesTrue([&] { return received().size() >= count; }, limit);
}

}  // namespace ventras
