// The model of the embedded A/V control object: one player of the platform, the media that it plays and the
// play state that script sees. The largest class of the system; its implementation is one file for each
// concern:
//   AVControl.cpp           kind, creation, destruction, display area, play report
//   AVControlMedia.cpp      the choice of media: MIME types, `data`
//   AVControlState.cpp      play state, ready state, the platform's messages
//   AVControlMonitor.cpp    the buffering monitor, a thread of its own
//   AVControlStreams.cpp    what the browser streams
//   AVControlPlay.cpp       play, pause, stop, seek, speed, queue, clips
//   AVControlComponents.cpp lists and selection of components
//   AVControlListeners.cpp  script listeners, DRM rights errors
//
// Everything runs on the browser thread but for the platform's callbacks and what the monitor thread uses.
// Nothing is locked: what both threads touch is atomic, and script is reached on the browser thread alone.
#ifndef TELIX_SRC_AVCONTROL_AVCONTROL_H
#define TELIX_SRC_AVCONTROL_AVCONTROL_H

#include <pthread.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <queue>
#include <string>
#include <string_view>

#include "common/DisplayArea.h"
#include "common/LiveRef.h"
#include "common/PluginBase.h"
#include "src/avcontrol/SharedNumber.h"
#include "src/avcontrol/StreamBody.h"
#include "telix/telix_platform.h"

struct ObjectKind;

extern const ObjectKind kAvControlKind;

// The numbers of the script property `playState`.
enum play_state {
    PLAY_STATE_STOPPED = 0,
    PLAY_STATE_PLAYING = 1,
    PLAY_STATE_PAUSED = 2,
    PLAY_STATE_CONNECTING = 3,
    PLAY_STATE_BUFFERING = 4,
    PLAY_STATE_FINISHED = 5,
    PLAY_STATE_ERROR = 6,
    PLAY_STATE_NEXT_CLIP = 7 // internal: another clip of the playlist is to start
};

// The reasons that processError() knows; any other number changes the state alone.
enum avcontrol_ce_error {
    AVCONTROL_ERROR_NONE = -1,
    AVCONTROL_ERROR_FORMAT = 0,
    AVCONTROL_ERROR_CONNECTION = 1,
    AVCONTROL_ERROR_UNIDENTIFIED = 2,
    AVCONTROL_ERROR_CONTENT_NOT_AVAILABLE = 1000,
    AVCONTROL_ERROR_CONTENT_FIRST = 1001,
    AVCONTROL_ERROR_PLAYLIST = 1007,
    AVCONTROL_ERROR_CONTENT_LAST = 1009,
    AVCONTROL_ERROR_DRM_CANNOT_PROCESS = 1100,
    AVCONTROL_ERROR_DRM_LICENCE_LOCAL = 1101,
    AVCONTROL_ERROR_DRM_LICENCE_TRANSFER = 1102,
    AVCONTROL_ERROR_DRM_LICENCE_EXPIRED = 1103
};

class AVControl;
class JSAVcomponent;

// The object that last handed a URL to the platform; null if there is none. The platform has one media
// pipeline: its messages go to this object, and no other may stop it. Any thread.
extern std::atomic<AVControl*> g_lastPlayedInstance;

// The platform's last message, for telling a repeated one. Any thread.
extern std::atomic<uint32_t> g_lastReceivedMessage;

class AVControl final : public PluginBase {
public:
    // The platform's code of the one container whose streams have to be restarted to seek.
    static constexpr int32_t kContainerMp3 = 2;

    AVControl(NPP npp, unsigned short objectKind);
    ~AVControl();

    // Reads the element's attributes and makes the player. NPERR_GENERIC_ERROR if the platform refuses one.
    NPError initAV(unsigned short mode, int argc, char** argn, char** argv, char* mimeType);
    // Releases the player and has the object deleted on a later turn of the browser thread. Always 1: the
    // caller must not delete it.
    int destroyAV();
    // Deletes the objects whose deletion destroyAV() has posted and the browser has dropped.
    static void deleteAbandoned();

    NPObject* getJSObject() override;

    // Callbacks of the platform (its threads) and the idle step of the first.
    static int onPlayStateChangeCb(unsigned int handle, TELIX_AV_CB_MSG msg);
    static int onPlayStateChangeCb(void* record);
    static int onDRMRightsErrorCb(unsigned int handle, TELIX_AV_DRM_ERR_STATE_ENUM_T state,
                                  unsigned char* contentId, unsigned char* drmSystemId,
                                  unsigned char* rightsIssuerUrl);

