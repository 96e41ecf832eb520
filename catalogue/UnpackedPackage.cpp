#include "catalogue/UnpackedPackage.h"

#include <glob.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <functional>
#include <iterator>
#include <system_error>

#include "catalogue/ControlData.h"
#include "deviceid/TextScan.h"
#include "drivers/PPDManager.h"
#include "platform/FileContent.h"
#include "platform/linux/BoundedProgram.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;
using Drivers = std::vector<ListedDriver>;
using Variables = std::map<std::string, std::string>;

// The largest collections unpack themselves in seconds.
constexpr auto kProgramLimit = std::chrono::seconds(120);

struct OwnPlace {
    const char *variable, *places;
};

// Where a driver program that is not installed finds its parts.
constexpr std::array kOwnPlaces{
    OwnPlace{"LD_LIBRARY_PATH", "usr/lib/*-linux-*"},
    OwnPlace{"STP_DATA_PATH", "usr/share/gutenprint/*/xml"},
    OwnPlace{"STP_MODULE_PATH", "usr/lib/*/gutenprint/*/modules"},
};

constexpr std::array kRelations{"Pre-Depends", "Depends", "Recommends"};

/// A folder of our own, removed with its content.
class WorkFolder {
public:
    WorkFolder() {
        std::error_code error;
        auto name = (fs::temp_directory_path(error) / "ventras-ppd-XXXXXX").string();
        if (mkdtemp(name.data()) != nullptr)
            path_ = name;
    }
    WorkFolder(const WorkFolder&) = delete;
    WorkFolder& operator=(const WorkFolder&) = delete;
    ~WorkFolder() {
        std::error_code error;
        if (!path_.empty())
            fs::remove_all(path_, error);
    }

    /// Empty when it could not be made.
    const fs::path& path() const { return path_; }

private:
    fs::path path_;
};

/// The first place below the folder that fits the pattern; empty when none does.
std::string firstPlace(const fs::path& folder, const char* pattern) {
    std::string escaped;
    for (const char c : folder.string())
        escaped.append(std::string_view("*?[\\").find(c) == std::string_view::npos ? "" : "\\").push_back(c);
    glob_t found{};
    const bool hasFound = glob((escaped + "/" + pattern).c_str(), 0, nullptr, &found) == 0;
    std::string place = hasFound ? found.gl_pathv[0] : "";
    globfree(&found);
    return place;
}

Variables ownPlaces(const fs::path& folder) {
    Variables variables;
    for (const auto& [variable, pattern] : kOwnPlaces)
        if (auto place = firstPlace(folder, pattern); !place.empty())
            variables.emplace(variable, std::move(place));
    return variables;
}

/// The files below a folder that are wanted, in the order of their paths.
std::vector<fs::path> filesIn(const fs::path& folder, const std::function<bool(const fs::path&)>& isWanted) {
    std::vector<fs::path> files;
    std::error_code error;
    for (fs::recursive_directory_iterator entry(folder, error), end; !error && entry != end;
         entry.increment(error))
        if (std::error_code unreadable; entry->is_regular_file(unreadable) && isWanted(entry->path()))
            files.push_back(entry->path());
    std::ranges::sort(files);
    return files;
}

bool isDriverInformation(const fs::path& path) {
    return path.extension() == ".drv";
}

bool isPPD(const fs::path& path) {
    return path.extension() == ".ppd" || path.string().ends_with(".ppd.gz");
}

bool isProgram(const fs::path& path) {
    return access(path.c_str(), X_OK) == 0;
}

bool addListed(const fs::path& program, const Variables& variables, Drivers& drivers) {
    const auto output = outputOf({program.string(), "list"}, variables, kProgramLimit);
    if (!output)
        return false;
    TextScan::Components lines(*output, "\n");
    while (const auto line = lines.next())
        if (auto driver = driverFromListing(*line))
            drivers.push_back(*std::move(driver));
    return true;
}

bool addPPD(const fs::path& path, Drivers& drivers) {
    const auto record = PPDManager::parsePPD(path.string());
    if (record)
        drivers.push_back(
            {record->make.value_or(""), record->makeAndModel.value_or(""), record->deviceID.value_or("")});
    return record.has_value();
}

bool addDriverInformation(const fs::path& path, Drivers& drivers) {
    const WorkFolder work;
    if (work.path().empty() ||
        !outputOf({"ppdc", "-d", work.path().string(), "-I", path.parent_path().string(), path.string()}, {},
                  kProgramLimit))
        return false;
    const auto ppds = filesIn(work.path(), isPPD);
    return std::ranges::all_of(ppds, [&](const auto& ppd) { return addPPD(ppd, drivers); });
}

/// Adds the drivers of each file. @return the first file that cannot be read; absent when all can.
template <typename Add>
std::optional<fs::path> addAll(const std::vector<fs::path>& files, Add add) {
    const auto unreadable = std::ranges::find_if_not(files, add);
    return unreadable == files.end() ? std::nullopt : std::optional{*unreadable};
}

std::optional<fs::path> addDrivers(const fs::path& folder, Drivers& drivers) {
    const auto variables = ownPlaces(folder);
    const auto list = [&](const fs::path& program) { return addListed(program, variables, drivers); };
    const auto expand = [&](const fs::path& file) { return addDriverInformation(file, drivers); };
    const auto parse = [&](const fs::path& ppd) { return addPPD(ppd, drivers); };
    if (auto unreadable = addAll(filesIn(folder / "usr/lib/cups/driver", isProgram), list))
        return unreadable;
    if (auto unreadable = addAll(filesIn(folder / "usr/share/cups/drv", isDriverInformation), expand))
        return unreadable;
    return addAll(filesIn(folder / "usr/share", isPPD), parse);
}

PackageContent describedBy(const std::string& control) {
    auto fields = controlFields(control);
    PackageContent package{fields["Package"], fields["Version"], fields["Description"]};
    for (const auto* relation : kRelations)
        std::ranges::move(packageNames(fields[relation]), std::back_inserter(package.brings));
    return package;
}

}  // namespace

PackageReading readUnpackedPackage(const fs::path& folder) {
    auto package = describedBy(fileContent(folder / "DEBIAN/control").value_or(""));
    if (package.name.empty() || package.version.empty())
        return {std::nullopt, folder.string() + ": no package is unpacked here, with DEBIAN/control"};
    std::error_code error;
    if (const auto unreadable = addDrivers(fs::absolute(folder, error), package.drivers))
        return {std::nullopt, unreadable->string() + ": does not tell its drivers"};
    return {std::move(package), {}};
}

}  // namespace ventras
