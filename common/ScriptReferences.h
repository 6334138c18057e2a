// References to script objects that models hold: one reference each for what is held, one more for whoever is
// given the object. Browser thread only.
#ifndef TELIX_COMMON_SCRIPTREFERENCES_H
#define TELIX_COMMON_SCRIPTREFERENCES_H

#include "common/BrowserGates.h"
#include "common/JSPluginBase.h"

// A new script object of the class `Wrapper`; the caller owns its one reference. Null if the browser refuses.
template <class Wrapper>
NPObject* createScriptObject(NPP npp) {
    return NPN_CreateObject(npp, JSPluginBase::classOf<Wrapper>());
}

// The wrapper behind a script object of ours; null stays null. The object's class is not tested.
template <class Wrapper>
Wrapper* wrapperOf(NPObject* object) {
    return static_cast<Wrapper*>(object);
}

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
