#pragma once

#include <chrono>
#include <cstddef>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/Handles.h"

namespace ventras {

/// What a peer sees after a reply.
enum class AfterReply { keepOpen, staySilent, close };

/// Bytes for a connection, and how they get there.
struct ScriptedReply {
    std::string bytes;
    std::chrono::milliseconds delay{};         ///< before the first byte
    std::size_t bytesPerStep = 0;              ///< 0 = all at once
    std::chrono::milliseconds stepInterval{};  ///< between two steps
    AfterReply after = AfterReply::keepOpen;
};

/// What a printer does instead of answering properly.
enum class Fault {
    none,
    silent,              ///< takes the connection and never says a word, whatever it is sent, TLS included
    drip,                ///< a proper answer, one byte at a time
    html,                ///< a web page
    garbage,             ///< bytes that are no HTTP and no line, then it hangs up
    garbageThenSilence,  ///< the same, and it does not hang up
    garbledIpp,          ///< proper HTTP around bytes that are no IPP
    halfThenSilence,     ///< the first half of a proper answer
    halfThenClose,
    notFound,        ///< HTTP 404
    unauthorized,    ///< HTTP 401, asking for a password
    closeAtOnce,     ///< hangs up as soon as somebody connects
    redirect,        ///< HTTP 302 to itself
    wrongRequestId,  ///< a proper answer to some other request
    noAttributes,    ///< successful-ok, and nothing else
};

/// Every fault by its name, for tables.
std::vector<std::pair<Fault, std::string_view>> allFaults();

/// An IPP message as bytes (RFC 8010), `rawAttributes` appended to its last group.
std::string encodeIpp(ipp_t* message, std::string_view rawAttributes = {});

/// Reads an IPP message; empty when it is none.
IppPtr decodeIpp(std::string_view bytes);

/// One attribute as bytes, exactly as given: libcups would refuse or mend what hostile printers send.
std::string rawAttribute(ipp_tag_t tag, std::string_view name, std::string_view value);

/// An HTTP response around a body.
std::string httpResponse(std::string_view statusLine, std::string_view contentType, std::string_view body,
                         std::string_view moreHeaders = {});

/// What goes into a reply besides the proper answer.
struct ReplyMatter {
    std::string rawAttributes;                 ///< appended to the answer's last group
    std::string document;                      ///< follows the answer
    std::chrono::milliseconds dripInterval{};  ///< for Fault::drip
};

/// The reply to a request that asks for `properAnswer`, as a printer with that fault gives it.
ScriptedReply faultyReply(Fault fault, const IppPtr& properAnswer, const ReplyMatter& matter);

}  // namespace ventras
