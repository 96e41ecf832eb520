#include "platform/ResponseBody.h"

#include <algorithm>
#include <cstring>

#include "platform/FileContent.h"

namespace ventras {

bool ResponseBody::refill() {
    const auto length = httpRead2(connection_, block_.data(), block_.size());
    begin_ = 0;
    end_ = length > 0 ? static_cast<std::size_t>(length) : 0;
    received_ += end_;
    return end_ > 0;
}

ssize_t ResponseBody::give(void* self, ipp_uchar_t* bytes, std::size_t count) {
    auto& body = *static_cast<ResponseBody*>(self);
    std::size_t given = 0;
    while (given < count) {
        if (body.begin_ == body.end_ && (body.received_ > kLargestMessage || !body.refill()))
            return -1;
        const auto taken = std::min(count - given, body.end_ - body.begin_);
        std::memcpy(bytes + given, body.block_.data() + body.begin_, taken);
        body.begin_ += taken;
        given += taken;
    }
    return body.limits_.follow({bytes, given}) ? static_cast<ssize_t>(given) : -1;
}

IppPtr ResponseBody::readMessage() {
    IppPtr message{ippNew()};
    return ippReadIO(this, give, 1, nullptr, message.get()) == IPP_STATE_DATA ? std::move(message) : nullptr;
}

bool ResponseBody::copyDocument(int file) {
    do {
        if (!writeAll(file, {block_.data() + begin_, end_ - begin_}))
            return false;
    } while (refill());
    return httpGetState(connection_) == HTTP_STATE_WAITING;
}

}  // namespace ventras
