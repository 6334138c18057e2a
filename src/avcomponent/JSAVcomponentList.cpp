// The script interface of a list of A/V components.
#include "src/avcomponent/JSAVcomponentList.h"

namespace {

constexpr ScriptMember kMembers[] = {
    method("item", invoke<&AVcomponentList::item>),
    property("length", read<&AVcomponentList::length>),
};

// Meant: this one line belongs to the channels' module.
constexpr ScriptArray kArray =
    scriptArray<&AVcomponentList::length, &AVcomponentList::item>(LogModule::CHANNEL, " ");

// Meant: a read that finds no property leaves the browser's result as it was.
constexpr ScriptClass kClass = ScriptClass("JSAVcomponentList", LogModule::AV_COMP, kMembers)
                                   .withArray(&kArray)
                                   .keepingUnreadResults()
                                   .refusingWritesWith("JSAVcomponentList class\n");

} // namespace

JSAVcomponentList::JSAVcomponentList(NPP npp) : SubObjectWrapper(npp, kClass) {}
