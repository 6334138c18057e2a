// The model of the collection of rating schemes that the platform knows. Browser thread only.
#ifndef TELIX_SRC_PARENTAL_PARENTALRATINGSCHEMECOLLECTION_H
#define TELIX_SRC_PARENTAL_PARENTALRATINGSCHEMECOLLECTION_H

#include "common/PluginBase.h"
#include "common/ScriptObjectList.h"
#include "telix/telix_platform.h"

class JSParentalRatingScheme;

class ParentalRatingSchemeCollection final : public PluginBase {
public:
    explicit ParentalRatingSchemeCollection(NPP npp);

    // Makes the schemes of `count` records, which stay the caller's; without an array there are none.
    void initializeCollection(unsigned int count, const PARENTALRATTINGSCHEME_STRUCT_T_TAG* records);

    // The scheme with one reference added for the caller; null beyond the end.
    NPObject* getitem(unsigned int index);
    uint32_t getLength() const { return m_schemes.length(); }

    // The first scheme of exactly this name with one reference added for the caller, or null.
    NPObject* getParentalRatingScheme(const std::string& name);

private:
    ScriptObjectList<JSParentalRatingScheme> m_schemes;
};

#endif
