// Profile list documents: parsed, and generated from the configuration.
#include "desktop/platform/Capabilities.h"

#include <algorithm>
#include <cassert>
#include <cstring>
#include <glib.h>
#include <memory>
#include <utility>

#include "desktop/platform/OwnedString.h"
#include "desktop/platform/RegularFile.h"

namespace desktop {

namespace {

constexpr size_t kMaxDocumentSize = size_t{1} << 20; // bytes

struct MediaProfile {
    const char* element;
    const char* name;
    const char* type;
};

// What the pipelines of this library play.
const MediaProfile kMediaProfiles[] = {
    {"audio_profile", "MPEG1_L3", "audio/mpeg"},
    {"audio_profile", "HEAAC", "audio/mp4"},
    {"video_profile", "TS_AVC_SD_25_HEAAC", "video/mpeg"},
    {"video_profile", "TS_AVC_HD_25_HEAAC", "video/mpeg"},
    {"video_profile", "TS_AVC_SD_25_MPEG1_L3", "video/mpeg"},
    {"video_profile", "TS_AVC_HD_25_MPEG1_L3", "video/mpeg"},
    {"video_profile", "MP4_AVC_SD_25_HEAAC", "video/mp4"},
    {"video_profile", "MP4_AVC_HD_25_HEAAC", "video/mp4"},
    {"video_profile", "MP4_AVC_SD_25_MPEG1_L3", "video/mp4"},
    {"video_profile", "MP4_AVC_HD_25_MPEG1_L3", "video/mp4"},
};

std::string escaped(const std::string& string) {
    return OwnedString(g_markup_escape_text(string.c_str(), -1)).get();
}

} // namespace

// Collects the profiles while GMarkup parses the document.
struct CapabilitiesParser {
    Capabilities capabilities;
    bool hasRoot = false;

    static void startElement(GMarkupParseContext* context, const gchar* element, const gchar** names,
                             const gchar** values, gpointer data, GError** error) {
        (void)context;
        auto* self = static_cast<CapabilitiesParser*>(data);
        const char* colon = std::strchr(element, ':'); // after the prefix of a namespace
        const std::string localName = colon ? colon + 1 : element;
        if (!std::exchange(self->hasRoot, true) && localName != "profilelist") {
            g_set_error(error, G_MARKUP_ERROR, G_MARKUP_ERROR_INVALID_CONTENT,
                        "the root element is <%s>, not <profilelist>", element);
            return;
        }
        for (size_t index = 0; names[index]; ++index) {
            if (std::strcmp(names[index], "name") != 0) {
                continue;
            }
            if (localName == "ui_profile") {
                self->capabilities.m_uiProfiles.push_back(Capabilities::parseUiProfile(values[index]));
            } else if (localName == "video_profile" || localName == "audio_profile") {
                self->capabilities.m_mediaProfiles.insert(values[index]);
            }
        }
    }
};

Capabilities::UiProfile Capabilities::parseUiProfile(const std::string& name) {
    UiProfile profile;
    const OwnedStrings parts(g_strsplit(name.c_str(), "+", -1));
    for (char** part = parts.get(); *part; ++part) {
        if (part == parts.get()) {
            profile.base = *part;
        } else {
            profile.fragments.insert(*part);
        }
    }
    return profile;
}

std::optional<Capabilities> Capabilities::parse(const std::string& document, std::string& error) {
    CapabilitiesParser parser;
    const GMarkupParser callbacks{CapabilitiesParser::startElement, nullptr, nullptr, nullptr, nullptr};
    std::unique_ptr<GMarkupParseContext, void (*)(GMarkupParseContext*)> context(
        g_markup_parse_context_new(&callbacks, G_MARKUP_DEFAULT_FLAGS, &parser, nullptr),
        g_markup_parse_context_free);
    GError* reason = nullptr;
    if (!g_markup_parse_context_parse(context.get(), document.data(), static_cast<gssize>(document.size()),
                                      &reason) ||
        !g_markup_parse_context_end_parse(context.get(), &reason)) {
        error = messageOf(reason);
        return std::nullopt;
    }
    // GMarkup accepts null characters, but the platform calls return null-terminated strings.
    if (document.find('\0') != std::string::npos) {
        error = "the document contains a null character";
        return std::nullopt;
    }
    parser.capabilities.m_document = document;
    return std::move(parser.capabilities);
}

std::optional<Capabilities> Capabilities::load(const std::string& file, std::string& error) {
    const auto document = contentsOf(file, kMaxDocumentSize, error);
    std::optional<Capabilities> capabilities = document ? parse(*document, error) : std::nullopt;
    if (!capabilities) {
        error = file + ": " + error;
    }
    return capabilities;
}

Capabilities Capabilities::generate(const Configuration& configuration) {
    std::string schemes = "dvb-si";
    for (const Configuration::RatingScheme& scheme : configuration.ratingSchemes) {
        schemes += " " + scheme.name;
    }
    std::string drm;
    for (const Configuration::DrmSystem& system : configuration.drmSystems) {
        drm += "    <drm DRMSystemID=\"" + escaped(system.id) + "\">TS MP4</drm>\n";
    }
    std::string document = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                           "<profilelist xmlns=\"urn:hbbtv:config:oitf:oitfCapabilities:2011-1\">\n"
                           "  <ui_profile name=\"OITF_HD_UIPROF+META_SI+TRICKMODE+AVCAD";
    document += drm.empty() ? "" : "+DRM";
    document += "+DVB_S\">\n"
                "    <ext>\n"
                "      <colorkeys>true</colorkeys>\n"
                "      <video_broadcast type=\"ID_DVB_S\" scaling=\"arbitrary\" minSize=\"0\">true"
                "</video_broadcast>\n"
                "      <parentalcontrol schemes=\"" +
                escaped(schemes) +
                "\">true</parentalcontrol>\n"
                "    </ext>\n" +
                drm + "  </ui_profile>\n";
    for (const MediaProfile& profile : kMediaProfiles) {
        document += std::string("  <") + profile.element + " name=\"" + profile.name + "\" type=\"" +
                    profile.type + "\"/>\n";
    }
    document += "</profilelist>\n";
    std::string error;
    const auto capabilities = parse(document, error);
    assert(capabilities);
    return *capabilities;
}

bool Capabilities::hasProfile(const std::string& name) const {
    if (m_mediaProfiles.count(name) != 0) {
        return true;
    }
    const UiProfile wanted = parseUiProfile(name);
    return std::any_of(m_uiProfiles.begin(), m_uiProfiles.end(), [&](const UiProfile& each) {
        const bool isBase = wanted.base == each.base || (wanted.base.empty() && !wanted.fragments.empty());
        return isBase && std::includes(each.fragments.begin(), each.fragments.end(), wanted.fragments.begin(),
                                       wanted.fragments.end());
    });
}

} // namespace desktop
