// The script interface of a programme.
#include "src/programme/JSProgramme.h"

namespace {

using Model = Programme;

constexpr ScriptMember kMembers[] = {
    property("name", read<&Model::getName>, write<&Model::setName>),
    property("startTime", read<&Model::getStartTime>, write<&Model::setStartTime>),
    property("duration", read<&Model::getDuration>, write<&Model::setDuration>),
    property("description", read<&Model::getDescription>, write<&Model::setDescription>),
    property("channelID", read<&Model::getChannelID>, write<&Model::setChannelID>),
    // quirk 33: the name of the property.
    property("parentalRating", read<&Model::getParentalRatingCollectionObject>),
};

constexpr ScriptClass kClass =
    ScriptClass("JSProgramme", LogModule::PROGRAMME, kMembers).refusingMethodsWith("JSProgramme class\n");

} // namespace

JSProgramme::JSProgramme(NPP npp) : SubObjectWrapper(npp, kClass) {}
