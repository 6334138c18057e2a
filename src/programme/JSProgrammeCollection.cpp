// The script interface of a collection of programmes.
#include "src/programme/JSProgrammeCollection.h"

namespace {

using Model = ProgrammeCollection;

constexpr ScriptMember kMembers[] = {
    method("item", invoker<&Model::getitem>),
    property("length", reader<&Model::getLength>),
};

constexpr ScriptArray kArray = scriptArray<&Model::getLength, &Model::getitem>(LogModule::PROGRAMME, "");

constexpr ScriptClass kClass =
    ScriptClass("JSProgrammeCollection", LogModule::PROGRAMME, kMembers).withArray(&kArray);

} // namespace

JSProgrammeCollection::JSProgrammeCollection(NPP npp) : SubObjectWrapper(npp, kClass) {}
