// The script interface of a list of A/V components.
#include "src/avcomponent/JSAVcomponentList.h"

namespace {

constexpr ScriptMember kMembers[] = {
    method("item", invoker<&AVcomponentList::item>),
    property("length", reader<&AVcomponentList::length>),
};

// This one line is logged under the channels' module.
constexpr ScriptArray kArray =
    scriptArray<&AVcomponentList::length, &AVcomponentList::item>(LogModule::CHANNEL, " ");

// A read that finds no property leaves the browser's result as it was.
constexpr ScriptClass kClass = ScriptClass("JSAVcomponentList", LogModule::AV_COMP, kMembers)
                                   .withArray(&kArray)
                                   .keepingUnreadResults()
                                   .refusingWritesWith("JSAVcomponentList class\n");

} // namespace

JSAVcomponentList::JSAVcomponentList(NPP npp) : SubObjectWrapper(npp, kClass) {}
