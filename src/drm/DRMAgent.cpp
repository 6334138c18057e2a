// The DRM agent: messages to the platform, and results from the platform's thread to the page.
#include "src/drm/DRMAgent.h"

#include <glib.h>

#include <cstdlib>
#include <cstring>

#include "common/Log.h"
#include "common/ObjectKind.h"
#include "common/PluginUtils.h"
#include "common/ScriptReferences.h"
#include "common/ScriptValues.h"
#include "src/drm/JSDRMAgent.h"

LiveRef<DRMAgent> drmAgentInst;

namespace {

const char* const kMimeTypes[] = {"application/oipfdrmagent", nullptr};

// A copy of the platform's string, null if there is no memory.
char* copyOf(const unsigned char* string) {
    const size_t size = std::strlen(reinterpret_cast<const char*>(string)) + 1;
    void* copy = std::malloc(size);
    return copy ? static_cast<char*>(std::memcpy(copy, string, size)) : nullptr;
}

// An empty string has the length 0, unless the browser gives no block for it.
NPVariant stringArgument(const char* string) {
    NPVariant argument{};
    if (!string || !setText(argument, string, std::strlen(string))) {
        setNull(argument);
    }
    return argument;
}

} // namespace

const ObjectKind kDrmAgentKind = [] {
    ObjectKind kind{};
    kind.id = 800;
    kind.destroyText = "DRMAGENT_OBJ_ID delete :: %p \n";
    kind.mimeTypes = kMimeTypes;
    kind.create = [](NPP npp, unsigned short id) -> PluginBase* { return new DRMAgent(npp, id); };
    kind.dispose = disposeOf<DRMAgent>;
    return kind;
}();

DRMMsgEventData::DRMMsgEventData(unsigned char* id, unsigned char* message,
                                 TELIX_DRM_RESULT_CODE_ENUM_T_tag code)
    : messageId(copyOf(id)), resultCode(code) {
    if (messageId) {
        resultMessage = copyOf(message);
    }
}

DRMMsgEventData::~DRMMsgEventData() {
    std::free(messageId);
    std::free(resultMessage);
}

int handleDRMMessageResultEvent(void* data) {
    if (!data) {
        return G_SOURCE_REMOVE;
    }
    auto* result = static_cast<DRMMsgEventData*>(data);
    const LiveRef<DRMAgent> receiver = drmAgentInst;
    if (DRMAgent* agent = receiver.get()) {
        const CallGuard guard(*agent);
        // quirk 44: an element without an id stops the process here.
        agent->invokeJScript(domEventScript(agent->getId(), "DRMMessageResult", false, false));
        // A listener of the event may have taken the element out of the page, and put another one in.
        NPObject* handler = receiver.get() ? agent->getOnDRMMessageResult() : nullptr;
        if (handler) {
            NPVariant args[3] = {
                stringArgument(result->messageId), stringArgument(result->resultMessage), {}};
            setResult(args[2], result->resultCode);
            agent->invokeJScriptFunc(handler, args, 3);
            // Neither the handler's reference from the getter nor the blocks of both strings are released.
        }
    }
    delete result;
    return G_SOURCE_REMOVE;
}

DRMAgent::DRMAgent(NPP npp, unsigned short objectId) : PluginBase(npp, objectId) {
    drmAgentInst = m_live.ref();
    TELIX_JS_DRM_RegisterOnDRMMessageResult(onDRMMessageResultCb);
}

void DRMAgent::close() {
    m_live.end();
    // quirk 46: once for each agent, also while others live on.
    TELIX_JS_DRM_UnregisterOnDRMMessageResult(onDRMMessageResultCb);
    releaseHeld(m_jsObject);
    releaseHeld(m_onDRMMessageResult);
}

NPObject* DRMAgent::getJSObject() {
    return handOutOnce<JSDRMAgent>(getBrowser(), m_jsObject);
}

std::string DRMAgent::sendDRMMessage(const std::string& type, const std::string& message,
                                     const std::string& systemId) {
    PLUGIN_LOG(DRMAGENT, " msgType = ( %s ), msg = ( %s ), DRMSystemID = ( %s ) \n", type.c_str(),
               message.c_str(), systemId.c_str());
    // quirk 45: a message that is refused gets the id of the preceding one.
    char* id = nullptr;
    if (TELIX_JS_DRM_SendDRMMessage(type.c_str(), message.c_str(), systemId.c_str(), &id) == 0 && id) {
        PLUGIN_LOG(DRMAGENT, " Message Id value returned from IF API = ( %s ) \n", id);
        m_messageId = id;
        std::free(id);
    }
    return m_messageId;
}

NPObject* DRMAgent::getOnDRMMessageResult() {
    return handOut(m_onDRMMessageResult);
}

void DRMAgent::setOnDRMMessageResult(NPObject* handler) {
    replaceListener(m_onDRMMessageResult, handler);
}

int DRMAgent::onDRMMessageResultCb(unsigned char* messageId, unsigned char* resultMessage,
                                   TELIX_DRM_RESULT_CODE_ENUM_T_tag resultCode) {
    PLUGIN_LOG(DRMAGENT, " msgID = ( %s ), resultMsg = ( %s ), resultCode = %d \n",
               reinterpret_cast<const char*>(messageId), reinterpret_cast<const char*>(resultMessage),
               resultCode);
    // The record passes to the idle step; this thread must not touch it afterwards.
    postIdle(handleDRMMessageResultEvent, new DRMMsgEventData(messageId, resultMessage, resultCode));
    return 0;
}
