#include "tests/soak/Workshop.h"

#include <cstdlib>
#include <filesystem>

namespace ventras {

namespace fs = std::filesystem;

Workshop::Workshop() {
    setenv("TMPDIR", temporary_.path().c_str(), 1);
    // Drivers below a folder of this name count as installed on this computer.
    const auto drivers = scheduler_.folder() / "data/model/Library/Printers";
    fs::create_directories(drivers);
    fs::copy_file(testDocument("colour-duplex.ppd"), drivers / "colorjet.ppd");
    scheduler_.addQueue(kPresent, "usb://Acme/Present", readFile(testDocument("colour-duplex.ppd")));
    saveQueues();
}

Workshop::~Workshop() {
    unsetenv("TMPDIR");
}

void Workshop::saveQueues() {
    scheduler_.stop();
    scheduler_.start();
}

std::vector<std::string> Workshop::newQueues() const {
    auto queues = scheduler_.queues();
    std::erase(queues, kPresent);
    return queues;
}

std::vector<std::string> Workshop::leftovers() const {
    std::vector<std::string> files;
    for (const auto& entry : fs::directory_iterator(temporary_.path()))
        if (!entry.is_directory())
            files.push_back(entry.path().filename());
    return files;
}

}  // namespace ventras
