#include "platform/linux/installer/PackageKit.h"

#include <utility>

namespace ventras {
namespace {

// PkFilterEnum and PkTransactionFlagEnum are bit numbers.
constexpr guint64 bit(unsigned number) {
    return guint64{1} << number;
}
constexpr auto kInstalledFilter = bit(2);
constexpr auto kNewestFilter = bit(16);
constexpr auto kThisArchitectureFilter = bit(18);
constexpr auto kNoSourceFilter = bit(21);
constexpr auto kOnlyTrusted = bit(1);
constexpr auto kSimulate = bit(2);

constexpr gboolean kWithoutDependants = FALSE;  // removing takes no package away that needs the removed one
constexpr gboolean kNoCleaning = FALSE;         // nor any that nobody needs any more

GVariant* listOf(const std::vector<std::string>& texts) {
    GVariantBuilder list;
    g_variant_builder_init(&list, G_VARIANT_TYPE_STRING_ARRAY);
    for (const auto& text : texts)
        g_variant_builder_add(&list, "s", text.c_str());
    return g_variant_builder_end(&list);
}

GVariant* flagsAndList(guint64 flags, const std::vector<std::string>& texts) {
    return g_variant_new("(t@as)", flags, listOf(texts));
}

}  // namespace

PackageKit::PackageKit(EventContext& events, PackageKitLimits limits)
    : events_(events), limits_(limits), connection_(Bus::System, limits.connect) {}

TransactionResult PackageKit::resolve(const std::vector<std::string>& names) {
    return lookUp("Resolve", flagsAndList(kNewestFilter | kThisArchitectureFilter | kNoSourceFilter, names));
}

TransactionResult PackageKit::resolveInstalled(const std::vector<std::string>& names) {
    return lookUp("Resolve", flagsAndList(kInstalledFilter, names));
}

TransactionResult PackageKit::simulateInstall(const std::vector<std::string>& ids) {
    return lookUp("InstallPackages", flagsAndList(kOnlyTrusted | kSimulate, ids));
}

TransactionResult PackageKit::install(const std::vector<std::string>& ids,
                                      PackageKitTransaction::ProgressHandler onProgress) {
    return change("InstallPackages", flagsAndList(kOnlyTrusted, ids), std::move(onProgress));
}

TransactionResult PackageKit::remove(const std::vector<std::string>& ids) {
    return change("RemovePackages",
                  g_variant_new("(t@asbb)", guint64{0}, listOf(ids), kWithoutDependants, kNoCleaning));
}

TransactionResult PackageKit::acceptLicence(const std::string& licenceID) {
    return lookUp("AcceptEula", g_variant_new("(s)", licenceID.c_str()));
}

TransactionResult PackageKit::lookUp(const char* role, GVariant* arguments) {
    return PackageKitTransaction(connection_, events_, limits_.lookUp).run(role, arguments);
}

TransactionResult PackageKit::change(const char* role, GVariant* arguments,
                                     PackageKitTransaction::ProgressHandler onProgress) {
    return PackageKitTransaction(connection_, events_, limits_.change, std::move(onProgress))
        .run(role, arguments);
}

}  // namespace ventras
