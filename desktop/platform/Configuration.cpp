// Reading of the key file. The parser tells no line numbers, so they are found in the text afterwards.
#include "desktop/platform/Configuration.h"

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

} // namespace

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
               read.capabilitiesFile = Text(g_canonicalize_filename(value.c_str(), folder.c_str())).get();
               return std::string();
           }},
          {"extra-sd-video-decodes", numberReader(read.extraSdVideoDecodes, 0, 16)},
          {"extra-hd-video-decodes", numberReader(read.extraHdVideoDecodes, 0, 16)}}},
    };

    std::unique_ptr<char*, void (*)(char**)> groups(g_key_file_get_groups(keys.get(), nullptr), g_strfreev);
    for (char** group = groups.get(); *group; ++group) {
        const auto section = known.find(*group);
        if (section == known.end()) {
            return Error{file, lineOf(text, *group, ""), std::string("unknown group [") + *group + "]"};
        }
        std::unique_ptr<char*, void (*)(char**)> names(
            g_key_file_get_keys(keys.get(), *group, nullptr, nullptr), g_strfreev);
        for (char** name = names.get(); *name; ++name) {
            const auto reader = section->second.find(*name);
            if (reader == section->second.end()) {
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
    }
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
