#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <random>
#include <vector>

#include "deviceid/PMDictionaryAdditions.h"
#include "deviceid/PMStringAdditions.h"

namespace ventras {
namespace {

using Text = std::optional<std::string>;

/// Random text out of fragments that make keys, indents and separators meet, with raw bytes between.
class DeviceIDSource {
public:
    std::string next() {
        std::string text;
        for (auto pieces = random_() % 12; pieces > 0; --pieces)
            text += piece();
        return text;
    }

    std::string piece() {
        static constexpr std::string_view kPieces[] = {
            "MFG:", "mdl:", "usb_MODEL:", "CMD:",     "ty:", "product:",   "(deskjet", "(HP ", "Scan",
            "SN:",  "DES",  "HP",         "Lexmark ", "PS",  "postscript", ";",        ";",    ";",
            " ",    "\t",   "\n",         ":",        ")",   "T",          "\xC3\xA9",
        };
        const auto choice = random_() % (std::size(kPieces) + 1);
        return choice < std::size(kPieces) ? std::string(kPieces[choice])
                                           : std::string(1, static_cast<char>(random_() & 0xFFU));
    }

private:
    std::mt19937 random_{1284};
};

constexpr int kRounds = 20000;

std::string lower(std::string text) {
    std::ranges::transform(text, text.begin(), [](char c) {
        return static_cast<char>(c >= 'A' && c <= 'Z' ? std::tolower(c) : c);
    });
    return text;
}

std::string trimmed(const std::string& text) {
    const auto first = text.find_first_not_of(" \t");
    return first == std::string::npos ? "" : text.substr(first, text.find_last_not_of(" \t") - first + 1);
}

std::vector<std::string> split(const std::string& text) {
    std::vector<std::string> parts(1);
    for (const char c : text)
        if (c == ';')
            parts.emplace_back();
        else
            parts.back() += c;
    return parts;
}

/// The rule in its plainest words: the first place in a component, with only white space before it.
Text plainLookUp(const std::string& deviceID, const std::string& key) {
    for (const auto& component : split(deviceID)) {
        const auto found = key.empty() ? std::string::npos : lower(component).find(lower(key));
        if (found == std::string::npos)
            continue;
        const auto end = found + key.size();
        if (found == 0 || trimmed(component.substr(0, end)).size() == key.size())
            return component.substr(end);
    }
    return std::nullopt;
}

TEST(RandomDeviceID, IsLookedUpByThePlainRule) {
    DeviceIDSource source;
    for (int round = 0; round < kRounds; ++round) {
        const auto deviceID = source.next();
        for (const auto& key : {source.piece(), source.piece() + source.piece(), std::string("MFG:")})
            if (key.find(';') == std::string::npos) {
                ASSERT_EQ(PMStringAdditions::stringForKey(deviceID, key), plainLookUp(deviceID, key))
                    << "device ID '" << deviceID << "' key '" << key << "'";
            }
    }
}

TEST(RandomDeviceID, HasAsManyKeysAsComponentsAtMost) {
    DeviceIDSource source;
    for (int round = 0; round < kRounds; ++round) {
        const auto deviceID = source.next();
        const auto dictionary = PMStringAdditions::dictionaryValue(deviceID);
        ASSERT_EQ(dictionary.has_value(), !deviceID.empty());
        if (dictionary) {
            ASSERT_LE(dictionary->size(), split(deviceID).size()) << deviceID;
        }
    }
}

TEST(RandomDeviceID, HasAScanIDWheneverItHasMakeAndModel) {
    DeviceIDSource source;
    for (int round = 0; round < kRounds; ++round) {
        const auto deviceID = source.next();
        const bool isKnown = PMStringAdditions::make(deviceID) && PMStringAdditions::model(deviceID);
        ASSERT_EQ(PMStringAdditions::softwareUpdateScaneID(deviceID).has_value(), isKnown) << deviceID;
        if (isKnown && !PMStringAdditions::stringForKey(deviceID, "product:")) {
            ASSERT_TRUE(PMStringAdditions::product(deviceID).starts_with('(')) << deviceID;
        }
    }
}

TEST(RandomDescription, AnswersAsItsDeviceIDWhereTheKeysAreTheSame) {
    DeviceIDSource source;
    for (int round = 0; round < kRounds; ++round) {
        DeviceDescription description{{"CMD", source.next()}, {"MDL", source.next()}};
        for (auto& [key, value] : description)
            std::erase(value, ';');
        const auto deviceID = PMDictionaryAdditions::stringValue(description);
        ASSERT_EQ(PMDictionaryAdditions::model(description), PMStringAdditions::model(deviceID)) << deviceID;
        ASSERT_EQ(PMDictionaryAdditions::supportsPostscript(description),
                  PMStringAdditions::supportsPostscript(deviceID))
            << deviceID;
        ASSERT_EQ(PMDictionaryAdditions::supportsPCL(description), PMStringAdditions::supportsPCL(deviceID))
            << deviceID;
    }
}

}  // namespace
}  // namespace ventras
