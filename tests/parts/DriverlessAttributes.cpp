#include <array>

#include "tests/parts/ScriptedPrinter.h"

namespace ventras {
namespace {

void addText(ipp_t* answer, ipp_tag_t tag, const char* name, const std::string& value) {
    ippAddString(answer, IPP_TAG_PRINTER, tag, name, nullptr, value.c_str());
}

template <std::size_t N>
void addList(ipp_t* answer, ipp_tag_t tag, const char* name, const std::array<const char*, N>& values) {
    ippAddStrings(answer, IPP_TAG_PRINTER, tag, name, static_cast<int>(N), nullptr, values.data());
}

}  // namespace

void addDriverlessAttributes(ipp_t* answer, const ScriptedPrinterOptions& options) {
    addText(answer, IPP_TAG_NAME, "printer-name", options.name);
    addText(answer, IPP_TAG_NAME, "printer-dns-sd-name", options.name);
    addText(answer, IPP_TAG_TEXT, "printer-make-and-model", options.makeAndModel);
    addText(answer, IPP_TAG_TEXT, "printer-info", options.name);
    addText(answer, IPP_TAG_TEXT, "printer-location", options.location);
    addText(answer, IPP_TAG_TEXT, "printer-device-id", "MFG:Acme;MDL:Scripted;CMD:PDF,URF;");
    addText(answer, IPP_TAG_URI, "printer-uuid", "urn:uuid:12345678-9abc-def0-1234-56789abcdef0");
    ippAddInteger(answer, IPP_TAG_PRINTER, IPP_TAG_ENUM, "printer-state", IPP_PSTATE_IDLE);
    addText(answer, IPP_TAG_KEYWORD, "printer-state-reasons", "none");
    ippAddBoolean(answer, IPP_TAG_PRINTER, "printer-is-accepting-jobs", 1);
    ippAddBoolean(answer, IPP_TAG_PRINTER, "color-supported", 1);
    addList(answer, IPP_TAG_KEYWORD, "ipp-versions-supported", std::array{"1.1", "2.0"});
    addList(answer, IPP_TAG_MIMETYPE, "document-format-supported",
            std::array{"application/octet-stream", "application/pdf", "image/urf"});
    addList(answer, IPP_TAG_KEYWORD, "urf-supported",
            std::array{"V1.4", "CP1", "W8", "SRGB24", "RS600", "DM3"});
    addList(answer, IPP_TAG_KEYWORD, "sides-supported",
            std::array{"one-sided", "two-sided-long-edge", "two-sided-short-edge"});
    addList(answer, IPP_TAG_KEYWORD, "print-color-mode-supported", std::array{"auto", "color", "monochrome"});
    addList(answer, IPP_TAG_KEYWORD, "output-mode-supported", std::array{"auto", "color", "monochrome"});
    addText(answer, IPP_TAG_KEYWORD, "media-default", "iso_a4_210x297mm");
    addList(answer, IPP_TAG_KEYWORD, "media-supported", std::array{"iso_a4_210x297mm", "na_letter_8.5x11in"});
    ippAddResolution(answer, IPP_TAG_PRINTER, "printer-resolution-default", IPP_RES_PER_INCH, 600, 600);
    ippAddResolution(answer, IPP_TAG_PRINTER, "printer-resolution-supported", IPP_RES_PER_INCH, 600, 600);
}

void removeAttribute(ipp_t* answer, const char* name) {
    while (auto* attribute = ippFindAttribute(answer, name, IPP_TAG_ZERO))
        ippDeleteAttribute(answer, attribute);
}

void setAttribute(ipp_t* answer, ipp_tag_t tag, const char* name, const std::string& value) {
    removeAttribute(answer, name);
    addText(answer, tag, name, value);
}

}  // namespace ventras
