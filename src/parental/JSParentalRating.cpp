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
    property("name", reader<&ParentalRating::getName>),
    property("scheme", reader<&ParentalRating::getScheme>),
    property("value", reader<&ParentalRating::getValue>),
    property("labels", reader<&ParentalRating::getLabels>),
    property("region", readRegion),
};

constexpr ScriptClass kClass = ScriptClass("JSParentalRating", LogModule::PARENTAL, kMembers)
                                   .refusingMethodsWith(kRefusal)
                                   .refusingWritesWith(kRefusal);

} // namespace

JSParentalRating::JSParentalRating(NPP npp) : SubObjectWrapper(npp, kClass) {}
