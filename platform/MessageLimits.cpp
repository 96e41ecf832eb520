#include "platform/MessageLimits.h"

#include <cups/ipp.h>

#include <algorithm>

namespace ventras {

bool MessageLimits::follow(std::span<const std::uint8_t> bytes) {
    while (!bytes.empty() && field_ != Field::End) {
        const auto part = bytes.first(std::min(missing_, bytes.size()));
        if (field_ == Field::Tag || field_ == Field::NameLength || field_ == Field::ValueLength)
            for (const auto byte : part)
                number_ = number_ << 8U | byte;
        missing_ -= part.size();
        bytes = bytes.subspan(part.size());
        if (missing_ == 0 && !finishField())
            return false;
    }
    return true;
}

bool MessageLimits::finishField() {
    switch (field_) {
        case Field::Tag:
            return take(number_);
        case Field::NameLength:
            return number_ == 0 ? expect(Field::ValueLength, 2) : expect(Field::Name, number_);
        case Field::Name:
            return expect(Field::ValueLength, 2);
        case Field::ValueLength:
            return number_ == 0 ? expect(Field::Tag, 1) : expect(Field::Value, number_);
        case Field::Header:
        case Field::Value:
        case Field::End:
            break;
    }
    return expect(Field::Tag, 1);
}

bool MessageLimits::take(std::uint32_t tag) {
    if (tag == IPP_TAG_END)
        return expect(Field::End, 0);
    if (tag < IPP_TAG_UNSUPPORTED_VALUE)
        return ++groups_ <= kMostGroups && expect(Field::Tag, 1);
    if (tag == IPP_TAG_EXTENSION)
        return false;
    if (tag == IPP_TAG_BEGIN_COLLECTION)
        ++depth_;
    else if (tag == IPP_TAG_END_COLLECTION)
        --depth_;
    ++values_;
    return depth_ >= 0 && depth_ <= kDeepest && values_ <= kMostValues && expect(Field::NameLength, 2);
}

bool MessageLimits::expect(Field field, std::size_t length) {
    field_ = field;
    missing_ = length;
    number_ = 0;
    return true;
}

}  // namespace ventras
