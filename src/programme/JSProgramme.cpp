// The script interface of a programme.
#include "src/programme/JSProgramme.h"

namespace {

using Model = Programme;

constexpr ScriptMember kMembers[] = {
    property("name", reader<&Model::getName>, writer<&Model::setName>),
    property("startTime", reader<&Model::getStartTime>, writer<&Model::setStartTime>),
    property("duration", reader<&Model::getDuration>, writer<&Model::setDuration>),
    property("description", reader<&Model::getDescription>, writer<&Model::setDescription>),
    property("channelID", reader<&Model::getChannelID>, writer<&Model::setChannelID>),
    // quirk 33: the name of the property.
    property("parentalRating", reader<&Model::getParentalRatingCollectionObject>),
};

constexpr ScriptClass kClass =
    ScriptClass("JSProgramme", LogModule::PROGRAMME, kMembers).refusingMethodsWith("JSProgramme class\n");

} // namespace

JSProgramme::JSProgramme(NPP npp) : SubObjectWrapper(npp, kClass) {}
