// NPVariants: who owns what they hold, and the argument lists that the plug-in gets.
#include "bridge/Variants.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>

#include "bridge/Objects.h"

namespace bridge {

NPVariant nullVariant() {
    NPVariant variant = {};
    variant.type = NPVariantType_Null;
    return variant;
}

NPVariant boolVariant(bool value) {
    NPVariant variant = {};
    variant.type = NPVariantType_Bool;
    variant.value.boolValue = value;
    return variant;
}

NPVariant doubleVariant(double value) {
    NPVariant variant = {};
    variant.type = NPVariantType_Double;
    variant.value.doubleValue = value;
    return variant;
}

NPVariant stringVariant(std::string_view text) {
    auto* const copy = text.size() <= UINT32_MAX ? static_cast<char*>(std::malloc(text.size() + 1)) : nullptr;
    if (!copy) {
        return voidVariant();
    }
    std::copy(text.begin(), text.end(), copy);
    copy[text.size()] = '\0';
    NPVariant variant = {};
    variant.type = NPVariantType_String;
    variant.value.stringValue = {copy, static_cast<uint32_t>(text.size())};
    return variant;
}

NPVariant objectVariant(NPObject* object) {
    if (!object) {
        return nullVariant();
    }
    NPVariant variant = {};
    variant.type = NPVariantType_Object;
    variant.value.objectValue = object;
    return variant;
}

void releaseVariant(NPVariant& variant) {
    const NPVariant released = variant;
    variant = voidVariant();
    if (released.type == NPVariantType_String) {
        std::free(const_cast<char*>(released.value.stringValue.UTF8Characters));
    } else if (released.type == NPVariantType_Object) {
        releaseObject(released.value.objectValue);
    }
}

std::string_view textOf(const NPVariant& variant) {
    if (variant.type != NPVariantType_String || !variant.value.stringValue.UTF8Characters) {
        return {};
    }
    return {variant.value.stringValue.UTF8Characters, variant.value.stringValue.UTF8Length};
}

double numberOf(const NPVariant& variant) {
    switch (variant.type) {
    case NPVariantType_Int32:
        return variant.value.intValue;
    case NPVariantType_Double:
        return variant.value.doubleValue;
    default:
        return 0;
    }
}

NPObject* objectOf(const NPVariant& variant) {
    return variant.type == NPVariantType_Object ? variant.value.objectValue : nullptr;
}

Arguments::Arguments(uint32_t count) : m_count(count) {
    m_data = m_few.data();
    if (count > kPadding) {
        m_many.assign(count, voidVariant());
        m_data = m_many.data();
    } else {
        m_few.fill(voidVariant());
    }
}

Arguments::~Arguments() {
    for (uint32_t i = 0; i < m_count; i++) {
        releaseVariant(m_data[i]);
    }
}

} // namespace bridge
