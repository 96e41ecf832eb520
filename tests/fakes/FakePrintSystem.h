#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "platform/PrintSystemService.h"
#include "platform/PropertyValue.h"

namespace ventras {

/// What autoSelectCreateContext() is to answer, and what the context then does.
struct FakeAutoSelection {
    std::int32_t createStatus = 0;
    std::int32_t ppdStatus = 0;
    std::int32_t optionsStatus = 0;
    AutoSelectInfo info{};
    std::optional<std::string> newPPDText{};  ///< contents of the new PPD; absent = none is made

    /// Hears of each selection before it is made, and may change how it goes.
    std::function<void(FakeAutoSelection&, const std::string& ppdPath)> onSelect{};
};

/// A print system in memory. Any thread may call it; change its settings before the calls.
class FakePrintSystem final : public PrintSystemService {
public:
    struct Creation {
        std::string queueID;
        PropertyDictionary attributes;
        std::map<std::string, std::string> options;
        std::string ppdText;  ///< of the PPD file, at the time of the call
    };

    // Settings.
    std::set<std::string> taken;  ///< identifiers in use
    std::optional<std::string> serverURL = "http://localhost:631/";
    std::function<std::int32_t(const Creation&)> create = [](const Creation&) { return 0; };
    std::set<std::string> faxQueues, scannerQueues;
    bool suggestsNames = true;
    bool makesDefault = true;
    FakeAutoSelection autoSelection;
    std::optional<std::string> localizedPPD;
    std::map<std::string, std::string> queuePPDs;  ///< the text of each queue's PPD

    // What was asked.
    std::vector<Creation> creations;
    std::vector<std::string> removed, defaults, autoSelected;
    std::vector<std::pair<std::string, std::string>> setPPDs;  ///< queue and the PPD's text
    std::vector<bool> binaryOK;
    int contextsMade = 0;
    int contextsAlive = 0;

    std::optional<std::string> suggestQueueName(const std::string& name, bool unique) override;
    std::optional<std::string> copyLocalServerURL() override { return serverURL; }
    std::int32_t createQueue(const std::string& server, const std::string& queueID,
                             const std::string& attributes,
                             const std::map<std::string, std::string>& options) override;
    std::int32_t removeQueue(const std::string& queueID) override;
    std::int32_t setDefaultPrinter(const std::string& queueID) override;
    bool isFax(const std::string& queueID) override { return faxQueues.contains(queueID); }
    bool isScanner(const std::string& queueID) override { return scannerQueues.contains(queueID); }
    std::optional<std::string> copyQueuePPD(const std::string& queueID) override;
    std::int32_t setQueuePPD(const std::string& queueID, const std::string& ppdPath) override;
    std::optional<std::string> copyLocalizedPPD(const std::string& ppdPath) override;
    bool useLastPrinterAsCurrentPrinter() override { return makesDefault; }
    AutoSelectCreation autoSelectCreateContext(const std::string& deviceURI) override;

private:
    friend class FakeAutoSelectContext;
    std::mutex mutex_;
};

}  // namespace ventras
