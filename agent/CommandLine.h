#pragma once

#include <string_view>

namespace ventras {

/// What an argument of the agent's command line asks for.
enum class ArgumentKind {
    Deprecated,   ///< an option of old; answered with a message
    UsbLocation,  ///< a USB printer interface: "LOCATION,INTERFACE" in decimal
    Scanner,      ///< a scanner, by its description
    NoDownload,   ///< missing drivers are not to be downloaded
    Skerrow,      ///< announce missing drivers instead of offering them
    IppUsb,       ///< an IPP-over-USB printer, by its name in DNS-SD
    NetworkURI,   ///< a network printer, by its whole "ipp://" or "ipps://" URI
    Ignored,
};

/// One argument, told apart. The text points into the argument.
struct Argument {
    ArgumentKind kind;
    std::string_view text;  ///< what the kind says it is, without the option in front of it
};

/// Tells an argument apart; the first rule that holds decides. Any thread may call.
Argument parseArgument(std::string_view argument);

}  // namespace ventras
