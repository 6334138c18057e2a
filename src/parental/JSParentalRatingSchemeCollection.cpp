// The script interface of the collection of rating schemes.
#include "src/parental/JSParentalRatingSchemeCollection.h"

namespace {

using Model = ParentalRatingSchemeCollection;

constexpr ScriptMember kMembers[] = {
    property("length", reader<&Model::getLength>),
    method("item", invoker<&Model::getitem>),
    method("getParentalRatingScheme", invoker<&Model::getParentalRatingScheme>),
};

constexpr ScriptArray kArray = scriptArray<&Model::getLength, &Model::getitem>(LogModule::PARENTAL, "");

constexpr ScriptClass kClass =
    ScriptClass("JSParentalRatingSchemeCollection", LogModule::PARENTAL, kMembers).withArray(&kArray);

} // namespace

JSParentalRatingSchemeCollection::JSParentalRatingSchemeCollection(NPP npp) : SubObjectWrapper(npp, kClass) {}
