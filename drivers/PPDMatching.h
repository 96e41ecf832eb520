#pragma once

#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "drivers/FoldedText.h"
#include "drivers/PPDKind.h"
#include "drivers/PPDRecord.h"
#include "drivers/SoughtWord.h"

namespace ventras {

/// What a driver says that a device says too; the tests are made in this order.
enum class MatchReason {
    product,             ///< one of the driver's products
    productWithSlashes,  ///< one of them, once its slashes are read as spaces
    deviceIDProduct,     ///< the product in the driver's device ID
    deviceIDModel,       ///< the model in the driver's device ID
    makeAndModel,        ///< the driver's name
    gutenprintName,      ///< the beginning of a Gutenprint driver's name
    modelNumber,         ///< the driver's model number
};

/// The reason in a few words for people.
std::string_view describe(MatchReason reason);

/// Words without which a device ID cannot say the same as some text.
struct Telltale {
    std::vector<SoughtWord> words;       ///< somewhere, the rarest first
    std::optional<SoughtWord> lastWord;  ///< at the end of a value
};

/// What a device says of itself, prepared once for being compared with every driver of a catalogue.
/// Immutable, so any thread may ask.
class DeviceToMatch {
public:
    using Text = std::optional<std::string>;

    /// @param deviceID IEEE 1284 device ID
    /// @param product product text, e.g. "(DeskJet 500)"
    DeviceToMatch(const Text& deviceID, const Text& model, const Text& product);

    /// Why the driver fits, by the first test that says so; absent when it does not fit.
    std::optional<MatchReason> match(const PPDRecord& record) const;

private:
    std::optional<MatchReason> matchProducts(const PPDRecord& record) const;
    std::optional<MatchReason> matchDeviceID(const PPDRecord& record) const;
    std::optional<MatchReason> matchName(const PPDRecord& record) const;
    bool mayOccurIn(std::string_view deviceID) const;

    FoldedTexts products_;        ///< everything that may be a product
    FoldedTexts wholeTexts_;      ///< the products as given, and the models
    FoldedTexts models_;          ///< the models
    FoldedTexts nameBeginnings_;  ///< the models, and the products without parentheses
    std::vector<Telltale> telltales_;
};

/// One driver that fits.
struct PPDMatch {
    std::size_t index;  ///< where in the list the record stands
    PPDKind::Kind kind;
    MatchReason reason;
};

/// All drivers of the list that fit, best kind first; within a kind in the order of the list, but for those
/// with a driver name, which trade places among themselves into the order of their names.
std::vector<PPDMatch> matchingDrivers(const DeviceToMatch& device, std::span<const PPDRecord> list);

}  // namespace ventras
