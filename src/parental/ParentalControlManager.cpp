// The parental control manager: the collection of schemes, made at its first use.
#include "src/parental/ParentalControlManager.h"

#include "common/ObjectKind.h"
#include "common/ScriptReferences.h"
#include "src/parental/JSParentalControlManager.h"
#include "src/parental/JSParentalRatingSchemeCollection.h"
#include "telix/telix_platform.h"

namespace {

const char* const kMimeTypes[] = {"application/oipfparentalcontrolmanager", nullptr};

} // namespace

const ObjectKind kParentalControlManagerKind = [] {
    ObjectKind kind{};
    kind.id = 600;
    kind.mimeTypes = kMimeTypes;
    kind.create = [](NPP npp, unsigned short id) -> PluginBase* {
        return new ParentalControlManager(npp, id);
    };
    kind.dispose = disposeOf<ParentalControlManager>;
    return kind;
}();

ParentalControlManager::ParentalControlManager(NPP npp, unsigned short objectId)
    : PluginBase(npp, objectId) {}

void ParentalControlManager::close() {
    releaseHeld(m_jsObject);
    releaseHeld(m_parentalRatingSchemes);
}

NPObject* ParentalControlManager::getJSObject() {
    return handOutOnce<JSParentalControlManager>(getBrowser(), m_jsObject);
}

NPObject* ParentalControlManager::getParentalRatingSchemes() {
    // quirk 42: read once; later changes on the platform are not seen.
    if (!m_parentalRatingSchemes) {
        uint32_t count = 0;
        PARENTALRATTINGSCHEME_STRUCT_T_TAG* records = nullptr; // stay the platform's
        if (TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes(&count, &records) == 0) {
            // Two references are kept, and the destructor gives one back: the collection outlives this
            // object.
            m_parentalRatingSchemes = handOut(createScriptObject<JSParentalRatingSchemeCollection>(m_npp));
            if (m_parentalRatingSchemes) {
                wrapperOf<JSParentalRatingSchemeCollection>(m_parentalRatingSchemes)
                    ->impl()
                    ->initializeCollection(count, records);
            }
        }
    }
    return handOut(m_parentalRatingSchemes);
}
