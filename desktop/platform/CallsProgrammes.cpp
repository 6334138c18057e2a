// The platform calls for programmes and parental ratings.
#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Output.h"
#include "desktop/platform/Utf8.h"

using namespace desktop;

namespace {

template <typename Function>
TELIX_RETCODE_ENUM_T ofProgramme(TELIX_JS_SI_HANDLE handle, Function function) {
    const auto programme = Broadcast::instance().programmes().find(handle);
    return programme ? function(*programme) : kRefused;
}

template <typename Function>
TELIX_RETCODE_ENUM_T ofRating(TELIX_JS_SI_PARENTALRATING_HANDLE handle, Function function) {
    const auto rating = Broadcast::instance().programmes().findRating(handle);
    return rating ? function(*rating) : kRefused;
}

template <typename Value>
TELIX_RETCODE_ENUM_T setProperty(TELIX_JS_SI_HANDLE programme, Value Programme::*property,
                                 const Value& value) {
    return Broadcast::instance().programmes().set(programme, property, value) ? TELIX_RETCODE_SUCCESS
                                                                              : kRefused;
}

// The length of a name or description is returned in one byte.
constexpr size_t kMaxStringSize = 255;

// Returns a string of at most kMaxStringSize bytes; none for an empty one.
TELIX_RETCODE_ENUM_T returnShortString(char** out, ___UINT8* length, const std::string& value) {
    const std::string string = truncateUtf8(value, kMaxStringSize);
    *length = static_cast<___UINT8>(string.size());
    return string.empty() ? TELIX_RETCODE_SUCCESS : returnString(out, string);
}

} // namespace

TELIX_RETCODE_ENUM_T TELIX_JS_SI_GetProgrammeHandles(uint32_t* count, TELIX_JS_SI_HANDLE** programmes) {
    static std::vector<TELIX_JS_SI_HANDLE> handles; // valid until the next call
    handles = Broadcast::instance().presentFollowing().handles();
    handles.reserve(1);
    *count = static_cast<uint32_t>(handles.size());
    *programmes = handles.data();
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_SetName(TELIX_JS_SI_HANDLE programme, const char* name) {
    return setProperty<std::string>(programme, &Programme::name, name);
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_SetChannelID(TELIX_JS_SI_HANDLE programme, const char* channelId) {
    return setProperty<std::string>(programme, &Programme::channelId, channelId);
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_SetDescription(TELIX_JS_SI_HANDLE programme, const char* description) {
    return setProperty<std::string>(programme, &Programme::description, description);
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_SetStartTime(TELIX_JS_SI_HANDLE programme, uint32_t startTime) {
    return setProperty(programme, &Programme::start, startTime);
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_SetDuration(TELIX_JS_SI_HANDLE programme, uint32_t duration) {
    return setProperty(programme, &Programme::duration, duration);
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_GetName(TELIX_JS_SI_HANDLE programme, char** name, ___UINT8* length) {
    return ofProgramme(programme,
                       [=](const Programme& found) { return returnShortString(name, length, found.name); });
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_GetDescription(TELIX_JS_SI_HANDLE programme, char** description,
                                                ___UINT8* length) {
    return ofProgramme(programme, [=](const Programme& found) {
        return returnShortString(description, length, found.description);
    });
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_GetStartTime(TELIX_JS_SI_HANDLE programme, uint32_t* startTime) {
    return ofProgramme(programme, [=](const Programme& found) {
        *startTime = found.start;
        return TELIX_RETCODE_SUCCESS;
    });
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_GetDuration(TELIX_JS_SI_HANDLE programme, uint32_t* duration) {
    return ofProgramme(programme, [=](const Programme& found) {
        *duration = found.duration;
        return TELIX_RETCODE_SUCCESS;
    });
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_GetChannelID(TELIX_JS_SI_HANDLE programme, char** channelId) {
    return ofProgramme(programme,
                       [=](const Programme& found) { return returnString(channelId, found.channelId); });
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_GetParentalRatingHandles(TELIX_JS_SI_HANDLE programme, uint32_t* count,
                                                          TELIX_JS_SI_PARENTALRATING_HANDLE** ratings) {
    static std::vector<TELIX_JS_SI_PARENTALRATING_HANDLE> handles; // valid until the next call
    return ofProgramme(programme, [=](const Programme& found) {
        handles = found.ratings;
        handles.reserve(1);
        *count = static_cast<uint32_t>(handles.size());
        *ratings = handles.data();
        return TELIX_RETCODE_SUCCESS;
    });
}

// The age as a string; a broadcaster's own value has no name.
TELIX_RETCODE_ENUM_T TELIX_JS_SI_PARENTALRATING_GetName(TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                                                        char** name) {
    return ofRating(rating, [=](const ParentalRating& found) {
        return returnString(name, found.isAge() ? std::to_string(found.value()) : "");
    });
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_PARENTALRATING_GetScheme(TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                                                          char** scheme) {
    return ofRating(rating, [=](const ParentalRating&) { return returnString(scheme, "dvb-si"); });
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_PARENTALRATING_GetValue(TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                                                         int32_t* value) {
    return ofRating(rating, [=](const ParentalRating& found) {
        *value = found.value();
        return TELIX_RETCODE_SUCCESS;
    });
}

// Broadcast carries no labels.
TELIX_RETCODE_ENUM_T TELIX_JS_SI_PARENTALRATING_GetLabels(TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                                                          int32_t* labels) {
    return ofRating(rating, [=](const ParentalRating&) {
        *labels = 0;
        return TELIX_RETCODE_SUCCESS;
    });
}

TELIX_RETCODE_ENUM_T TELIX_JS_SI_PARENTALRATING_GetRegion(TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                                                          char** region) {
    return ofRating(rating, [=](const ParentalRating& found) { return returnString(region, found.region); });
}
