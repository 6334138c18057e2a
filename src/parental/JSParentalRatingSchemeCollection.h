// The script interface of the collection of rating schemes. It owns the collection.
#ifndef TELIX_SRC_PARENTAL_JSPARENTALRATINGSCHEMECOLLECTION_H
#define TELIX_SRC_PARENTAL_JSPARENTALRATINGSCHEMECOLLECTION_H

#include "common/ScriptWrapper.h"
#include "src/parental/ParentalRatingSchemeCollection.h"

class JSParentalRatingSchemeCollection final : public SubObjectWrapper<ParentalRatingSchemeCollection, 3> {
public:
    explicit JSParentalRatingSchemeCollection(NPP npp);
};

#endif
