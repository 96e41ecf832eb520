#include "tests/kernel/UsbipPeer.h"

#include <endian.h>
#include <gmock/gmock.h>
#include <poll.h>
#include <sys/socket.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;

constexpr std::uint8_t kOutEndpoint = 1;
constexpr std::uint8_t kInEndpoint = 2;

/// An answer of either kind; `status` is a negative errno.
struct Answer {
    std::uint32_t command = 0;
    std::uint32_t sequence = 0;
    int status = 0;
    std::uint32_t length = 0;
    std::string data{};
};

/// The test has the kernel's end of the connection.
class Usbip : public testing::Test {
protected:
    using Words = std::array<std::uint32_t, 10>;
    using Setup = std::array<std::uint8_t, 8>;

    Usbip() {
        std::array<int, 2> ends{};
        socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends.data());
        kernel_ = FileDescriptor(ends[0]);
        peer_ = std::make_unique<UsbipPeer>(FileDescriptor(ends[1]), printer_);
    }

    void send(Words words, const Setup& setup = {}, std::string_view data = {}) const {
        for (auto& word : words)
            word = htobe32(word);
        std::string bytes(reinterpret_cast<const char*>(words.data()), sizeof words);
        bytes.append(setup.begin(), setup.end()).append(data);
        ASSERT_EQ(write(kernel_.get(), bytes.data(), bytes.size()), static_cast<ssize_t>(bytes.size()));
    }

    void getDeviceID(std::uint32_t sequence, std::uint8_t length) const {
        send({1, sequence, 0x10002, 1, 0, 0, length}, {0xA1, 0, 0, 0, 0, 0, length, 0});
    }
    void bulkIn(std::uint32_t sequence, std::uint32_t length) const {
        send({1, sequence, 0x10002, 1, kInEndpoint, 0, length});
    }
    void bulkOut(std::uint32_t sequence, std::string_view data) const {
        send({1, sequence, 0x10002, 0, kOutEndpoint, 0, static_cast<std::uint32_t>(data.size())}, {}, data);
    }
    void takeBack(std::uint32_t sequence, std::uint32_t victim) const {
        send({2, sequence, 0x10002, 0, 0, victim});
    }

    /// @param isIn whether the answer's data follow it
    std::optional<Answer> answer(bool isIn, std::chrono::milliseconds limit = 5s) const {
        pollfd ready{kernel_.get(), POLLIN, 0};
        std::array<std::uint32_t, 12> words{};
        if (poll(&ready, 1, static_cast<int>(limit.count())) != 1 ||
            recv(kernel_.get(), words.data(), sizeof words, MSG_WAITALL) != sizeof words)
            return std::nullopt;
        Answer answer{be32toh(words[0]), be32toh(words[1]), static_cast<int>(be32toh(words[5])),
                      be32toh(words[6])};
        answer.data.resize(isIn ? answer.length : 0);
        if (!answer.data.empty())
            recv(kernel_.get(), answer.data.data(), answer.data.size(), MSG_WAITALL);
        return answer;
    }

    void expectHungUp() const {
        char byte = 0;
        pollfd ready{kernel_.get(), POLLIN, 0};
        ASSERT_EQ(poll(&ready, 1, 5000), 1);
        EXPECT_EQ(recv(kernel_.get(), &byte, 1, 0), 0);
    }

    FakePrinter printer_{{.deviceID = "MFG:A;MDL:B;"}};
    FileDescriptor kernel_;
    std::unique_ptr<UsbipPeer> peer_;
};

TEST_F(Usbip, AnswersAControlRequest) {
    getDeviceID(7, 255);
    const auto given = answer(true);
    ASSERT_TRUE(given);
    EXPECT_EQ(given->command, 3U);
    EXPECT_EQ(given->sequence, 7U);
    EXPECT_EQ(given->status, 0);
    EXPECT_EQ(given->data, "\0\x0e"s + "MFG:A;MDL:B;");
}

