#include "platform/linux/GettextStringTable.h"

#include <libintl.h>
#include <locale.h>

namespace ventras {
namespace {

constexpr const char* kDomain = "browser";

}  // namespace

GettextStringTable::~GettextStringTable() {
    if (locale_ != nullptr)
        freelocale(static_cast<locale_t>(locale_));
}

std::string GettextStringTable::localizedString(std::string_view english) const {
    // A locale of this object's own: setlocale() would change the whole process under running threads.
    std::call_once(opened_, [this] {
        bindtextdomain(kDomain, catalogues_.c_str());
        bind_textdomain_codeset(kDomain, "UTF-8");
        locale_ = newlocale(LC_MESSAGES_MASK | LC_CTYPE_MASK, "", nullptr);
    });
    const std::string text(english);
    if (text.empty() || locale_ == nullptr)
        return text;  // gettext's translation of "" is the catalogue's header
    const locale_t previous = uselocale(static_cast<locale_t>(locale_));
    std::string translation = dgettext(kDomain, text.c_str());
    uselocale(previous);
    return translation;
}

}  // namespace ventras
