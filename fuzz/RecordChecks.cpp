#include "fuzz/RecordChecks.h"

#include <array>

#include "drivers/PPDKind.h"
#include "drivers/PPDMatching.h"
#include "fuzz/Require.h"
#include "platform/Utf8.h"

namespace ventras {

void checkRecord(const PPDRecord& record) {
    require(record.make && record.makeAndModel && record.deviceID);
    for (const auto& product : record.product)
        require(isValidUtf8(product));
    require(recordFromDictionary(dictionaryFromRecord(record)) == record);

    const auto kind = PPDKind::of(record);
    require(kind == PPDKind::kInstalledLocalized || kind == PPDKind::kInstalled || kind == PPDKind::kTioga);

    for (const auto& product : record.product)
        require(product.empty() || DeviceToMatch({}, {}, product).match(record));
    const std::array list{record};
    matchingDrivers(DeviceToMatch(record.deviceID, record.makeAndModel, record.make), list);
}

}  // namespace ventras
