// First the readers of values, then the table.
#include "desktop/platform/Settings.h"

#include <algorithm>
#include <glib.h>
#include <utility>

#include "desktop/platform/Capabilities.h"
#include "desktop/platform/OwnedString.h"

namespace desktop {

namespace {

constexpr uint32_t kMaxAge = 18;
constexpr uint32_t kSecondsPerDay = 86400;
constexpr uint32_t kMaxZapDelay = 60000;
constexpr uint32_t kMaxTuners = 3;          // for a channel and both of its neighbours
constexpr size_t kMaxApplicationsUrl = 240; // it must fit into a descriptor

const char kTestMultiplex[] = "test";

// The items of a list, without the white space around them. A semicolon at the end is part of the last item.
std::vector<std::string> itemsOf(const std::string& list) {
    std::vector<std::string> items;
    const OwnedStrings parts(g_strsplit(list.c_str(), ";", -1));
    for (char** part = parts.get(); *part; ++part) {
        items.push_back(trimmed(*part));
    }
    if (!items.empty() && items.back().empty()) {
        items.pop_back();
    }
    return items;
}

std::string absolutePath(const std::string& file, const std::string& folder) {
    return OwnedString(g_canonicalize_filename(file.c_str(), folder.c_str())).get();
}

// ---- Readers

std::string readNumber(const std::string& value, uint32_t minimum, uint32_t maximum, uint32_t& number) {
    guint64 read = 0;
    GError* error = nullptr;
    if (!g_ascii_string_to_unsigned(value.c_str(), 10, minimum, maximum, &read, &error)) {
        return messageOf(error);
    }
    number = static_cast<uint32_t>(read);
    return "";
}

std::string range(uint32_t minimum, uint32_t maximum) {
    return std::to_string(minimum) + " to " + std::to_string(maximum);
}

SettingReader number(uint32_t Configuration::*member, uint32_t minimum, uint32_t maximum) {
    return {range(minimum, maximum), [=](SettingTarget& target, const std::string& value) {
                return readNumber(value, minimum, maximum, target.configuration.*member);
            }};
}

SettingReader flag(bool Configuration::*member) {
    return {"true or false", [=](SettingTarget& target, const std::string& value) -> std::string {
                if (value != "true" && value != "false") {
                    return "\"" + value + "\" is neither true nor false";
                }
                target.configuration.*member = value == "true";
                return "";
            }};
}

SettingReader isoCode(std::string Configuration::*member) {
    return {"ISO code of three letters", [=](SettingTarget& target, const std::string& value) -> std::string {
                if (value.size() != 3 || !std::all_of(value.begin(), value.end(),
                                                      [](char letter) { return g_ascii_isalpha(letter); })) {
                    return "\"" + value + "\" is not an ISO code of three letters";
                }
                target.configuration.*member = value;
                return "";
            }};
}

SettingReader keys(uint32_t Configuration::*member) {
    return {"list of key groups", [=](SettingTarget& target, const std::string& value) -> std::string {
                uint32_t mask = 0;
                for (const std::string& item : itemsOf(value)) {
                    const auto group = std::find_if(keyGroups().begin(), keyGroups().end(),
                                                    [&](const KeyGroup& each) { return each.name == item; });
                    if (group == keyGroups().end()) {
                        return "\"" + item + "\" is not a group of keys";
                    }
                    mask |= group->bit;
                }
                target.configuration.*member = mask;
                return "";
            }};
}

// A reader of its own.
SettingReader custom(std::string accepts,
                     std::string (*read)(SettingTarget& target, const std::string& value)) {
    return {std::move(accepts), read};
}

std::string readCapabilities(SettingTarget& target, const std::string& value) {
    std::string& file = target.configuration.capabilitiesFile;
    std::string reason;
    file = value.empty() ? "" : absolutePath(value, target.folder);
    if (!file.empty()) {
        Capabilities::load(file, reason);
    }
    return reason;
}

std::string readRatings(SettingTarget& target, const std::string& value) {
    std::vector<std::string>& ratings = target.configuration.ratingSchemes.back().ratings;
    ratings = itemsOf(value);
    for (auto each = ratings.begin(); each != ratings.end(); ++each) {
        if (each->empty()) {
            return "a rating has no name";
        }
        if (std::find(ratings.begin(), each, *each) != each) {
            return "\"" + *each + "\" is given twice";
        }
    }
    return "";
}

// An item may be empty, also the last one: a semicolon at the end may follow the last item or stand before an
// empty one. Which of the two it is shows the number of ratings, in finishRatingScheme.
std::string readIcons(SettingTarget& target, const std::string& value) {
    std::vector<std::string>& icons = target.configuration.ratingSchemes.back().icons;
    icons.clear();
    const OwnedStrings parts(g_strsplit(value.c_str(), ";", -1));
    for (char** part = parts.get(); *part; ++part) {
        icons.push_back(trimmed(*part));
    }
    return "";
}

std::string readSchemeThreshold(SettingTarget& target, const std::string& value) {
    target.schemeThreshold = value;
    return "";
}

std::string readDrmResult(SettingTarget& target, const std::string& value) {
    uint32_t result = 0;
    std::string reason = readNumber(value, 0, G_MAXINT32, result);
    target.configuration.drmSystems.back().result = static_cast<int32_t>(result);
    return reason;
}

std::string readDrmMessage(SettingTarget& target, const std::string& value) {
    target.configuration.drmSystems.back().message = value;
    return "";
}

} // namespace

// A source is "test", a file or a folder, and may end in "#SERVICE-ID".
std::string readSources(SettingTarget& target, const std::string& value) {
    std::vector<Configuration::Source> sources;
    for (std::string item : itemsOf(value)) {
        Configuration::Source source;
        const size_t mark = item.rfind('#');
        if (mark != std::string::npos) {
            uint32_t service = 0;
            const std::string reason = readNumber(item.substr(mark + 1), 1, 0xFFFF, service);
            if (!reason.empty()) {
                return "service id of \"" + item + "\": " + reason;
            }
            source.service = static_cast<uint16_t>(service);
            item.resize(mark);
        } else if (item.empty()) {
            continue;
        }
        if (item != kTestMultiplex) {
            source.path = absolutePath(item, target.folder);
        }
        sources.push_back(source);
    }
    if (sources.empty()) {
        return "no channel source is given";
    }
    target.configuration.sources = sources;
    return "";
}

// ---- The table

const std::vector<KeyGroup>& keyGroups() {
    static const auto& groups = *new std::vector<KeyGroup>{
        {"red", 0x1},  {"green", 0x2},   {"yellow", 0x4}, {"blue", 0x8},      {"navigation", 0x10},
        {"vcr", 0x20}, {"scroll", 0x40}, {"info", 0x80},  {"numeric", 0x100}, {"alpha", 0x200}};
    return groups;
}

// A folder, so that paths can be appended.
std::string readApplicationsUrl(SettingTarget& target, const std::string& value) {
    const OwnedString scheme(g_uri_parse_scheme(value.c_str()));
    if (!value.empty() && !scheme) {
        return "\"" + value + "\" is not an absolute URL";
    }
    if (value.size() > kMaxApplicationsUrl) {
        return "longer than " + std::to_string(kMaxApplicationsUrl) + " bytes";
    }
    target.configuration.applicationsUrl = value.empty() || value.back() == '/' ? value : value + "/";
    return "";
}

const std::vector<Setting>& settings() {
    using C = Configuration;
    static const auto& table = *new std::vector<Setting>{
        {"channels", "sources", custom("list of sources", readSources), "test",
         "`test` for the generated test multiplex, transport stream files, and folders of `.ts` files; "
         "`#SERVICE-ID` after a source selects one service. `TELIX_CHANNELS` overrides the setting"},
        {"test", "programme-seconds", number(&C::programmeSeconds, 2, kSecondsPerDay), "300",
         "Duration of the programmes of the test multiplex"},
        {"test", "stream-event-seconds", number(&C::streamEventSeconds, 0, kSecondsPerDay), "10",
         "Interval of the stream events of the test multiplex; 0 sends none"},
        {"test", "applications", custom("URL", readApplicationsUrl), "",
         "Folder of the applications that the test multiplex signals, `demo/index.html` and "
         "`media/index.html` in it; if empty, it signals none. `TELIX_APPLICATIONS` overrides the setting"},
        {"viewer", "country", isoCode(&C::country), "DEU", "Country of the viewer"},
        {"viewer", "audio-language", isoCode(&C::audioLanguage), "deu", "Preferred audio language"},
        {"viewer", "subtitle-language", isoCode(&C::subtitleLanguage), "deu", "Preferred subtitle language"},
        {"parental", "threshold", number(&C::ratingThreshold, 0, kMaxAge), "16",
         "Threshold of the rating scheme `dvb-si`, an age in years"},
        {kSchemeSection, "ratings", custom("list of names", readRatings), nullptr,
         "Ratings of a further rating scheme, in ascending order"},
        {kSchemeSection, "icons", custom("list of URLs", readIcons), "",
         "Icons of the ratings, in the same order; an item may be empty"},
        {kSchemeSection, "threshold", custom("one of `ratings`", readSchemeThreshold), "",
         "Threshold of the rating scheme, which pages read as its index; if empty, the last rating"},
        {kDrmSection, "result", custom(range(0, G_MAXINT32), readDrmResult), "0",
         "Result code of every message to this DRM system; 0 is success"},
        {kDrmSection, "message", custom("string", readDrmMessage), "", "Result message of every message"},
        {"set", "signal-timeout", number(&C::signalTimeout, 1, 3600), "6",
         "Seconds that a channel has to show its picture or sound; after that it has no signal"},
        {"set", "free-memory", number(&C::freeMemory, 0, G_MAXUINT32), "67108864",
         "Free memory that pages read, in bytes"},
        {"set", "keys", keys(&C::keys), "red;green;yellow;blue;navigation;vcr;scroll;info;numeric;alpha",
         "Key groups that the remote control has"},
        {"set", "key-set", keys(&C::keySet), "red;green;yellow;blue;navigation",
         "Key groups that pages receive until one sets a key set; groups that `keys` lacks are ignored"},
        {"set", "capabilities", custom("file", readCapabilities), "",
         "Profile list document with the capabilities; if empty, one that describes what this library plays"},
        {"set", "extra-sd-video-decodes", number(&C::extraSdVideoDecodes, 0, 16), "1",
         "Number of further SD videos that could be decoded"},
        {"set", "extra-hd-video-decodes", number(&C::extraHdVideoDecodes, 0, 16), "0",
         "Number of further HD videos that could be decoded"},
        {"set", "tuners", number(&C::tuners, 1, kMaxTuners), "1",
         "Number of tuners. The second one, and the third, receive the multiplexes of the next and the "
         "previous channel while a channel is on, so that changes to them are instant as well"},
        {"set", "instant-zap", flag(&C::instantZap), "true",
         "Whether a channel change to a multiplex that a tuner receives presents at once what has been "
         "received since the last keyframe; if false, it waits for the next one"},
        {"set", "zap-delay", number(&C::zapDelay, 0, kMaxZapDelay), "0",
         "Milliseconds before each tune begins, as on a slower set"},
    };
    return table;
}

} // namespace desktop
