#include "platform/linux/options/NewPpd.h"

#include <cups/http.h>

#include <array>

namespace ventras {

std::optional<std::string> NewPpd::take() const {
    if (file_) {
        std::array<char, HTTP_MAX_URI> url{};
        httpAssembleURI(HTTP_URI_CODING_ALL, url.data(), static_cast<int>(url.size()), "file", nullptr,
                        nullptr, 0, file_->release().c_str());
        url_ = url.data();
        file_.reset();
    }
    return url_;
}

}  // namespace ventras
