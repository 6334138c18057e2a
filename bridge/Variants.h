// NPVariants: who owns what they hold, and the argument lists that the plug-in gets. Main thread only.
//
// Strings are malloc()'s, because plug-ins free them with free() as well as with NPN_MemFree(), and hand over
// strings of strdup().
#ifndef TELIX_BRIDGE_VARIANTS_H
#define TELIX_BRIDGE_VARIANTS_H

#include <array>
#include <string_view>
#include <vector>

#include "npapi/npruntime.h"

namespace bridge {

inline NPVariant voidVariant() {
    NPVariant variant = {};
    variant.type = NPVariantType_Void;
    return variant;
}

NPVariant nullVariant();
NPVariant boolVariant(bool value);
NPVariant doubleVariant(double value);
// A copy of the text, followed by a zero that does not count. Void when there is no memory or the text is
// longer than 32 bits can say.
NPVariant stringVariant(std::string_view text);
// Takes over a reference of the caller's; null for a null pointer.
NPVariant objectVariant(NPObject* object);

// Gives back what the variant holds and makes it void.
void releaseVariant(NPVariant& variant);

// The text of a string; empty for another variant.
std::string_view textOf(const NPVariant& variant);
// The number; 0 for another variant.
double numberOf(const NPVariant& variant);
// The object, still owned by the variant; null for another variant.
NPObject* objectOf(const NPVariant& variant);

// Owns a variant.
class OwnedVariant {
public:
    OwnedVariant() = default;
    explicit OwnedVariant(const NPVariant& variant) : m_variant(variant) {}
    OwnedVariant(const OwnedVariant&) = delete;
    OwnedVariant& operator=(const OwnedVariant&) = delete;
    ~OwnedVariant() { releaseVariant(m_variant); }

    NPVariant* operator&() { return &m_variant; }
    const NPVariant& get() const { return m_variant; }

private:
    NPVariant m_variant = voidVariant();
};

// The arguments of a call, owned. The plug-in reads arguments by position without a look at their number, so
// that at least kPadding of them can be read; those beyond count() are void.
class Arguments {
public:
    static constexpr uint32_t kPadding = 16;

    explicit Arguments(uint32_t count);
    Arguments(const Arguments&) = delete;
    Arguments& operator=(const Arguments&) = delete;
    ~Arguments();

    NPVariant& operator[](uint32_t index) { return m_data[index]; }
    const NPVariant* data() const { return m_data; }
    uint32_t count() const { return m_count; }

private:
    uint32_t m_count;
    std::array<NPVariant, kPadding> m_few;
    std::vector<NPVariant> m_many; // all of them when there are more than kPadding
    NPVariant* m_data;
};

} // namespace bridge

#endif
