#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace ventras {

/// A word that is looked for in thousands of texts, ignoring the case of ASCII letters. Immutable, so any
/// thread may ask.
class SoughtWord {
public:
    /// @param word ASCII, not empty
    explicit SoughtWord(std::string_view word);

    std::size_t size() const { return word_.size(); }

    /// Whether few texts can be expected to have it: model numbers, not the names of makers and series.
    bool isRare() const;

    /// Where it first occurs; `npos` when it does not.
    std::size_t findIn(std::string_view text) const;

private:
    std::string word_;    ///< lower-cased
    std::size_t anchor_;  ///< where its rarest character stands, a digit if it has one
};

}  // namespace ventras
