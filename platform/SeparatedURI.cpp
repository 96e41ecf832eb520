#include "platform/SeparatedURI.h"

#include <array>

namespace ventras {

SeparatedURI SeparatedURI::from(const std::string& uri) {
    std::array<char, HTTP_MAX_URI> scheme{}, user{}, host{}, resource{};
    constexpr auto kSize = static_cast<int>(HTTP_MAX_URI);
    int port = 0;
    const auto status = httpSeparateURI(HTTP_URI_CODING_ALL, uri.c_str(), scheme.data(), kSize, user.data(),
                                        kSize, host.data(), kSize, &port, resource.data(), kSize);
    return {status, scheme.data(), user.data(), host.data(), resource.data(), port};
}

}  // namespace ventras