TEST_F(Usbip, TellsAStall) {
    printer_.fault = [](const UsbSetup&) { return std::optional{UsbAnswer::stall()}; };
    getDeviceID(1, 255);
    const auto given = answer(true);
    ASSERT_TRUE(given);
    EXPECT_EQ(given->status, -EPIPE);
    EXPECT_EQ(given->length, 0U);
}

// More than it asked for would bring the kernel down.
TEST_F(Usbip, SendsNoMoreThanWasAskedFor) {
    printer_.fault = [](const UsbSetup&) { return std::optional{UsbAnswer{0, UsbBytes(300, 'x'), {}}}; };
    getDeviceID(1, 8);
    const auto given = answer(true);
    ASSERT_TRUE(given);
    EXPECT_EQ(given->status, -EOVERFLOW);
    EXPECT_LE(given->length, 8U);
    EXPECT_FALSE(answer(true, 50ms)) << "bytes that belong to nothing";
}

TEST_F(Usbip, MovesBulkDataBothWays) {
    printer_.interpreter = [](std::string_view data) {
        return data.empty() ? ""s : "echo " + std::string(data);
    };
    bulkOut(1, "hello");
    const auto taken = answer(false);
    ASSERT_TRUE(taken);
    EXPECT_EQ(taken->status, 0);
    EXPECT_EQ(taken->length, 5U);
    EXPECT_EQ(printer_.received(), "hello");
    bulkIn(2, 6);
    EXPECT_EQ(answer(true).value_or(Answer{}).data, "echo h");
    bulkIn(3, 512);
    EXPECT_EQ(answer(true).value_or(Answer{}).data, "ello");
}

TEST_F(Usbip, KeepsABulkInUntilThePrinterHasSomethingToSay) {
    bulkIn(1, 512);
    EXPECT_FALSE(answer(true, 50ms));
    printer_.interpreter = [](std::string_view) { return "at last"s; };
    EXPECT_EQ(answer(true).value_or(Answer{}).data, "at last");
}

TEST_F(Usbip, AnswersOthersWhileOneIsLate) {
    printer_.fault = [count = 0](const UsbSetup&) mutable {
        return ++count == 1 ? std::optional{UsbAnswer{0, {'l'}, 300ms}} : std::nullopt;
    };
    getDeviceID(1, 255);
    getDeviceID(2, 255);
    EXPECT_EQ(answer(true).value_or(Answer{}).sequence, 2U);
    EXPECT_EQ(answer(true).value_or(Answer{}).data, "l");
}

TEST_F(Usbip, KeepsASilentTransferUntilItIsTakenBack) {
    printer_.fault = [](const UsbSetup&) { return std::optional{UsbAnswer::silence()}; };
    getDeviceID(1, 255);
    EXPECT_FALSE(answer(true, 50ms));
    takeBack(2, 1);
    const auto given = answer(false);
    ASSERT_TRUE(given);
    EXPECT_EQ(given->command, 4U);
    EXPECT_EQ(given->sequence, 2U);
    EXPECT_EQ(given->status, -ECONNRESET);
    EXPECT_EQ(peer_->takenBack(), 1);
}

TEST_F(Usbip, TellsThatATransferWasAnsweredBeforeItWasTakenBack) {
    getDeviceID(1, 255);
    ASSERT_TRUE(answer(true));
    takeBack(2, 1);
    const auto given = answer(false);
    ASSERT_TRUE(given);
    EXPECT_EQ(given->command, 4U);
    EXPECT_EQ(given->status, 0);
    EXPECT_EQ(peer_->takenBack(), 0);
}

TEST_F(Usbip, HangsUpAtItsEndWhateverIsPending) {
    bulkIn(1, 512);
    peer_.reset();
    expectHungUp();
}

TEST_F(Usbip, HangsUpOnARecordThatIsNone) {
    send({99});
    expectHungUp();
}

}  // namespace
}  // namespace ventras
