// Settings, keys, memory, capabilities, rating schemes and DRM messages.
#include "desktop/conformance/Checks.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <glib.h>
#include <mutex>

namespace {

void checkCode(const Means& m, const char* name, TELIX_RETCODE_ENUM_T (*function)(char**)) {
    m.check(std::string(name) + " gives an ISO code of three letters, in a fresh text",
            {{name, function != nullptr}}, [&] {
                const std::string code = takeText(name, function);
                const bool isCode =
                    code.size() == 3 && std::all_of(code.begin(), code.end(),
                                                    [](char letter) { return g_ascii_isalpha(letter); });
                if (code.empty()) {
                    throw Skip{"it gives none"};
                }
                expect(isCode, "it is \"" + code + "\"");
            });
}

void checkCount(const Means& m, const char* name, TELIX_RETCODE_ENUM_T (*function)(uint32_t*)) {
    m.check(std::string(name) + " gives a number, or leaves it alone", {{name, function != nullptr}}, [&] {
        uint32_t count = 0;
        const bool isTaken = function(&count) == 0;
        expect(isTaken || count == 0, "it refuses and has changed its output");
    });
}

TELIX_RETCODE_ENUM_T onLowMemory() {
    return 0;
}

// ---- DRM

struct Answer {
    std::string id;
    bool hasTexts;
};
std::mutex answersMutex;
std::vector<Answer> answers;

TELIX_RETCODE_ENUM_T onAnswer(___UINT8* id, ___UINT8* message, TELIX_DRM_RESULT_CODE_ENUM_T result) {
    (void)result;
    std::lock_guard<std::mutex> lock(answersMutex);
    answers.push_back({id ? reinterpret_cast<char*>(id) : "", id && message});
    return 0;
}

size_t answersTo(const std::string& id) {
    std::lock_guard<std::mutex> lock(answersMutex);
    return static_cast<size_t>(
        std::count_if(answers.begin(), answers.end(), [&](const Answer& each) { return each.id == id; }));
}

// Sends a message and gives its id; a library without DRM refuses.
std::string send(const Means& m) {
    char* id = nullptr;
    const TELIX_RETCODE_ENUM_T result =
        m.library.TELIX_JS_DRM_SendDRMMessage("text/plain", "message", "urn:dvb:casystemid:0", &id);
    expect(result == 0 || id == nullptr, "it refuses and has changed its output");
    if (result != 0 || !id) {
        throw Skip{"the library takes no DRM messages"};
    }
    std::string text = id;
    std::free(id);
    expect(!text.empty() && isUtf8(text.c_str()), "the id is no text");
    return text;
}

} // namespace

