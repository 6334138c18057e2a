// Preferences, keys, memory and capabilities.
#include <algorithm>
#include <glib.h>

#include "desktop/conformance/CheckGroup.h"

namespace desktop {

namespace {

Check isoCode(const char* name, TELIX_RETCODE_ENUM_T (*Library::*call)(char**)) {
    const RequiredCall required{name, [call](const Library& library) { return library.*call != nullptr; }};
    return {std::string(name) + " returns an ISO code of three letters, in a new string",
            {required},
            [name, call](const CheckContext& context) {
                const std::string code = checkedString(name, context.library.*call);
                if (code.empty()) {
                    throw CheckSkipped{"the library returns none"};
                }
                expect(code.size() == 3 && std::all_of(code.begin(), code.end(),
                                                       [](char letter) { return g_ascii_isalpha(letter); }),
                       "it is \"" + code + "\"");
            }};
}

void checkKeySet(const CheckContext& context) {
    const Library& library = context.library;
    constexpr uint32_t kFirstPattern = 0xA5A5A5A5;
    constexpr uint32_t kSecondPattern = 0x5A5A5A5A;
    uint32_t before = 0;
    library.TELIX_JS_APP_GetKeySetValue(&before);
    for (const uint32_t mask : {0x1FU, 0U, 0xFFFFFFFFU, 0x10U, before}) {
        uint32_t first = kFirstPattern;
        uint32_t second = kSecondPattern;
        if (library.TELIX_JS_APP_SetKeySetValue(mask, &first) != 0) {
            expect(first == kFirstPattern, "it refuses, but changes its output");
            continue;
        }
        expect(library.TELIX_JS_APP_SetKeySetValue(mask, &second) == 0, "it refuses the second time");
        expect(first == second, "the granted mask is not written");
        uint32_t current = 0;
        expect(library.TELIX_JS_APP_GetKeySetValue(&current) != 0 || current == first,
               "the mask read back is not the granted one");
    }
}

TELIX_RETCODE_ENUM_T onLowMemory() {
    return 0;
}

void checkLowMemory(const CheckContext& context) {
    const Library& library = context.library;
    for (int time = 0; time < 2; ++time) {
        library.TELIX_JS_APP_RegisterLowMemory(onLowMemory);
        library.TELIX_JS_APP_UnRegisterLowMemory(onLowMemory);
    }
    library.TELIX_JS_APP_UnRegisterLowMemory(onLowMemory);
}

void checkCurrentChannel(const CheckContext& context) {
    TELIX_JS_CM_HANDLE channel = 0;
    if (context.library.TELIX_JS_APP_GetCurrentChannel(&channel) != 0) {
        expect(channel == 0, "it refuses, but changes its output");
        throw CheckSkipped{"no channel is presented"};
    }
    uint32_t sid = 0;
    expect(context.library.TELIX_JS_CM_GetSid(channel, &sid) == 0, "it has no service id");
}

void checkCapabilitiesDocument(const CheckContext& context) {
    const std::string document =
        checkedString("the function", context.library.TELIX_JS_CAP_GetXmlCapabilities);
    if (document.empty()) {
        throw CheckSkipped{"the library returns none"};
    }
    const GMarkupParser callbacks{};
    GMarkupParseContext* parser =
        g_markup_parse_context_new(&callbacks, G_MARKUP_DEFAULT_FLAGS, nullptr, nullptr);
    GError* error = nullptr;
    const bool isWellFormed =
        g_markup_parse_context_parse(parser, document.data(), static_cast<gssize>(document.size()), &error) &&
        g_markup_parse_context_end_parse(parser, &error);
    g_markup_parse_context_free(parser);
    const std::string reason = error ? error->message : "";
    g_clear_error(&error);
    expect(isWellFormed, reason);
}

void checkUnknownProfiles(const CheckContext& context) {
    for (const char* profile :
         {"NO_SUCH_PROFILE", "+NO_SUCH_FRAGMENT", "OITF_HD_UIPROF+NO_SUCH_FRAGMENT", " "}) {
        ___UINT8 isSupported = 0;
        context.library.TELIX_JS_CAP_HasCapability(profile, &isSupported);
        expect(isSupported == 0, profile);
    }
}

} // namespace

std::vector<Check> deviceChecks() {
    return {
        isoCode(NAMED_CALL(TELIX_JS_APP_Config_GetPreferredAudioLanguage)),
        isoCode(NAMED_CALL(TELIX_JS_APP_Config_GetPreferredSubtitleLanguage)),
        isoCode(NAMED_CALL(TELIX_JS_APP_Config_GetCountryId)),
        optionalNumber(NAMED_CALL(TELIX_JS_APP_GetFreeMem)),
        optionalNumber(NAMED_CALL(TELIX_JS_APP_GetKeySetValue)),
        {"a key set is granted through the output, and is then in force",
         {REQUIRED_CALL(TELIX_JS_APP_GetKeySetValue), REQUIRED_CALL(TELIX_JS_APP_SetKeySetValue)},
         checkKeySet},
        {"low memory callbacks can be registered and unregistered repeatedly",
         {REQUIRED_CALL(TELIX_JS_APP_RegisterLowMemory), REQUIRED_CALL(TELIX_JS_APP_UnRegisterLowMemory)},
         checkLowMemory},
        {"the current channel is one of the channels",
         {REQUIRED_CALL(TELIX_JS_APP_GetCurrentChannel), REQUIRED_CALL(TELIX_JS_CM_GetSid)},
         checkCurrentChannel},
    };
}

std::vector<Check> capabilityChecks() {
    return {
        {"the capabilities are an XML document, in a new string",
         {REQUIRED_CALL(TELIX_JS_CAP_GetXmlCapabilities)},
         checkCapabilitiesDocument},
        {"unknown profiles are not supported",
         {REQUIRED_CALL(TELIX_JS_CAP_HasCapability)},
         checkUnknownProfiles},
        optionalNumber(NAMED_CALL(TELIX_JS_CAP_GetExtraSDVideoDecodes)),
        optionalNumber(NAMED_CALL(TELIX_JS_CAP_GetExtraHDVideoDecodes)),
    };
}

} // namespace desktop
