#include "ctl/PackageCommand.h"

#include <array>
#include <filesystem>
#include <fstream>
#include <span>
#include <system_error>

#include "catalogue/CatalogueBuilder.h"
#include "catalogue/ThisRelease.h"
#include "ctl/Complaint.h"
#include "ctl/Output.h"
#include "ctl/PackageOffer.h"
#include "ctl/Translation.h"

namespace ventras {
namespace {

using Operands = std::span<const std::string>;

constexpr std::array kColumns{Column{"name", translatable("PACKAGE")}, Column{"tier", translatable("TIER")},
                              Column{"version", translatable("VERSION")},
                              Column{"title", translatable("TITLE")}};

const Value& member(const Object& object, std::string_view key) {
    return *find(object, key);
}

void showOffer(const Object& offer, Output& output) {
    if (output.isForProgram()) {
        output.print(offer);
        return;
    }
    output.print(std::get<Array>(member(offer, "packages")), kColumns);
    const auto& package = member(offer, "driverPackage");
    output.printText((package.isNull() ? "None is offered: " : textOf(package) + " is offered: ") +
                     textOf(member(offer, "packageReason")) + ".");
}

Exit lookUp(const Arguments& arguments, Operands ids, Output& output) {
    if (ids.size() != 1)
        return usageError(translated("catalogue lookup: which ID?"));
    const auto file = arguments.value("file");
    const auto reading = file ? DriverCatalogue::read(*file) : installedCatalogue();
    if (!reading.catalogue) {
        complain(reading.fault);
        return Exit::Unreachable;
    }
    const auto offer = packageOffer(*reading.catalogue, ids.front());
    showOffer(offer, output);
    return std::get<Array>(member(offer, "packages")).empty() ? Exit::NotFound : Exit::Success;
}

Array conflictsOf(const DriverCatalogue& catalogue) {
    Array conflicts;
    catalogue.forEachConflict([&](const std::string& key, const DriverCatalogue::Packages& packages) {
        std::vector<std::string> names;
        for (const auto* package : packages)
            names.push_back(package->name);
        conflicts.push_back(Object{{"key", key}, {"packages", names}});
    });
    return conflicts;
}

/// For people the number of conflicts, for programs each of them.
Object summaryOf(const DriverCatalogue& catalogue, std::size_t bytes, const Output& output) {
    const auto count = [](std::size_t number) { return static_cast<std::int64_t>(number); };
    std::size_t tags = 0;
    for (const auto& package : catalogue.packages())
        tags += package.tags.size();
    const auto coverage = catalogue.coverage();
    auto conflicts = conflictsOf(catalogue);
    return {
        {"release", catalogue.release()},
        {"packages", count(catalogue.packages().size())},
        {"tags", count(tags)},
        {"devices", count(coverage.devices)},
        {"resolved", count(coverage.resolved)},
        {"conflicts", output.isForProgram() ? Value{std::move(conflicts)} : Value{count(conflicts.size())}},
        {"bytes", count(bytes)}};
}

/// Never leaves half a file under its name.
bool writeWhole(const std::filesystem::path& path, const std::string& text) {
    auto unfinished = path;
    unfinished += ".new";
    std::ofstream file(unfinished, std::ios::binary | std::ios::trunc);
    file << text;
    file.close();
    std::error_code error;
    if (file)
        std::filesystem::rename(unfinished, path, error);
    return file && !error;
}

Exit build(const Arguments& arguments, Operands folders, Output& output) {
    if (folders.empty())
        return usageError(translated("catalogue build: from which packages' folders?"));
    CatalogueBuilder builder;
    for (const auto& folder : folders) {
        auto reading = readUnpackedPackage(folder);
        if (!reading.package) {
            complain(reading.fault);
            return Exit::NotFound;
        }
        builder.add(*std::move(reading.package));
    }
    const auto catalogue = builder.build(arguments.value("release").value_or(thisRelease()));
    const auto text = catalogueText(catalogue);
    if (!text) {
        complain(translated("these packages, or the release, cannot stand in a catalogue"));
        return Exit::NotFound;
    }
    const auto path = arguments.value("output");
    if (path && !writeWhole(*path, *text)) {
        complain(translated("%@: cannot be written", *path));
        return Exit::Unreachable;
    }
    output.print(summaryOf(catalogue, text->size(), output));
    return Exit::Success;
}

struct Task {
    std::string_view name;
    Exit (*run)(const Arguments& arguments, Operands operands, Output& output);
};

constexpr std::array kTasks{Task{"lookup", lookUp}, Task{"build", build}};

}  // namespace

Exit showPackages(const Arguments& arguments, Output& output) {
    const Operands operands = arguments.operands;
    for (const auto& task : kTasks)
        if (!operands.empty() && operands.front() == task.name)
            return task.run(arguments, operands.subspan(1), output);
    return usageError(translated("catalogue: 'lookup ID' or 'build DIR...'?"));
}

}  // namespace ventras
