#include <cstdint>
#include <fstream>
#include <set>
#include <system_error>

#include "catalogue/CatalogueFormat.h"
#include "catalogue/DriverCatalogue.h"
#include "catalogue/ScanIDKey.h"
#include "deviceid/TextScan.h"
#include "platform/PropertyList.h"

namespace ventras {
namespace {

using namespace CatalogueFormat;

/// What is wrong with a file: the first thing that was found. Reading goes on behind it, with empty values.
class FirstFault {
public:
    void add(std::string_view place, std::string_view reason) {
        if (text_.empty())
            text_.append(place).append(": ").append(reason);
    }

    const std::string& text() const { return text_; }

private:
    std::string text_;
};

std::string inQuotes(std::string_view text) {
    return "\"" + std::string(text) + "\"";
}

/// One dictionary of the file, and what it is called when something in it is wrong.
class Entry {
public:
    Entry(const PropertyDictionary& dictionary, std::string_view place, FirstFault& fault)
        : dictionary_(dictionary), place_(place), fault_(fault) {}

    void fail(std::string_view reason) const { fault_.add(place_, reason); }

    template <typename T>
    const T* find(std::string_view key) const {
        const auto found = dictionary_.find(key);
        if (found == dictionary_.end())
            return nullptr;
        const auto* value = std::get_if<T>(&found->second);
        if (value == nullptr)
            fail(inQuotes(key) + " is of the wrong type");
        return value;
    }

    template <typename T>
    const T& get(std::string_view key) const {
        static const T kEmpty{};
        if (const auto* value = find<T>(key))
            return *value;
        fail("no " + inQuotes(key));
        return kEmpty;
    }

    const std::string& text(std::string_view key) const {
        const auto& text = get<std::string>(key);
        if (!isPlainText(text))
            fail(inQuotes(key) + " is empty, too long, or no plain text");
        return text;
    }

private:
    const PropertyDictionary& dictionary_;
    std::string_view place_;
    FirstFault& fault_;
};

int tierOf(const Entry& entry) {
    const auto tier = entry.get<std::int64_t>(kTier);
    if (tier < 0 || tier > kLastTier)
        entry.fail("\"tier\" is not within 0 and 9");
    return static_cast<int>(tier);
}

std::vector<std::string> tagsOf(const Entry& entry) {
    const auto& array = entry.get<PropertyArray>(kTags);
    if (array.size() > kMostTags)
        entry.fail("too many tags");
    std::vector<std::string> tags;
    std::set<std::string> known;
    for (const auto& value : array) {
        const auto* tag = std::get_if<std::string>(&value);
        if (tag == nullptr || !isPlainText(*tag)) {
            entry.fail("tag " + std::to_string(tags.size() + 1) + " is empty, too long, or no plain text");
            return {};
        }
        if (!known.insert(scanIDKey(*tag).value_or(*tag)).second)
            entry.fail("the tag " + inQuotes(*tag) + " is there twice");
        tags.push_back(*tag);
    }
    return tags;
}

std::optional<DriverPackage> packageOf(const std::string& name, const PropertyValue& value,
                                       FirstFault& fault) {
    const auto* dictionary = std::get_if<PropertyDictionary>(&value);
    if (!isPackageName(name) || dictionary == nullptr) {
        fault.add("the file", isPackageName(name) ? name + " is no dictionary"
                                                  : "a package has a name that no package can have");
        return std::nullopt;
    }
    const Entry entry(*dictionary, name, fault);
    const auto* driverless = entry.find<bool>(kDriverless);
    return DriverPackage{.name = name,
                         .title = entry.text(kTitle),
                         .version = entry.text(kVersion),
                         .tier = tierOf(entry),
                         .driverless = driverless != nullptr && *driverless,
                         .tags = tagsOf(entry)};
}

DriverCatalogue catalogueOf(const PropertyDictionary& dictionary, FirstFault& fault) {
    const Entry file(dictionary, "the file", fault);
    if (file.get<std::int64_t>(kFormat) != kNumber)
        file.fail("its format is not 1");
    const auto& entries = file.get<PropertyDictionary>(kPackages);
    if (entries.size() > kMostPackages)
        file.fail("too many packages");
    const auto& release = file.text(kRelease);
    std::vector<DriverPackage> packages;
    for (const auto& [name, entry] : entries)
        if (auto package = packageOf(name, entry, fault))
            packages.push_back(*std::move(package));
    return {release, std::move(packages)};
}

/// The property-list library takes the end of a truncated file for its end.
bool isWhole(std::string_view text) {
    return TextScan::trimmedOfLineEnds(text).ends_with("</plist>");
}

}  // namespace

CatalogueReading DriverCatalogue::parse(std::string_view text) {
    if (text.size() > kLongestFile)
        return {std::nullopt, "it is too long"};
    const auto value = isWhole(text) ? parsePropertyList(text) : std::nullopt;
    const auto* dictionary = value ? std::get_if<PropertyDictionary>(&*value) : nullptr;
    if (dictionary == nullptr)
        return {std::nullopt, "it is no whole XML property list with a dictionary"};
    FirstFault fault;
    auto catalogue = catalogueOf(*dictionary, fault);
    if (!fault.text().empty())
        return {std::nullopt, fault.text()};
    return {std::move(catalogue), {}};
}

CatalogueReading DriverCatalogue::read(const std::filesystem::path& path) {
    std::error_code error;
    if (!std::filesystem::is_regular_file(path, error))
        return {std::nullopt, path.string() + ": there is no such file"};
    std::ifstream file(path, std::ios::binary);
    std::string text(kLongestFile + 1, '\0');
    file.read(text.data(), static_cast<std::streamsize>(text.size()));
    if (file.bad() || (!file && file.gcount() == 0))
        return {std::nullopt, path.string() + ": it cannot be read"};
    text.resize(static_cast<std::size_t>(file.gcount()));
    auto reading = parse(text);
    if (!reading.catalogue)
        reading.fault.insert(0, path.string() + ": ");
    return reading;
}

}  // namespace ventras
