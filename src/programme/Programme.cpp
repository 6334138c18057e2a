// A programme: the platform's answers, and writes that go to the platform first.
#include "src/programme/Programme.h"

#include <cstdlib>

#include "common/Log.h"
#include "common/ScriptReferences.h"
#include "src/parental/JSParentalRatingCollection.h"
#include "telix/telix_platform.h"

namespace {

// quirk 31: a string whose length comes beside it in one byte.
template <class Ask>
std::string fetchString(std::string& last, uint32_t handle, Ask ask) {
    char* text = nullptr;
    ___UINT8 length = 0;
    // A string of length 0 is not freed.
    if (handle != 0 && ask(handle, &text, &length) == 0 && text && length != 0) {
        last.assign(text, length);
        std::free(text);
    }
    return last;
}

template <class Ask>
uint32_t fetchNumber(uint32_t& last, uint32_t handle, Ask ask) {
    uint32_t value = 0;
    if (handle != 0 && ask(handle, &value) == 0) {
        last = value;
    }
    return last;
}

// quirk 32: a write that the platform refuses leaves the value and succeeds for script.
template <class Tell>
void store(std::string& last, const std::string& text, uint32_t handle, Tell tell) {
    if (handle != 0 && tell(handle, text.c_str()) == 0) {
        last = text;
    }
}

template <class Tell>
void store(uint32_t& last, uint32_t value, uint32_t handle, Tell tell) {
    if (handle != 0 && tell(handle, value) == 0) {
        last = value;
    }
}

} // namespace

Programme::Programme(NPP npp) : PluginBase(npp) {}

Programme::~Programme() {
    releaseHeld(m_parentalRatings);
}

std::string Programme::getName() {
    return fetchString(m_name, m_programmeHandle, TELIX_JS_SI_GetName);
}

uint32_t Programme::getStartTime() {
    return fetchNumber(m_startTime, m_programmeHandle, TELIX_JS_SI_GetStartTime);
}

uint32_t Programme::getDuration() {
    return fetchNumber(m_duration, m_programmeHandle, TELIX_JS_SI_GetDuration);
}

std::string Programme::getDescription() {
    return fetchString(m_description, m_programmeHandle, TELIX_JS_SI_GetDescription);
}

std::string Programme::getChannelID() {
    char* text = nullptr;
    if (m_programmeHandle != 0) {
        if (TELIX_JS_SI_GetChannelID(m_programmeHandle, &text) == 0) {
            m_channelID = text ? text : "";
        }
        std::free(text); // ours, also if the call failed
    }
    return m_channelID;
}

void Programme::setName(const std::string& name) {
    PLUGIN_LOG(PROGRAMME, " Name: %s \n", name.c_str());
    store(m_name, name, m_programmeHandle, TELIX_JS_SI_SetName);
}

void Programme::setStartTime(unsigned int startTime) {
    PLUGIN_LOG(PROGRAMME, " Start time: %u \n", startTime);
    store(m_startTime, startTime, m_programmeHandle, TELIX_JS_SI_SetStartTime);
}

void Programme::setDuration(unsigned int duration) {
    PLUGIN_LOG(PROGRAMME, " Duration: %u \n", duration);
    store(m_duration, duration, m_programmeHandle, TELIX_JS_SI_SetDuration);
}

void Programme::setDescription(const std::string& description) {
    PLUGIN_LOG(PROGRAMME, " Description: %s \n", description.c_str());
    store(m_description, description, m_programmeHandle, TELIX_JS_SI_SetDescription);
}

void Programme::setChannelID(const std::string& channelID) {
    PLUGIN_LOG(PROGRAMME, " Channel id: %s \n", channelID.c_str());
    store(m_channelID, channelID, m_programmeHandle, TELIX_JS_SI_SetChannelID);
}

NPObject* Programme::getParentalRatingCollectionObject() {
    // quirk 33: made once; later changes on the platform are not seen.
    if (!m_parentalRatings && m_programmeHandle != 0) {
        uint32_t count = 0;
        TELIX_JS_SI_PARENTALRATING_HANDLE* handles = nullptr; // stay the platform's
        if (TELIX_JS_SI_GetParentalRatingHandles(m_programmeHandle, &count, &handles) == 0) {
            // Kept: the reference of the creation.
            m_parentalRatings = createScriptObject<JSParentalRatingCollection>(m_npp);
            if (m_parentalRatings) {
                wrapperOf<JSParentalRatingCollection>(m_parentalRatings)
                    ->impl()
                    ->initializeParentalRatting(count, handles);
            }
        }
    }
    return handOut(m_parentalRatings);
}
