#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {

/// A checkout that holds the scripts and what this build made, in which commands may be replaced: those that
/// would change the machine or build anew are refused from the start. One thread at a time.
class ScriptsFolder {
public:
    explicit ScriptsFolder(std::optional<uid_t> user = {});

    /// Puts a shell script in the place of a command.
    void replaceCommand(std::string_view name, std::string_view script) const;

    /// Adds a variable to the scripts' environment.
    void setVariable(const std::string& name, const std::string& value) {
        options_.environment[name] = value;
    }

    /// Runs a script of the checkout, or anything else.
    ProgramResult run(std::string_view script, const std::vector<std::string>& arguments = {}) const;

    /// Runs shell code after the parts of the scripts have been read in.
    ProgramResult runWithParts(std::string_view code) const;

    /// The user's home, in which the scripts keep what they keep.
    std::filesystem::path home() const { return folder_ / "home"; }

private:
    TemporaryFolder folder_;
    ProgramOptions options_;
};

}  // namespace ventras
