// References to script objects that models hold: one reference each for what is held, one more for whoever is
// given the object. Browser thread only.
#ifndef TELIX_COMMON_SCRIPTREFERENCES_H
#define TELIX_COMMON_SCRIPTREFERENCES_H

#include "common/BrowserGates.h"
#include "common/JSPluginBase.h"
#include "common/ScriptValues.h"

// A new script object of the class `Wrapper`; the caller owns its one reference. Null if the browser refuses.
template <class Wrapper>
NPObject* createScriptObject(NPP npp) {
    return NPN_CreateObject(npp, JSPluginBase::classOf<Wrapper>());
}

// The wrapper behind a script object of the class `Wrapper`; null for any other object, which script may hand
// over just as well, and for null.
template <class Wrapper>
Wrapper* wrapperOf(NPObject* object) {
    const bool isOurs = object && object->_class == JSPluginBase::classOf<Wrapper>();
    return isOurs ? static_cast<Wrapper*>(object) : nullptr;
}

// How script hands over an object of one of our classes; it stays the browser's.
template <class Wrapper>
struct ScriptArgument<Wrapper*> {
    static bool fits(const NPVariant& value) {
        return value.type == NPVariantType_Object && wrapperOf<Wrapper>(value.value.objectValue);
    }
    static Wrapper* read(const NPVariant& value) { return wrapperOf<Wrapper>(value.value.objectValue); }
};

// The held object with one reference added for the caller; null stays null.
inline NPObject* handOut(NPObject* held) {
    if (held) {
        NPN_RetainObject(held);
    }
    return held;
}

// The same for an object that is made at its first use; the slot keeps the reference of the creation.
template <class Wrapper>
NPObject* handOutOnce(NPP npp, NPObject*& slot) {
    if (!slot) {
        slot = createScriptObject<Wrapper>(npp);
    }
    return handOut(slot);
}

// Gives the held reference back, if there is one.
inline void releaseHeld(NPObject*& slot) {
    if (slot) {
        NPN_ReleaseObject(slot);
        slot = nullptr;
    }
}

// Puts another listener, or none, in the place of the held one.
inline void replaceListener(NPObject*& slot, NPObject* listener) {
    releaseHeld(slot);
    slot = handOut(listener);
}

// The same in another order: the slot holds the listener by the time that the browser counts the reference,
// and the retain is made on whatever is stored, null included.
inline void storeListener(NPObject*& slot, NPObject* listener) {
    releaseHeld(slot);
    slot = listener;
    NPN_RetainObject(slot);
}

#endif
