// What a viewer or a set maker would have set up: read once from a key file, with a default for everything.
#ifndef TELIX_DESKTOP_CONFIGURATION_H
#define TELIX_DESKTOP_CONFIGURATION_H

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace desktop {

// A group of remote control keys, as the key set of a page has them.
struct KeyGroup {
    const char* name;
    uint32_t bit;
};
const std::vector<KeyGroup>& keyGroups();

struct Configuration {
    // One entry of the channel line-up: a transport stream file, a folder of them, or the test multiplex.
    struct Source {
        std::string path;                // empty for the test multiplex
        std::optional<uint16_t> service; // only this service; otherwise all
    };

    // A scheme of parental ratings beside "dvb-si".
    struct RatingScheme {
        std::string name;
        std::vector<std::string> ratings; // in rising order
        std::vector<std::string> icons;   // addresses, beside `ratings`; empty where there is none
        uint32_t threshold = 0;           // index of the rating that the viewer has set
    };

    // A DRM system, and what it answers to every message.
    struct DrmSystem {
        std::string id;
        int32_t result = 0;
        std::string message;
    };

    // What is wrong with a file.
    struct Error {
        std::string file;
        unsigned int line = 0; // from 1; 0 where the file as a whole is meant
        std::string reason;

        std::string text() const; // "FILE:LINE: REASON"
    };

    // [channels]
    std::vector<Source> sources{{"", std::nullopt}};

    // [test] of the test multiplex
    uint32_t programmeSeconds = 300;  // length of each programme
    uint32_t streamEventSeconds = 10; // distance of the stream events; 0: none

    // [viewer] ISO codes of three letters
    std::string country = "DEU";
    std::string audioLanguage = "deu";
    std::string subtitleLanguage = "deu";

    // [parental]
    int32_t ratingThreshold = 16; // of the scheme "dvb-si", as a page sees values of it: years of age
    std::vector<RatingScheme> ratingSchemes; // each of [parental-scheme NAME]

    // [drm SYSTEM-ID] each
    std::vector<DrmSystem> drmSystems;

    // [set]
    uint32_t freeMemory = 64 * 1024 * 1024; // bytes
    std::string capabilitiesFile;           // empty: the built-in document
    uint32_t extraSdVideoDecodes = 1;
    uint32_t extraHdVideoDecodes = 0;
    uint32_t keys = 0x3FF;  // groups of keys that the remote control has
    uint32_t keySet = 0x1F; // those that go to the pages as long as none asks for others

    // Reads `file`. On an error `configuration` is left unchanged.
    static std::optional<Error> load(const std::string& file, Configuration& configuration);

    // The file of this process: TELIX_CONFIG, or telix/tv.conf in the user's configuration folder. Empty if
    // neither is there. A file named by TELIX_CONFIG need not exist.
    static std::string file();

    // The configuration of this process: that of file(), or after an error, which goes to standard error, the
    // defaults. TELIX_CHANNELS, if not empty, replaces `sources`, written as in the file.
    static Configuration loadOrDefault();
};

} // namespace desktop

#endif
