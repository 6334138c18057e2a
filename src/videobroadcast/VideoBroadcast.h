// The model of the embedded video/broadcast object: the page's window on the television picture. Most of its
// operations are one step to the platform with a small cache in front. The implementation is one file for
// each concern:
//   VideoBroadcast.cpp             kind, list of instances, life, the platform's callbacks, play state
//   VideoBroadcastGeometry.cpp     size, display area, full screen
//   VideoBroadcastHandlers.cpp     script handlers
//   VideoBroadcastStreamEvents.cpp subscriptions to stream events
//   VideoBroadcastChannels.cpp     tuning, channels, programmes, components
//   VideoBroadcastUtils.cpp        events: from the platform's callbacks to the page
//   InstanceList.cpp               which object holds which platform handle, for platform threads
//
// Browser thread only, except getInstance(handle), refOf(), ref() and callbacksRegistered().
#ifndef TELIX_SRC_VIDEOBROADCAST_VIDEOBROADCAST_H
#define TELIX_SRC_VIDEOBROADCAST_VIDEOBROADCAST_H

#include <atomic>
#include <string>
#include <vector>

#include "common/DisplayArea.h"
#include "common/LiveRef.h"
#include "common/PluginBase.h"
#include "src/videobroadcast/InstanceList.h"
#include "telix/telix_platform.h"

class JSAVcomponent;
class JSChannel;
struct ObjectKind;

extern const ObjectKind kVideoBroadcastKind;

// One subscription to a stream event.
struct StreamEventInfo {
    std::string targetUrl;    // as the page gave it; the key for removal
    std::string componentTag; // as the platform was given it
    std::string eventId;
    std::string eventName;
};

class VideoBroadcast final : public PluginBase {
public:
    // A new object at every call, listed and with the platform handle if there is one to be had.
    static VideoBroadcast* getInstance(NPP npp, unsigned short objectId);
    // The listed object with the handle, or null; the one with the lowest address if several share it. Any
    // thread; elsewhere than on the browser thread the object may be gone at any moment.
    static VideoBroadcast* getInstance(unsigned int handle);
    // The same, for steps that are posted from there.
    static LiveRef<VideoBroadcast> refOf(unsigned int handle);

    static void addInstance(VideoBroadcast* instance);
    // The last object to go unregisters the platform's callbacks.
    static void deleteInstance(VideoBroadcast* instance);
    // Whether the address is that of a listed object, which need not be the one that was there before.
    static bool checkValidInstance(VideoBroadcast* instance);
    static VideoBroadcast* getActiveInst();
    // Whether the platform has the callbacks. Any thread.
    static bool callbacksRegistered() { return bCallbacksRegistered; }

    // The end of the object but for its memory, which a call that is in it may still need.
    void close();

    // This object, for steps that are posted and for whatever returns from the page.
    LiveRef<VideoBroadcast> ref() const { return m_live.ref(); }

    NPObject* getJSObject() override;

    unsigned int getHandle();
    void setHandle(unsigned int handle);

    void registerCallbacks();
    static void unregisterCallbacks();

    // Geometry. A size set by script is applied on a later turn of the main loop, and reads back only then.
    void setWidth(int width);
    void setHeight(int height);
    int getWidth();
    int getHeight();
    // The idle steps; their argument is the object, which is alive. Always 0.
    static int shouldChangeWidth(void* object);
    static int shouldChangeHeight(void* object);
    // The display area follows the element's rectangle in the page, not the browser's record.
    void setWindow(const NPWindow* window, bool bForceReset);
    void setPluginRegionFromDOM();

    void setPlayState(int state);
    int getPlayState();

    // Hides the base's operation, which does not ask the platform.
    bool isFullScreen();
    void setFullScreenChange(bool bFullScreen);

    // Releases the platform handle and keeps its value: later calls are still made with it.
    void release();

    bool isActive() const { return m_isActive; }
    void setActive(bool active) { m_isActive = active; }

    // Always 0, not handled.
    int16_t handleEvent(void** event);