void checkDevice(const Means& m) {
    checkCode(m, ALL_CALLS(TELIX_JS_APP_Config_GetPreferredAudioLanguage));
    checkCode(m, ALL_CALLS(TELIX_JS_APP_Config_GetPreferredSubtitleLanguage));
    checkCode(m, ALL_CALLS(TELIX_JS_APP_Config_GetCountryId));
    checkCount(m, ALL_CALLS(TELIX_JS_APP_GetFreeMem));
    checkCount(m, ALL_CALLS(TELIX_JS_APP_GetKeySetValue));
    m.check("a key set that is asked for is granted in writing, and then in force",
            {NEED(TELIX_JS_APP_GetKeySetValue), NEED(TELIX_JS_APP_SetKeySetValue)}, [&] {
                uint32_t former = 0;
                m.library.TELIX_JS_APP_GetKeySetValue(&former);
                for (const uint32_t mask : {0x1FU, 0U, 0xFFFFFFFFU, 0x10U, former}) {
                    uint32_t first = 0xA5A5A5A5;
                    uint32_t second = 0x5A5A5A5A;
                    if (m.library.TELIX_JS_APP_SetKeySetValue(mask, &first) != 0) {
                        expect(first == 0xA5A5A5A5, "it refuses and has changed its output");
                        continue;
                    }
                    expect(m.library.TELIX_JS_APP_SetKeySetValue(mask, &second) == 0,
                           "it refuses the second time");
                    expect(first == second, "the granted mask is not written");
                    uint32_t now = 0;
                    expect(m.library.TELIX_JS_APP_GetKeySetValue(&now) != 0 || now == first,
                           "another mask is in force than was granted");
                }
            });
    m.check("low memory can be asked for and given up, more than once",
            {NEED(TELIX_JS_APP_RegisterLowMemory), NEED(TELIX_JS_APP_UnRegisterLowMemory)}, [&] {
                for (int time = 0; time < 2; ++time) {
                    m.library.TELIX_JS_APP_RegisterLowMemory(onLowMemory);
                    m.library.TELIX_JS_APP_UnRegisterLowMemory(onLowMemory);
                }
                m.library.TELIX_JS_APP_UnRegisterLowMemory(onLowMemory);
            });
    m.check("the current channel is one of the channels",
            {NEED(TELIX_JS_APP_GetCurrentChannel), NEED(TELIX_JS_CM_GetSid)}, [&] {
                TELIX_JS_CM_HANDLE channel = 0;
                if (m.library.TELIX_JS_APP_GetCurrentChannel(&channel) != 0) {
                    expect(channel == 0, "it refuses and has changed its output");
                    throw Skip{"nothing is presented"};
                }
                uint32_t sid = 0;
                expect(m.library.TELIX_JS_CM_GetSid(channel, &sid) == 0, "it has no service id");
            });
}

void checkCapabilities(const Means& m) {
    m.check("the capabilities are an XML document, in a fresh text", {NEED(TELIX_JS_CAP_GetXmlCapabilities)},
            [&] {
                const std::string document = takeText("it", m.library.TELIX_JS_CAP_GetXmlCapabilities);
                if (document.empty()) {
                    throw Skip{"there is none"};
                }
                const GMarkupParser nothing{};
                GMarkupParseContext* context =
                    g_markup_parse_context_new(&nothing, G_MARKUP_DEFAULT_FLAGS, nullptr, nullptr);
                GError* error = nullptr;
                const bool isGood =
                    g_markup_parse_context_parse(context, document.data(),
                                                 static_cast<gssize>(document.size()), &error) &&
                    g_markup_parse_context_end_parse(context, &error);
                g_markup_parse_context_free(context);
                const std::string reason = error ? error->message : "";
                g_clear_error(&error);
                expect(isGood, reason);
            });
    m.check("a profile that nobody has is not supported", {NEED(TELIX_JS_CAP_HasCapability)}, [&] {
        for (const char* profile :
             {"NO_SUCH_PROFILE", "+NO_SUCH_FRAGMENT", "OITF_HD_UIPROF+NO_SUCH_FRAGMENT", " "}) {
            ___UINT8 supported = 0;
            m.library.TELIX_JS_CAP_HasCapability(profile, &supported);
            expect(supported == 0, profile);
        }
    });
    checkCount(m, ALL_CALLS(TELIX_JS_CAP_GetExtraSDVideoDecodes));
    checkCount(m, ALL_CALLS(TELIX_JS_CAP_GetExtraHDVideoDecodes));
}