    // Media.
    void setData(const std::string& url);
    std::string getData() const { return m_data; }
    // Looks at the content that a MIME type promises; an empty type looks at the stream's headers.
    void detectMediaType(const std::string& type);
    // Has the browser fetch the URL, to look at its content.
    void getURLValue(const std::string& url);

    // Display area. setWindow gives it to the platform, unless it is the one that the platform accepted last;
    // always 0.
    NPError setWindow(const NPWindow* window, bool forceReset);
    // Reads the element's place in the page.
    void setPluginRegionFromDOM();
    // The sizes last read there. Script may overwrite them until the next reading.
    // quirk 61: the next read of the region replaces both.
    void setWidth(int32_t width) { m_displayArea.region().width = width; }
    void setHeight(int32_t height) { m_displayArea.region().height = height; }
    int32_t getWidth() const { return m_displayArea.region().width; }
    int32_t getHeight() const { return m_displayArea.region().height; }

    // The browser's streams.
    NPError newStream(NPMIMEType type, NPStream* stream, NPBool seekable, uint16_t* stype);
    int32_t writeReady(NPStream* stream);
    int32_t write(NPStream* stream, int32_t offset, int32_t length, void* buffer);
    NPError destroyStream(NPStream* stream, NPReason reason);
    void urlNotify(const char* url, NPReason reason, void* notifyData);

    // State.
    play_state getPlayState() const { return m_playState; }
    int getReadyState() const { return m_readyState; }
    // -1 before the first error.
    int32_t getError() const { return m_error; }
    void handlePlayStateChange(unsigned int handle, TELIX_AV_CB_MSG msg); // any thread
    void processError(avcontrol_ce_error code);
    void changePlayState(play_state to);                  // any thread
    void changePlayState(play_state from, play_state to); // any thread
    void changeReadyState(int value);                     // any thread
    void decrementWorkingAsyncCall() { --m_workingAsyncCalls; }

    // Play operations.
    bool play(double speed);
    void pause();
    void stop(); // any thread
    bool seek(unsigned int ms);
    void setPlaySpeed(double speed);
    double getPlaySpeed() const { return m_playSpeed; }
    bool setVolume(unsigned int volume);
    bool queue(const std::string& url);
    void playSound();
    // 1 for the next clip, -1 for the one before.
    void changeClip(int direction);
    bool setCurTrackIndex(unsigned int index);
    unsigned int getCurTrackIndex() const;
    unsigned int getNrTracks() const;
    // Both in milliseconds.
    void getPlayInfo(unsigned int* duration, unsigned int* position);
    void setFullScreenChange(bool on);
    // Stored for script; without effect.
    bool getPersist() const { return m_persist != 0; }
    void setPersist(bool persist) { m_persist = persist ? 1 : 0; }

    // Buffering.
    void startBufferingThread();
    void createBufferingThread();
    void destroyBufferingThread(); // any thread
    void setBufferingThreadId(unsigned long id) { m_bufferingThread = id; }
    bool getRunBufferingThread() const { return m_runBufferingThread; }
    void setRunBufferingThread(bool run) { m_runBufferingThread = run; }
    bool getNotifyReadyState() const { return m_notifyReadyState; }
    void setNotifyReadyState(bool notify) { m_notifyReadyState = notify; }
    unsigned int getLowerLimit() const { return m_lowerLimit; }
    unsigned int getUpperLimit() const { return m_upperLimit; }

    // Components. Lists carry one reference for the caller; null if there is none.
    NPObject* getComponents(int32_t type);
    NPObject* getCurrentActiveComponents(int32_t type);
    void selectComponent(JSAVcomponent* component);
    void unSelectComponent(JSAVcomponent* component);

    // Listeners. A setter keeps one reference and takes null too; a getter hands out one more.
    void setOnPlayStateChange(NPObject* listener);
    void setOnFullScreenChange(NPObject* listener);
    void setOnPlaySpeedChanged(NPObject* listener);
    void setOnPlayPositionChanged(NPObject* listener);
    void setOnDRMRightsError(NPObject* listener);
    NPObject* getOnPlayStateChange();
    NPObject* getOnFullScreenChange();
    NPObject* getOnPlaySpeedChanged();
    NPObject* getOnPlayPositionChanged();
    NPObject* getOnDRMRightsError();
    void handlePlaySpeedChanged();
    void handlePlayPositionChanged(); // any thread

    // 1 at the start of a clip, 2 at its end: writes the play report to the log. Any thread.
    void printMonitoringInfo(int kind);

private:
    // The kind of source, in the platform's codes.
    enum class SourceCode : int32_t { Ordinary = 6, OneShot = 7, SmoothStreaming = 23, Hls = 25 };

    // Whether the browser has to deliver a stream before a clip from the network may play.
    enum class StreamState { NotRequested, Requested, Ready };

