#pragma once

#include <csignal>
#include <memory>
#include <optional>
#include <string>

#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/responder/ServicePublisher.h"

namespace ventras {

/// A real DNS-SD responder (Avahi) on a message bus and in a network of its own, which the program's main()
/// has moved into; gone with its owner. This process and every program that it starts use it. One at a time,
/// and one thread at a time.
class PrivateResponder {
public:
    /// Returns when the responder answers.
    /// @throw std::runtime_error, with what it wrote, when it does not.
    PrivateResponder();
    PrivateResponder(const PrivateResponder&) = delete;
    PrivateResponder& operator=(const PrivateResponder&) = delete;
    ~PrivateResponder();

    void publish(const PublishedService& service) { publisher_->publish(service); }
    void withdrawAll() { publisher_->withdrawAll(); }

    /// Freezes the responder: questions are taken and never answered.
    void suspend() { daemon_->signal(SIGSTOP); }
    void resume() { daemon_->signal(SIGCONT); }

    /// Ends the responder, or the bus that it is reached by, without a word.
    void kill();
    void killBus();

    /// Everything that the responder wrote.
    std::string log() const { return daemon_->standardError(); }

private:
    void startBus();
    void startDaemon();

    TemporaryFolder folder_;
    std::unique_ptr<RunningProgram> bus_;
    std::unique_ptr<RunningProgram> daemon_;
    std::unique_ptr<ServicePublisher> publisher_;
};

}  // namespace ventras
