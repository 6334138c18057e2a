// The video/broadcast object's subscriptions to stream events.
#include <strings.h>

#include <cassert>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "common/BrowserGates.h"
#include "common/Log.h"
#include "common/PluginUtils.h"
#include "common/ScriptValues.h"
#include "src/videobroadcast/VideoBroadcast.h"
#include "src/videobroadcast/VideoBroadcastUtils.h"
#include "telix/telix_platform.h"

namespace {

bool startsWithIgnoringCase(const std::string& string, const char* start) {
    return strncasecmp(string.c_str(), start, std::strlen(start)) == 0;
}

// Calls the element's addEventListener or removeEventListener for stream events.
void changeDOMListener(NPP npp, NPObject* element, const char* operation, NPObject* listener) {
    // quirk 94: all subscriptions share this type.
    static const NPString eventType{"StreamEvent", 11};
    NPVariant args[3]{};
    args[0].type = NPVariantType_String;
    args[0].value.stringValue = eventType;
    setResult(args[1], listener); // borrowed: the page keeps its listener
    setResult(args[2], false);
    NPVariant result{};
    if (NPN_Invoke(npp, element, NPN_GetStringIdentifier(operation), args, 3, &result)) {
        NPN_ReleaseVariantValue(&result);
    }
}

} // namespace

void VideoBroadcast::addStreamEventListener(const std::string& targetUrl, const std::string& eventName,
                                            NPObject* streamEventListener) {
    PLUGIN_LOG(VIDEOBCAST, "VBHandle:-- %d --, TargetURL: %s\n", m_vbHandle, targetUrl.c_str());
    assert(streamEventListener);
    const std::string script = parseStreamEventXMLScript(targetUrl, eventName, getId(), true);
    NPObject* window = getNPWindowObj();
    if (!window) {
        return;
    }
    NPString text{script.data(), static_cast<uint32_t>(script.size())};
    NPVariant result{};
    if (!NPN_Evaluate(m_npp, window, &text, &result)) {
        return;
    }
    NPN_ReleaseVariantValue(&result);
    NPObject* element = getNPPluginObj();
    if (!element || isClosed()) {
        return;
    }
    PLUGIN_LOG(VIDEOBCAST, "::PluginObject:-- %p -- , StreamEvent Listener: %p \n",
               static_cast<void*>(element), static_cast<void*>(streamEventListener));
    changeDOMListener(m_npp, element, "addEventListener", streamEventListener);
}

void VideoBroadcast::addStreamEventListener(const std::string& targetUrl, const std::string& eventName,
                                            const std::string& eventId, const std::string& componentTag) {
    PLUGIN_LOG(VIDEOBCAST, "VBHandle:-- %d -- \n", m_vbHandle);
    assert(m_vbHandle);
    std::string tag = componentTag;
    if (!targetUrl.empty()) {
        const std::string urlPath = getBaseURL(targetUrl);
        if (isClosed()) {
            return;
        }
        PLUGIN_LOG(VIDEOBCAST, "urlPath:-- %s \n", urlPath.c_str());
        if (startsWithIgnoringCase(urlPath, "http")) {
            const std::string targetUrlSubStr = targetUrl.substr(0, 6);
            PLUGIN_LOG(VIDEOBCAST, "targetUrlSubStr:-- %s \n", targetUrlSubStr.c_str());
            // quirk 93: a description that came over http writes the tag in decimal; the platform wants it in
            // hex.
            if (strcasecmp(targetUrlSubStr.c_str(), "dvb://") != 0) {
                const int number = std::atoi(tag.c_str());
                PLUGIN_LOG(VIDEOBCAST, "comp_tag value: Decimal value:-- %d \n", number);
                char hex[2 * sizeof(number) + 1];
                std::snprintf(hex, sizeof(hex), "%x", static_cast<unsigned int>(number));
                PLUGIN_LOG(VIDEOBCAST, "comp_tag value: Hex value:-- %s \n", hex);
                tag = hex;
            }
        }
    }
    m_StreamEventList.push_back({targetUrl, tag, eventId, eventName});
    PLUGIN_LOG(VIDEOBCAST, "Event Name: %s , Id: %s , CTag: %s \n", eventName.c_str(), eventId.c_str(),
               tag.c_str());
    // The subscription stays whatever the platform returns.
    TELIX_JS_VB_RegisterStreamEvent(m_vbHandle, streamEventHandler, eventId.c_str(), tag.c_str(),
                                    eventName.c_str());
}

unsigned int VideoBroadcast::getStreamEventInfo(const std::string& targetUrl) {
    PLUGIN_LOG(VIDEOBCAST, "size of m_StreamEventList: %d \n", static_cast<int>(m_StreamEventList.size()));
    unsigned int found = static_cast<unsigned int>(-1);
    for (unsigned int i = 0; i < m_StreamEventList.size(); ++i) {
        if (m_StreamEventList[i].targetUrl == targetUrl) {
            found = i;
        }
    }
    return found;
}

void VideoBroadcast::removeStreamEventListener(const std::string& targetUrl, const std::string& eventName,
                                               NPObject* streamEventListener) {
    PLUGIN_LOG(VIDEOBCAST, "VBHandle:-- %d --, TargetURL: %s\n", m_vbHandle, targetUrl.c_str());
    assert(streamEventListener);
    if (NPObject* element = getNPPluginObj()) {
        PLUGIN_LOG(VIDEOBCAST, "::PluginObject:-- %p -- , StreamEvent Listener: %p \n",
                   static_cast<void*>(element), static_cast<void*>(streamEventListener));
        changeDOMListener(m_npp, element, "removeEventListener", streamEventListener);
    }
    // quirk 95: the last subscription of the URL goes, whatever its name.
    const unsigned int count = getStreamEventInfo(targetUrl);
    if (count == static_cast<unsigned int>(-1)) {
        return;
    }
    PLUGIN_LOG(VIDEOBCAST, "count value returned is: %d \n", count);
    const StreamEventInfo removed = m_StreamEventList[count];
    m_StreamEventList.erase(m_StreamEventList.begin() + count);
    if (m_vbHandle) {
        PLUGIN_LOG(VIDEOBCAST, "Event Name: %s, Id: %s, CTag: %s \n", eventName.c_str(),
                   removed.eventId.c_str(), removed.componentTag.c_str());
        // The caller's name, which need not be that of the subscription that went.
        TELIX_JS_VB_UnRegisterStreamEvent(m_vbHandle, streamEventHandler, removed.eventId.c_str(),
                                          removed.componentTag.c_str(), eventName.c_str());
    }
}

void VideoBroadcast::deleteStreamEventInfo() {
    PLUGIN_LOG(VIDEOBCAST, "Size of m_StreamEventList List: %d \n",
               static_cast<int>(m_StreamEventList.size()));
    while (!m_StreamEventList.empty()) {
        const StreamEventInfo& last = m_StreamEventList.back();
        PLUGIN_LOG(VIDEOBCAST, "m_StreamEventList[%u] TargetURL: %s \n",
                   static_cast<unsigned int>(m_StreamEventList.size() - 1), last.targetUrl.c_str());
        TELIX_JS_VB_UnRegisterStreamEvent(m_vbHandle, streamEventHandler, last.eventId.c_str(),
                                          last.componentTag.c_str(), last.eventName.c_str());
        m_StreamEventList.pop_back();
    }
}