    // A monitor thread, and its way to this object (AVControlMonitor.cpp).
    class Monitor;
    class MonitorLink;

    // Steps posted to the browser thread. Those that get the object run only while it lives.
    static void startMediaCb(void* address);
    static void destroyMediaCB(void* object);
    static void changePlayStateCb(void* record);
    static void changeReadyStateCb(void* object);
    static void playPositionChangedCb(void* object);

    bool isBrowserThread() const;

    void readAttribute(const char* name, const char* value);
    void openPlayerPage();
    void beginBody(std::string_view chunk);
    void lookAtMedia(const std::string& mimeType);
    void encodeURL();

    void endOfClip();
    void takeQueuedURL();
    void dispatchDomEvent(const char* event, bool bubbles);

    std::string currentMedia() const;
    void setCurrentMedia(std::string url);
    void selectMedia();
    bool waitsForStream();
    bool beginMedia();
    bool handOverMedia();

    // stop() without its call of the platform: what comes before, with whether the platform is to be asked,
    // and what comes after the platform has stopped.
    bool beginStop();
    void completeStop();
    // The same for the play report of a clip's start: the platform's part, and the line of the log.
    static void takeReportedLength(uint32_t player);
    void reportClip(const char* status) const;

    static void* bufferingThread(void* monitor);
    bool isWatched(bool monitorHasPaused) const;
    bool isPastClipEnd(uint32_t position) const;
    bool giveUpMonitor(pthread_t monitor);
    void endMonitors();

    NPObject* getComponentList(int32_t type, bool active);

    uint32_t m_playerHandle = 0; // 0: no player, and nearly every operation does nothing
    uint8_t m_persist = 0;
    NPObject* m_jsObject = nullptr;
    NPObject* m_onPlayStateChange = nullptr;
    NPObject* m_videoComponents = nullptr;
    NPObject* m_audioComponents = nullptr;
    NPObject* m_subtitleComponents = nullptr;
    // The codes of the platform.
    int32_t m_containerCode = 1280;
    int32_t m_audioCodecCode = 0;
    SourceCode m_sourceCode = SourceCode::Ordinary;
    std::atomic<play_state> m_playState{PLAY_STATE_STOPPED};
    std::string m_mimeType;      // after the first bytes of a stream: all of its headers
    bool m_downloadable = false; // stored; nothing reads it
    bool m_buffering = true;
    bool m_playPending = false;                     // stored; nothing reads it
    std::atomic<int32_t> m_workingAsyncCalls{0};    // state changes posted and not yet run
    std::atomic<uint32_t> m_durationLast{0};        // milliseconds
    std::atomic<uint32_t> m_currentPositionLast{0}; // milliseconds
    // Seconds of buffered media.
    uint32_t m_lowerLimit = 4;
    uint32_t m_upperLimit = 10;
    uint32_t m_playCount = 1;
    std::string m_data; // the URL as script sees it
    bool m_fetchStream = true;
    StreamState m_streamState = StreamState::NotRequested;
    int32_t m_mediaType = -1;
    bool m_streamSeen = false;
    SharedNumber m_playSpeed{1.0}; // in force
    double m_requestedSpeed = 1.0; // the last one asked for but 0
    std::atomic<bool> m_isPlayList{false};
    StreamBody m_body;             // read only if it is a playlist
    bool m_bodyIsPlaylist = false; // the one that is being gathered
    int32_t m_error = -1;
    std::atomic<pthread_t> m_bufferingThread{0};
    const pthread_t m_mainThread; // the browser thread
    std::atomic<bool> m_runBufferingThread{false};
    std::atomic<int> m_readyState{0};
    std::atomic<uint32_t> m_playStartCounter{0}; // nothing reads it
    std::atomic<bool> m_notifyReadyState{false};
    bool m_streamFlag = false; // nothing reads it
    bool m_memoryAudio = false;
    // Its sizes are apart from the attributes that the base class keeps.
    DisplayArea m_displayArea;
    mutable std::mutex m_currentMediaMutex;
    std::string m_currentMedia;               // the URL in play; the monitor reports it
    NPObject* m_onFullScreenChange = nullptr; // never released at the end
    NPObject* m_onPlaySpeedChanged = nullptr;
    NPObject* m_onPlayPositionChanged = nullptr;
    std::queue<std::string> m_urlQueue; // mirrors what the platform has been given to play next
    NPObject* m_onDRMRightsError = nullptr;

    std::shared_ptr<MonitorLink> m_monitorLink; // of all monitors; null before the first
    std::atomic<bool> m_monitorStarting{false}; // a thread is made, and its id not yet in its place

    const LiveRegistration<AVControl> m_live{*this};
};

#endif
