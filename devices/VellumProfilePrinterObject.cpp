#include "devices/VellumProfilePrinterObject.h"

#include <algorithm>
#include <array>
#include <utility>

#include "deviceid/PMStringAdditions.h"
#include "deviceid/TextScan.h"
#include "devices/IPPAdditions.h"
#include "devices/TXTRecord.h"
#include "drivers/PPDManager.h"
#include "platform/ImageDeviceBrowser.h"
#include "platform/IppConnection.h"
#include "platform/Log.h"
#include "platform/Platform.h"
#include "platform/SeparatedURI.h"

namespace ventras {
namespace {

// The two modes are part of the request that printers are known to answer well; the description does not keep
// them.
constexpr std::array kRequestedAttributes{
    "document-format-supported",
    "output-mode-supported",
    "print-color-mode-supported",
    "printer-dns-sd-name",
    "printer-location",
    "printer-make-and-model",
    "printer-uuid",
    "sides-supported",
    "urf-supported",
};

using AddOperation = void (*)(PropertyDictionary&, ipp_attribute_t*, std::string_view);

void addDuplex(PropertyDictionary& dictionary, ipp_attribute_t* attribute, std::string_view key) {
    constexpr std::array kLongEdge{std::string_view{"two-sided-long-edge"}};
    IPPAdditions::ippAddBooleanFromAttribte(dictionary, attribute, kLongEdge, key);
}

struct KeptAttribute {
    const char* name;
    ipp_tag_t tag;
    AddOperation add;
    std::string_view key;
};

constexpr std::array kKeptAttributes{
    KeptAttribute{"document-format-supported", IPP_TAG_MIMETYPE, IPPAdditions::ippAddStringsFromAttribute,
                  "pdl"},
    KeptAttribute{"printer-dns-sd-name", IPP_TAG_NAME, IPPAdditions::ippAddStringFromAttribute,
                  "display-name"},
    KeptAttribute{"printer-location", IPP_TAG_TEXT, IPPAdditions::ippAddStringFromAttribute, "note"},
    KeptAttribute{"printer-make-and-model", IPP_TAG_TEXT, IPPAdditions::ippAddProductFromAttribute,
                  "product"},
    KeptAttribute{"printer-uuid", IPP_TAG_URI, IPPAdditions::ippAddUUIDStringFromAttribute, "UUID"},
    KeptAttribute{"urf-supported", IPP_TAG_KEYWORD, IPPAdditions::ippAddStringsFromAttribute, "URF"},
    KeptAttribute{"sides-supported", IPP_TAG_KEYWORD, addDuplex, "Duplex"},
};

IppPtr descriptionRequest(const std::string& uri) {
    IppPtr request{ippNewRequest(IPP_OP_GET_PRINTER_ATTRIBUTES)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr, uri.c_str());
    ippAddStrings(request.get(), IPP_TAG_OPERATION, IPP_TAG_KEYWORD, "requested-attributes",
                  static_cast<int>(kRequestedAttributes.size()), nullptr, kRequestedAttributes.data());
    return request;
}

DeviceDescription descriptionFrom(ipp_t* response) {
    PropertyDictionary found;
    for (const auto& [name, tag, add, key] : kKeptAttributes)
        add(found, ippFindAttribute(response, name, tag), key);
    DeviceDescription description;
    for (const auto& [key, value] : found)
        if (const auto* text = std::get_if<std::string>(&value))
            description.emplace(key, *text);
    return description;
}

}  // namespace

VellumProfilePrinterObject::VellumProfilePrinterObject(Platform& platform, PPDManager& drivers,
                                                       std::optional<std::string> uri)
    : platform_(platform), drivers_(drivers), uri_(std::move(uri)) {}

std::shared_ptr<VellumProfilePrinterObject> VellumProfilePrinterObject::initVellumProfilePrinterObjectWithURI(
    Platform& platform, PPDManager& drivers, std::string uri) {
    return std::make_shared<VellumProfilePrinterObject>(platform, drivers, std::move(uri));
}

const DeviceDescription& VellumProfilePrinterObject::attributes() {
    if (!attributes_)
        updateAttributes();
    return *attributes_;
}

void VellumProfilePrinterObject::setAttributes(DeviceDescription attributes) {
    attributes_ = std::move(attributes);
    failure_.clear();
}

void VellumProfilePrinterObject::updateAttributes() {
    const std::string uri = uri_.value_or("");
    const auto address = SeparatedURI::from(uri);
    attributes_.emplace();
    failure_.clear();

    auto connection = IppConnection::toPrinter(address.host, address.port, cupsEncryption());
    if (!connection.connected()) {
        failure_ = "it cannot be reached: " + connection.failure();
        platform_.log.error("-[VellumProfilePrinterObject updateAttributes]: Unable to connect to " +
                            address.host + ":" + std::to_string(address.port) + ": " + connection.failure());
        return;
    }
    const auto answer = connection.exchange(descriptionRequest(uri), address.resource);
    if (answer.response)
        attributes_ = descriptionFrom(answer.response.get());
    if (!answer.succeeded())
        failure_ = "it does not describe itself: " + answer.reason;
}

std::optional<std::string> VellumProfilePrinterObject::attribute(std::string_view key) {
    const auto& all = attributes();
    const auto found = all.find(key);
    return found == all.end() ? std::nullopt : std::optional{found->second};
}

std::optional<std::string> VellumProfilePrinterObject::name() {
    if (auto displayName = attribute("display-name"))
        return displayName;
    auto text = product();
    if (text && text->size() >= 2 && text->front() == '(' && text->back() == ')')
        return text->substr(1, text->size() - 2);
    return text;
}

std::optional<std::string> VellumProfilePrinterObject::location() {
    return attribute("note");
}

std::optional<std::string> VellumProfilePrinterObject::uuid() {
    return attribute("UUID");
}

std::optional<std::string> VellumProfilePrinterObject::urf() {
    return attribute("URF");
}

std::optional<std::string> VellumProfilePrinterObject::product() {
    return attribute("product");
}

std::optional<std::vector<std::string>> VellumProfilePrinterObject::pdl() {
    const auto joined = attribute("pdl");
    if (!joined)
        return std::nullopt;
    std::vector<std::string> types;
    TextScan::Components parts(*joined, ",");
    while (const auto type = parts.next())
        types.push_back(TextScan::lowerCased(*type));
    return types;
}

std::optional<std::string> VellumProfilePrinterObject::duplex() {
    return attribute("Duplex");
}

std::optional<std::vector<PPDRecord>> VellumProfilePrinterObject::driverList() {
    return std::vector{drivers_.genericURFPPD()};
}

bool VellumProfilePrinterObject::matchesIDDevice(const ImageDevice& device) {
    if (device.transport != ImageDeviceTransport::kTCPIP)
        return false;
    const auto record = dictionaryFromTXTRecord(device.txtRecord);
    const auto theirs = record.find("UUID");
    return theirs != record.end() && uuid() == theirs->second;
}

std::optional<std::string> VellumProfilePrinterObject::matchExistingQueues(const QueueRecords& queues) {
    if (!uri_)
        return "";
    const auto serving = std::ranges::find(queues, uri_, &QueueRecord::deviceURI);
    return serving == queues.end() ? std::nullopt : serving->printerName;
}

std::optional<QueueAttributes> VellumProfilePrinterObject::driverInfo(const PPDRecord& driver) {
    const auto displayName = name();
    if (!displayName)
        return std::nullopt;
    QueueAttributes info;
    const auto set = [&info](std::string_view key, const std::optional<std::string>& value) {
        if (value)
            info.insert_or_assign(std::string(key), *value);
    };
    const std::string text = product().value_or("");
    set(QueueAttributeKeys::kPrinterURI, uri_);
    set(QueueAttributeKeys::kPrinterAddress, displayName);
    set(QueueAttributeKeys::kPPD, driver.name);
    set(QueueAttributeKeys::kModel, PMStringAdditions::model(text));
    set(QueueAttributeKeys::kManufacturer, PMStringAdditions::make(text));
    return info;
}

std::optional<std::string> VellumProfilePrinterObject::difficulty() {
    if (!failure_.empty())
        return failure_;
    if (!name())
        return "it tells neither a name nor its make and model";
    const auto types = pdl();
    if (!urf() || !types || !std::ranges::count(*types, "image/urf"))
        return "it does not say that it takes image/urf documents, so there is no driverless queue for it";
    return std::nullopt;
}

std::string VellumProfilePrinterObject::description() {
    std::string text = "URI=" + uri_.value_or("(null)") + " Attributes={";
    for (const auto& [key, value] : attributes())
        text.append(key).append(" = ").append(value).append("; ");
    return text + "}";
}

}  // namespace ventras
