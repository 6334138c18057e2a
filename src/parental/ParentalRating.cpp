// A parental rating: the platform's answers, or a threshold's own.
#include "src/parental/ParentalRating.h"

#include <cstdlib>

#include "common/Log.h"
#include "telix/telix_platform.h"

ParentalRating::ParentalRating(NPP npp) : PluginBase(npp) {}

void ParentalRating::setThresholdProperties(unsigned int threshold, const std::string& scheme) {
    // quirk 38: the name is the number in decimal, and the region is the string "undefined".
    const std::string number = std::to_string(static_cast<int32_t>(threshold));
    PLUGIN_LOG(PARENTAL, " Buffer value is:: ( %s )\n", number.c_str());
    m_isThreshold = true;
    m_name = number;
    m_value = static_cast<int32_t>(threshold);
    m_scheme = scheme;
    m_region = "undefined";
}

template <class Ask>
std::string ParentalRating::fetchString(std::string& cache, Ask ask) const {
    if (!m_isThreshold && cache.empty() && m_handle != 0) {
        char* text = nullptr;
        if (ask(m_handle, &text) == 0 && text) {
            cache = text;
            std::free(text);
        }
    }
    return cache;
}

template <class Ask>
int32_t ParentalRating::fetchNumber(int32_t& last, Ask ask) const {
    if (!m_isThreshold && m_handle != 0) {
        int32_t value = last;
        if (ask(m_handle, &value) == 0) {
            last = value;
        }
    }
    return last;
}

std::string ParentalRating::getName() {
    return fetchString(m_name, TELIX_JS_SI_PARENTALRATING_GetName);
}

std::string ParentalRating::getScheme() {
    return fetchString(m_scheme, TELIX_JS_SI_PARENTALRATING_GetScheme);
}

std::string ParentalRating::getRegion() {
    return fetchString(m_region, TELIX_JS_SI_PARENTALRATING_GetRegion);
}

int32_t ParentalRating::getValue() {
    return fetchNumber(m_value, TELIX_JS_SI_PARENTALRATING_GetValue);
}

int32_t ParentalRating::getLabels() {
    return fetchNumber(m_labels, TELIX_JS_SI_PARENTALRATING_GetLabels);
}
