// The script interface of a parental rating. It owns the rating.
#ifndef TELIX_SRC_PARENTAL_JSPARENTALRATING_H
#define TELIX_SRC_PARENTAL_JSPARENTALRATING_H

#include "common/ScriptWrapper.h"
#include "src/parental/ParentalRating.h"

class JSParentalRating final : public SubObjectWrapper<ParentalRating, 5> {
public:
    explicit JSParentalRating(NPP npp);
};

#endif
