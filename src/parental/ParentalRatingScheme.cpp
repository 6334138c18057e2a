// A rating scheme: a copy of the platform's record, and the way to its threshold.
#include "src/parental/ParentalRatingScheme.h"

#include <algorithm>

#include "common/Log.h"
#include "common/ScriptReferences.h"
#include "src/parental/JSParentalRating.h"

ParentalRatingScheme::ParentalRatingScheme(NPP npp) : PluginBase(npp) {}

void ParentalRatingScheme::setHandle(PARENTALRATTINGSCHEME_STRUCT_T_TAG record) {
    if (!record.szName) {
        return;
    }
    m_count = record.ratingNames && record.iconUris ? record.count : 0;
    PLUGIN_LOG(PARENTAL, " parentalRatingScheme.szName is:: ( %s )\n", record.szName);
    m_name = record.szName;
    m_handle = record.handle;
    m_ratingNames.insert(m_ratingNames.end(), record.ratingNames, record.ratingNames + m_count);
    m_iconUris.insert(m_iconUris.end(), record.iconUris, record.iconUris + m_count);
}

uint32_t ParentalRatingScheme::getLength() const {
    // quirk 40: this scheme has no named ratings by its length, though its items can be had.
    return m_name == "dvb-si" ? 0 : m_count;
}

std::string ParentalRatingScheme::getitem(unsigned int index) const {
    return index < m_count ? m_ratingNames[index] : std::string();
}

std::string ParentalRatingScheme::getIconUri(unsigned int index) const {
    return index < m_count ? m_iconUris[index] : std::string();
}

uint32_t ParentalRatingScheme::getIndexOf(const std::string& name) const {
    constexpr auto kAbsent = static_cast<uint32_t>(-1);
    if (name.empty()) {
        return kAbsent;
    }
    const auto end = m_ratingNames.begin() + m_count;
    const auto found = std::find(m_ratingNames.begin(), end, name);
    return found == end ? kAbsent : static_cast<uint32_t>(found - m_ratingNames.begin());
}

NPObject* ParentalRatingScheme::getThreshold() {
    int32_t threshold = 0;
    if (m_handle == 0 || TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(m_handle, &threshold) != 0) {
        return nullptr;
    }
    PLUGIN_LOG(PARENTAL, " parentalRatingThreshold is:: ( %d )\n", threshold);
    // quirk 39: a new object at every read.
    NPObject* object = createScriptObject<JSParentalRating>(m_npp);
    if (!object) {
        return nullptr;
    }
    NPN_RetainObject(object); // the caller's; the reference of the creation is never given back
    ParentalRating& rating = *wrapperOf<JSParentalRating>(object)->impl();
    // The number is the handle too, which does no harm, since a threshold never asks the platform.
    rating.setParentalRatingHandle(static_cast<uint32_t>(threshold));
    rating.setThresholdProperties(static_cast<uint32_t>(threshold), m_name);
    return object;
}
