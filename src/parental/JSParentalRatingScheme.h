// The script interface of a rating scheme. It owns the scheme.
#ifndef TELIX_SRC_PARENTAL_JSPARENTALRATINGSCHEME_H
#define TELIX_SRC_PARENTAL_JSPARENTALRATINGSCHEME_H

#include "common/ScriptWrapper.h"
#include "src/parental/ParentalRatingScheme.h"

class JSParentalRatingScheme final : public SubObjectWrapper<ParentalRatingScheme, 6> {
public:
    explicit JSParentalRatingScheme(NPP npp);
};

#endif
