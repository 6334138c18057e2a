// The model of the embedded parental control manager: gives a page the rating schemes that the platform
// knows. There is no PIN and no blocking here. Browser thread only.
#ifndef TELIX_SRC_PARENTAL_PARENTALCONTROLMANAGER_H
#define TELIX_SRC_PARENTAL_PARENTALCONTROLMANAGER_H

#include "common/PluginBase.h"

struct ObjectKind;

extern const ObjectKind kParentalControlManagerKind;

class ParentalControlManager final : public PluginBase {
public:
    ParentalControlManager(NPP npp, unsigned short objectId);
    // The end of the object but for its memory, which a call that is in it may still need.
    void close();

    NPObject* getJSObject() override;

    // The collection of schemes with one reference added for the caller. It is read from the platform at the
    // first call that it answers and never again; null until then.
    NPObject* getParentalRatingSchemes();

private:
    NPObject* m_jsObject = nullptr;
    NPObject* m_parentalRatingSchemes = nullptr;
};

#endif
