// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Inspect/InspectionPage.h"

#include <string_view>

#include "Host/Inspect/InspectionJson.h"

// The page's files, embedded by Page/Embedded.S.
extern "C" {
extern const char vantrel_inspect_page_html[], vantrel_inspect_page_html_end[];
extern const char vantrel_inspect_page_css[], vantrel_inspect_page_css_end[];
extern const char vantrel_inspect_page_js[], vantrel_inspect_page_js_end[];
}

namespace Vantrel::Host {

namespace {

std::string_view Between(const char* begin, const char* end) { return {begin, static_cast<std::size_t>(end - begin)}; }

void Replace(std::string& text, std::string_view place, std::string_view by) {
    const std::size_t at = text.find(place);
    if (at != std::string::npos) text.replace(at, place.size(), by);
}

/// JSON that may stand inside a page: nothing in it ends the element around it.
std::string EscapeForPage(const std::string& json) {
    std::string text;
    text.reserve(json.size());
    for (const char c : json) {
        if (c == '<') {
            text += R"(\u003c)";
        } else {
            text += c;
        }
    }
    return text;
}

}  // namespace

std::string InspectionToPage(const Inspection& inspection) {
    std::string page(Between(vantrel_inspect_page_html, vantrel_inspect_page_html_end));
    Replace(page, "/*STYLE*/", Between(vantrel_inspect_page_css, vantrel_inspect_page_css_end));
    Replace(page, "/*SCRIPT*/", Between(vantrel_inspect_page_js, vantrel_inspect_page_js_end));
    // Names come from files, which needn't be valid UTF-8.
    const std::string json =
        InspectionToJson(inspection).dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
    Replace(page, "/*DATA*/", EscapeForPage(json));
    return page;
}

}  // namespace Vantrel::Host
