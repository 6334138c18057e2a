// The device's settings: the platform's answers and their caches.
#include "src/config/Configuration.h"

#include <cstdlib>

#include "telix/telix_platform.h"

namespace {

// quirk 25: an answer that is not empty is kept for good.
std::string fetchString(std::string& cache, TELIX_RETCODE_ENUM_T (*ask)(char**)) {
    char* text = nullptr;
    if (cache.empty() && ask(&text) == 0 && text) {
        cache = text;
    }
    std::free(text); // ours, also if the call failed
    return cache;
}

} // namespace

Configuration::Configuration(NPP npp) : PluginBase(npp) {}

std::string Configuration::getPreferredAudioLanguage() {
    return fetchString(m_preferredAudioLanguage, TELIX_JS_APP_Config_GetPreferredAudioLanguage);
}

std::string Configuration::getPreferredSubtitleLanguage() {
    return fetchString(m_preferredSubtitleLanguage, TELIX_JS_APP_Config_GetPreferredSubtitleLanguage);
}

std::string Configuration::getCountryId() {
    return fetchString(m_countryId, TELIX_JS_APP_Config_GetCountryId);
}
