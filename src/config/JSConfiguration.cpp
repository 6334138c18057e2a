// The script interface of the device's settings.
#include "src/config/JSConfiguration.h"

namespace {

constexpr ScriptMember kMembers[] = {
    property("preferredAudioLanguage", reader<&Configuration::getPreferredAudioLanguage>),
    property("preferredSubtitleLanguage", reader<&Configuration::getPreferredSubtitleLanguage>),
    property("countryId", reader<&Configuration::getCountryId>),
};

// A name that isn't one of these leaves the result as the browser gave it.
constexpr ScriptClass kClass =
    ScriptClass("JSConfiguration", LogModule::CONFIG, kMembers).keepingUnreadResults();

} // namespace

JSConfiguration::JSConfiguration(NPP npp) : SubObjectWrapper(npp, kClass) {}
