#pragma once

#include <filesystem>

#include "platform/ResourceBundle.h"

namespace ventras {

/// The folder with this program's data files, for an installed program and for one in its build folder alike.
std::filesystem::path locateDataFolder();

/// The resources as files of one folder. Any thread may ask.
class DataFolder : public ResourceBundle {
public:
    explicit DataFolder(std::filesystem::path folder) : folder_(std::move(folder)) {}

    std::string name() const override { return folder_.string(); }
    std::optional<std::string> pathForResource(std::string_view name, std::string_view type) const override;

private:
    std::filesystem::path folder_;
};

}  // namespace ventras
