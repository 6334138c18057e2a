// The script interface of the parental control manager.
#include "src/parental/JSParentalControlManager.h"

#include "src/parental/ParentalControlManager.h"

namespace {

constexpr ScriptMember kMembers[] = {
    property("parentalRatingSchemes", reader<&ParentalControlManager::getParentalRatingSchemes>),
};

constexpr ScriptClass kClass("JSParentalControlManager", LogModule::PARENTAL, kMembers);

} // namespace

JSParentalControlManager::JSParentalControlManager(NPP npp) : EmbeddedObjectWrapper(npp, kClass) {}
