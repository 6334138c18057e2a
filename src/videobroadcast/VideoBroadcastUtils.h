// The event pipeline of the video/broadcast object: the callbacks that the platform calls on threads of its
// own, and the handler that delivers what they queued on the browser thread.
#ifndef TELIX_SRC_VIDEOBROADCAST_VIDEOBROADCASTUTILS_H
#define TELIX_SRC_VIDEOBROADCAST_VIDEOBROADCASTUTILS_H

#include "common/LiveRef.h"
#include "telix/telix_platform.h"

class VideoBroadcast;

enum VBEventType : unsigned int {
    VBEvent_NoEvent,
    VBEvent_StreamEvent,
    VBEvent_ChannelChangeSucceded,
    VBEvent_ChannelChangeError,
    VBEvent_ProgrammesChanged,
    VBEvent_ParentalRatingChange,
    VBEvent_ParentalRatingError,
    VBEvent_PlayStateChange,
    VBEvent_FullScreenChange
};

// The record that crosses the threads.
struct VideoBcastEvent {
    VBEventType eventType = VBEvent_NoEvent;
    LiveRef<VideoBroadcast> vbInstance; // whether it still lives is asked on delivery
    void* eventData = nullptr;          // the event's payload, owned by the record
};

// Delivers one record and disposes of it; the idle function. Browser thread. Always 0: a record runs once.
int handleVideoBroadcastEvent(void* eventData);

// The platform's callbacks. Any thread. They copy what they are given, queue it and return 0, whether or not
// there is an object with the handle.
TELIX_RETCODE_ENUM_T streamEventHandler(TELIX_JS_VB_HANDLE vbHandle, ___UINT8* first, ___UINT8* second,
                                        ___UINT8* szEventName, ___UINT8* szEventData, ___UINT32 dataLength,
                                        ___UINT8* szEventStatus);
TELIX_RETCODE_ENUM_T onChannelChangeSuccededCb(TELIX_JS_VB_HANDLE vbHandle, TELIX_JS_CM_HANDLE channelHandle);
TELIX_RETCODE_ENUM_T onChannelChangeErrorCb(TELIX_JS_VB_HANDLE vbHandle, TELIX_JS_CM_HANDLE channelHandle,
                                            TELIX_ERR_STATE_ENUM_T errorState);
TELIX_RETCODE_ENUM_T onProgrammesChangedCb(TELIX_JS_VB_HANDLE vbHandle);
TELIX_RETCODE_ENUM_T onParentalRatingChangeCb(TELIX_JS_VB_HANDLE vbHandle, ___UINT8* contentId,
                                              TELIX_JS_SI_PARENTALRATING_HANDLE ratingHandle,
                                              ___UINT8* drmSystemId);
TELIX_RETCODE_ENUM_T onParentalRatingErrorCb(TELIX_JS_VB_HANDLE vbHandle, ___UINT8* contentId,
                                             TELIX_JS_SI_PARENTALRATING_HANDLE ratingHandle,
                                             ___UINT8* drmSystemId);
TELIX_RETCODE_ENUM_T onPlayStateChangeCb(TELIX_JS_VB_HANDLE vbHandle, uint32_t value,
                                         TELIX_PLAYSTATE_ENUM_T state, TELIX_ERR_STATE_ENUM_T error);
TELIX_RETCODE_ENUM_T onFullScreenChangeCb(TELIX_JS_VB_HANDLE vbHandle);

#endif
