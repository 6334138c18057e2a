// The script interface of a key set.
#include "src/config/JSKeySet.h"

namespace {

// The second argument is read also when script passed none, and counts as 0 unless it is a number.
bool setValue(PluginBase& model, const NPVariant* args, unsigned int, NPVariant& result) {
    if (!isNumberValue(args[0])) {
        return false;
    }
    const uint32_t mask = toUint32(numberValue(args[0]));
    const uint32_t other = toUint32(numberValue(args[1]));
    setResult(result, static_cast<KeySet&>(model).setValue(mask, other));
    return true;
}

constexpr ScriptMember kMembers[] = {
    property("value", reader<&KeySet::getValue>),
    method("setValue", setValue),
    constant("RED", 0x1),
    constant("GREEN", 0x2),
    constant("YELLOW", 0x4),
    constant("BLUE", 0x8),
    constant("NAVIGATION", 0x10),
    constant("VCR", 0x20),
    constant("SCROLL", 0x40),
    constant("INFO", 0x80),
    constant("NUMERIC", 0x100),
    constant("ALPHA", 0x200),
};

constexpr ScriptClass kClass("JSKeySet", LogModule::APP_MGR, kMembers);

} // namespace

JSKeySet::JSKeySet(NPP npp) : SubObjectWrapper(npp, kClass) {}
