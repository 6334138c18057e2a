// Elements are recognised by their local names: documents differ in the namespace that they declare, as the
// editions of the standard do.
#include "desktop/platform/XmlAit.h"

#include <array>
#include <cstring>
#include <glib.h>
#include <libxml/parser.h>
#include <libxml/tree.h>
#include <memory>

#include "desktop/platform/OwnedString.h"

namespace desktop {

namespace {

constexpr const char* kHbbTvType = "application/vnd.hbbtv.xhtml+xml";
constexpr const char* kDigitalTextUsage = "urn:dvb:mhp:2009:digitalText";

struct Visibility {
    const char* name;
    uint8_t value;
};

constexpr std::array<Visibility, 3> kVisibilities{{
    {"NOT_VISIBLE_ALL", 0},
    {"NOT_VISIBLE_USERS", 1},
    {"VISIBLE_ALL", kVisibilityAll},
}};

struct XmlFree {
    void operator()(xmlDoc* document) const { xmlFreeDoc(document); }
    void operator()(xmlParserCtxt* parser) const { xmlFreeParserCtxt(parser); }
    void operator()(xmlChar* string) const { xmlFree(string); }
};

bool isNamed(const xmlNode* node, const char* name) {
    return node->type == XML_ELEMENT_NODE &&
           std::strcmp(reinterpret_cast<const char*>(node->name), name) == 0;
}

template <typename Function>
void forEachChild(const xmlNode* parent, const char* name, Function function) {
    for (xmlNode* node = parent ? parent->children : nullptr; node; node = node->next) {
        if (isNamed(node, name)) {
            function(node);
        }
    }
}

xmlNode* firstChild(const xmlNode* parent, const char* name) {
    xmlNode* first = nullptr;
    forEachChild(parent, name, [&](xmlNode* node) { first = first ? first : node; });
    return first;
}

// Without white space at both ends; empty if there is no node.
std::string textOf(const xmlNode* node) {
    const std::unique_ptr<xmlChar, XmlFree> content(node ? xmlNodeGetContent(node) : nullptr);
    return content ? trimmed(reinterpret_cast<const char*>(content.get())) : "";
}

std::string childText(const xmlNode* parent, const char* name) {
    return textOf(firstChild(parent, name));
}

// A whole number; nothing if it is none or above the maximum.
std::optional<uint32_t> numberOf(const std::string& text, uint32_t maximum) {
    guint64 number = 0;
    const bool isNumber = g_ascii_string_to_unsigned(text.c_str(), 10, 0, maximum, &number, nullptr) != FALSE;
    return isNumber ? std::optional(static_cast<uint32_t>(number)) : std::nullopt;
}

// The value of an entry of controlCodes() or kVisibilities.
template <typename Table>
std::optional<uint8_t> valueOf(const Table& table, const std::string& name) {
    for (const auto& each : table) {
        if (name == each.name) {
            return each.value;
        }
    }
    return std::nullopt;
}

// ---- Parts of an Application element. Each function returns what is wrong; empty if nothing is.

std::string readId(const xmlNode* element, SignalledApplication& application) {
    const xmlNode* identifier = firstChild(element, "applicationIdentifier");
    const auto organisation = numberOf(childText(identifier, "orgId"), UINT32_MAX);
    const auto number = numberOf(childText(identifier, "appId"), UINT16_MAX);
    if (!organisation || !number) {
        return "no valid applicationIdentifier";
    }
    application.id = {*organisation, static_cast<uint16_t>(*number)};
    return "";
}

// A document need not say which profile an application needs.
bool isVersionSupported(const xmlNode* descriptor) {
    const xmlNode* version = firstChild(descriptor, "mhpVersion");
    if (!version) {
        return true;
    }
    const auto profile = numberOf(childText(version, "profile"), UINT16_MAX);
    const auto major = numberOf(childText(version, "versionMajor"), UINT8_MAX);
    const auto minor = numberOf(childText(version, "versionMinor"), UINT8_MAX);
    return profile && major && minor &&
           isSupported({static_cast<uint16_t>(*profile), static_cast<uint8_t>(*major),
                        static_cast<uint8_t>(*minor), 0});
}

std::string readDescriptor(const xmlNode* descriptor, SignalledApplication& application) {
    const std::string type = childText(firstChild(descriptor, "type"), "OtherApp");
    if (!type.empty() && type != kHbbTvType) {
        return "\"" + type + "\" is not the type of HbbTV applications";
    }
    if (!isVersionSupported(descriptor)) {
        return "the set does not support the profile or version";
    }
    const std::string controlCode = childText(descriptor, "controlCode");
    const auto code = valueOf(controlCodes(), controlCode);
    if (!code) {
        return "the set does not support control code \"" + controlCode + "\"";
    }
    application.controlCode = *code;
    const std::string priority = childText(descriptor, "priority");
    if (!priority.empty()) {
        // Documents write it in hexadecimal, without a prefix.
        guint64 number = 0;
        if (!g_ascii_string_to_unsigned(priority.c_str(), 16, 0, UINT8_MAX, &number, nullptr)) {
            return "\"" + priority + "\" is not a priority";
        }
        application.priority = static_cast<uint8_t>(number);
    }
    const std::string serviceBound = childText(descriptor, "serviceBound");
    application.isServiceBound = serviceBound.empty() || serviceBound == "true" || serviceBound == "1";
    application.visibility =
        valueOf(kVisibilities, childText(descriptor, "visibility")).value_or(kVisibilityAll);
    return "";
}

// The location relative to the first HTTP transport, or an absolute URL.
std::string readLocation(const xmlNode* element, SignalledApplication& application) {
    const std::string location = childText(element, "applicationLocation");
    const OwnedString scheme(g_uri_parse_scheme(location.c_str()));
    std::string base;
    forEachChild(element, "applicationTransport", [&](const xmlNode* transport) {
        if (base.empty()) {
            base = childText(transport, "URLBase");
            base += base.empty() ? "" : childText(transport, "URLExtension");
        }
    });
    application.url = scheme ? location : base + location;
    if (!application.isStartable()) {
        return "";
    }
    if (location.empty()) {
        return "no applicationLocation";
    }
    return scheme || !base.empty() ? "" : "no HTTP transport protocol";
}

std::string readApplication(const xmlNode* element, SignalledApplication& application) {
    application.name = childText(element, "appName");
    const std::string usage =
        childText(firstChild(element, "applicationUsageDescriptor"), "ApplicationUsage");
    application.usage = usage == kDigitalTextUsage ? kUsageDigitalText : kUsageNone;
    forEachChild(firstChild(element, "applicationBoundary"), "BoundaryExtension",
                 [&](const xmlNode* boundary) { application.boundaries.push_back(textOf(boundary)); });
    std::string fault = readId(element, application);
    if (fault.empty()) {
        fault = readDescriptor(firstChild(element, "applicationDescriptor"), application);
    }
    return fault.empty() ? readLocation(element, application) : fault;
}

// "line 3: REASON" of a document that libxml2 rejects.
std::string reasonOf(const xmlParserCtxt& parser) {
    const xmlError& error = parser.lastError;
    const std::string message = trimmed(error.message ? error.message : "not well-formed");
    return "line " + std::to_string(error.line) + ": " + message;
}

} // namespace

std::optional<ApplicationList> parseXmlAit(const std::string& document, std::string& error) {
    if (document.size() > kMaxXmlAitSize) {
        error = "larger than " + std::to_string(kMaxXmlAitSize) + " bytes";
        return std::nullopt;
    }
    const std::unique_ptr<xmlParserCtxt, XmlFree> parser(xmlNewParserCtxt());
    const std::unique_ptr<xmlDoc, XmlFree> read(
        xmlCtxtReadMemory(parser.get(), document.data(), static_cast<int>(document.size()), nullptr, nullptr,
                          XML_PARSE_NONET | XML_PARSE_NOERROR | XML_PARSE_NOWARNING));
    if (!read) {
        error = reasonOf(*parser);
        return std::nullopt;
    }
    if (read->intSubset) { // entities of its own could expand without limit
        error = "a document type declaration is not allowed";
        return std::nullopt;
    }
    const xmlNode* root = xmlDocGetRootElement(read.get());
    if (!isNamed(root, "ServiceDiscovery")) {
        error = std::string("the root element is <") + reinterpret_cast<const char*>(root->name) +
                ">, not <ServiceDiscovery>";
        return std::nullopt;
    }
    ApplicationList list;
    forEachChild(root, "ApplicationDiscovery", [&](const xmlNode* discovery) {
        forEachChild(discovery, "ApplicationList", [&](const xmlNode* applications) {
            forEachChild(applications, "Application", [&](const xmlNode* element) {
                SignalledApplication application;
                const std::string fault = readApplication(element, application);
                addApplication(std::move(application), fault, list);
            });
        });
    });
    return list;
}

} // namespace desktop
