// The model of an ordered collection of parental ratings, filled once from the platform's handles. Browser
// thread only.
#ifndef TELIX_SRC_PARENTAL_PARENTALRATINGCOLLECTION_H
#define TELIX_SRC_PARENTAL_PARENTALRATINGCOLLECTION_H

#include "common/PluginBase.h"
#include "common/ScriptObjectList.h"

class JSParentalRating;

class ParentalRatingCollection final : public PluginBase {
public:
    explicit ParentalRatingCollection(NPP npp);

    // Makes the ratings of `count` handles, which stay the caller's. Without a rating there need be no array.
    void initializeParentalRatting(unsigned int count, const uint32_t* handles);

    // The rating with one reference added for the caller; null beyond the end.
    NPObject* getitem(unsigned int index);
    uint32_t getLength() const { return m_ratings.length(); }

    // The collection's rating of this handle with one reference added for the caller, or else a new one,
    // which is the caller's alone. Null if the browser refuses to make it.
    NPObject* getJSParentalRatingForHandle(unsigned int handle);

private:
    ScriptObjectList<JSParentalRating> m_ratings;
};

#endif
