// The script interface of the device's settings.
#include "src/config/JSConfiguration.h"

namespace {

constexpr ScriptMember kMembers[] = {
    property("preferredAudioLanguage", read<&Configuration::getPreferredAudioLanguage>),
    property("preferredSubtitleLanguage", read<&Configuration::getPreferredSubtitleLanguage>),
    property("countryId", read<&Configuration::getCountryId>),
};

// A name that isn't one of these leaves the result as the browser gave it.
constexpr ScriptClass kClass =
    ScriptClass("JSConfiguration", LogModule::CONFIG, kMembers).keepingUnreadResults();

} // namespace

JSConfiguration::JSConfiguration(NPP npp) : SubObjectWrapper(npp, kClass) {}
