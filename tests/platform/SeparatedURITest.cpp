#include "platform/SeparatedURI.h"

#include <gtest/gtest.h>

namespace ventras {
namespace {

struct Case {
    const char* uri;
    SeparatedURI parts;
};

const Case kCases[] = {
    {"ipp://printer.example/ipp/print",
     {HTTP_URI_STATUS_OK, "ipp", "", "printer.example", "/ipp/print", 631}},
    {"ipps://me@printer.example:8631/ipp/faxout?waitjob=false",
     {HTTP_URI_STATUS_OK, "ipps", "me", "printer.example", "/ipp/faxout?waitjob=false", 8631}},
    {"ippusb://Acme%20Laser._ipp._tcp.local./?uuid=1",
     {HTTP_URI_STATUS_UNKNOWN_SCHEME, "ippusb", "", "Acme Laser._ipp._tcp.local.", "/?uuid=1", 0}},
    {"file:///tmp/a%20b.ppd", {HTTP_URI_STATUS_OK, "file", "", "", "/tmp/a b.ppd", 0}},
    {"ipp://printer.example", {HTTP_URI_STATUS_MISSING_RESOURCE, "ipp", "", "printer.example", "/", 631}},
};

TEST(SeparatedURI, HasEachPartDecoded) {
    for (const auto& [uri, parts] : kCases) {
        const auto found = SeparatedURI::from(uri);
        EXPECT_EQ(found.status, parts.status) << uri;
        EXPECT_EQ(found.scheme, parts.scheme) << uri;
        EXPECT_EQ(found.user, parts.user) << uri;
        EXPECT_EQ(found.host, parts.host) << uri;
        EXPECT_EQ(found.resource, parts.resource) << uri;
        EXPECT_EQ(found.port, parts.port) << uri;
    }
}

TEST(SeparatedURI, OfWhatIsNoURIIsAFailure) {
    for (const auto* uri : {"", "printer", "ipp://printer:port/", "ipp://[::1/", "ipp://printer/%zz"})
        EXPECT_LT(SeparatedURI::from(uri).status, HTTP_URI_STATUS_OK) << uri;
}

TEST(SeparatedURI, IsCutWhereAPartIsTooLong) {
    const std::string longest(1023, 'x');
    const auto parts =
        SeparatedURI::from("ipp://" + longest + "user@" + longest + "host:8631/" + longest + "resource");
    EXPECT_EQ(parts.user, longest);
    EXPECT_EQ(parts.host, longest);
    EXPECT_EQ(parts.resource, ("/" + longest).substr(0, longest.size()));
    EXPECT_EQ(parts.port, 8631);
}

}  // namespace
}  // namespace ventras