void checkRatings(const Means& m) {
    checkRefusal(m, ALL_CALLS(TELIX_JS_SI_PARENTALRATING_GetName));
    checkRefusal(m, ALL_CALLS(TELIX_JS_SI_PARENTALRATING_GetScheme));
    checkRefusal(m, ALL_CALLS(TELIX_JS_SI_PARENTALRATING_GetValue));
    checkRefusal(m, ALL_CALLS(TELIX_JS_SI_PARENTALRATING_GetLabels));
    checkRefusal(m, ALL_CALLS(TELIX_JS_SI_PARENTALRATING_GetRegion));
    checkRefusal(m, ALL_CALLS(TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold));
    std::vector<uint32_t> handles;
    m.check("the rating schemes are complete records",
            {NEED(TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes)}, [&] {
                uint32_t count = 0;
                auto* const nowhere = reinterpret_cast<PARENTALRATTINGSCHEME_STRUCT_T_TAG*>(&count);
                PARENTALRATTINGSCHEME_STRUCT_T_TAG* schemes = nowhere;
                if (m.library.TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes(&count, &schemes) != 0) {
                    expect(count == 0 && schemes == nowhere, "it refuses and has changed its outputs");
                    throw Skip{"the library has none"};
                }
                expect(count == 0 || (schemes && schemes != nowhere), "the array is not written");
                for (uint32_t index = 0; index < count; ++index) {
                    const PARENTALRATTINGSCHEME_STRUCT_T_TAG& scheme = schemes[index];
                    if (!scheme.szName) {
                        continue;
                    }
                    expect(isUtf8(scheme.szName), "a name is no UTF-8 text");
                    handles.push_back(scheme.handle);
                    for (uint32_t rating = 0; rating < scheme.count; ++rating) {
                        expect(scheme.ratingNames && scheme.iconUris && scheme.ratingNames[rating] &&
                                   scheme.iconUris[rating],
                               std::string("a text of ") + scheme.szName + " is null");
                        expect(isUtf8(scheme.ratingNames[rating]) && isUtf8(scheme.iconUris[rating]),
                               std::string("a text of ") + scheme.szName + " is no UTF-8");
                    }
                }
            });
    m.check("the threshold of each scheme is written", {NEED(TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold)},
            [&] {
                if (handles.empty()) {
                    throw Skip{"there are no schemes"};
                }
                for (const uint32_t handle : handles) {
                    int32_t first = 0x5A5A5A5A;
                    int32_t second = 0x25A5A5A5;
                    const bool isThere =
                        m.library.TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(handle, &first) == 0;
                    m.library.TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(handle, &second);
                    expect(isThere ? first == second : first == 0x5A5A5A5A,
                           "scheme " + std::to_string(handle));
                }
            });
}

void checkDrm(const Means& m) {
    const std::initializer_list<Need> needs{NEED(TELIX_JS_DRM_RegisterOnDRMMessageResult),
                                            NEED(TELIX_JS_DRM_UnregisterOnDRMMessageResult),
                                            NEED(TELIX_JS_DRM_SendDRMMessage)};
    const Library& library = m.library;
    m.check("each DRM message has an id of its own and one answer to it", needs, [&] {
        library.TELIX_JS_DRM_RegisterOnDRMMessageResult(onAnswer);
        const std::string first = send(m);
        const std::string second = send(m);
        expect(first != second, "two messages have the id " + first);
        expect(m.waitUntil([&] { return answersTo(first) > 0 && answersTo(second) > 0; }), "no answer comes");
        expect(!m.comesWithin(std::chrono::milliseconds(200),
                              [&] { return answersTo(first) > 1 || answersTo(second) > 1; }),
               "one message has two answers");
        std::lock_guard<std::mutex> lock(answersMutex);
        expect(std::all_of(answers.begin(), answers.end(), [](const Answer& each) { return each.hasTexts; }),
               "a text is null");
    });
    m.check("answers go on as long as one agent of two is left", needs, [&] {
        library.TELIX_JS_DRM_RegisterOnDRMMessageResult(onAnswer); // the second one
        library.TELIX_JS_DRM_UnregisterOnDRMMessageResult(onAnswer);
        const std::string id = send(m);
        expect(m.waitUntil([&] { return answersTo(id) > 0; }), "no answer comes");
    });
    m.check("no answer comes after the last agent has gone", needs, [&] {
        library.TELIX_JS_DRM_UnregisterOnDRMMessageResult(onAnswer);
        library.TELIX_JS_DRM_UnregisterOnDRMMessageResult(onAnswer); // one too many does no harm
        const std::string id = send(m);
        expect(!m.comesWithin(std::chrono::milliseconds(500), [&] { return answersTo(id) > 0; }), "one came");
    });
}
