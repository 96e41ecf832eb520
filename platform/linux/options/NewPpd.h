#pragma once

#include <optional>
#include <string>
#include <utility>

#include "platform/TemporaryFile.h"

namespace ventras {

/// A PPD that auto-selection made, until its caller takes it over; one that nobody takes is deleted. One
/// thread at a time.
class NewPpd {
public:
    void reset() { *this = NewPpd{}; }
    void hold(TemporaryFile file) { file_ = std::move(file); }

    /// The file's "file://" URL; absent when there is none. Once asked for, the file is the caller's to
    /// delete.
    std::optional<std::string> take() const;

private:
    mutable std::optional<TemporaryFile> file_;
    mutable std::optional<std::string> url_;
};

}  // namespace ventras
