// The script interface of an A/V component.
#include "src/avcomponent/JSAVcomponent.h"

namespace {

// quirk 35: an empty string has length 0 and is not null.
// The block comes from the C heap: the browsers of the sets free it there.
template <std::string (AVcomponent::*Getter)()>
bool readText(PluginBase& model, NPVariant& result) {
    setDuplicatedText(result, (static_cast<AVcomponent&>(model).*Getter)());
    return true;
}

// Two decimals.
bool readAspectRatio(PluginBase& model, NPVariant& result) {
    const double ratio = static_cast<AVcomponent&>(model).getAspectRatio();
    setResult(result, toUint32(ratio * 100.0 + 0.5) / 100.0);
    return true;
}

constexpr ScriptMember kMembers[] = {
    property("type", reader<&AVcomponent::getType>),
    property("encoding", readText<&AVcomponent::getEncoding>),
    property("encrypted", reader<&AVcomponent::getEncrypted>),
    property("aspectRatio", readAspectRatio),
    property("language", readText<&AVcomponent::getLanguage>),
    property("audioDescription", reader<&AVcomponent::getAudioDescription>),
    property("audioChannels", reader<&AVcomponent::getAudioChannels>),
    property("hearingImpaired", reader<&AVcomponent::getHearingImpaired>),
};

constexpr ScriptClass kClass("JSAVcomponent", LogModule::AV_COMP, kMembers);

} // namespace

JSAVcomponent::JSAVcomponent(NPP npp) : SubObjectWrapper(npp, kClass) {}
