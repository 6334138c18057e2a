// The configuration of the television: what a viewer or a set maker sets up. It is read once, from a key
// file, and every setting has a default.
#ifndef TELIX_DESKTOP_PLATFORM_CONFIGURATION_H
#define TELIX_DESKTOP_PLATFORM_CONFIGURATION_H

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace desktop {

// A group of remote control keys, with its bit in the key set of a page.
struct KeyGroup {
    const char* name;
    uint32_t bit;
};
const std::vector<KeyGroup>& keyGroups();

// The values of all settings. Their sections, keys, defaults and meanings stand in Settings.cpp.
struct Configuration {
    // One source of channels: a transport stream file, a folder of them, or the test multiplex.
    struct Source {
        std::string path;                // empty for the test multiplex
        std::optional<uint16_t> service; // only this service; all if not given
    };

    // A parental rating scheme besides "dvb-si".
    struct RatingScheme {
        std::string name;
        std::vector<std::string> ratings; // in ascending order
        std::vector<std::string> icons;   // URL per rating; empty where there is none
        uint32_t threshold = 0;           // index of the rating that the viewer has set
    };

    // A DRM system and its response to every message.
    struct DrmSystem {
        std::string id;
        int32_t result = 0;
        std::string message;
    };

    // An error in a configuration file.
    struct Error {
        std::string file;
        unsigned int line = 0; // from 1; 0 if the error concerns the whole file
        std::string reason;

        std::string message() const; // "FILE:LINE: REASON"
    };

    // All settings at their defaults.
    Configuration();

    // Reads `file`. `configuration` is unchanged if there is an error.
    static std::optional<Error> load(const std::string& file, Configuration& configuration);

    // The configuration file of this process: TELIX_CONFIG, which need not exist, or telix/tv.conf in the
    // user's configuration folder. Empty if there is neither.
    static std::string file();

    // The configuration of this process: that of file() or, after an error, which goes to standard error, the
    // defaults. If TELIX_CHANNELS or TELIX_APPLICATIONS is not empty, it replaces `sources` or
    // `applicationsUrl`, in the notation of the file.
    static Configuration loadOrDefault();

    std::vector<Source> sources;
    uint32_t programmeSeconds;
    uint32_t streamEventSeconds; // 0: no stream events
    std::string applicationsUrl; // of the folder with the test applications; empty: none are signalled
    std::string country;         // ISO codes of three letters
    std::string audioLanguage;
    std::string subtitleLanguage;
    uint32_t ratingThreshold;                // of the scheme "dvb-si": years of age
    std::vector<RatingScheme> ratingSchemes; // in the order of the file
    std::vector<DrmSystem> drmSystems;
    uint32_t signalTimeout;       // seconds
    uint32_t freeMemory;          // bytes
    std::string capabilitiesFile; // absolute path; empty: the generated document
    uint32_t extraSdVideoDecodes;
    uint32_t extraHdVideoDecodes;
    uint32_t tuners;   // at least 1
    bool instantZap;   // changes of the channel begin with kept packets
    uint32_t zapDelay; // milliseconds before a tune begins
    uint32_t keys;     // bits of the key groups that the remote control has
    uint32_t keySet;   // bits of those that pages receive until one sets a key set
};

} // namespace desktop

#endif
