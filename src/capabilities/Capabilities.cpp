// The device's capabilities: the description goes through the page's own parser, the rest is asked of the
// platform at every read.
#include "src/capabilities/Capabilities.h"

#include <cstdlib>
#include <cstring>

#include "common/BrowserGates.h"
#include "common/Log.h"
#include "common/ObjectKind.h"
#include "common/ScriptReferences.h"
#include "src/capabilities/JSCapabilities.h"
#include "telix/telix_platform.h"

namespace {

const char* const kMimeTypes[] = {"application/oipfcapabilities", nullptr};

// quirk 12: XMLCapabilitiesDoc is not declared, so every parse leaves a global of that name.
const char kParserScript[] =
    "window.parseCapabilityDescString = function(xmlCapaDesc)"
    "{"
    "\tvar domParserForCapabilities = new DOMParser();"
    " \tXMLCapabilitiesDoc = domParserForCapabilities.parseFromString(xmlCapaDesc, 'text/xml');"
    "\treturn XMLCapabilitiesDoc;"
    "};";

uint32_t fetchCount(uint32_t& last, TELIX_RETCODE_ENUM_T (*ask)(uint32_t*)) {
    uint32_t count = 0;
    if (ask(&count) == 0) {
        last = count;
    }
    return last;
}

} // namespace

const ObjectKind kCapabilitiesKind = [] {
    ObjectKind kind{};
    kind.id = 700;
    kind.destroyText = "OIPFCAPABILITIES_OBJ_ID delete :: %p \n";
    kind.mimeTypes = kMimeTypes;
    kind.create = [](NPP npp, unsigned short id) -> PluginBase* { return new Capabilities(npp, id); };
    kind.dispose = disposeOf<Capabilities>;
    return kind;
}();

Capabilities::Capabilities(NPP npp, unsigned short objectId) : PluginBase(npp, objectId) {
    // The value of the script is the function, so this reports false even when it ran.
    invokeJScript(kParserScript);
}

Capabilities::~Capabilities() {
    releaseHeld(m_xmlCapabilities); // of a call that was under way when the object closed
}

void Capabilities::close() {
    releaseHeld(m_jsObject);
    releaseHeld(m_xmlCapabilities);
}

NPObject* Capabilities::getJSObject() {
    return handOutOnce<JSCapabilities>(getBrowser(), m_jsObject);
}

NPObject* Capabilities::getxmlCapabilities() {
    char* xml = nullptr;
    if (!m_xmlCapabilities && TELIX_JS_CAP_GetXmlCapabilities(&xml) == 0) {
        const char* text = xml ? xml : "";
        NPVariant argument{};
        argument.type = NPVariantType_String;
        argument.value.stringValue = {text, static_cast<uint32_t>(std::strlen(text))};
        NPVariant result{};
        if (NPN_Invoke(m_npp, getNPWindowObj(), NPN_GetStringIdentifier("parseCapabilityDescString"),
                       &argument, 1, &result)) {
            PLUGIN_LOG(CAPABILITIES, " NPN_Invoke Result Type = %d \n", result.type);
            // quirk 26: any object will do. Whatever else the page's function gives is no description.
            if (result.type == NPVariantType_Object) {
                releaseHeld(m_xmlCapabilities); // the page's function may have read this property itself
                m_xmlCapabilities = result.value.objectValue; // the reference stays with the field
            } else {
                NPN_ReleaseVariantValue(&result);
            }
        }
        std::free(xml);
    }
    return handOut(m_xmlCapabilities);
}

bool Capabilities::hasCapability(const std::string& name) {
    ___UINT8 supported = 0;
    return !name.empty() && TELIX_JS_CAP_HasCapability(name.c_str(), &supported) == 0 && supported != 0;
}

uint32_t Capabilities::getExtraSDVideoDecodes() {
    return fetchCount(m_extraSDVideoDecodes, TELIX_JS_CAP_GetExtraSDVideoDecodes);
}

uint32_t Capabilities::getExtraHDVideoDecodes() {
    return fetchCount(m_extraHDVideoDecodes, TELIX_JS_CAP_GetExtraHDVideoDecodes);
}
