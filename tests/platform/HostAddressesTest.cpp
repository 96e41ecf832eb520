#include "platform/HostAddresses.h"

#include <dlfcn.h>
#include <gmock/gmock.h>
#include <netdb.h>
#include <pthread.h>

#include <array>
#include <chrono>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "platform/IppConnection.h"

namespace {

using namespace std::chrono_literals;
using GetAddrInfo = decltype(&getaddrinfo);

constexpr std::string_view kUnservedName = "printer.unserved.example";
constexpr std::string_view kSlowName = "printer.slow.example";
constexpr auto kNameServersPatience = 12s;  // longer than ours

}  // namespace

// In place of the system's resolver: one name whose servers are dead, one whose servers take their time.
extern "C" int getaddrinfo(const char* name, const char* service, const addrinfo* hints, addrinfo** found) {
    static const auto resolver = reinterpret_cast<GetAddrInfo>(dlsym(RTLD_NEXT, "getaddrinfo"));
    const std::string_view wanted = name == nullptr ? "" : name;
    if (wanted == kUnservedName) {
        std::this_thread::sleep_for(kNameServersPatience);
        return EAI_AGAIN;
    }
    if (wanted == kSlowName) {
        std::this_thread::sleep_for(300ms);
        name = "127.0.0.1";
    }
    return resolver(name, service, hints, found);
}

namespace ventras {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using Clock = std::chrono::steady_clock;

std::vector<std::string> texts(const HostAddresses& addresses) {
    std::vector<std::string> texts;
    for (const auto* address = addresses.list.get(); address != nullptr; address = address->next) {
        std::array<char, 256> text{};
        auto copy = address->addr;
        texts.push_back(std::string(httpAddrString(&copy, text.data(), text.size())) + " " +
                        std::to_string(httpAddrPort(&copy)));
    }
    return texts;
}

TEST(HostAddresses, AreThoseThatAreWrittenAsNumbers) {
    EXPECT_THAT(texts(HostAddresses::find("127.0.0.2", 631, Deadline::after(1s))),
                ElementsAre("127.0.0.2 631"));
    EXPECT_THAT(texts(HostAddresses::find("::1", 8631, Deadline::after(1s))), ElementsAre("[v1.::1] 8631"));
}

TEST(HostAddresses, OfThisComputerAreBothOfItsLoopback) {
    for (const auto* name : {"localhost", "LocalHost"})
        EXPECT_THAT(texts(HostAddresses::find(name, 631, Deadline::after(1s))),
                    ElementsAre("[v1.::1] 631", "127.0.0.1 631"));
}

TEST(HostAddresses, MayBeThePathOfASocket) {
    const auto found = HostAddresses::find("/run/some/socket", 631, Deadline::after(1s));
    ASSERT_TRUE(found.list);
    EXPECT_EQ(std::string(found.list->addr.un.sun_path), "/run/some/socket");
    EXPECT_EQ(found.list->next, nullptr);
}

TEST(HostAddresses, AreNotAPathThatIsCutShort) {
    const auto found = HostAddresses::find("/" + std::string(200, 'x'), 631, Deadline::after(1s));
    EXPECT_FALSE(found.list);
    EXPECT_EQ(found.failure, "File name too long");
}

TEST(HostAddresses, AreWaitedForAWhile) {
    const auto found = HostAddresses::find(std::string(kSlowName), 631, Deadline::after(5s));
    EXPECT_THAT(texts(found), ElementsAre("127.0.0.1 631")) << found.failure;
}

TEST(HostAddresses, AreNotWaitedForBeyondTheDeadline) {
    const auto begin = Clock::now();
    const auto found = HostAddresses::find(std::string(kUnservedName), 631, Deadline::after(200ms));
    EXPECT_FALSE(found.list);
    EXPECT_THAT(found.failure, HasSubstr("name server"));
    EXPECT_LT(Clock::now() - begin, 1s);
}

// While one lives, every new thread wants a larger stack than there is memory for.
class NoMoreThreads {
public:
    NoMoreThreads() {
        pthread_getattr_default_np(&usual_);
        pthread_attr_t endless{};
        pthread_getattr_default_np(&endless);
        pthread_attr_setstacksize(&endless, std::size_t{1} << 47U);
        pthread_setattr_default_np(&endless);
        pthread_attr_destroy(&endless);
    }
    NoMoreThreads(const NoMoreThreads&) = delete;
    NoMoreThreads& operator=(const NoMoreThreads&) = delete;
    ~NoMoreThreads() {
        pthread_setattr_default_np(&usual_);
        pthread_attr_destroy(&usual_);
    }

private:
    pthread_attr_t usual_{};
};

TEST(HostAddresses, AreNotLookedUpWhereNoThreadCanBeStarted) {
    const NoMoreThreads limit;
    const auto found = HostAddresses::find(std::string(kSlowName), 631, Deadline::after(5s));
    EXPECT_FALSE(found.list);
    EXPECT_THAT(found.failure, HasSubstr("no thread can be started"));
}

TEST(HostAddresses, ThatNobodyTellsEndAConnectionWithinItsLimit) {
    const auto begin = Clock::now();
    const auto connection =
        IppConnection::toPrinter(std::string(kUnservedName), 631, HTTP_ENCRYPTION_IF_REQUESTED);
    EXPECT_FALSE(connection.connected());
    EXPECT_THAT(connection.failure(), HasSubstr("name server"));
    EXPECT_LT(Clock::now() - begin, IppConnection::kConnectLimit + 1s);
}

}  // namespace
}  // namespace ventras
