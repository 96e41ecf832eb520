#include "agent/InstallerSettings.h"

#include <string_view>

#include "platform/ResourceBundle.h"
#include "platform/StringTable.h"

namespace ventras {
namespace {

constexpr std::string_view kPlaceholder = "%@";
constexpr int kLegalTextType = 2;

}  // namespace

PredicateInstallSettings installerSettings(const StringTable& strings, const ResourceBundle& resources) {
    return {
        .icon = resources.pathForResource("GenericPostscriptPrinter", "svg").value_or(""),
        .noNetworkTitle = strings.localizedString("Unable to connect to internet."),
        .noNetworkMessage = strings.localizedString("Intentionally left blank."),
        .noServerTitle = strings.localizedString("Unable to reach the Software Update Server."),
        .busyTitle = strings.localizedString("Software Update is currently running."),
        .busyMessage = strings.localizedString(
            "You can download and install the software when the other download is complete."),
        .legalTextType = kLegalTextType,
        .helpAnchor = "mh28042",
        .requiresLicenceAgreement = true,
    };
}

std::string promptTitle(const StringTable& strings, std::span<const DevicePtr> printers) {
    if (printers.size() != 1)
        return strings.localizedString("Would you like to install software for your printers?");
    auto title = strings.localizedString("Would you like to download and install software for '%@'?");
    if (const auto placeholder = title.find(kPlaceholder); placeholder != std::string::npos)
        title.replace(placeholder, kPlaceholder.size(), printers.front()->name().value_or("(null)"));
    return title;
}

}  // namespace ventras
