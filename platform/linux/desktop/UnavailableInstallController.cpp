#include "platform/linux/desktop/UnavailableInstallController.h"

#include <glib.h>
#include <sysexits.h>

#include "platform/Log.h"

namespace ventras {

UnavailableInstallController::~UnavailableInstallController() {
    if (pendingFailure_ != 0)
        g_source_remove(pendingFailure_);
}

void UnavailableInstallController::startWithPredicate(const std::string& predicate, bool) {
    log_.error("no driver package is installed for " + predicate + ": this build has no package installer");
    if (pendingFailure_ != 0)
        return;
    // Later, from the run loop: the caller is promised that this call returns before the delegate hears its
    // end.
    const auto fail = [](gpointer data) -> gboolean {
        auto* self = static_cast<UnavailableInstallController*>(data);
        self->pendingFailure_ = 0;
        if (self->delegate_ != nullptr)
            self->delegate_->predicateInstallDidFailWithError(EX_UNAVAILABLE);
        return G_SOURCE_REMOVE;
    };
    pendingFailure_ = g_idle_add(fail, this);
}

}  // namespace ventras
