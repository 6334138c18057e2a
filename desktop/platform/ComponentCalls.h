// The component calls of the platform interface. They exist for the players (TELIX_JS_AV_...) and for
// broadcast (TELIX_JS_VB_...) with the same meaning: each family defines all of them with
//   TELIX_DEFINE_COMPONENT_CALLS(TELIX_JS_AV, TELIX_JS_AV_HANDLE, PlayerRegistry)
// The third argument is a class with the functions instance(), components(), findComponent() and
// selectComponent() of PlayerRegistry.
#ifndef TELIX_DESKTOP_PLATFORM_COMPONENTCALLS_H
#define TELIX_DESKTOP_PLATFORM_COMPONENTCALLS_H

#include <optional>
#include <utility>
#include <vector>

#include "desktop/platform/ComponentTraits.h"
#include "desktop/platform/Output.h"

namespace desktop {

// Returns an array, which stays in `kept`. Refuses without one.
inline TELIX_RETCODE_ENUM_T returnComponents(std::vector<TELIX_JS_AVCOMPHANDLE>& kept,
                                             std::optional<std::vector<TELIX_JS_AVCOMPHANDLE>> found,
                                             TELIX_JS_AVCOMPHANDLE** components, uint32_t* count) {
    if (!found) {
        return kRefused;
    }
    kept = std::move(*found);
    kept.reserve(1); // the address of an empty array is not null either
    *components = kept.data();
    *count = static_cast<uint32_t>(kept.size());
    return TELIX_RETCODE_SUCCESS;
}

// Return one trait of a component. They refuse without a component.
inline TELIX_RETCODE_ENUM_T returnTrait(const std::optional<ComponentTraits>& found,
                                        std::string ComponentTraits::*trait, char** out) {
    return found ? returnString(out, (*found).*trait) : kRefused;
}

inline TELIX_RETCODE_ENUM_T returnTrait(const std::optional<ComponentTraits>& found,
                                        bool ComponentTraits::*trait, ___UINT8* out) {
    return found ? returnFlag(out, (*found).*trait) : kRefused;
}

// The plug-in repeats a call for a number until it succeeds: refuses until the decoder has reported the
// number.
template <typename Number>
TELIX_RETCODE_ENUM_T returnTrait(const std::optional<ComponentTraits>& found, Number ComponentTraits::*trait,
                                 Number* out) {
    if (!found || (*found).*trait <= 0) {
        return kRefused;
    }
    *out = (*found).*trait;
    return TELIX_RETCODE_SUCCESS;
}

} // namespace desktop

// A row for each trait: the end of the call's name, what it returns, and the trait.
#define TELIX_COMPONENT_TRAITS(ROW, PREFIX, FAMILY)                                                          \
    ROW(PREFIX, FAMILY, GetEncoding, char*, encoding)                                                        \
    ROW(PREFIX, FAMILY, GetEncrypted, ___UINT8, isEncrypted)                                                 \
    ROW(PREFIX, FAMILY, GetAspectRatio, float, aspectRatio)                                                  \
    ROW(PREFIX, FAMILY, GetLanguage, char*, language)                                                        \
    ROW(PREFIX, FAMILY, GetAudioDescription, ___UINT8, isAudioDescription)                                   \
    ROW(PREFIX, FAMILY, GetAudioChannels, uint32_t, audioChannels)                                           \
    ROW(PREFIX, FAMILY, GetHearingImpaired, ___UINT8, isForHearingImpaired)

#define TELIX_DEFINE_TRAIT_CALL(PREFIX, FAMILY, NAME, VALUE, TRAIT)                                          \
    TELIX_RETCODE_ENUM_T PREFIX##_AVComponent_##NAME(TELIX_JS_AVCOMPHANDLE component,                        \
                                                     TELIX_JS_AVCOMPTYPE type, VALUE* value) {               \
        return desktop::returnTrait(desktop::FAMILY::instance().findComponent(component, type),              \
                                    &desktop::ComponentTraits::TRAIT, value);                                \
    }

// The array that a call returns is valid until the next call of the same function.
#define TELIX_DEFINE_LIST_CALL(NAME, HANDLE, FAMILY, ACTIVE_ONLY)                                            \
    TELIX_RETCODE_ENUM_T NAME(HANDLE owner, TELIX_JS_AVCOMPTYPE type, TELIX_JS_AVCOMPHANDLE** components,    \
                              uint32_t* count) {                                                             \
        static std::vector<TELIX_JS_AVCOMPHANDLE> kept;                                                      \
        return desktop::returnComponents(                                                                    \
            kept, desktop::FAMILY::instance().components(owner, type, ACTIVE_ONLY), components, count);      \
    }

#define TELIX_DEFINE_SELECTION_CALL(NAME, HANDLE, FAMILY, IS_ACTIVE)                                         \
    TELIX_RETCODE_ENUM_T NAME(HANDLE owner, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type) {     \
        return desktop::resultOf(                                                                            \
            desktop::FAMILY::instance().selectComponent(owner, component, type, IS_ACTIVE));                 \
    }

#define TELIX_DEFINE_COMPONENT_CALLS(PREFIX, HANDLE, FAMILY)                                                 \
    TELIX_DEFINE_LIST_CALL(PREFIX##_GetComponents, HANDLE, FAMILY, false)                                    \
    TELIX_DEFINE_LIST_CALL(PREFIX##_GetCurrActiveComponents, HANDLE, FAMILY, true)                           \
    TELIX_DEFINE_SELECTION_CALL(PREFIX##_SelectComponent, HANDLE, FAMILY, true)                              \
    TELIX_DEFINE_SELECTION_CALL(PREFIX##_UnselectComponent, HANDLE, FAMILY, false)                           \
    TELIX_COMPONENT_TRAITS(TELIX_DEFINE_TRAIT_CALL, PREFIX, FAMILY)

#endif
