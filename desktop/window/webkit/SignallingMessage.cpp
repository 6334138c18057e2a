// The signalling of the current channel as the parameters of a message.
#include "desktop/window/webkit/SignallingMessage.h"

namespace desktop {

namespace {

// State, service, serial and channel; then of each application: ids, control code, whether it is
// service-bound, priority, name and URL.
constexpr char kFormat[] = "(uttua(uqybyss))";
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
    return g_variant_new(kFormat, static_cast<guint32>(signalling.state), signalling.service,
                         signalling.serial, signalling.channel, &applications);
}

Signalling signallingOf(GVariant* variant) {
    Signalling signalling;
    guint32 state = 0;
    GVariantIter* applications = nullptr;
    g_variant_get(variant, kFormat, &state, &signalling.service, &signalling.serial, &signalling.channel,
                  &applications);
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
    return signalling;
}

} // namespace desktop
