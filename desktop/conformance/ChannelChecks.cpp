// The channel list, and what handles of channels and programmes refuse.
#include <set>

#include "desktop/conformance/BroadcastFixture.h"
#include "desktop/conformance/CheckGroup.h"

namespace desktop {

namespace {

void checkChannelList(const CheckContext& context) {
    const auto channels = channelsOf(context);
    const std::set<uint32_t> distinct(channels.begin(), channels.end());
    expect(distinct.size() == channels.size(), "a handle is listed twice");
    expect(distinct.count(0) == 0, "a handle is 0");
    expect(channelsOf(context) == channels, "the second call returns another list");
}

void checkChannelProperties(const CheckContext& context) {
    const Library& library = context.library;
    for (const TELIX_JS_CM_HANDLE channel : channelsOf(context)) {
        int32_t type = 0;
        if (library.TELIX_JS_CM_GetChannelType && library.TELIX_JS_CM_GetChannelType(channel, &type) == 0) {
            expect(type >= 0 && type <= 2,
                   "channel " + std::to_string(channel) + " has the type " + std::to_string(type));
        }
        checkStringOf("TELIX_JS_CM_GetName", library.TELIX_JS_CM_GetName, channel);
        checkStringOf("TELIX_JS_CM_GetDsd", library.TELIX_JS_CM_GetDsd, channel);
    }
}

void checkTriplets(const CheckContext& context) {
    firstChannel(context);
    for (const TELIX_JS_CM_HANDLE channel : channelsOf(context)) {
        const Triplet triplet = tripletOf(context, channel);
        for (const uint32_t tsid : {triplet.tsid, kAnyTransportStream}) {
            TELIX_JS_CM_HANDLE found = 0;
            expect(context.library.TELIX_JS_CM_GetChannelByTriplet(triplet.onid, tsid, triplet.sid, &found) ==
                       0,
                   "channel " + std::to_string(channel) + " is not found");
            const Triplet other = tripletOf(context, found);
            expect(other.onid == triplet.onid && other.sid == triplet.sid, "another channel is found");
        }
    }
}

void checkUnknownTriplet(const CheckContext& context) {
    TELIX_JS_CM_HANDLE found = 0;
    expect(context.library.TELIX_JS_CM_GetChannelByTriplet(0xFFFFFFFF, 0xFFFFFFFE, 0xFFFFFFFD, &found) != 0,
           "it is accepted");
    expect(found == 0, "the output has changed");
}

// Outputs of calls that are refused.
char* unusedString = nullptr;
___UINT8 unusedLength = 0;
uint32_t unusedCount = 0;
TELIX_JS_SI_PARENTALRATING_HANDLE* unusedRatings = nullptr;

} // namespace

std::vector<Check> channelChecks() {
    const std::vector<RequiredCall> tripletCalls{
        REQUIRED_CALL(TELIX_JS_CM_GetChannelList), REQUIRED_CALL(TELIX_JS_CM_GetChannelByTriplet),
        REQUIRED_CALL(TELIX_JS_CM_GetOnid), REQUIRED_CALL(TELIX_JS_CM_GetTsid),
        REQUIRED_CALL(TELIX_JS_CM_GetSid)};
    return {
        {"the channel list has distinct handles and does not change",
         {REQUIRED_CALL(TELIX_JS_CM_GetChannelList)},
         checkChannelList},
        {"each channel has a valid type and new strings",
         {REQUIRED_CALL(TELIX_JS_CM_GetChannelList)},
         checkChannelProperties},
        {"a channel is found by its triplet, also without the transport stream", tripletCalls, checkTriplets},
        {"an unknown triplet is refused", tripletCalls, checkUnknownTriplet},
        refusalWithOutput(NAMED_CALL(TELIX_JS_CM_GetChannelType)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_CM_GetSid)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_CM_GetOnid)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_CM_GetTsid)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_CM_GetDsd)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_CM_GetName)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_SI_GetStartTime)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_SI_GetDuration)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_SI_GetChannelID)),
        refusal(NAMED_CALL(TELIX_JS_SI_SetName), "name"),
        refusal(NAMED_CALL(TELIX_JS_SI_SetChannelID), "1"),
        refusal(NAMED_CALL(TELIX_JS_SI_SetDescription), "description"),
        refusal(NAMED_CALL(TELIX_JS_SI_SetStartTime), 1),
        refusal(NAMED_CALL(TELIX_JS_SI_SetDuration), 1),
        refusal(NAMED_CALL(TELIX_JS_SI_GetName), &unusedString, &unusedLength),
        refusal(NAMED_CALL(TELIX_JS_SI_GetDescription), &unusedString, &unusedLength),
        refusal(NAMED_CALL(TELIX_JS_SI_GetParentalRatingHandles), &unusedCount, &unusedRatings),
    };
}

} // namespace desktop
