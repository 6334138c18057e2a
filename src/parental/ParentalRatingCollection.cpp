// A collection of parental ratings: built from handles, searched by handle.
#include "src/parental/ParentalRatingCollection.h"

#include "common/Log.h"
#include "src/parental/JSParentalRating.h"

ParentalRatingCollection::ParentalRatingCollection(NPP npp) : PluginBase(npp) {}

void ParentalRatingCollection::initializeParentalRatting(unsigned int count, const uint32_t* handles) {
    PLUGIN_LOG(PARENTAL, " addParentalRattingObject \n");
    if (!handles) {
        return;
    }
    // Unlike the other lists this one has its full length before its entries are there.
    m_ratings.setLength(count);
    for (unsigned int index = 0; index < count; ++index) {
        m_ratings.add(m_npp).impl()->setParentalRatingHandle(handles[index]);
    }
}

NPObject* ParentalRatingCollection::getitem(unsigned int index) {
    return m_ratings.item(index);
}

NPObject* ParentalRatingCollection::getJSParentalRatingForHandle(unsigned int handle) {
    NPObject* rating = m_ratings.find(
        [handle](const ParentalRating& held) { return held.getParentalRatingHandle() == handle; });
    if (!rating) {
        // Not kept: another call for the handle makes another object.
        rating = createScriptObject<JSParentalRating>(m_npp);
        if (rating) {
            wrapperOf<JSParentalRating>(rating)->impl()->setParentalRatingHandle(handle);
        }
    }
    return rating;
}
