#include "tests/fakes/FakePrintSystem.h"

#include <cups/cups.h>
#include <unistd.h>

#include <array>
#include <fstream>

#include "platform/FileContent.h"
#include "platform/PropertyList.h"
#include "platform/QueueAttributes.h"
#include "platform/TemporaryFile.h"

namespace ventras {

namespace {

std::string newFile(const std::string& text) {
    auto file = TemporaryFile::create();
    std::ofstream(file->path()) << text;
    return file->release();
}

std::string fileURL(const std::string& path) {
    std::array<char, HTTP_MAX_URI> url{};
    httpAssembleURI(HTTP_URI_CODING_ALL, url.data(), static_cast<int>(url.size()), "file", nullptr, nullptr,
                    0, path.c_str());
    return url.data();
}

}  // namespace

class FakeAutoSelectContext final : public AutoSelectContext {
public:
    explicit FakeAutoSelectContext(FakePrintSystem& owner) : owner_(owner) {
        const std::lock_guard lock(owner_.mutex_);
        ++owner_.contextsMade;
        ++owner_.contextsAlive;
    }
    ~FakeAutoSelectContext() override {
        const std::lock_guard lock(owner_.mutex_);
        --owner_.contextsAlive;
    }
    FakeAutoSelectContext(const FakeAutoSelectContext&) = delete;
    FakeAutoSelectContext& operator=(const FakeAutoSelectContext&) = delete;

    std::int32_t autoSelectPPD() override { return owner_.autoSelection.ppdStatus; }
    AutoSelectInfo autoSelectGetInfo() const override { return owner_.autoSelection.info; }
    void autoSelectSetIsBinaryOK(bool isBinaryOK) override {
        const std::lock_guard lock(owner_.mutex_);
        owner_.binaryOK.push_back(isBinaryOK);
    }

    std::int32_t autoSelectInstallableOptions(const std::string& ppdPath) override {
        const std::lock_guard lock(owner_.mutex_);
        owner_.autoSelected.push_back(ppdPath);
        if (owner_.autoSelection.onSelect)
            owner_.autoSelection.onSelect(owner_.autoSelection, ppdPath);
        return owner_.autoSelection.optionsStatus;
    }

    std::optional<std::string> autoSelectHasNewPPD() const override {
        const auto& text = owner_.autoSelection.newPPDText;
        return text ? std::optional{fileURL(newFile(*text))} : std::nullopt;
    }

private:
    FakePrintSystem& owner_;
};

std::optional<std::string> FakePrintSystem::suggestQueueName(const std::string& name, bool unique) {
    const std::lock_guard lock(mutex_);
    if (!suggestsNames)
        return std::nullopt;
    std::string identifier = name;
    for (char& c : identifier)
        c = c == ' ' ? '_' : c;
    std::string candidate = identifier;
    for (int i = 2; unique && taken.contains(candidate); ++i)
        candidate = identifier + "_" + std::to_string(i);
    return candidate;
}

std::int32_t FakePrintSystem::createQueue(const std::string&, const std::string& queueID,
                                          const std::string& attributes,
                                          const std::map<std::string, std::string>& options) {
    const std::lock_guard lock(mutex_);
    Creation creation{queueID, {}, options, {}};
    if (const auto parsed = parsePropertyList(attributes))
        creation.attributes = std::get<PropertyDictionary>(*parsed);
    if (const auto* path = findText(creation.attributes, QueueAttributeKeys::kPPD))
        creation.ppdText = fileContent(*path).value_or("");
    creations.push_back(creation);
    const auto status = create(creation);
    if (status == 0)
        taken.insert(queueID);
    return status;
}

std::int32_t FakePrintSystem::removeQueue(const std::string& queueID) {
    const std::lock_guard lock(mutex_);
    removed.push_back(queueID);
    return 0;
}

std::int32_t FakePrintSystem::setDefaultPrinter(const std::string& queueID) {
    const std::lock_guard lock(mutex_);
    defaults.push_back(queueID);
    return 0;
}

std::optional<std::string> FakePrintSystem::copyQueuePPD(const std::string& queueID) {
    const std::lock_guard lock(mutex_);
    const auto ppd = queuePPDs.find(queueID);
    return ppd == queuePPDs.end() ? std::nullopt : std::optional{newFile(ppd->second)};
}

std::int32_t FakePrintSystem::setQueuePPD(const std::string& queueID, const std::string& ppdPath) {
    const std::lock_guard lock(mutex_);
    setPPDs.emplace_back(queueID, fileContent(ppdPath).value_or(""));
    return 0;
}

std::optional<std::string> FakePrintSystem::copyLocalizedPPD(const std::string& ppdPath) {
    if (localizedPPD)
        return localizedPPD;
    return access(ppdPath.c_str(), R_OK) == 0 ? std::optional{ppdPath} : std::nullopt;
}

AutoSelectCreation FakePrintSystem::autoSelectCreateContext(const std::string&) {
    if (autoSelection.createStatus != 0)
        return {autoSelection.createStatus, nullptr};
    return {0, std::make_unique<FakeAutoSelectContext>(*this)};
}

}  // namespace ventras
