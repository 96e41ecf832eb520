#pragma once

#include <optional>
#include <string>
#include <vector>

#include "drivers/TextEncoding.h"
#include "platform/Handles.h"

namespace ventras {

/// The keyword values of an open PPD (Adobe PPD 4.3), read by libcups, which finds keywords ignoring case.
///
/// It names the PPD and does not own it. libcups keeps its place in the PPD, so one thread at a time.
class PPDValues {
public:
    explicit PPDValues(ppd_file_t* ppd);

    /// The encoding that the PPD names.
    TextEncoding encoding() const { return encoding_; }

    /// A keyword's first value in the PPD's own encoding; absent without the keyword, or when it does not
    /// decode.
    std::optional<std::string> text(const char* keyword) const;

    /// A keyword's first value in UTF-8, whatever the PPD's encoding.
    std::optional<std::string> utf8(const char* keyword) const;

    /// A keyword's first value as the file holds it.
    std::optional<std::string> bytes(const char* keyword) const;

    /// All values of a keyword as the file holds them, in its order.
    std::vector<std::string> allBytes(const char* keyword) const;

private:
    ppd_file_t* ppd_;
    TextEncoding encoding_;
};

}  // namespace ventras
