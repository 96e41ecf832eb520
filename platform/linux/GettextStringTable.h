#pragma once

#include <filesystem>
#include <mutex>

#include "platform/StringTable.h"

namespace ventras {

/// Translations through gettext, domain "browser", in the language of the user's environment. Nothing is read
/// before the first text is asked for. Any thread may ask.
class GettextStringTable : public StringTable {
public:
    /// @param catalogues folder of the compiled message catalogues (LANGUAGE/LC_MESSAGES/browser.mo)
    explicit GettextStringTable(std::filesystem::path catalogues) : catalogues_(std::move(catalogues)) {}
    ~GettextStringTable() override;
    GettextStringTable(const GettextStringTable&) = delete;
    GettextStringTable& operator=(const GettextStringTable&) = delete;

    std::string localizedString(std::string_view english) const override;

private:
    std::filesystem::path catalogues_;
    mutable std::once_flag opened_;
    mutable void* locale_ = nullptr;
};

}  // namespace ventras
