#include "drivers/PPDMatching.h"

#include <algorithm>
#include <array>
#include <iterator>

#include "deviceid/PMStringAdditions.h"
#include "deviceid/TextScan.h"

namespace ventras {
namespace {

/// The text between surrounding parentheses; absent without them, or with nothing between.
DeviceToMatch::Text withoutParentheses(const DeviceToMatch::Text& text) {
    if (!text || text->size() < 3 || text->front() != '(' || text->back() != ')')
        return std::nullopt;
    return text->substr(1, text->size() - 2);
}

template <typename Function>
DeviceToMatch::Text applied(Function function, const DeviceToMatch::Text& deviceID) {
    return deviceID ? DeviceToMatch::Text(function(*deviceID)) : std::nullopt;
}

void add(FoldedTexts& texts, std::initializer_list<const DeviceToMatch::Text*> wanted) {
    for (const auto* text : wanted)
        if (*text)
            texts.add(**text);
}

constexpr bool endsWord(char c) {
    return c == ' ' || c == '(';
}

/// Words that are found as they stand: ASCII ones, but not the "HP" that may have replaced the maker's full
/// name.
bool isTelling(std::string_view word) {
    return !word.empty() && !TextScan::equalsIgnoringCase(word, "hp") &&
           std::ranges::all_of(word, [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

/// What must stand in every device ID whose product or model is equal to a text. Both are cut out of the
/// device ID, where a value ends before ";", or are put together from two values, "(make model)".
Telltale telltaleOf(std::string_view text) {
    if (text.ends_with(')'))
        text.remove_suffix(1);

    Telltale telltale;
    for (auto begin = text.begin(); begin != text.end();) {
        const auto end = std::find_if(begin, text.end(), endsWord);
        if (const std::string_view word(begin, end); isTelling(word)) {
            telltale.words.emplace_back(word);
            if (end == text.end())
                telltale.lastWord = telltale.words.back();
        }
        begin = end == text.end() ? end : std::next(end);
    }
    std::stable_partition(telltale.words.begin(), telltale.words.end(),
                          [](const SoughtWord& word) { return word.isRare(); });
    return telltale;
}

/// Whether the word occurs close before the end of a value: only the last character of a product, a
/// parenthesis as a rule, may stand between.
bool endsAValue(std::string_view deviceID, const SoughtWord& word) {
    constexpr std::size_t kLongestCharacter = 4;
    for (auto at = word.findIn(deviceID); at != std::string_view::npos; at = word.findIn(deviceID)) {
        deviceID.remove_prefix(at + word.size());
        if (deviceID.size() <= kLongestCharacter || deviceID.find(';') <= kLongestCharacter)
            return true;
    }
    return false;
}

std::vector<Telltale> telltalesOf(const FoldedTexts& texts) {
    std::vector<Telltale> telltales;
    for (const auto& text : texts.all())
        telltales.push_back(telltaleOf(text));
    return telltales;
}

/// Most records are turned away faster than the processor gets hold of their texts, which lie anywhere in
/// memory: it is told a few records ahead.
void fetchTexts(const PPDRecord& record) {
    if (!record.product.empty())
        __builtin_prefetch(record.product.data());
    for (const auto* text : {&record.deviceID, &record.name, &record.makeAndModel})
        if (*text)
            __builtin_prefetch((*text)->data());
}

/// Sorts those matches of one kind that have a driver name among the places that they hold; the others, which
/// compare equal to everything, stay where they are.
void sortNamed(std::span<PPDMatch> matches, std::span<const PPDRecord> list) {
    struct Named {
        std::string name;
        PPDMatch match;
    };
    std::vector<Named> named;
    const auto nameOf = [&](const PPDMatch& match) -> const auto& {
        return list[match.index].driverName;
    };
    for (const auto& match : matches)
        if (nameOf(match))
            named.push_back({folded(*nameOf(match)), match});

    std::ranges::stable_sort(named, {}, &Named::name);
    auto next = named.begin();
    for (auto& match : matches)
        if (nameOf(match))
            match = (next++)->match;
}

void sortByDriverOrder(std::vector<PPDMatch>& matches, std::span<const PPDRecord> list) {
    std::ranges::stable_sort(matches, {}, &PPDMatch::kind);
    for (auto begin = matches.begin(); begin != matches.end();) {
        const auto end =
            std::find_if(begin, matches.end(), [&](const auto& match) { return match.kind != begin->kind; });
        sortNamed(std::span(begin, end), list);
        begin = end;
    }
}

}  // namespace

std::string_view describe(MatchReason reason) {
    static constexpr std::array<std::string_view, 7> kTexts{
        "its product is equal",
        "its product is equal with spaces for slashes",
        "the product in its device ID is equal",
        "the model in its device ID is equal",
        "its name is equal",
        "its name begins with the device's",
        "its model number is equal",
    };
    return kTexts.at(static_cast<std::size_t>(reason));
}

DeviceToMatch::DeviceToMatch(const Text& deviceID, const Text& model, const Text& product) {
    const auto bareProduct = withoutParentheses(product);
    const auto idProduct = applied(PMStringAdditions::product, deviceID);
    const auto bareIDProduct = withoutParentheses(idProduct);
    const auto idModel = deviceID ? PMStringAdditions::model(*deviceID) : std::nullopt;

    add(products_, {&product, &bareProduct, &idProduct, &bareIDProduct, &idModel, &model});
    add(wholeTexts_, {&product, &idProduct, &idModel, &model});
    add(models_, {&model, &idModel});
    add(nameBeginnings_, {&model, &idModel, &bareIDProduct, &bareProduct});
    telltales_ = telltalesOf(wholeTexts_);
}

std::optional<MatchReason> DeviceToMatch::match(const PPDRecord& record) const {
    if (const auto reason = matchProducts(record))
        return reason;
    if (const auto reason = matchDeviceID(record))
        return reason;
    if (const auto reason = matchName(record))
        return reason;
    if (record.modelNumber && wholeTexts_.contain(*record.modelNumber))
        return MatchReason::modelNumber;
    return std::nullopt;
}

std::optional<MatchReason> DeviceToMatch::matchProducts(const PPDRecord& record) const {
    for (const auto& product : record.product) {
        if (products_.contain(product))
            return MatchReason::product;
        if (products_.containWithSpacesForSlashes(product))
            return MatchReason::productWithSlashes;
    }
    return std::nullopt;
}

std::optional<MatchReason> DeviceToMatch::matchDeviceID(const PPDRecord& record) const {
    // Reading a device ID makes copies, and hardly any of a catalogue's can fit.
    if (!record.deviceID || !mayOccurIn(*record.deviceID))
        return std::nullopt;
    if (wholeTexts_.contain(PMStringAdditions::product(*record.deviceID)))
        return MatchReason::deviceIDProduct;
    const auto model = PMStringAdditions::model(*record.deviceID);
    if (model && models_.contain(*model))
        return MatchReason::deviceIDModel;
    return std::nullopt;
}

std::optional<MatchReason> DeviceToMatch::matchName(const PPDRecord& record) const {
    if (!record.makeAndModel)
        return std::nullopt;
    if (models_.contain(*record.makeAndModel))
        return MatchReason::makeAndModel;
    if (record.name && record.name->starts_with("gutenprint") && nameBeginnings_.begin(*record.makeAndModel))
        return MatchReason::gutenprintName;
    return std::nullopt;
}

bool DeviceToMatch::mayOccurIn(std::string_view deviceID) const {
    const auto occurs = [deviceID](const SoughtWord& word) {
        return word.findIn(deviceID) != std::string_view::npos;
    };
    return std::ranges::any_of(telltales_, [&](const Telltale& telltale) {
        return std::ranges::all_of(telltale.words, occurs) &&
               (!telltale.lastWord || endsAValue(deviceID, *telltale.lastWord));
    });
}

std::vector<PPDMatch> matchingDrivers(const DeviceToMatch& device, std::span<const PPDRecord> list) {
    constexpr std::size_t kAhead = 6;
    std::vector<PPDMatch> matches;
    for (std::size_t i = 0; i < list.size(); ++i) {
        if (i + kAhead < list.size())
            fetchTexts(list[i + kAhead]);
        if (const auto reason = device.match(list[i]))
            matches.push_back({i, PPDKind::of(list[i]), *reason});
    }
    sortByDriverOrder(matches, list);
    return matches;
}

}  // namespace ventras
