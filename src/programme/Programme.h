// The model of one programme of the schedule: a handle of the platform, asked at every read; a write goes to
// the platform first. Browser thread only.
#ifndef TELIX_SRC_PROGRAMME_PROGRAMME_H
#define TELIX_SRC_PROGRAMME_PROGRAMME_H

#include "common/PluginBase.h"

class Programme final : public PluginBase {
public:
    explicit Programme(NPP npp);
    ~Programme();

    // 0 means no handle: the platform is never asked, and writes have no effect.
    void setProgrammeHandle(unsigned int handle) { m_programmeHandle = handle; }

    // What the platform has at this moment; if it refuses, what was read or written last. Name and
    // description are at most 255 bytes long and keep their last value when the platform gives an empty one.
    // Start time and duration are in units of the platform's.
    std::string getName();
    uint32_t getStartTime();
    uint32_t getDuration();
    std::string getDescription();
    std::string getChannelID();

    // Changes the programme, unless the platform refuses.
    void setName(const std::string& name);
    void setStartTime(unsigned int startTime);
    void setDuration(unsigned int duration);
    void setDescription(const std::string& description);
    void setChannelID(const std::string& channelID);

    // The collection of the programme's ratings with one reference added for the caller. It is made at the
    // first call that the platform answers and never again; null until then.
    NPObject* getParentalRatingCollectionObject();

private:
    std::string m_name;
    uint32_t m_startTime = 0;
    uint32_t m_duration = 0;
    std::string m_description;
    std::string m_channelID;
    NPObject* m_parentalRatings = nullptr;
    uint32_t m_programmeHandle = 0;
};

#endif
