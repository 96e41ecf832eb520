#include "drivers/PPDManager.h"

#include "drivers/PPDCatalogue.h"
#include "drivers/PPDFiles.h"
#include "drivers/PPDKind.h"
#include "drivers/PPDMatching.h"
#include "drivers/PPDParser.h"
#include "drivers/PPDValues.h"
#include "drivers/SoftwareUpdateDrivers.h"
#include "platform/Platform.h"

namespace ventras {

PPDManager::PPDManager(Platform& platform)
    : platform_(platform), generics_(platform.resources, [this] { return ppds(); }) {}

PPDManager& PPDManager::defaultManager(Platform& platform) {
    static PPDManager manager(platform);
    return manager;
}

std::optional<PPDRecord> PPDManager::parsePPD(const std::string& path) {
    return parsePPDFile(path);
}

unsigned PPDManager::ppdKind(const std::optional<PPDRecord>& record) {
    return record ? ppdKind(*record) : PPDKind::kNone;
}

unsigned PPDManager::ppdKind(const PPDRecord& record) {
    return PPDKind::of(record);
}

bool PPDManager::isPPDFile(const std::string& path) {
    return beginsAsPPD(path);
}

bool PPDManager::isValidPPD(const std::string& /*path*/) {
    return true;
}

bool PPDManager::isFaxPPD(const PPDRecord& record) {
    return record.type == "fax";
}

// Only a fax driver must say what it is; a driver that says nothing is taken for both of the other types.
bool PPDManager::isPostscriptPPD(const PPDRecord& record) {
    return !record.type || record.type == "postscript";
}

bool PPDManager::isRasterPPD(const PPDRecord& record) {
    return !record.type || record.type == "raster";
}

TextEncoding PPDManager::stringEncoding(ppd_file_t* ppd) {
    return ppd == nullptr ? TextEncoding::UTF8 : PPDValues(ppd).encoding();
}

std::string PPDManager::localizedPPD(const std::string& ppd) {
    return ppd;
}

PPDManager::Records PPDManager::ppds() const {
    return PPDCatalogue::ask();
}

std::optional<std::string> PPDManager::ppdFileWithName(const std::optional<std::string>& path) const {
    return PPDFiles::copyOf(path);
}

std::optional<std::string> PPDManager::ppdFile(const PPDRecord& record) const {
    return PPDFiles::fetch(record, platform_.printSystem);
}

PPDManager::Records PPDManager::matchPPDsByDeviceID(const Text& deviceID, const Text& model,
                                                    const Text& product) const {
    return matchPPDsByDeviceID(deviceID, model, product, ppds());
}

PPDManager::Records PPDManager::matchPPDsByDeviceID(const Text& deviceID, const Text& model,
                                                    const Text& product, const Records& list) {
    Records records;
    for (const auto& match : matchingDrivers(DeviceToMatch(deviceID, model, product), list))
        records.push_back(list[match.index]);
    return records;
}

PPDManager::Records PPDManager::matchPPDsByProduct(const Text& product) const {
    return matchPPDsByDeviceID(std::nullopt, std::nullopt, product);
}

PPDManager::Records PPDManager::matchPPDsByProduct(const Text& product, const Records& list) {
    return matchPPDsByDeviceID(std::nullopt, std::nullopt, product, list);
}

PPDManager::Records PPDManager::matchPPDsByModel(const Text& model) const {
    return matchPPDsByDeviceID(std::nullopt, model, std::nullopt);
}

PPDManager::Records PPDManager::matchPPDsByModel(const Text& model, const Records& list) {
    return matchPPDsByDeviceID(std::nullopt, model, std::nullopt, list);
}

// The lists by type have always been empty, and an empty one is no list.
std::optional<PPDManager::Records> PPDManager::ppdsOfType(std::string_view /*type*/) const {
    return std::nullopt;
}

std::optional<PPDManager::Records> PPDManager::faxPPDs() const {
    return ppdsOfType("fax");
}

std::optional<PPDManager::Records> PPDManager::rasterPPDs() const {
    return ppdsOfType("raster");
}

std::optional<PPDManager::Records> PPDManager::postscriptPPDs() const {
    return ppdsOfType("postscript");
}

PPDRecord PPDManager::genericPostscriptPPD() {
    return generics_.postscript();
}

PPDRecord PPDManager::genericPCLPPD() {
    return generics_.pcl();
}

PPDRecord PPDManager::genericFaxPPD() {
    return generics_.fax();
}

PPDRecord PPDManager::genericURFPPD() {
    return generics_.urf();
}

PPDRecord PPDManager::genericSystemPPD(std::string_view name) const {
    return generics_.system(name);
}

std::optional<PPDRecord> PPDManager::softwareUpdateDriverFor(const Text& deviceID, bool vellum) const {
    return SoftwareUpdateDrivers::forDevice(platform_.printToolAgent, deviceID, vellum);
}

std::optional<PPDRecord> PPDManager::softwareUpdateForPPD(ppd_file_t* ppd) const {
    return SoftwareUpdateDrivers::forPPD(platform_.printToolAgent, ppd);
}

}  // namespace ventras
