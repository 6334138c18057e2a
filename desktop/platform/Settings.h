// The settings of a configuration file, one row each. The rows are in Settings.cpp; the table in
// docs/television.md comes from them.
#ifndef TELIX_DESKTOP_PLATFORM_SETTINGS_H
#define TELIX_DESKTOP_PLATFORM_SETTINGS_H

#include <functional>
#include <string>
#include <vector>

#include "desktop/platform/Configuration.h"

namespace desktop {

// What readers write to, and what they need besides the value.
struct SettingTarget {
    Configuration& configuration; // the rating scheme or DRM system that is read is the last one
    std::string folder;           // absolute; relative file names start there
    std::string schemeThreshold;  // of the rating scheme that is read, until its ratings are known
};

// How the value of a setting is read.
struct SettingReader {
    std::string accepts; // the accepted values in words

    // Returns what is wrong with the value; empty if it is accepted.
    std::function<std::string(SettingTarget& target, const std::string& value)> read;
};

struct Setting {
    const char* section;
    const char* key;
    SettingReader reader;
    const char* defaultValue; // in the notation of the file; null if the setting is required
    const char* meaning;
};

// Sections that a file may have any number of, one for each name.
inline constexpr char kSchemeSection[] = "parental-scheme NAME";
inline constexpr char kDrmSection[] = "drm SYSTEM-ID";

// All settings, in the order of the documentation.
const std::vector<Setting>& settings();

// The settings `sources` and `applications`, which the environment can override.
std::string readSources(SettingTarget& target, const std::string& value);
std::string readApplicationsUrl(SettingTarget& target, const std::string& value);

} // namespace desktop

#endif
