// The callbacks of the plug-in that broadcast calls. Each is registered for all video/broadcast objects.
#ifndef TELIX_DESKTOP_PLATFORM_BROADCASTCALLBACKS_H
#define TELIX_DESKTOP_PLATFORM_BROADCASTCALLBACKS_H

#include "desktop/platform/Callback.h"
#include "telix/telix_platform.h"

namespace desktop {

// Registered on any thread, called on the platform thread alone.
struct BroadcastCallbacks {
    Callback<TELIX_JS_VB_CHANNEL_CHANGE_CB> onChannelChange;
    Callback<TELIX_JS_VB_CHANNEL_ERROR_CB> onChannelError;
    Callback<TELIX_JS_VB_FULLSCREEN_CB> onFullScreen;
    Callback<TELIX_JS_VB_PLAYSTATE_CB> onPlayState;
    Callback<TELIX_JS_VB_PROGRAMMES_CB> onProgrammes;
    Callback<TELIX_JS_VB_PARENTAL_RATING_CB> onRatingChange;
    Callback<TELIX_JS_VB_PARENTAL_RATING_CB> onRatingError;
};

} // namespace desktop

#endif
