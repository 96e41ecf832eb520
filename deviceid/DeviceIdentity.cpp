#include "deviceid/DeviceIdentity.h"

#include <array>
#include <span>

#include "deviceid/TextScan.h"

namespace ventras::DeviceIdentity {
namespace {

using namespace std::string_view_literals;

struct Rewrite {
    std::string_view pattern, replacement;
};

// Firmware that repeats the maker, or spells it out, would make long names and match no driver's product. The
// patterns begin with the parenthesis of a product text, which a name for people has not.
constexpr std::array kHPRewrites{
    Rewrite{"(Hewlett-Packard HP"sv, "(HP"sv},
    Rewrite{"(HP HP"sv, "(HP"sv},
    Rewrite{"(Hewlett-Packard "sv, "(HP "sv},
};
constexpr std::array kLexmarkRewrites{
    Rewrite{"(Lexmark International Lexmark "sv, "(Lexmark "sv},
    Rewrite{"(Lexmark International "sv, "(Lexmark "sv},
    Rewrite{"(Lexmark Lexmark "sv, "(Lexmark "sv},
};
constexpr std::array<std::span<const Rewrite>, 2> kRewriteGroups{kHPRewrites, kLexmarkRewrites};

constexpr std::size_t kParenthesised = 0;
constexpr std::size_t kPlain = 1;  // leaves the parenthesis out of pattern and replacement

void rewriteFirst(std::string& text, std::span<const Rewrite> group, std::size_t form) {
    for (const auto& [pattern, replacement] : group) {
        const auto wanted = pattern.substr(form);
        const auto found = TextScan::findIgnoringCase(text, wanted);
        if (found == std::string::npos)
            continue;
        text.replace(found, wanted.size(), replacement.substr(form));
        return;
    }
}

void shortenMaker(std::string& text, std::size_t form) {
    for (const auto group : kRewriteGroups)
        rewriteFirst(text, group, form);
}

// This family's firmware gives a product without a maker, "(deskjet 990c)".
bool isBareDeskjet(std::string_view product) {
    return product.starts_with("(deskjet");
}

bool isContinuation(char byte) {
    return (static_cast<unsigned char>(byte) & 0xC0U) == 0x80U;
}

std::string_view withoutFirstCharacter(std::string_view text) {
    std::size_t size = text.empty() ? 0 : 1;
    while (size < text.size() && isContinuation(text[size]))
        ++size;
    return text.substr(size);
}

std::string_view withoutLastCharacter(std::string_view text) {
    while (!text.empty() && isContinuation(text.back()))
        text.remove_suffix(1);
    return text.substr(0, text.empty() ? 0 : text.size() - 1);
}

std::string joined(std::string_view first, std::string_view second) {
    std::string text;
    text.reserve(first.size() + second.size() + 3);
    return text.append(first).append(" ").append(second);
}

View trimmed(View text) {
    return text ? View{TextScan::trimmed(*text)} : std::nullopt;
}

}  // namespace

View makeFromProduct(View product) {
    if (!product || product->empty())
        return std::nullopt;
    if (isBareDeskjet(*product))
        return "hp"sv;
    const auto space = product->find(' ');
    if (space == std::string_view::npos)
        return std::nullopt;
    return withoutFirstCharacter(product->substr(0, space));
}

View modelFromProduct(View product) {
    if (!product || product->empty())
        return std::nullopt;
    if (isBareDeskjet(*product))
        return product->substr(1);  // on purpose with the closing parenthesis
    const auto space = product->find(' ');
    if (space == std::string_view::npos)
        return std::nullopt;
    return withoutLastCharacter(product->substr(space + 1));
}

std::string normalizedProduct(View product, View make, View model) {
    std::string text;
    if (product)
        text = *product;
    else if (make && model)
        text.append("(").append(*make).append(" ").append(*model).append(")");
    shortenMaker(text, kParenthesised);
    return text;
}

std::optional<std::string> nameFrom(View make, View model) {
    make = trimmed(make);
    model = trimmed(model);
    if (make && model) {
        std::string name = TextScan::startsWith(*model, *make) ? std::string(*model) : joined(*make, *model);
        shortenMaker(name, kPlain);
        return name;
    }
    const auto only = model ? model : make;
    return only ? std::optional<std::string>{*only} : std::nullopt;
}

std::optional<std::string> scanIDFrom(View make, View model) {
    make = trimmed(make);
    model = trimmed(model);
    if (!make || !model)
        return std::nullopt;
    if (model->starts_with(*make) && model->substr(make->size()).starts_with(' '))
        model->remove_prefix(make->size() + 1);
    constexpr auto kMake = "MANUFACTURER:"sv;
    constexpr auto kModel = ";MODEL:"sv;
    std::string text;
    text.reserve(kMake.size() + make->size() + kModel.size() + model->size());
    return text.append(kMake).append(*make).append(kModel).append(*model);
}

// A bare "PS" in a list, as in "PCL,PS,PJL", is on purpose no PostScript: too many devices list it for a
// clone.
bool listsPostscript(View commandSet) {
    if (!commandSet)
        return true;
    if (TextScan::findIgnoringCase(*commandSet, "postscript") != std::string_view::npos)
        return true;
    TextScan::Components pieces{*commandSet, ";"};
    while (const auto piece = pieces.next())
        if (TextScan::equalsIgnoringCase(*piece, "ps") ||
            TextScan::findIgnoringCase(*piece, " ps ") != std::string_view::npos)
            return true;
    return false;
}

bool listsPCL(View commandSet) {
    return commandSet && TextScan::findIgnoringCase(*commandSet, "pcl") != std::string_view::npos;
}

}  // namespace ventras::DeviceIdentity
