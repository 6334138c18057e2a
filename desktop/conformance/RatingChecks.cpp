// Parental ratings and rating schemes.
#include "desktop/conformance/CheckGroup.h"

namespace desktop {

namespace {

std::vector<uint32_t> schemeHandles; // of the schemes with a name

void checkScheme(const PARENTALRATTINGSCHEME_STRUCT_T_TAG& scheme) {
    const std::string name = scheme.szName;
    expect(isUtf8(scheme.szName), "a name is not valid UTF-8");
    for (uint32_t rating = 0; rating < scheme.count; ++rating) {
        expect(scheme.ratingNames && scheme.iconUris && scheme.ratingNames[rating] && scheme.iconUris[rating],
               "a string of " + name + " is null");
        expect(isUtf8(scheme.ratingNames[rating]) && isUtf8(scheme.iconUris[rating]),
               "a string of " + name + " is not valid UTF-8");
    }
}

void checkSchemes(const CheckContext& context) {
    uint32_t count = 0;
    // The output is not preset: an address that the library cannot return shows whether it is written.
    auto* const preset = reinterpret_cast<PARENTALRATTINGSCHEME_STRUCT_T_TAG*>(&count);
    PARENTALRATTINGSCHEME_STRUCT_T_TAG* schemes = preset;
    if (context.library.TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes(&count, &schemes) != 0) {
        expect(count == 0 && schemes == preset, "it refuses, but changes its outputs");
        throw CheckSkipped{"the library has none"};
    }
    expect(count == 0 || (schemes && schemes != preset), "the array is not written");
    for (uint32_t index = 0; index < count; ++index) {
        if (schemes[index].szName) {
            checkScheme(schemes[index]);
            schemeHandles.push_back(schemes[index].handle);
        }
    }
}

void checkThresholds(const CheckContext& context) {
    if (schemeHandles.empty()) {
        throw CheckSkipped{"there are no schemes"};
    }
    constexpr int32_t kFirstPattern = 0x5A5A5A5A;
    constexpr int32_t kSecondPattern = 0x25A5A5A5;
    for (const uint32_t handle : schemeHandles) {
        int32_t first = kFirstPattern;
        int32_t second = kSecondPattern;
        const bool isAccepted =
            context.library.TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(handle, &first) == 0;
        context.library.TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(handle, &second);
        expect(isAccepted ? first == second : first == kFirstPattern, "scheme " + std::to_string(handle));
    }
}

} // namespace

std::vector<Check> ratingChecks() {
    return {
        refusalWithOutput(NAMED_CALL(TELIX_JS_SI_PARENTALRATING_GetName)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_SI_PARENTALRATING_GetScheme)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_SI_PARENTALRATING_GetValue)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_SI_PARENTALRATING_GetLabels)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_SI_PARENTALRATING_GetRegion)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold)),
        {"the rating schemes are complete records",
         {REQUIRED_CALL(TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes)},
         checkSchemes},
        {"the threshold of each scheme is written",
         {REQUIRED_CALL(TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold)},
         checkThresholds},
    };
}

} // namespace desktop
