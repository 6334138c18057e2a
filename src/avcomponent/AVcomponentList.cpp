// A list of A/V components: built from handles.
#include "src/avcomponent/AVcomponentList.h"

#include <cassert>

#include "src/avcomponent/JSAVcomponent.h"

AVcomponentList::AVcomponentList(NPP npp) : PluginBase(npp) {}

void AVcomponentList::initialize(const uint32_t* pHandles, AVcompType_T type, AVcompObjType_T objType,
                                 unsigned int count) {
    assert(pHandles);
    m_components.fillUpTo(count, m_npp, [=](JSAVcomponent& wrapper, uint32_t index) {
        AVcomponent& component = *wrapper.impl();
        component.setHandle(pHandles[index]);
        component.setType(type);
        component.setObjType(objType);
    });
}

NPObject* AVcomponentList::item(unsigned int index) {
    return m_components.item(index);
}
