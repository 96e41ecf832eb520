#pragma once

#include <chrono>
#include <cstdint>
#include <filesystem>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {

/// What a virtual printer is to be like.
struct VirtualPrinterOptions {
    std::string name = "Virtual Printer";
    std::string make = "Acme";
    std::string model = "Laser";
    std::string location = "Lab 2";
    bool duplex = false;
    bool colour = false;
    std::string formats = "application/pdf,image/urf";
    std::vector<std::string> moreArguments = {};  ///< for ippeveprinter itself
};

/// A document that a virtual printer received completely.
struct ReceivedDocument {
    std::filesystem::path file;
    std::string contentType;  ///< told from its first bytes: "image/urf", "application/pdf", or empty
};

/// A real IPP printer on loopback (ippeveprinter), reachable over IPv4 and IPv6, with and without TLS on the
/// same port, that keeps what it is sent. One thread at a time.
class VirtualPrinter {
public:
    /// Returns when the printer answers.
    explicit VirtualPrinter(VirtualPrinterOptions options = {});
    VirtualPrinter(const VirtualPrinter&) = delete;
    VirtualPrinter& operator=(const VirtualPrinter&) = delete;
    ~VirtualPrinter();

    std::uint16_t port() const { return port_; }

    /// "SCHEME://HOST:PORT/ipp/print".
    std::string uri(std::string_view scheme = "ipp", std::string_view host = "localhost") const;

    /// The documents that arrived, in order.
    std::vector<ReceivedDocument> received() const;

    /// Whether at least `count` documents arrive in time.
    bool receivedWithin(std::chrono::milliseconds limit, std::size_t count = 1) const;

    /// What it has written about its work.
    std::string log() const { return program_->standardError(); }

    /// Switches it off.
    void stop() { program_->end(); }

private:
    std::vector<std::string> arguments() const;
    bool start();

    VirtualPrinterOptions options_;
    TemporaryFolder folder_;
    std::uint16_t port_ = 0;
    std::unique_ptr<RunningProgram> program_;
};

}  // namespace ventras
