// The model of one elementary stream of a programme: a handle of the platform, with properties that are
// fetched at their first read and stay. Browser thread only.
#ifndef TELIX_SRC_AVCOMPONENT_AVCOMPONENT_H
#define TELIX_SRC_AVCOMPONENT_AVCOMPONENT_H

#include "common/PluginBase.h"

// The kind of object that a component came from. It alone selects the family of platform calls.
enum AVcompObjType_T : int { AVCOMP_OBJ_UNSET = -1, AVCOMP_OBJ_AVCONTROL = 0, AVCOMP_OBJ_VIDEOBROADCAST = 1 };

// The kind of stream, with the numbers that script knows.
enum AVcompType_T : int {
    AVCOMP_TYPE_UNSET = -1,
    AVCOMP_TYPE_VIDEO = 0,
    AVCOMP_TYPE_AUDIO = 1,
    AVCOMP_TYPE_SUBTITLE = 2
};

class AVcomponent final : public PluginBase {
public:
    // A component apart from any page.
    AVcomponent();
    explicit AVcomponent(NPP npp);

    // 0 means no handle: the platform is never asked.
    uint32_t getHandle() const { return m_handle; }
    void setHandle(uint32_t handle) { m_handle = handle; }
    void setType(AVcompType_T type) { m_type = type; }
    void setObjType(AVcompObjType_T objType) { m_objType = objType; }

    AVcompType_T getType() const { return m_type; }

    // Each is the platform's first successful answer, for a string the first that isn't empty. Until then
    // they give empty, false or 0.
    std::string getEncoding();
    bool getEncrypted();
    float getAspectRatio(); // width by height
    std::string getLanguage();
    bool getAudioDescription();
    uint32_t getAudioChannels();
    bool getHearingImpaired();

private:
    // One of the platform's getters, given in both families. `Raw` is what it writes.
    template <class Raw, class Call>
    bool ask(Call ofAVControl, Call ofVideoBroadcast, Raw& result) const;
    // True if the cache was filled now.
    template <class Call>
    bool fetchString(std::string& cache, Call ofAVControl, Call ofVideoBroadcast) const;
    template <class Raw, class Value, class Call>
    Value fetchOnce(Value& cache, bool& valid, Call ofAVControl, Call ofVideoBroadcast) const;

    uint32_t m_handle = 0;
    AVcompObjType_T m_objType = AVCOMP_OBJ_UNSET;
    AVcompType_T m_type = AVCOMP_TYPE_UNSET;
    bool m_encryptedValid = false;
    bool m_aspectRatioValid = false;
    bool m_audioChannelsValid = false;
    bool m_audioDescriptionValid = false;
    bool m_hearingImpairedValid = false;
    std::string m_encoding;
    bool m_encrypted = false;
    float m_aspectRatio = 0;
    std::string m_language;
    bool m_audioDescription = false;
    uint32_t m_audioChannels = 0;
    bool m_hearingImpaired = false;
};

#endif
