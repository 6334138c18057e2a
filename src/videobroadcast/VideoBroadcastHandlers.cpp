// The script handlers of the video/broadcast object.
#include "common/ScriptReferences.h"
#include "src/videobroadcast/VideoBroadcast.h"

NPObject* VideoBroadcast::getOnFullScreenChange() {
    return handOut(m_onFullScreenChangeObj);
}

NPObject* VideoBroadcast::getOnPlayStateChange() {
    return handOut(m_onPlayStateChangeObj);
}

NPObject* VideoBroadcast::getOnChannelChangeSucceeded() {
    return handOut(m_onChannelChangeSucceededObj);
}

NPObject* VideoBroadcast::getOnChannelChangeError() {
    return handOut(m_onChannelChangeErrorObj);
}

NPObject* VideoBroadcast::getOnProgrammesChanged() {
    return handOut(m_onProgrammesChangedObj);
}

NPObject* VideoBroadcast::getOnParentalRatingChange() {
    return handOut(m_onParentalRatingChangeObj);
}

NPObject* VideoBroadcast::getOnParentalRatingError() {
    return handOut(m_onParentalRatingErrorObj);
}

void VideoBroadcast::setOnFullScreenChange(NPObject* handler) {
    replaceListener(m_onFullScreenChangeObj, handler);
}

void VideoBroadcast::setOnPlayStateChange(NPObject* handler) {
    replaceListener(m_onPlayStateChangeObj, handler);
}

void VideoBroadcast::setOnChannelChangeSucceeded(NPObject* handler) {
    replaceListener(m_onChannelChangeSucceededObj, handler);
}

void VideoBroadcast::setOnChannelChangeError(NPObject* handler) {
    replaceListener(m_onChannelChangeErrorObj, handler);
}

void VideoBroadcast::setOnProgrammesChanged(NPObject* handler) {
    replaceListener(m_onProgrammesChangedObj, handler);
}

void VideoBroadcast::setOnParentalRatingChange(NPObject* handler) {
    replaceListener(m_onParentalRatingChangeObj, handler);
}

void VideoBroadcast::setOnParentalRatingError(NPObject* handler) {
    replaceListener(m_onParentalRatingErrorObj, handler);
}
