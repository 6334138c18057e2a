// The capabilities of the television: a profile list document, and the profiles that it contains.
#ifndef TELIX_DESKTOP_PLATFORM_CAPABILITIES_H
#define TELIX_DESKTOP_PLATFORM_CAPABILITIES_H

#include <optional>
#include <set>
#include <string>
#include <vector>

#include "desktop/platform/Configuration.h"

namespace desktop {

class Capabilities {
public:
    // Parses a document. Nothing, with the reason in `error`, if it is not well-formed or not a profile list.
    static std::optional<Capabilities> parse(const std::string& document, std::string& error);

    // Parses the document in a file, likewise.
    static std::optional<Capabilities> load(const std::string& file, std::string& error);

    // The generated document: what this library plays, with the rating schemes and DRM systems of the
    // configuration.
    static Capabilities generate(const Configuration& configuration);

    const std::string& document() const { return m_document; }

    // Whether the document contains a profile: a media profile by its complete name; a user interface profile
    // by its base name, followed by any of its fragments in any order; or fragments alone, as "+DVB_S".
    bool hasProfile(const std::string& name) const;

private:
    struct UiProfile {
        std::string base;
        std::set<std::string> fragments;
    };
    static UiProfile parseUiProfile(const std::string& name);
    friend struct CapabilitiesParser;

    std::string m_document;
    std::vector<UiProfile> m_uiProfiles;
    std::set<std::string> m_mediaProfiles;
};

} // namespace desktop

#endif
