// The script interface of a rating scheme.
#include "src/parental/JSParentalRatingScheme.h"

namespace {

using Model = ParentalRatingScheme;

// A string from the C heap: the browsers of the sets free it there. An empty one is null.
void setTextOrNull(NPVariant& result, const std::string& text) {
    if (text.empty()) {
        setNull(result);
    } else {
        setDuplicatedText(result, text);
    }
}

bool readName(PluginBase& model, NPVariant& result) {
    setTextOrNull(result, static_cast<Model&>(model).getName());
    return true;
}

bool invokeItem(PluginBase& model, const NPVariant* args, unsigned int, NPVariant& result) {
    using Index = ScriptArgument<uint32_t>;
    if (!Index::fits(args[0])) {
        return false;
    }
    setTextOrNull(result, static_cast<Model&>(model).getitem(Index::read(args[0])));
    return true;
}

// quirk 41: the argument counts as a double whatever its type, so an integer is read by its bits.
bool invokeIconUri(PluginBase& model, const NPVariant* args, unsigned int, NPVariant& result) {
    setTextOrNull(result, static_cast<Model&>(model).getIconUri(toUint32(args[0].value.doubleValue)));
    return true;
}

constexpr ScriptMember kMembers[] = {
    property("name", readName),
    property("length", reader<&Model::getLength>),
    property("threshold", reader<&Model::getThreshold>),
    method("indexOf", invoker<&Model::getIndexOf>),
    method("item", invokeItem),
    method("iconUri", invokeIconUri),
};

constexpr ScriptClass kClass("JSParentalRatingScheme", LogModule::PARENTAL, kMembers);

} // namespace

JSParentalRatingScheme::JSParentalRatingScheme(NPP npp) : SubObjectWrapper(npp, kClass) {}
