// Reading of the key file. The parser tells no line numbers, so they are found in the text afterwards.
#include "desktop/platform/Configuration.h"

#include "desktop/platform/Capabilities.h"

#include <algorithm>
#include <cstdio>
#include <functional>
#include <glib.h>
#include <map>
#include <memory>

namespace desktop {

namespace {

struct Free {
    void operator()(char* text) const { g_free(text); }
    void operator()(GKeyFile* file) const { g_key_file_free(file); }
    void operator()(GError* error) const { g_error_free(error); }
};
using Text = std::unique_ptr<char, Free>;
using KeyFile = std::unique_ptr<GKeyFile, Free>;

std::vector<std::string> linesOf(const std::string& text) {
    std::vector<std::string> lines;
    size_t begin = 0;
    while (begin < text.size()) {
        const size_t end = std::min(text.find('\n', begin), text.size());
        lines.push_back(text.substr(begin, end - begin));
        begin = end + 1;
    }
    return lines;
}

std::string trimmed(const std::string& text) {
    Text copy(g_strdup(text.c_str()));
    return g_strstrip(copy.get());
}

// The line of a group's header, or of a key in it, from 1. The last one counts, as for the parser.
unsigned int lineOf(const std::string& text, const std::string& group, const std::string& key) {
    unsigned int found = 0;
    unsigned int number = 0;
    bool inGroup = false;
    for (const std::string& each : linesOf(text)) {
        ++number;
        const std::string line = trimmed(each);
        if (!line.empty() && line[0] == '[') {
            inGroup = line == "[" + group + "]";
            if (inGroup && key.empty()) {
                found = number;
            }
        } else if (inGroup && !key.empty() && trimmed(line.substr(0, line.find('='))) == key) {
            found = number;
        }
    }
    return found;
}

// The first line with which the text is no key file any more.
unsigned int lineOfFault(const std::string& text) {
    std::string part;
    unsigned int number = 0;
    for (const std::string& line : linesOf(text)) {
        ++number;
        part += line + "\n";
        KeyFile file(g_key_file_new());
        if (!g_key_file_load_from_data(file.get(), part.data(), part.size(), G_KEY_FILE_NONE, nullptr)) {
            return number;
        }
    }
    return 0;
}

// Reads one value; gives what is wrong with it, or an empty text.
using Reader = std::function<std::string(const std::string& value)>;

Reader numberReader(uint32_t& number, uint32_t least, uint32_t most) {
    return [&number, least, most](const std::string& value) -> std::string {
        guint64 read = 0;
        GError* error = nullptr;
        if (!g_ascii_string_to_unsigned(value.c_str(), 10, least, most, &read, &error)) {
            std::unique_ptr<GError, Free> owned(error);
            return owned->message;
        }
        number = static_cast<uint32_t>(read);
        return "";
    };
}

Reader codeReader(std::string& code) {
    return [&code](const std::string& value) -> std::string {
        bool good = value.size() == 3;
        for (const char letter : value) {
            good = good && g_ascii_isalpha(letter);
        }
        if (!good) {
            return "\"" + value + "\" is not an ISO code of three letters";
        }
        code = value;
        return "";
    };
}

// Sources stand behind semicolons: test, a file or a folder, each with #SERVICE behind it for one service
// alone.
std::string readSources(const std::string& value, const std::string& folder,
                        std::vector<Configuration::Source>& sources) {
    std::vector<Configuration::Source> read;
    std::unique_ptr<char*, void (*)(char**)> parts(g_strsplit(value.c_str(), ";", -1), g_strfreev);
    for (char** part = parts.get(); *part; ++part) {
        std::string name = trimmed(*part);
        if (name.empty()) {
            continue;
        }
        Configuration::Source source;
        const size_t mark = name.rfind('#');
        if (mark != std::string::npos) {
            uint32_t service = 0;
            const std::string wrong = numberReader(service, 1, 0xFFFF)(name.substr(mark + 1));
            if (!wrong.empty()) {
                return "service of \"" + name + "\": " + wrong;
            }
            source.service = static_cast<uint16_t>(service);
            name.resize(mark);
        }
        if (name != "test") {
            source.path = Text(g_canonicalize_filename(name.c_str(), folder.c_str())).get();
        }
        read.push_back(source);
    }
    if (read.empty()) {
        return "no channel source is given";
    }
    sources = read;
    return "";
}

// The items between semicolons, without the blanks around them.
std::vector<std::string> itemsOf(const std::string& value) {
    std::vector<std::string> items;
    std::unique_ptr<char*, void (*)(char**)> parts(g_strsplit(value.c_str(), ";", -1), g_strfreev);
    for (char** part = parts.get(); *part; ++part) {
        items.push_back(trimmed(*part));
    }
    if (!items.empty() && items.back().empty()) { // a semicolon at the end ends the last item
        items.pop_back();
    }
    return items;
}

Reader keysReader(uint32_t& mask) {
    return [&mask](const std::string& value) -> std::string {
        uint32_t read = 0;
        for (const std::string& item : itemsOf(value)) {
            const auto group = std::find_if(keyGroups().begin(), keyGroups().end(),
                                            [&](const KeyGroup& each) { return each.name == item; });
            if (group == keyGroups().end()) {
                return "\"" + item + "\" is no group of keys";
            }
            read |= group->bit;
        }
        mask = read;
        return "";
    };
}

Reader textReader(std::string& text) {
    return [&text](const std::string& value) {
        text = value;
        return std::string();
    };
}

// A group of the file: its keys, and what can be said only when all of them are read.
struct Group {
    struct Fault {
        std::string key; // empty: the group as a whole
        std::string reason;
    };
    std::map<std::string, Reader> keys;
    std::function<std::optional<Fault>()> finish;
};

// The scheme and the threshold live in `schemes` and in the functions.
Group schemeGroup(const std::string& name, std::vector<Configuration::RatingScheme>& schemes) {
    auto scheme = std::make_shared<Configuration::RatingScheme>();
    auto threshold = std::make_shared<std::string>();
    auto hasIcons = std::make_shared<bool>(false);
    scheme->name = name;
    Group group;
    group.keys = {{"ratings",
                   [scheme](const std::string& value) -> std::string {
                       scheme->ratings = itemsOf(value);
                       const auto& all = scheme->ratings;
                       for (auto each = all.begin(); each != all.end(); ++each) {
                           if (each->empty()) {
                               return "a rating has no name";
                           }
                           if (std::find(all.begin(), each, *each) != each) {
                               return "\"" + *each + "\" is given twice";
                           }
                       }
                       return "";
                   }},
                  {"icons",
                   [scheme, hasIcons](const std::string& value) {
                       std::unique_ptr<char*, void (*)(char**)> parts(g_strsplit(value.c_str(), ";", -1),
                                                                      g_strfreev);
                       for (char** part = parts.get(); *part; ++part) {
                           scheme->icons.push_back(trimmed(*part));
                       }
                       *hasIcons = true;
                       return std::string();
                   }},
                  {"threshold", textReader(*threshold)}}; // `finish` keeps it alive
    group.finish = [scheme, threshold, hasIcons, &schemes]() -> std::optional<Group::Fault> {
        const auto& ratings = scheme->ratings;
        if (scheme->name == "dvb-si") {
            return Group::Fault{"", "the scheme dvb-si is built in"};
        }
        if (ratings.empty()) {
            return Group::Fault{"", "the scheme has no ratings"};
        }
        for (const Configuration::RatingScheme& each : schemes) {
            if (each.name == scheme->name) {
                return Group::Fault{"", "the scheme is given twice"};
            }
        }
        if (*hasIcons && scheme->icons.size() == ratings.size() + 1 && scheme->icons.back().empty()) {
            scheme->icons.pop_back(); // a semicolon at the end
        }
        if (*hasIcons && scheme->icons.size() != ratings.size()) {
            return Group::Fault{"icons", "icons: " + std::to_string(scheme->icons.size()) + " for " +
                                             std::to_string(ratings.size()) + " ratings"};
        }
        scheme->icons.resize(ratings.size());
        scheme->threshold = static_cast<uint32_t>(ratings.size() - 1);
        if (!threshold->empty()) {
            const auto found = std::find(ratings.begin(), ratings.end(), *threshold);
            if (found == ratings.end()) {
                return Group::Fault{"threshold", "threshold: \"" + *threshold + "\" is none of the ratings"};
            }
            scheme->threshold = static_cast<uint32_t>(found - ratings.begin());
        }
        schemes.push_back(*scheme);
        return std::nullopt;
    };
    return group;
}

Group drmGroup(const std::string& id, std::vector<Configuration::DrmSystem>& systems) {
    auto system = std::make_shared<Configuration::DrmSystem>();
    auto result = std::make_shared<uint32_t>(0);
    system->id = id;
    Group group;
    group.keys = {
        {"result", numberReader(*result, 0, G_MAXINT32)},
        {"message", textReader(system->message)},
    };
    group.finish = [system, result, &systems]() -> std::optional<Group::Fault> {
        for (const Configuration::DrmSystem& each : systems) {
            if (each.id == system->id) {
                return Group::Fault{"", "the DRM system is given twice"};
            }
        }
        system->result = static_cast<int32_t>(*result);
        systems.push_back(*system);
        return std::nullopt;
    };
    return group;
}

// The name behind the first word of a group's header; empty if there is none or another word.
std::string nameBehind(const std::string& header, const std::string& word) {
    const bool isMeant = header.compare(0, word.size() + 1, word + " ") == 0;
    return isMeant ? trimmed(header.substr(word.size() + 1)) : "";
}

} // namespace

const std::vector<KeyGroup>& keyGroups() {
    static const auto& groups = *new std::vector<KeyGroup>{
        {"red", 0x1},  {"green", 0x2},   {"yellow", 0x4}, {"blue", 0x8},      {"navigation", 0x10},
        {"vcr", 0x20}, {"scroll", 0x40}, {"info", 0x80},  {"numeric", 0x100}, {"alpha", 0x200}};
    return groups;
}

std::string Configuration::Error::text() const {
    return line == 0 ? file + ": " + reason : file + ":" + std::to_string(line) + ": " + reason;
}

std::optional<Configuration::Error> Configuration::load(const std::string& file,
                                                        Configuration& configuration) {
    char* contents = nullptr;
    gsize length = 0;
    GError* error = nullptr;
    if (!g_file_get_contents(file.c_str(), &contents, &length, &error)) {
        std::unique_ptr<GError, Free> owned(error);
        return Error{file, 0, owned->message};
    }
    const std::string text(contents, length);
    g_free(contents);

    KeyFile keys(g_key_file_new());
    if (!g_key_file_load_from_data(keys.get(), text.data(), text.size(), G_KEY_FILE_NONE, &error)) {
        std::unique_ptr<GError, Free> owned(error);
        return Error{file, lineOfFault(text), owned->message};
    }

    const std::string folder = Text(g_path_get_dirname(file.c_str())).get();
    Configuration read;
    uint32_t threshold = 0;
    const std::map<std::string, std::map<std::string, Reader>> known{
        {"channels",
         {{"sources",
           [&](const std::string& value) {
               const Text base(g_canonicalize_filename(folder.c_str(), nullptr));
               return readSources(value, base.get(), read.sources);
           }}}},
        {"test",
         {{"programme-seconds", numberReader(read.programmeSeconds, 2, 86400)},
          {"stream-event-seconds", numberReader(read.streamEventSeconds, 0, 86400)}}},
        {"viewer",
         {{"country", codeReader(read.country)},
          {"audio-language", codeReader(read.audioLanguage)},
          {"subtitle-language", codeReader(read.subtitleLanguage)}}},
        {"parental",
         {{"threshold",
           [&](const std::string& value) {
               std::string wrong = numberReader(threshold, 0, 18)(value);
               read.ratingThreshold = static_cast<int32_t>(threshold);
               return wrong;
           }}}},
        {"set",
         {{"free-memory", numberReader(read.freeMemory, 0, G_MAXUINT32)},
          {"capabilities",
           [&](const std::string& value) {
               const Text base(g_canonicalize_filename(folder.c_str(), nullptr));
               read.capabilitiesFile = Text(g_canonicalize_filename(value.c_str(), base.get())).get();
               std::string wrong;
               Capabilities::load(read.capabilitiesFile, wrong);
               return wrong;
           }},
          {"extra-sd-video-decodes", numberReader(read.extraSdVideoDecodes, 0, 16)},
          {"extra-hd-video-decodes", numberReader(read.extraHdVideoDecodes, 0, 16)},
          {"keys", keysReader(read.keys)},
          {"key-set", keysReader(read.keySet)}}},
    };

    std::unique_ptr<char*, void (*)(char**)> groups(g_key_file_get_groups(keys.get(), nullptr), g_strfreev);
    for (char** group = groups.get(); *group; ++group) {
        Group section;
        if (const std::string scheme = nameBehind(*group, "parental-scheme"); !scheme.empty()) {
            section = schemeGroup(scheme, read.ratingSchemes);
        } else if (const std::string system = nameBehind(*group, "drm"); !system.empty()) {
            section = drmGroup(system, read.drmSystems);
        } else if (const auto found = known.find(*group); found != known.end()) {
            section.keys = found->second;
        } else {
            return Error{file, lineOf(text, *group, ""), std::string("unknown group [") + *group + "]"};
        }
        std::unique_ptr<char*, void (*)(char**)> names(
            g_key_file_get_keys(keys.get(), *group, nullptr, nullptr), g_strfreev);
        for (char** name = names.get(); *name; ++name) {
            const auto reader = section.keys.find(*name);
            if (reader == section.keys.end()) {
                return Error{file, lineOf(text, *group, *name),
                             std::string("unknown key \"") + *name + "\" in [" + *group + "]"};
            }
            const Text value(g_key_file_get_string(keys.get(), *group, *name, &error));
            if (!value) {
                std::unique_ptr<GError, Free> owned(error);
                return Error{file, lineOf(text, *group, *name), owned->message};
            }
            const std::string wrong = reader->second(value.get());
            if (!wrong.empty()) {
                return Error{file, lineOf(text, *group, *name), std::string(*name) + ": " + wrong};
            }
        }
        if (const auto fault = section.finish ? section.finish() : std::nullopt) {
            return Error{file, lineOf(text, *group, fault->key), fault->reason};
        }
    }
    read.keySet &= read.keys;
    configuration = read;
    return std::nullopt;
}

std::string Configuration::file() {
    if (const char* named = g_getenv("TELIX_CONFIG"); named && *named) {
        return named;
    }
    const Text usual(g_build_filename(g_get_user_config_dir(), "telix", "tv.conf", nullptr));
    return g_file_test(usual.get(), G_FILE_TEST_EXISTS) ? usual.get() : "";
}

Configuration Configuration::loadOrDefault() {
    Configuration configuration;
    const std::string name = file();
    if (!name.empty()) {
        if (const auto error = load(name, configuration)) {
            std::fprintf(stderr, "libtelix: %s; the defaults hold\n", error->text().c_str());
        }
    }
    if (const char* channels = g_getenv("TELIX_CHANNELS"); channels && *channels) {
        const Text here(g_get_current_dir());
        const std::string wrong = readSources(channels, here.get(), configuration.sources);
        if (!wrong.empty()) {
            std::fprintf(stderr, "libtelix: TELIX_CHANNELS: %s\n", wrong.c_str());
        }
    }
    return configuration;
}

} // namespace desktop
