#include "catalogue/ScanIDKey.h"

#include <algorithm>
#include <array>

#include "deviceid/PMStringAdditions.h"
#include "deviceid/TextScan.h"

namespace ventras {
namespace {

struct MakerSpelling {
    std::string_view spelling, maker;
};

// Makers that devices and drivers spell in several ways, all folded. A spelling that begins with the maker's
// own name has to be here even where devices agree, or the rest of it would be taken for the model.
constexpr std::array kMakers{
    MakerSpelling{"hewlett-packard", "hp"},
    MakerSpelling{"hewlett packard", "hp"},
    MakerSpelling{"hewlettpackard", "hp"},
    MakerSpelling{"seiko epson", "epson"},
    MakerSpelling{"lexmark international, inc.", "lexmark"},
    MakerSpelling{"lexmark international", "lexmark"},
    MakerSpelling{"eastman kodak company", "kodak"},
    MakerSpelling{"eastman kodak", "kodak"},
    MakerSpelling{"oki data corp", "oki"},
    MakerSpelling{"oki data", "oki"},
    MakerSpelling{"okidata", "oki"},
    MakerSpelling{"kyocera mita", "kyocera"},
    MakerSpelling{"konicaminolta", "konica minolta"},
    MakerSpelling{"minolta-qms", "minolta qms"},
    MakerSpelling{"fujixerox", "fuji xerox"},
    MakerSpelling{"samsung electronics", "samsung"},
    MakerSpelling{"brother industries", "brother"},
    MakerSpelling{"toshiba tec corp.", "toshiba"},
    MakerSpelling{"citizen systems", "citizen"},
    MakerSpelling{"utax/ta", "utax_ta"},
    MakerSpelling{"datamax-o'neil", "datamaxoneil"},
    MakerSpelling{"datamaxoneil_", "datamaxoneil"},
};

constexpr std::string_view kBlanks = " \t\r\n\v\f";

/// Lower case, single blanks, none at the ends.
std::string folded(std::string_view text) {
    std::string result;
    result.reserve(text.size());
    while (true) {
        const auto start = text.find_first_not_of(kBlanks);
        if (start == std::string_view::npos)
            return result;
        text.remove_prefix(start);
        const auto word = text.substr(0, text.find_first_of(kBlanks));
        text.remove_prefix(word.size());
        result.append(result.empty() ? "" : " ").append(TextScan::lowerCased(word));
    }
}

std::string_view makerOf(std::string_view spelling) {
    const auto known = std::ranges::find(kMakers, spelling, &MakerSpelling::spelling);
    return known == kMakers.end() ? spelling : known->maker;
}

bool removePrefix(std::string_view& model, std::string_view word) {
    if (!model.starts_with(word) || !model.substr(word.size()).starts_with(' '))
        return false;
    model.remove_prefix(word.size() + 1);
    return true;
}

// "Hewlett-Packard HP LaserJet": the maker may stand there more than once, and in another spelling.
std::string_view withoutMaker(std::string_view model, std::string_view maker) {
    const auto removeSpelling = [&](const MakerSpelling& known) {
        return known.maker == maker && removePrefix(model, known.spelling);
    };
    while (std::ranges::any_of(kMakers, removeSpelling) || removePrefix(model, maker)) {
    }
    return model;
}

}  // namespace

std::optional<std::string> scanIDKey(std::string_view deviceID) {
    const auto make = PMStringAdditions::make(deviceID);
    const auto model = PMStringAdditions::model(deviceID);
    if (!make || !model)
        return std::nullopt;
    const auto foldedMake = folded(*make);
    const auto foldedModel = folded(*model);
    if (foldedMake.empty() || foldedModel.empty())
        return std::nullopt;
    const auto maker = makerOf(foldedMake);
    return std::string(maker).append(";").append(withoutMaker(foldedModel, maker));
}

}  // namespace ventras
