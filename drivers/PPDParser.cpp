#include "drivers/PPDParser.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>
#include <vector>

#include "deviceid/PMStringAdditions.h"
#include "deviceid/TextScan.h"
#include "drivers/PPDValues.h"
#include "platform/Handles.h"

namespace ventras {
namespace {

constexpr std::array kNameKeywords{"NickName", "ModelName", "ShortNickName"};

// Generic driver packages write their own name where a device's product belongs.
constexpr std::array<std::string_view, 6> kPackageProducts{"(GIMP", "(CUPS", "(AFPL",
                                                           "(GNU",  "(ESP",  "(GUTEN"};

// These devices report their product with a hyphen where the drivers have a blank.
constexpr std::string_view kHyphenatedProducts = "(Canon BJC ";
constexpr std::size_t kHyphenPosition = 10;

bool isFax(const PPDValues& values) {
    const auto fax = values.bytes("cupsFax").value_or("");
    return TextScan::equalsIgnoringCase(fax, "yes") || TextScan::equalsIgnoringCase(fax, "true");
}

std::optional<std::string> makeAndModelIn(const PPDValues& values) {
    for (const auto* keyword : kNameKeywords)
        if (auto name = values.text(keyword))
            return name;
    return std::nullopt;
}

std::optional<std::string> makeIn(const PPDValues& values) {
    if (auto make = values.text("Manufacturer"))
        return make;
    const auto model = values.bytes("ModelName").value_or("");
    const auto space = model.find(' ');
    return space == std::string::npos ? std::nullopt : decoded(model.substr(0, space), values.encoding());
}

std::vector<std::string> split(std::string_view text, std::string_view separator) {
    std::vector<std::string> parts;
    TextScan::Components components(text, separator);
    while (const auto part = components.next())
        parts.emplace_back(*part);
    return parts;
}

std::vector<std::string> allUtf8(std::vector<std::string> values) {
    std::erase_if(values, [](const auto& value) { return !decoded(value, TextEncoding::UTF8); });
    return values;
}

/// The filters are kept in the opposite of the file's order.
std::vector<std::string> filtersOf(const ppd_file_t& ppd) {
    std::vector<std::string> filters;
    for (int i = ppd.num_filters; i > 0; --i)
        filters.emplace_back(ppd.filters[i - 1]);
    return allUtf8(std::move(filters));
}

bool isPackageProduct(std::string_view product) {
    return std::ranges::any_of(
        kPackageProducts, [&](auto package) { return TextScan::startsWithIgnoringCase(product, package); });
}

/// Collects the texts under which a driver can be found, each decoded, absent ones left out.
class ProductList {
public:
    void add(std::optional<std::string> product) {
        if (product)
            products_.push_back(*std::move(product));
    }

    void addNew(std::optional<std::string> product) {
        if (product && std::ranges::find(products_, *product) == products_.end())
            add(std::move(product));
    }

    std::vector<std::string> take() { return std::move(products_); }

private:
    std::vector<std::string> products_;
};

void addProducts(const PPDValues& values, ProductList& list) {
    for (auto product : values.allBytes("Product")) {
        if (isPackageProduct(product))
            continue;
        list.add(decoded(product, values.encoding()));
        if (product.find(kHyphenatedProducts) != std::string::npos) {
            product[kHyphenPosition] = '-';
            list.add(decoded(product, values.encoding()));
        }
    }
}

void addDeviceIDProduct(const std::string& deviceID, ProductList& list) {
    if (PMStringAdditions::make(deviceID) && PMStringAdditions::model(deviceID))
        list.addNew(PMStringAdditions::product(deviceID));
}

}  // namespace

std::optional<PPDRecord> parsePPDFile(const std::string& path) {
    const PpdPtr ppd{ppdOpenFile(path.c_str())};
    if (!ppd)
        return std::nullopt;
    const PPDValues values(ppd.get());

    PPDRecord record;
    record.name = path;
    record.make = makeIn(values).value_or("UNKNOWN");
    record.makeAndModel = makeAndModelIn(values).value_or(path);
    record.deviceID = values.text("1284DeviceID").value_or("");
    record.modelNumber = values.text("cupsModelNumber");
    if (isFax(values))
        record.type = "fax";
    // libcups takes a PPD that is silent for level 2.
    record.languageLevel = values.bytes("LanguageLevel") ? ppd->language_level : 0;
    record.color = ppd->color_device != 0;
    record.throughput = ppd->throughput;
    record.fileVersion = values.utf8("FileVersion");
    record.languageVersion = values.utf8("LanguageVersion");
    record.iconPath = values.utf8("QLPrinterIconPath");
    record.inkTool = values.utf8("QLPrinterLowInkTool");
    record.cupsCommands = values.utf8("cupsCommands");
    if (const auto languages = values.utf8("cupsLanguages"))
        record.naturalLanguage = split(*languages, " ");
    record.psVersion = allUtf8(values.allBytes("PSVersion"));
    record.filters = filtersOf(*ppd);
    record.pdes = allUtf8(values.allBytes("QLDialogExtension"));

    ProductList products;
    addProducts(values, products);
    products.addNew(values.text("ModelName"));
    products.addNew(values.text("ShortNickName"));
    addDeviceIDProduct(*record.deviceID, products);
    products.add(record.modelNumber);
    record.product = products.take();
    return record;
}

bool beginsAsPPD(const std::string& path) {
    const CupsFilePtr file{cupsFileOpen(path.c_str(), "r")};
    std::array<char, 256> line{};
    if (!file || cupsFileGets(file.get(), line.data(), line.size()) == nullptr)
        return false;
    return std::string_view(line.data()).starts_with("*PPD-Adobe");
}

}  // namespace ventras
