// The model of an ordered collection of A/V components, filled once from the platform's handles. Browser
// thread only.
#ifndef TELIX_SRC_AVCOMPONENT_AVCOMPONENTLIST_H
#define TELIX_SRC_AVCOMPONENT_AVCOMPONENTLIST_H

#include "common/PluginBase.h"
#include "common/ScriptObjectList.h"
#include "src/avcomponent/AVcomponent.h"

class JSAVcomponent;

class AVcomponentList final : public PluginBase {
public:
    explicit AVcomponentList(NPP npp);

    // Makes the components that the list is short of `count`, from the entries of `pHandles` at their
    // indexes. The handles stay the caller's; without an array it is a programming fault, even for no
    // component.
    void initialize(const uint32_t* pHandles, AVcompType_T type, AVcompObjType_T objType, unsigned int count);

    // The component with one reference added for the caller; null beyond the end.
    NPObject* item(unsigned int index);
    uint32_t length() const { return m_components.length(); }

private:
    ScriptObjectList<JSAVcomponent> m_components;
};

#endif
