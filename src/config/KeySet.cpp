// A key set: the mask and its exchange with the platform.
#include "src/config/KeySet.h"

#include "common/Log.h"
#include "src/application/ApplicationManager.h"
#include "telix/telix_platform.h"

KeySet::KeySet(NPP npp) : PluginBase(npp) {}

uint32_t KeySet::getValue() {
    if (m_value == 0) {
        ApplicationManager* manager = ApplicationManager::sharedInstance(m_npp);
        uint32_t mask = 0;
        if (manager && manager->getApplication(this) && TELIX_JS_APP_GetKeySetValue(&mask) == 0) {
            m_value = mask;
        }
    }
    return static_cast<uint32_t>(m_value);
}

uint32_t KeySet::setValue(uint32_t value, uint32_t other) {
    PLUGIN_LOG(APP_MGR, " Value: %d, Other: %d \n", value, other);
    // Unlike a read, this needs only a manager, no application that owns the key set.
    // quirk 24: `other` goes no further than the log.
    if (ApplicationManager::sharedInstance(m_npp)) {
        PLUGIN_LOG(APP_MGR, " Value_typecast: %d, Other: %d \n", value, other);
        uint32_t granted = 0; // the platform writes it if it accepts the mask
        if (TELIX_JS_APP_SetKeySetValue(value, &granted) == 0) {
            // quirk 23: what script asked for is kept, what the platform granted is returned.
            m_value = value;
            return granted;
        }
    }
    return static_cast<uint32_t>(m_value);
}
