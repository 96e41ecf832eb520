#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace ventras {

/// Text for comparing without regard to case, character by character in Unicode; bytes that are no UTF-8
/// stand for themselves. Two spellings of different length in UTF-8 count as different.
std::string folded(std::string_view text);

/// A handful of texts that thousands of others are compared with, without a copy of any of those.
/// Empty texts are left out: they are equal to nothing and begin nothing. Immutable texts are safe on any
/// thread.
class FoldedTexts {
public:
    FoldedTexts() = default;

    void add(std::string_view text);

    /// Whether one of the texts is equal to this one.
    bool contain(std::string_view text) const;

    /// The same for this text with a space in place of every "/".
    bool containWithSpacesForSlashes(std::string_view text) const;

    /// Whether one of the texts stands at this one's beginning.
    bool begin(std::string_view text) const;

    const std::vector<std::string>& all() const { return texts_; }

private:
    bool haveLength(std::size_t length) const;

    std::vector<std::string> texts_;
    std::uint64_t lengths_ = 0;  ///< one bit a length, so that most texts are turned away without being read
};

}  // namespace ventras
