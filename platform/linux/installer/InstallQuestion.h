#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace ventras {

/// What a person is asked. Plain texts: valid UTF-8, no markup, no control characters but line ends.
struct InstallQuestion {
    std::string title;
    std::string body;
    std::string yes;   ///< on the button that installs
    std::string no;    ///< on the other
    std::string icon;  ///< a file, or a name from the icon theme
};

/// A package as people are told of it.
struct OfferedPackage {
    std::string name;
    std::string version;
    std::string title;
};

/// The body of the question: the packages, each with name and version, and the devices that they are for.
/// Everything in it is made plainText().
/// @param devices names of devices, as these say them
std::string offerText(const std::vector<OfferedPackage>& packages, const std::vector<std::string>& devices);

/// One line that can be shown: what is not plain text in it is made visible, and it is cut where it is longer
/// than a prompt should be.
std::string plainText(std::string_view text);

/// The same for a text of several lines, of which a prompt shows the first ones.
std::string plainLines(std::string_view text);

/// Text for what reads markup: "&", "<" and ">" stand for themselves.
std::string escapeMarkup(std::string_view text);

}  // namespace ventras
