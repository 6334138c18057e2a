// The script interface of a parental rating.
#include "src/parental/JSParentalRating.h"

namespace {

constexpr const char* kRefusal = "JSParentalRating class\n";

// quirk 37: unlike the other strings an empty region reads as void.
bool readRegion(PluginBase& model, NPVariant& result) {
    const std::string region = static_cast<ParentalRating&>(model).getRegion();
    if (!region.empty()) {
        setResult(result, region);
    }
    return true;
}

constexpr ScriptMember kMembers[] = {
    property("name", read<&ParentalRating::getName>),
    property("scheme", read<&ParentalRating::getScheme>),
    property("value", read<&ParentalRating::getValue>),
    property("labels", read<&ParentalRating::getLabels>),
    property("region", readRegion),
};

constexpr ScriptClass kClass = ScriptClass("JSParentalRating", LogModule::PARENTAL, kMembers)
                                   .refusingMethodsWith(kRefusal)
                                   .refusingWritesWith(kRefusal);

} // namespace

JSParentalRating::JSParentalRating(NPP npp) : SubObjectWrapper(npp, kClass) {}
