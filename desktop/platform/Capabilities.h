// The description of what the set can do: a profile list document, and the profiles that are found in it.
#ifndef TELIX_DESKTOP_CAPABILITIES_H
#define TELIX_DESKTOP_CAPABILITIES_H

#include "desktop/platform/Configuration.h"

#include <optional>
#include <set>
#include <string>
#include <vector>

namespace desktop {

class Capabilities {
public:
    // Reads a document; nothing, with the reason in `error`, if it is not well-formed or no profile list.
    static std::optional<Capabilities> parse(const std::string& document, std::string& error);

    // The document of a file, with the same outcomes.
    static std::optional<Capabilities> load(const std::string& file, std::string& error);

    // The set as it is without a file: what this library plays, with the rating schemes and DRM systems of
    // the configuration.
    static Capabilities builtIn(const Configuration& configuration);

    const std::string& document() const { return m_document; }

    // Whether the document has a profile of that name: the whole name of a media profile; the base name of a
    // user interface profile, with any of its fragments behind it in any order; or fragments alone, as
    // +DVB_S.
    bool has(const std::string& name) const;

private:
    struct UiProfile {
        std::string base;
        std::set<std::string> fragments;
    };
    static UiProfile split(const std::string& name);
    friend struct CapabilitiesParser;

    std::string m_document;
    std::vector<UiProfile> m_uiProfiles;
    std::set<std::string> m_mediaProfiles;
};

} // namespace desktop

#endif
