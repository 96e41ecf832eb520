#pragma once

#include <cups/cups.h>
#include <dns_sd.h>

#include <cstdint>
#include <span>
#include <string_view>

#include "platform/PropertyValue.h"

namespace ventras {

class Log;

/// Copies IPP attributes (RFC 8011) into a dictionary in the style of a DNS-SD TXT record, each under a key
/// that the caller chooses.
///
/// Every ippAdd... adds at most one entry, replacing one of the same key, and removes none. An attribute that
/// is null or holds no value adds nothing. Texts that are not UTF-8 count as not sent: they would spread into
/// queue names, files and messages. The functions keep no state; any thread may call them on a dictionary of
/// its own.
namespace IPPAdditions {

/// All texts in order, joined with ",".
void ippAddStringsFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                                std::string_view key);

/// The first text.
void ippAddStringFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                               std::string_view key);

/// The list of all texts.
void ippAddStringArrayFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                                    std::string_view key);

/// The first text in parentheses, as a PPD's product is written.
void ippAddProductFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                                std::string_view key);

/// The first text without a leading "urn:uuid:" (RFC 4122 section 3).
void ippAddUUIDStringFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                                   std::string_view key);

/// The first text, a URI, rebuilt on the host and port at which the printer was reached, without a user name.
/// A URI of another host or port adds nothing and leaves a line in the log.
/// @param host part of the URI's host, compared without regard to case
/// @param port TCP port that the URI must name or imply
void ippAddURIStringFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                                  std::string_view host, std::int32_t port, std::string_view key, Log& log);

/// "PaperMax" = the class of the largest custom size that a list of media sizes allows (PWG 5100.7).
/// @param attribute collections with "x-dimension" and "y-dimension" in hundredths of a millimetre; only
///        ranges count, fixed sizes do not
void ippAddPaperMaxFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute);

/// "T" when the first value is true, else "F". The spelling of the name is the interface's.
void ippAddBooleanFromAttribte(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                               std::string_view key);

/// "T" when the attribute contains any of the texts, else "F".
void ippAddBooleanFromAttribte(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                               std::span<const std::string_view> matching, std::string_view key);

/// Sets every text of the dictionary in a TXT record that is being built; other values are left out.
/// The length that is set is the text's number of characters modulo 256, as the length field is one byte.
void txtRecordRepresentation(const PropertyDictionary& dictionary, TXTRecordRef& record);

}  // namespace IPPAdditions
}  // namespace ventras
