// The model of the device's settings that a page may read. Browser thread only.
#ifndef TELIX_SRC_CONFIG_CONFIGURATION_H
#define TELIX_SRC_CONFIG_CONFIGURATION_H

#include "common/PluginBase.h"

class Configuration final : public PluginBase {
public:
    explicit Configuration(NPP npp);

    // Codes in the platform's form. The platform is asked until it has given a string that isn't empty; that
    // one is kept for the life of the object, so a later change of the setting is not seen.
    std::string getPreferredAudioLanguage();
    std::string getPreferredSubtitleLanguage();
    std::string getCountryId();

private:
    std::string m_preferredAudioLanguage;
    std::string m_preferredSubtitleLanguage;
    std::string m_countryId;
};

#endif
