// The collection of rating schemes: built from records, searched by name.
#include "src/parental/ParentalRatingSchemeCollection.h"

#include "src/parental/JSParentalRatingScheme.h"

ParentalRatingSchemeCollection::ParentalRatingSchemeCollection(NPP npp) : PluginBase(npp) {}

void ParentalRatingSchemeCollection::initializeCollection(unsigned int count,
                                                          const PARENTALRATTINGSCHEME_STRUCT_T_TAG* records) {
    m_schemes.setLength(0);
    if (!records) {
        return;
    }
    m_schemes.fillUpTo(count, m_npp, [records](JSParentalRatingScheme& wrapper, uint32_t index) {
        wrapper.impl()->setHandle(records[index]);
    });
}

NPObject* ParentalRatingSchemeCollection::getitem(unsigned int index) {
    return m_schemes.item(index);
}

NPObject* ParentalRatingSchemeCollection::getParentalRatingScheme(const std::string& name) {
    return m_schemes.find([&name](const ParentalRatingScheme& scheme) { return scheme.getName() == name; });
}
