#include "ctl/Translation.h"

#include "platform/linux/DataFolder.h"
#include "platform/linux/GettextStringTable.h"

namespace ventras {
namespace {

constexpr std::string_view kPlaceholder = "%@";

}  // namespace

std::string translated(std::string_view english) {
    static const GettextStringTable texts(locateDataFolder().parent_path() / "locale");
    return texts.localizedString(english);
}

std::string translated(std::string_view english, std::string_view value) {
    auto text = translated(english);
    if (const auto place = text.find(kPlaceholder); place != std::string::npos)
        text.replace(place, kPlaceholder.size(), value);
    return text;
}

}  // namespace ventras