    // Script handlers. A getter hands out one more reference; null if none is set. A setter takes null too.
    NPObject* getOnFullScreenChange();
    NPObject* getOnPlayStateChange();
    NPObject* getOnChannelChangeSucceeded();
    NPObject* getOnChannelChangeError();
    NPObject* getOnProgrammesChanged();
    NPObject* getOnParentalRatingChange();
    NPObject* getOnParentalRatingError();
    void setOnFullScreenChange(NPObject* handler);
    void setOnPlayStateChange(NPObject* handler);
    void setOnChannelChangeSucceeded(NPObject* handler);
    void setOnChannelChangeError(NPObject* handler);
    void setOnProgrammesChanged(NPObject* handler);
    void setOnParentalRatingChange(NPObject* handler);
    void setOnParentalRatingError(NPObject* handler);

    // Stream events. The first form attaches the page's listener and has the page fetch the description of
    // the event; the page then calls the second form, which subscribes at the platform.
    void addStreamEventListener(const std::string& targetUrl, const std::string& eventName,
                                NPObject* streamEventListener);
    void addStreamEventListener(const std::string& targetUrl, const std::string& eventName,
                                const std::string& eventId, const std::string& componentTag);
    // Ends the latest subscription to the URL, whatever its name.
    void removeStreamEventListener(const std::string& targetUrl, const std::string& eventName,
                                   NPObject* streamEventListener);
    // The index of the latest subscription to the URL, or -1.
    unsigned int getStreamEventInfo(const std::string& targetUrl);
    void deleteStreamEventInfo();

    // Tuning. A request returns as soon as the platform has taken it; the outcome comes as an event.
    void bindToCurrentChannel();
    void setChannel(JSChannel* channel, bool trickPlay); // null for no channel; the object is not kept
    void setChannelByTriplet(int onid, int tsid, int sid);
    void prevChannel();
    void nextChannel();
    void stop();

    // What is on. Each gives null where there is nothing; the caller owns one reference of what it is given,
    // unless another number is stated.
    NPObject* createChannelObject(unsigned int idType, unsigned int onid, unsigned int tsid,
                                  unsigned int sid);
    NPObject* createChannelObject(unsigned int idType, const unsigned char* dsd, unsigned int length,
                                  unsigned int sid);
    NPObject* getCurrChannel();
    NPObject* getChannel(unsigned int channelHandle);
    NPObject* getChannelConfig();
    NPObject* getProgrammes();
    NPObject* getParentalRatingObj(unsigned int ratingHandle);

    // Components, by the type of stream (AVcompType_T).
    NPObject* getComponentList(unsigned int type, bool active);
    NPObject* getComponents(unsigned int type);
    NPObject* getCurrentActiveComponents(unsigned int type); // the caller owns two references
    void selectComponent(JSAVcomponent* component);
    void unSelectComponent(JSAVcomponent* component);

private:
    using SetSize = TELIX_RETCODE_ENUM_T (*)(TELIX_JS_VB_HANDLE object, int32_t size);

    VideoBroadcast(NPP npp, unsigned short objectId);

    void applySize(const char* step, const char* callName, SetSize call, int wanted, int& applied);

    void resetCurrentChannel(unsigned int channelHandle);

    const LiveRegistration<VideoBroadcast> m_live{*this};

    static InstanceList VBInstanceList;
    static std::atomic<bool>
        bCallbacksRegistered; // read where events are delivered, whichever thread that is

    // One reference held of each.
    NPObject* m_jsObject = nullptr;
    NPObject* m_configObj = nullptr;
    NPObject* m_programmesObj = nullptr;
    NPObject* m_pCurChannel = nullptr;
    NPObject* m_videoComponents = nullptr;
    NPObject* m_audioComponents = nullptr;
    NPObject* m_subtitleComponents = nullptr;
    NPObject* m_onFullScreenChangeObj = nullptr;
    NPObject* m_onPlayStateChangeObj = nullptr;
    NPObject* m_onChannelChangeSucceededObj = nullptr;
    NPObject* m_onChannelChangeErrorObj = nullptr;
    NPObject* m_onProgrammesChangedObj = nullptr;
    NPObject* m_onParentalRatingChangeObj = nullptr;
    NPObject* m_onParentalRatingErrorObj = nullptr;

    bool m_isActive = false;     // since a tuning request that the platform took
    int m_pWidth = 0;            // as last applied at, or read from, the platform
    int m_pHeight = 0;           // likewise
    int m_nWidth = 0;            // as last requested by script
    int m_nHeight = 0;           // likewise
    bool m_isFullScreen = false; // as last known
    DisplayArea m_displayArea;
    int m_playState = 0; // as last known
    unsigned int m_vbHandle = 0;
    std::vector<StreamEventInfo> m_StreamEventList; // in order of subscription
};

#endif
