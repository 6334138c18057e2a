// The signalling of the current channel as the parameters of a message.
#include "desktop/window/webkit/SignallingMessage.h"

namespace desktop {

namespace {

// State, service, serial and channel; then of each application: ids, control code, whether it is
// service-bound, priority, name and URL; then what was left out.
constexpr char kFormat[] = "(uttua(uqybyss)as)";
constexpr char kSkipped[] = "as";
constexpr char kApplications[] = "a(uqybyss)";
constexpr char kApplication[] = "(uqybyss)";
constexpr char kApplicationValues[] = "(uqyby&s&s)";

} // namespace

GVariant* variantOf(const Signalling& signalling) {
    GVariantBuilder applications;
    g_variant_builder_init(&applications, G_VARIANT_TYPE(kApplications));
    for (const SignalledApplication& each : signalling.applications) {
        g_variant_builder_add(&applications, kApplication, each.id.organisation, each.id.application,
                              each.controlCode, each.isServiceBound, each.priority, each.name.c_str(),
                              each.url.c_str());
    }
    GVariantBuilder skipped;
    g_variant_builder_init(&skipped, G_VARIANT_TYPE(kSkipped));
    for (const std::string& each : signalling.skipped) {
        g_variant_builder_add(&skipped, "s", each.c_str());
    }
    return g_variant_new(kFormat, static_cast<guint32>(signalling.state), signalling.service,
                         signalling.serial, signalling.channel, &applications, &skipped);
}

Signalling signallingOf(GVariant* variant) {
    Signalling signalling;
    guint32 state = 0;
    GVariantIter* applications = nullptr;
    GVariantIter* skipped = nullptr;
    g_variant_get(variant, kFormat, &state, &signalling.service, &signalling.serial, &signalling.channel,
                  &applications, &skipped);
    signalling.state = static_cast<telix_desktop_signalling_state>(state);
    SignalledApplication each;
    gboolean isServiceBound = FALSE;
    const char* name = nullptr;
    const char* url = nullptr;
    while (g_variant_iter_next(applications, kApplicationValues, &each.id.organisation, &each.id.application,
                               &each.controlCode, &isServiceBound, &each.priority, &name, &url)) {
        each.isServiceBound = isServiceBound != FALSE;
        each.name = name;
        each.url = url;
        signalling.applications.push_back(each);
    }
    g_variant_iter_free(applications);
    while (g_variant_iter_next(skipped, "&s", &name)) {
        signalling.skipped.emplace_back(name);
    }
    g_variant_iter_free(skipped);
    return signalling;
}

} // namespace desktop
