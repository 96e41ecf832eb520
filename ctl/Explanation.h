#pragma once

#include "ctl/Value.h"

namespace ventras {

class Services;
class VentrasPrinterObject;

/// What the agent would do about one device, found out by having it done without making anything: what the
/// device is, the queue that serves it already, the drivers that fit, the outcome, and the queues that would
/// be made.
Object explain(VentrasPrinterObject& device, Services& services);

/// The same with its nested parts in short, for people.
Object shortened(const Object& explanation);

}  // namespace ventras
