#pragma once

#include <string>
#include <vector>

#include "platform/Handles.h"
#include "platform/linux/options/PrinterCapabilities.h"

namespace ventras {

/// A printer's answer to Get-Printer-Attributes that a test builds up, from that of a good driverless
/// printer.
class Description {
public:
    Description();

    ipp_t* get() const { return message_.get(); }

    // Each replaces the attribute of the name.
    Description& text(ipp_tag_t tag, const char* name, const std::vector<std::string>& values);
    Description& numbers(ipp_tag_t tag, const char* name, const std::vector<int>& values);
    Description& collections(const char* name, const std::vector<IppPtr>& values);

    IppPtr capabilities(PrinterService service = PrinterService::Print) const {
        return printerCapabilities(get(), service);
    }

private:
    IppPtr message_{ippNew()};
};

/// A media-size collection, in hundredths of a millimetre.
IppPtr size(int x, int y);

/// A media-col collection.
IppPtr media(const IppPtr& mediaSize, const std::string& source, const std::string& type);

}  // namespace ventras
