#include "agent/CommandLine.h"

#include <algorithm>
#include <array>
#include <cstddef>

namespace ventras {
namespace {

enum class Test { BeginsWith, Equals, EndsWith };

struct Rule {
    Test test;
    std::string_view pattern;
    ArgumentKind kind;
    std::size_t dropped;  // characters in front of the text
};

// The order counts: what begins like an earlier rule never reaches a later one. So "-d" is always the option
// of old and its second rule never holds, and a scanner may end in "--skerrow".
constexpr std::array kRules{
    Rule{Test::BeginsWith, "-b", ArgumentKind::Deprecated, 0},
    Rule{Test::BeginsWith, "-t", ArgumentKind::Deprecated, 0},
    Rule{Test::BeginsWith, "-d", ArgumentKind::Deprecated, 0},
    Rule{Test::BeginsWith, "-u", ArgumentKind::UsbLocation, 2},
    Rule{Test::BeginsWith, "--scanner", ArgumentKind::Scanner, 9},
    Rule{Test::BeginsWith, "-s", ArgumentKind::Scanner, 2},
    Rule{Test::Equals, "--download", ArgumentKind::NoDownload, 0},
    Rule{Test::Equals, "-d", ArgumentKind::NoDownload, 0},
    Rule{Test::EndsWith, "--skerrow", ArgumentKind::Skerrow, 0},
    Rule{Test::BeginsWith, "ippusb://", ArgumentKind::IppUsb, 9},
    Rule{Test::BeginsWith, "ipp://", ArgumentKind::NetworkURI, 0},
    Rule{Test::BeginsWith, "ipps://", ArgumentKind::NetworkURI, 0},
};

bool holds(const Rule& rule, std::string_view argument) {
    switch (rule.test) {
        case Test::BeginsWith:
            return argument.starts_with(rule.pattern);
        case Test::Equals:
            return argument == rule.pattern;
        case Test::EndsWith:
            return argument.ends_with(rule.pattern);
    }
    return false;
}

}  // namespace

Argument parseArgument(std::string_view argument) {
    const auto rule = std::ranges::find_if(kRules, [&](const Rule& each) { return holds(each, argument); });
    if (rule == kRules.end())
        return {ArgumentKind::Ignored, argument};
    return {rule->kind, argument.substr(rule->dropped)};
}

}  // namespace ventras
