#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "platform/Handles.h"
#include "platform/linux/FileDescriptor.h"

namespace ventras {

/// One of the filter programs that a PPD has the scheduler run.
struct PpdFilter {
    std::string line;     ///< keyword and value as they stand
    std::string program;  ///< file name, path, or "-" for none; empty when the line does not parse
};

/// A PPD file opened for handing it to the scheduler: what was looked at is what goes out, even when somebody
/// replaces the file meanwhile. Values move; one thread at a time.
class PpdFile {
public:
    /// Opens a regular file. The result says by defect() whether it is fit to be a driver at all.
    static PpdFile open(const std::string& path);

    /// Why the file is no PPD; empty when it is one.
    const std::string& defect() const { return defect_; }

    /// Open for reading, at the file's beginning.
    int descriptor() const;

    /// Every filter line, in the order of cupsFilter, cupsFilter2, cupsPreFilter.
    const std::vector<PpdFilter>& filters() const { return filters_; }

    /// Every line that begins as a filter line does, or as one that the filter foomatic-rip runs as a
    /// command: as readers see them that know no texts of several lines, as libcups does.
    const std::vector<std::string>& codeLines() const { return codeLines_; }

    /// Whether the PPD says, once or more, that its queue is a scanner without a printer.
    bool isScannerOnly() const { return isScannerOnly_; }

private:
    void read();
    void collectFilters(ppd_file_t* ppd);
    void collectCodeLines();

    FileDescriptor file_;
    std::string defect_;
    std::vector<PpdFilter> filters_;
    std::vector<std::string> codeLines_;
    bool isScannerOnly_ = false;
};

}  // namespace ventras
