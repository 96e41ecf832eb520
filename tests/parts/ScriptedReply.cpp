#include "tests/parts/ScriptedReply.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <span>

namespace ventras {
namespace {

using namespace std::string_literals;

const std::string kGarbage = "\x01\x7f\xfe no protocol at all \x00\xff\x80 really not"s;
const std::string kWebPage =
    "<!DOCTYPE html><html><head><title>Printer</title></head><body>It works.</body></html>";

ssize_t appendToString(void* context, ipp_uchar_t* bytes, std::size_t length) {
    static_cast<std::string*>(context)->append(reinterpret_cast<const char*>(bytes), length);
    return static_cast<ssize_t>(length);
}

ssize_t takeFromView(void* context, ipp_uchar_t* bytes, std::size_t length) {
    auto& rest = *static_cast<std::string_view*>(context);
    const auto taken = std::min(length, rest.size());
    std::memcpy(bytes, rest.data(), taken);
    rest.remove_prefix(taken);
    return static_cast<ssize_t>(taken);
}

std::string twoBytes(std::size_t number) {
    return {static_cast<char>(number >> 8U & 0xFFU), static_cast<char>(number & 0xFFU)};
}

std::string ippResponse(std::string_view body) {
    return httpResponse("200 OK", "application/ipp", body);
}

std::string emptyAnswer(ipp_t* properAnswer) {
    const IppPtr answer{ippNew()};
    ippSetOperation(answer.get(), IPP_OP_CUPS_INVALID);
    ippSetStatusCode(answer.get(), IPP_STATUS_OK);
    ippSetVersion(answer.get(), 2, 0);
    ippSetRequestId(answer.get(), ippGetRequestId(properAnswer));
    return encodeIpp(answer.get());
}

}  // namespace

std::vector<std::pair<Fault, std::string_view>> allFaults() {
    return {
        {Fault::silent, "silent"},
        {Fault::drip, "drip"},
        {Fault::html, "html"},
        {Fault::garbage, "garbage"},
        {Fault::garbageThenSilence, "garbageThenSilence"},
        {Fault::garbledIpp, "garbledIpp"},
        {Fault::halfThenSilence, "halfThenSilence"},
        {Fault::halfThenClose, "halfThenClose"},
        {Fault::notFound, "notFound"},
        {Fault::unauthorized, "unauthorized"},
        {Fault::closeAtOnce, "closeAtOnce"},
        {Fault::redirect, "redirect"},
        {Fault::wrongRequestId, "wrongRequestId"},
        {Fault::noAttributes, "noAttributes"},
    };
}

std::string encodeIpp(ipp_t* message, std::string_view rawAttributes) {
    std::string bytes;
    ippSetState(message, IPP_STATE_IDLE);
    ippWriteIO(&bytes, appendToString, 1, nullptr, message);
    if (!bytes.empty() && !rawAttributes.empty())
        bytes.insert(bytes.size() - 1, rawAttributes);  // before the end-of-attributes tag
    return bytes;
}

IppPtr decodeIpp(std::string_view bytes) {
    IppPtr message{ippNew()};
    return ippReadIO(&bytes, takeFromView, 1, nullptr, message.get()) == IPP_STATE_DATA ? std::move(message)
                                                                                        : nullptr;
}

std::string rawAttribute(ipp_tag_t tag, std::string_view name, std::string_view value) {
    std::string bytes(1, static_cast<char>(tag));
    return bytes.append(twoBytes(name.size())).append(name).append(twoBytes(value.size())).append(value);
}

std::string httpResponse(std::string_view statusLine, std::string_view contentType, std::string_view body,
                         std::string_view moreHeaders) {
    return std::string("HTTP/1.1 ")
        .append(statusLine)
        .append("\r\nContent-Type: ")
        .append(contentType)
        .append("\r\nContent-Length: ")
        .append(std::to_string(body.size()))
        .append("\r\n")
        .append(moreHeaders)
        .append("\r\n")
        .append(body);
}

ScriptedReply faultyReply(Fault fault, const IppPtr& properAnswer, const ReplyMatter& matter) {
    if (fault == Fault::wrongRequestId)
        ippSetRequestId(properAnswer.get(), ippGetRequestId(properAnswer.get()) + 1000);
    const std::string proper =
        ippResponse(encodeIpp(properAnswer.get(), matter.rawAttributes) + matter.document);
    switch (fault) {
        case Fault::silent:
            return {.bytes = {}, .after = AfterReply::staySilent};
        case Fault::drip:
            return {.bytes = proper, .bytesPerStep = 1, .stepInterval = matter.dripInterval};
        case Fault::html:
            return {.bytes = httpResponse("200 OK", "text/html", kWebPage)};
        case Fault::garbage:
            return {.bytes = kGarbage, .after = AfterReply::close};
        case Fault::garbageThenSilence:
            return {.bytes = kGarbage, .after = AfterReply::staySilent};
        case Fault::garbledIpp:
            return {.bytes = ippResponse(kGarbage)};
        case Fault::halfThenSilence:
            return {.bytes = proper.substr(0, proper.size() / 2), .after = AfterReply::staySilent};
        case Fault::halfThenClose:
            return {.bytes = proper.substr(0, proper.size() / 2), .after = AfterReply::close};
        case Fault::notFound:
            return {.bytes = httpResponse("404 Not Found", "text/html", kWebPage)};
        case Fault::unauthorized:
            return {.bytes = httpResponse("401 Unauthorized", "text/html", kWebPage,
                                          "WWW-Authenticate: Basic realm=\"Printer\"\r\n")};
        case Fault::closeAtOnce:
            return {.bytes = {}, .after = AfterReply::close};
        case Fault::redirect:
            return {.bytes = httpResponse("302 Found", "text/html", kWebPage, "Location: /ipp/print\r\n")};
        case Fault::noAttributes:
            return {.bytes = ippResponse(emptyAnswer(properAnswer.get()))};
        case Fault::none:
        case Fault::wrongRequestId:
            break;
    }
    return {.bytes = proper};
}

}  // namespace ventras
