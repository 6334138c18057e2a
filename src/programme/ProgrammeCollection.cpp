// A collection of programmes: built from handles, searched for ratings.
#include "src/programme/ProgrammeCollection.h"

#include "common/Log.h"
#include "src/parental/JSParentalRatingCollection.h"
#include "src/programme/JSProgramme.h"

ProgrammeCollection::ProgrammeCollection(NPP npp) : PluginBase(npp) {}

void ProgrammeCollection::initialize(unsigned int count, const uint32_t* handles) {
    m_programmes.setLength(0);
    if (!handles) {
        return;
    }
    m_programmes.fillUpTo(count, m_npp, [handles](JSProgramme& wrapper, uint32_t index) {
        wrapper.impl()->setProgrammeHandle(handles[index]);
    });
}

NPObject* ProgrammeCollection::getitem(unsigned int index) {
    PLUGIN_LOG(PROGRAMME, "ProgrammeCollection getitem\n");
    return m_programmes.item(index);
}

NPObject* ProgrammeCollection::getJSParentalRatingForHandle(unsigned int ratingHandle) {
    for (uint32_t index = 0; index < getLength(); ++index) {
        // The reference that the programme hands out here is never released.
        NPObject* ratings = m_programmes.wrapperAt(index).impl()->getParentalRatingCollectionObject();
        if (!ratings) {
            continue;
        }
        NPObject* rating =
            wrapperOf<JSParentalRatingCollection>(ratings)->impl()->getJSParentalRatingForHandle(
                ratingHandle);
        if (rating) {
            // A second reference, though the collection has handed out one: neither is ever released.
            return handOut(rating);
        }
    }
    return nullptr;
}
