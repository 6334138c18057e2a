// The script interface of a collection of parental ratings. It owns the collection.
#ifndef TELIX_SRC_PARENTAL_JSPARENTALRATINGCOLLECTION_H
#define TELIX_SRC_PARENTAL_JSPARENTALRATINGCOLLECTION_H

#include "common/ScriptWrapper.h"
#include "src/parental/ParentalRatingCollection.h"

class JSParentalRatingCollection final : public SubObjectWrapper<ParentalRatingCollection, 2> {
public:
    explicit JSParentalRatingCollection(NPP npp);
};

#endif
