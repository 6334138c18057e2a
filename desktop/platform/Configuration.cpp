// Reading of a configuration file, section by section. GKeyFile reports no line numbers, so they are looked
// up in the contents afterwards.
#include "desktop/platform/Configuration.h"

#include <algorithm>
#include <cassert>
#include <cstdio>
#include <glib.h>
#include <memory>

#include "desktop/platform/OwnedString.h"
#include "desktop/platform/RegularFile.h"
#include "desktop/platform/Settings.h"

namespace desktop {

namespace {

const char kBuiltInScheme[] = "dvb-si";

constexpr size_t kMaxConfigurationSize = size_t{1} << 20; // bytes

struct KeyFileFree {
    void operator()(GKeyFile* file) const { g_key_file_free(file); }
};
using KeyFile = std::unique_ptr<GKeyFile, KeyFileFree>;

void applyDefaults(SettingTarget& target, const std::string& section) {
    for (const Setting& setting : settings()) {
        if (setting.section == section && setting.defaultValue) {
            const std::string reason = setting.reader.read(target, setting.defaultValue);
            assert(reason.empty());
        }
    }
}

// ---- Lines of the file

std::vector<std::string> linesOf(const std::string& contents) {
    std::vector<std::string> lines;
    size_t begin = 0;
    while (begin < contents.size()) {
        const size_t end = std::min(contents.find('\n', begin), contents.size());
        lines.push_back(contents.substr(begin, end - begin));
        begin = end + 1;
    }
    return lines;
}

// The line of a section's header or, if `key` is not empty, of a key in the section; from 1. The last one
// counts, as it does for GKeyFile.
unsigned int lineOf(const std::string& contents, const std::string& section, const std::string& key) {
    unsigned int found = 0;
    unsigned int number = 0;
    bool isInSection = false;
    for (const std::string& each : linesOf(contents)) {
        ++number;
        const std::string line = trimmed(each);
        if (!line.empty() && line[0] == '[') {
            isInSection = line == "[" + section + "]";
            if (isInSection && key.empty()) {
                found = number;
            }
        } else if (isInSection && !key.empty() && trimmed(line.substr(0, line.find('='))) == key) {
            found = number;
        }
    }
    return found;
}

// The first line that GKeyFile rejects: it accepts the lines before it, and rejects every beginning of the
// file that contains it.
unsigned int lineOfSyntaxError(const std::string& contents) {
    std::vector<size_t> ends; // of the lines
    for (const std::string& line : linesOf(contents)) {
        ends.push_back((ends.empty() ? 0 : ends.back()) + line.size() + 1);
    }
    const auto isAccepted = [&](size_t end) {
        const KeyFile file(g_key_file_new());
        return g_key_file_load_from_data(file.get(), contents.data(), std::min(end, contents.size()),
                                         G_KEY_FILE_NONE, nullptr) != FALSE;
    };
    const auto first = std::partition_point(ends.begin(), ends.end(), isAccepted);
    return first == ends.end() ? 0 : static_cast<unsigned int>(first - ends.begin()) + 1;
}

// ---- Sections

struct SettingError {
    std::string key; // empty: the section as a whole
    std::string reason;
};

// The name in the header of a named section such as "drm SYSTEM-ID"; empty if the header is another one.
std::string nameOf(const std::string& header, const std::string& namedSection) {
    const std::string prefix = namedSection.substr(0, namedSection.find(' ') + 1);
    return header.compare(0, prefix.size(), prefix) == 0 ? trimmed(header.substr(prefix.size())) : "";
}

// The section of the table that a header belongs to; empty if there is none. Adds a rating scheme or a DRM
// system for its section, with the defaults.
std::string beginSection(SettingTarget& target, const std::string& header) {
    std::string section;
    if (const std::string scheme = nameOf(header, kSchemeSection); !scheme.empty()) {
        target.configuration.ratingSchemes.push_back({scheme, {}, {}, 0});
        section = kSchemeSection;
    } else if (const std::string system = nameOf(header, kDrmSection); !system.empty()) {
        target.configuration.drmSystems.push_back({system, 0, ""});
        section = kDrmSection;
    } else {
        const bool isKnown = std::any_of(settings().begin(), settings().end(), [&](const Setting& setting) {
            return setting.section == header && header != kSchemeSection && header != kDrmSection;
        });
        return isKnown ? header : "";
    }
    applyDefaults(target, section);
    return section;
}

std::optional<SettingError> finishRatingScheme(SettingTarget& target) {
    auto& schemes = target.configuration.ratingSchemes;
    Configuration::RatingScheme& scheme = schemes.back();
    const auto isSame = [&](const Configuration::RatingScheme& each) { return each.name == scheme.name; };
    if (scheme.name == kBuiltInScheme) {
        return SettingError{"", "the scheme dvb-si is built in"};
    }
    if (scheme.ratings.empty()) {
        return SettingError{"", "the scheme has no ratings"};
    }
    if (std::count_if(schemes.begin(), schemes.end(), isSame) > 1) {
        return SettingError{"", "the scheme is given twice"};
    }
    if (scheme.icons.size() == scheme.ratings.size() + 1 && scheme.icons.back().empty()) {
        scheme.icons.pop_back();
    }
    if (!scheme.icons.empty() && scheme.icons.size() != scheme.ratings.size()) {
        return SettingError{"icons", "icons: " + std::to_string(scheme.icons.size()) + " for " +
                                         std::to_string(scheme.ratings.size()) + " ratings"};
    }
    scheme.icons.resize(scheme.ratings.size());
    const std::string& threshold =
        target.schemeThreshold.empty() ? scheme.ratings.back() : target.schemeThreshold;
    const auto found = std::find(scheme.ratings.begin(), scheme.ratings.end(), threshold);
    if (found == scheme.ratings.end()) {
        return SettingError{"threshold", "threshold: \"" + threshold + "\" is not one of the ratings"};
    }
    scheme.threshold = static_cast<uint32_t>(found - scheme.ratings.begin());
    return std::nullopt;
}

std::optional<SettingError> finishDrmSystem(const SettingTarget& target) {
    const auto& systems = target.configuration.drmSystems;
    const auto isSame = [&](const Configuration::DrmSystem& each) { return each.id == systems.back().id; };
    if (std::count_if(systems.begin(), systems.end(), isSame) > 1) {
        return SettingError{"", "the DRM system is given twice"};
    }
    return std::nullopt;
}

std::optional<SettingError> readKey(SettingTarget& target, const std::string& section, GKeyFile* file,
                                    const char* header, const std::string& key) {
    const auto setting = std::find_if(settings().begin(), settings().end(), [&](const Setting& each) {
        return each.section == section && each.key == key;
    });
    if (setting == settings().end()) {
        return SettingError{key, "unknown key \"" + key + "\" in [" + header + "]"};
    }
    GError* error = nullptr;
    const OwnedString value(g_key_file_get_string(file, header, key.c_str(), &error));
    if (!value) {
        return SettingError{key, messageOf(error)};
    }
    const std::string reason = setting->reader.read(target, value.get());
    return reason.empty() ? std::nullopt : std::optional(SettingError{key, key + ": " + reason});
}

std::optional<SettingError> readSection(SettingTarget& target, GKeyFile* file, const char* header) {
    const std::string section = beginSection(target, header);
    if (section.empty()) {
        return SettingError{"", std::string("unknown group [") + header + "]"};
    }
    const OwnedStrings keys(g_key_file_get_keys(file, header, nullptr, nullptr));
    for (char** key = keys.get(); *key; ++key) {
        if (auto error = readKey(target, section, file, header, *key)) {
            return error;
        }
    }
    if (section == kSchemeSection) {
        return finishRatingScheme(target);
    }
    return section == kDrmSection ? finishDrmSystem(target) : std::nullopt;
}

// A variable of the environment that replaces a setting.
void applyVariable(Configuration& configuration, const char* variable,
                   std::string (*read)(SettingTarget& target, const std::string& value)) {
    const char* value = g_getenv(variable);
    if (!value || !*value) {
        return;
    }
    const OwnedString folder(g_get_current_dir());
    SettingTarget target{configuration, folder.get(), ""};
    const std::string reason = read(target, value);
    if (!reason.empty()) {
        std::fprintf(stderr, "libtelix: %s: %s\n", variable, reason.c_str());
    }
}

} // namespace

// ---- Configuration

Configuration::Configuration() {
    SettingTarget target{*this, "/", ""};
    std::string section;
    for (const Setting& setting : settings()) {
        if (setting.section != section && setting.section != kSchemeSection &&
            setting.section != kDrmSection) {
            section = setting.section;
            applyDefaults(target, section);
        }
    }
}

std::string Configuration::Error::message() const {
    return line == 0 ? file + ": " + reason : file + ":" + std::to_string(line) + ": " + reason;
}

std::optional<Configuration::Error> Configuration::load(const std::string& file,
                                                        Configuration& configuration) {
    std::string reason;
    const auto found = contentsOf(file, kMaxConfigurationSize, reason);
    if (!found) {
        return Error{file, 0, reason};
    }
    const std::string& contents = *found;
    GError* error = nullptr;
    const KeyFile keyFile(g_key_file_new());
    if (!g_key_file_load_from_data(keyFile.get(), contents.data(), contents.size(), G_KEY_FILE_NONE,
                                   &error)) {
        return Error{file, lineOfSyntaxError(contents), messageOf(error)};
    }

    Configuration read;
    const OwnedString folder(g_path_get_dirname(file.c_str()));
    SettingTarget target{read, OwnedString(g_canonicalize_filename(folder.get(), nullptr)).get(), ""};
    const OwnedStrings headers(g_key_file_get_groups(keyFile.get(), nullptr));
    for (char** header = headers.get(); *header; ++header) {
        if (const auto fault = readSection(target, keyFile.get(), *header)) {
            return Error{file, lineOf(contents, *header, fault->key), fault->reason};
        }
    }
    read.keySet &= read.keys;
    configuration = read;
    return std::nullopt;
}

std::string Configuration::file() {
    if (const char* variable = g_getenv("TELIX_CONFIG"); variable && *variable) {
        return variable;
    }
    const OwnedString standard(g_build_filename(g_get_user_config_dir(), "telix", "tv.conf", nullptr));
    return g_file_test(standard.get(), G_FILE_TEST_EXISTS) ? standard.get() : "";
}

Configuration Configuration::loadOrDefault() {
    Configuration configuration;
    const std::string name = file();
    if (!name.empty()) {
        if (const auto error = load(name, configuration)) {
            std::fprintf(stderr, "libtelix: %s; the defaults apply\n", error->message().c_str());
        }
    }
    for (const auto& [variable, read] : {std::make_pair("TELIX_CHANNELS", readSources),
                                         std::make_pair("TELIX_APPLICATIONS", readApplicationsUrl)}) {
        applyVariable(configuration, variable, read);
    }
    return configuration;
}

} // namespace desktop
