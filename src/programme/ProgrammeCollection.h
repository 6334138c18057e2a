// The model of an ordered collection of programmes, filled once from the platform's handles. Browser thread
// only.
#ifndef TELIX_SRC_PROGRAMME_PROGRAMMECOLLECTION_H
#define TELIX_SRC_PROGRAMME_PROGRAMMECOLLECTION_H

#include "common/PluginBase.h"
#include "common/ScriptObjectList.h"

class JSProgramme;

class ProgrammeCollection final : public PluginBase {
public:
    explicit ProgrammeCollection(NPP npp);

    // Makes the programmes of `count` handles, which stay the caller's. Without a programme there need be no
    // array.
    void initialize(unsigned int count, const uint32_t* handles);

    uint32_t getLength() const { return m_programmes.length(); }

    // The programme with one reference added for the caller; null beyond the end.
    NPObject* getitem(unsigned int index);

    // The rating object for a handle of the platform, with one reference for the caller beside the one that
    // the ratings' collection handed out. Null if no programme has a collection of ratings.
    NPObject* getJSParentalRatingForHandle(unsigned int ratingHandle);

private:
    ScriptObjectList<JSProgramme> m_programmes;
};

#endif
