#include "platform/TagPredicate.h"

#include <algorithm>
#include <utility>
#include <vector>

namespace ventras {
namespace {

// Conditions that are written by this system nest four deep; a device must not exhaust the stack.
constexpr int kDeepest = 32;

constexpr std::string_view kBlanks = " \t\r\n";

bool isLetter(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

bool isWord(std::string_view text, std::string_view upperCaseWord) {
    const auto upper = [](char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c; };
    return std::ranges::equal(text, upperCaseWord, {}, upper);
}

}  // namespace

struct TagPredicate::Node {
    enum class Kind { HasTag, And, Or };

    Kind kind;
    std::string tag;
    std::vector<std::unique_ptr<const Node>> parts;
};

// Recursive descent: a condition is ANDs joined by OR, those are terms joined by AND, and a term is a
// condition in parentheses or `"tag" IN tags`.
class TagPredicate::Parser {
public:
    explicit Parser(std::string_view text) : rest_(text) {}

    std::unique_ptr<const Node> whole() {
        auto node = condition(0);
        skipBlanks();
        return rest_.empty() ? std::move(node) : nullptr;
    }

private:
    using NodePtr = std::unique_ptr<const Node>;
    using Rule = NodePtr (Parser::*)(int);

    NodePtr condition(int depth) { return joined(Node::Kind::Or, "OR", &Parser::conjunction, depth); }
    NodePtr conjunction(int depth) { return joined(Node::Kind::And, "AND", &Parser::term, depth); }

    NodePtr joined(Node::Kind kind, std::string_view word, Rule part, int depth) {
        auto node = std::make_unique<Node>(Node{kind, {}, {}});
        do {
            auto next = (this->*part)(depth);
            if (!next)
                return nullptr;
            node->parts.push_back(std::move(next));
        } while (takeWord(word));
        return node;
    }

    NodePtr term(int depth) {
        if (depth > kDeepest)
            return nullptr;
        if (!take('('))
            return hasTag();
        auto node = condition(depth + 1);
        return take(')') ? std::move(node) : nullptr;
    }

    NodePtr hasTag() {
        const auto end = take('"') ? rest_.find('"') : std::string_view::npos;
        if (end == std::string_view::npos)
            return nullptr;
        auto node = std::make_unique<Node>(Node{Node::Kind::HasTag, std::string(rest_.substr(0, end)), {}});
        rest_.remove_prefix(end + 1);
        return takeWord("IN") && takeWord("TAGS") ? std::move(node) : nullptr;
    }

    void skipBlanks() { rest_.remove_prefix(std::min(rest_.find_first_not_of(kBlanks), rest_.size())); }

    bool take(char sign) {
        skipBlanks();
        if (!rest_.starts_with(sign))
            return false;
        rest_.remove_prefix(1);
        return true;
    }

    bool takeWord(std::string_view upperCaseWord) {
        skipBlanks();
        const auto end = std::ranges::find_if_not(rest_, isLetter);
        const auto word = rest_.substr(0, static_cast<std::size_t>(end - rest_.begin()));
        if (!isWord(word, upperCaseWord))
            return false;
        rest_.remove_prefix(word.size());
        return true;
    }

    std::string_view rest_;
};

std::optional<TagPredicate> TagPredicate::parse(std::string_view text) {
    auto root = Parser(text).whole();
    return root ? std::optional{TagPredicate(std::move(root))} : std::nullopt;
}

TagPredicate::TagPredicate(std::unique_ptr<const Node> root) : root_(std::move(root)) {}
TagPredicate::TagPredicate(TagPredicate&&) noexcept = default;
TagPredicate& TagPredicate::operator=(TagPredicate&&) noexcept = default;
TagPredicate::~TagPredicate() = default;

bool TagPredicate::holds(const std::function<bool(const std::string&)>& hasTag) const {
    struct Evaluation {
        const std::function<bool(const std::string&)>& hasTag;

        bool operator()(const std::unique_ptr<const Node>& node) const {
            switch (node->kind) {
                case Node::Kind::HasTag:
                    return hasTag(node->tag);
                case Node::Kind::And:
                    return std::ranges::all_of(node->parts, *this);
                case Node::Kind::Or:
                    return std::ranges::any_of(node->parts, *this);
            }
            return false;
        }
    };
    return Evaluation{hasTag}(root_);
}

}  // namespace ventras
