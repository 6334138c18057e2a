// The model of the embedded DRM agent: hands messages of the page to the platform, and the platform's later
// results to the page. Browser thread only, but for the platform's callback.
#ifndef TELIX_SRC_DRM_DRMAGENT_H
#define TELIX_SRC_DRM_DRMAGENT_H

#include "common/LiveRef.h"
#include "common/PluginBase.h"
#include "telix/telix_platform.h"

class DRMAgent;
struct ObjectKind;

extern const ObjectKind kDrmAgentKind;

// quirk 43: every result goes to the agent constructed last.
// It stays so when that agent has gone; results then go nowhere.
extern LiveRef<DRMAgent> drmAgentInst;

// One result that is posted from the platform's thread to the browser's.
struct DRMMsgEventData {
    // Copies both strings, neither of which may be null. A string for which there was no memory stays null,
    // and then so does the one after it. Any thread.
    DRMMsgEventData(unsigned char* id, unsigned char* message, TELIX_DRM_RESULT_CODE_ENUM_T_tag code);
    DRMMsgEventData(const DRMMsgEventData&) = delete;
    DRMMsgEventData& operator=(const DRMMsgEventData&) = delete;
    ~DRMMsgEventData();

    char* messageId = nullptr;     // owned, of malloc
    char* resultMessage = nullptr; // owned, of malloc
    TELIX_DRM_RESULT_CODE_ENUM_T_tag resultCode;
};

// The idle step that brings a result to the page: the DOM event, then the handler. Deletes the record. Always
// 0, so that it runs once. The element of the agent must have an id.
int handleDRMMessageResultEvent(void* data);

class DRMAgent final : public PluginBase {
public:
    // Becomes the agent that results go to.
    DRMAgent(NPP npp, unsigned short objectId);
    // The end of the object but for its memory, which a call that is in it may still need.
    void close();

    NPObject* getJSObject() override;

    // Sends a message and returns its id; if the platform refuses, the id of the previous message, empty if
    // there was none. The outcome comes as a result.
    std::string sendDRMMessage(const std::string& type, const std::string& message,
                               const std::string& systemId);

    // The script handler. The getter hands out one more reference; null if none is set. The setter takes null
    // too.
    NPObject* getOnDRMMessageResult();
    void setOnDRMMessageResult(NPObject* handler);

    // The platform's callback. Any thread; the strings need to be valid only during the call. Always 0.
    static int onDRMMessageResultCb(unsigned char* messageId, unsigned char* resultMessage,
                                    TELIX_DRM_RESULT_CODE_ENUM_T_tag resultCode);

private:
    const LiveRegistration<DRMAgent> m_live{*this};
    // One reference held of each that isn't null.
    NPObject* m_jsObject = nullptr;
    NPObject* m_onDRMMessageResult = nullptr;
    std::string m_messageId;
};

#endif
