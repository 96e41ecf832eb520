#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// A condition over a set of tags, e.g. `(("a" IN tags) OR ("b" in tags)) AND ("c" IN tags)`.
///
/// Texts stand in double quotes, without escapes; the words AND, OR and IN are read in any case; AND binds
/// closer than OR. Immutable; any thread may evaluate.
class TagPredicate {
public:
    /// Reads a condition. @return absent when the text is not exactly one condition, or nests too deeply.
    static std::optional<TagPredicate> parse(std::string_view text);

    TagPredicate(TagPredicate&&) noexcept;
    TagPredicate& operator=(TagPredicate&&) noexcept;
    ~TagPredicate();

    /// Whether the condition holds. @param hasTag answers whether the set holds a tag.
    bool holds(const std::function<bool(const std::string& tag)>& hasTag) const;

private:
    struct Node;
    class Parser;

    explicit TagPredicate(std::unique_ptr<const Node> root);

    std::unique_ptr<const Node> root_;
};

}  // namespace ventras
