// An A/V component: the two families of platform calls behind one set of getters, and the caches.
#include "src/avcomponent/AVcomponent.h"

#include <cstdlib>

#include "common/Log.h"
#include "telix/telix_platform.h"

AVcomponent::AVcomponent() : PluginBase(nullptr) {
    PLUGIN_LOG(AV_COMP, " default constructor is called \n");
}

AVcomponent::AVcomponent(NPP npp) : PluginBase(npp) {
    PLUGIN_LOG(AV_COMP, " override constructor is called \n");
}

template <class Raw, class Call>
bool AVcomponent::ask(Call ofAVControl, Call ofVideoBroadcast, Raw& result) const {
    switch (m_objType) {
    case AVCOMP_OBJ_AVCONTROL:
        return ofAVControl(m_handle, m_type, &result) == 0;
    case AVCOMP_OBJ_VIDEOBROADCAST:
        return ofVideoBroadcast(m_handle, m_type, &result) == 0;
    case AVCOMP_OBJ_UNSET:
        break;
    }
    return false;
}

template <class Call>
bool AVcomponent::fetchString(std::string& cache, Call ofAVControl, Call ofVideoBroadcast) const {
    char* text = nullptr;
    if (m_handle == 0 || !cache.empty() || !ask(ofAVControl, ofVideoBroadcast, text) || !text) {
        return false;
    }
    cache = text;
    std::free(text);
    return true;
}

// quirk 34: the first successful answer is kept for good.
template <class Raw, class Value, class Call>
Value AVcomponent::fetchOnce(Value& cache, bool& valid, Call ofAVControl, Call ofVideoBroadcast) const {
    if (m_handle != 0 && !valid) {
        Raw value{};
        if (ask(ofAVControl, ofVideoBroadcast, value)) {
            cache = static_cast<Value>(value);
            valid = true;
        }
    }
    return cache;
}

std::string AVcomponent::getEncoding() {
    if (fetchString(m_encoding, TELIX_JS_AV_AVComponent_GetEncoding, TELIX_JS_VB_AVComponent_GetEncoding)) {
        PLUGIN_LOG(AV_COMP, " Encoding value returned from IF API= ( %s ) \n", m_encoding.c_str());
    }
    return m_encoding;
}

bool AVcomponent::getEncrypted() {
    return fetchOnce<uint8_t>(m_encrypted, m_encryptedValid, TELIX_JS_AV_AVComponent_GetEncrypted,
                              TELIX_JS_VB_AVComponent_GetEncrypted);
}

float AVcomponent::getAspectRatio() {
    return fetchOnce<float>(m_aspectRatio, m_aspectRatioValid, TELIX_JS_AV_AVComponent_GetAspectRatio,
                            TELIX_JS_VB_AVComponent_GetAspectRatio);
}

std::string AVcomponent::getLanguage() {
    fetchString(m_language, TELIX_JS_AV_AVComponent_GetLanguage, TELIX_JS_VB_AVComponent_GetLanguage);
    return m_language;
}

bool AVcomponent::getAudioDescription() {
    return fetchOnce<uint8_t>(m_audioDescription, m_audioDescriptionValid,
                              TELIX_JS_AV_AVComponent_GetAudioDescription,
                              TELIX_JS_VB_AVComponent_GetAudioDescription);
}

uint32_t AVcomponent::getAudioChannels() {
    return fetchOnce<uint32_t>(m_audioChannels, m_audioChannelsValid,
                               TELIX_JS_AV_AVComponent_GetAudioChannels,
                               TELIX_JS_VB_AVComponent_GetAudioChannels);
}

bool AVcomponent::getHearingImpaired() {
    return fetchOnce<uint8_t>(m_hearingImpaired, m_hearingImpairedValid,
                              TELIX_JS_AV_AVComponent_GetHearingImpaired,
                              TELIX_JS_VB_AVComponent_GetHearingImpaired);
}
