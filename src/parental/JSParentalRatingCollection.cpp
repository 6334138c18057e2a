// The script interface of a collection of parental ratings.
#include "src/parental/JSParentalRatingCollection.h"

namespace {

using Model = ParentalRatingCollection;

constexpr ScriptMember kMembers[] = {
    method("item", invoker<&Model::getitem>),
    property("length", reader<&Model::getLength>),
};

// This one line is logged under the channels' module.
constexpr ScriptArray kArray = scriptArray<&Model::getLength, &Model::getitem>(LogModule::CHANNEL, " ");

constexpr ScriptClass kClass = ScriptClass("JSParentalRatingCollection", LogModule::PARENTAL, kMembers)
                                   .withArray(&kArray)
                                   .refusingWritesWith("JSParentalRatingCollection class\n");

} // namespace

JSParentalRatingCollection::JSParentalRatingCollection(NPP npp) : SubObjectWrapper(npp, kClass) {}
