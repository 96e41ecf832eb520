#include "drivers/PPDCatalogue.h"

#include <algorithm>
#include <array>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <thread>
#include <utility>

#include "platform/IppConnection.h"

namespace ventras::PPDCatalogue {
namespace {

constexpr std::string_view kSchedulersDriverless = "drv:///vellum.drv/urf.ppd";

// Packed collections stay out by not being named.
constexpr std::array kSchemes{"drv", "file", "gutenprint*"};

template <typename Member>
struct Attribute {
    std::string_view name;
    Member member;
};

constexpr std::array<Attribute<std::optional<std::string> PPDRecord::*>, 5> kTexts{{
    {"ppd-make", &PPDRecord::make},
    {"ppd-name", &PPDRecord::name},
    {"ppd-type", &PPDRecord::type},
    {"ppd-device-id", &PPDRecord::deviceID},
    {"ppd-make-and-model", &PPDRecord::makeAndModel},
}};

/// The values worth knowing: Ghostscript's own products and versions stand for no device, and each text once.
std::vector<std::string> usefulValues(ipp_attribute_t* attribute) {
    std::vector<std::string> values;
    for (int i = 0; i < ippGetCount(attribute); ++i) {
        const auto* text = ippGetString(attribute, i, nullptr);
        if (text == nullptr || std::string_view(text).find("Ghostscript") != std::string_view::npos)
            continue;
        if (std::ranges::find(values, text) == values.end())
            values.emplace_back(text);
    }
    return values;
}

bool addText(PPDRecord& record, std::string_view name, ipp_attribute_t* attribute) {
    const auto* entry = std::ranges::find(kTexts, name, [](const auto& text) { return text.name; });
    const auto* text = entry == kTexts.end() ? nullptr : ippGetString(attribute, 0, nullptr);
    if (text == nullptr)
        return false;
    record.*(entry->member) = text;
    return true;
}

bool addModelNumber(PPDRecord& record, std::string_view name, ipp_attribute_t* attribute) {
    if (name != "ppd-model-number" || ippGetValueTag(attribute) != IPP_TAG_INTEGER)
        return false;
    record.modelNumber = std::to_string(ippGetInteger(attribute, 0));
    return true;
}

bool addValues(PPDRecord& record, std::string_view name, ipp_attribute_t* attribute) {
    if (name == "ppd-product")
        record.product = usefulValues(attribute);
    else if (name == "ppd-psversion")
        record.psVersion = usefulValues(attribute);
    else if (name == "ppd-natural-language")
        record.naturalLanguage = usefulValues(attribute);
    else
        return false;
    return true;
}

/// Gathers the attributes of one run into a record, and finished records into a list.
class Collector {
public:
    void add(ipp_attribute_t* attribute) {
        const std::string_view name = ippGetName(attribute);
        known_ |= addText(record_, name, attribute) || addModelNumber(record_, name, attribute) ||
                  addValues(record_, name, attribute);
    }

    void endRun() {
        if (known_ && record_.name != kSchedulersDriverless)
            records_.push_back(std::move(record_));
        record_ = {};
        known_ = false;
    }

    std::vector<PPDRecord> take() { return std::move(records_); }

private:
    PPDRecord record_;
    bool known_ = false;
    std::vector<PPDRecord> records_;
};

// libcups keeps each text once, and to free one it searches thousands: that takes as long as reading them
// did. Nobody need wait for it, unless there are too many threads already.
void freeAside(IppPtr response) {
    try {
        std::thread([unused = std::move(response)] {}).detach();
    } catch (const std::system_error&) {
    }
}

}  // namespace

std::vector<PPDRecord> ask() {
    IppPtr request{ippNewRequest(IPP_OP_CUPS_GET_PPDS)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_KEYWORD, "requested-attributes", nullptr, "all");
    ippAddStrings(request.get(), IPP_TAG_OPERATION, IPP_TAG_NAME, "include-schemes", kSchemes.size(), nullptr,
                  kSchemes.data());

    auto answer = IppConnection::toScheduler().exchange(std::move(request), "/");
    if (!answer.succeeded() || !answer.response)
        return {};
    auto records = recordsIn(answer.response.get());
    freeAside(std::move(answer.response));
    return records;
}

std::vector<PPDRecord> recordsIn(ipp_t* response) {
    Collector collector;
    for (auto* attribute = ippFirstAttribute(response); attribute != nullptr;
         attribute = ippNextAttribute(response)) {
        // A nameless attribute separates two groups of the same kind.
        if (ippGetGroupTag(attribute) == IPP_TAG_PRINTER && ippGetName(attribute) != nullptr)
            collector.add(attribute);
        else
            collector.endRun();
    }
    collector.endRun();
    return collector.take();
}

}  // namespace ventras::PPDCatalogue
