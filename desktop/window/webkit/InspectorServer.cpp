// The server of the engine's remote inspector.
#include "desktop/window/webkit/InspectorServer.h"

#include <gio/gio.h>

namespace desktop {

namespace {

// Whether the port is free, as far as it can be known before the engine takes it. Sets `error` if not.
void checkFree(GSocketAddress* address, GError** error) {
    g_autoptr(GSocket) socket = g_socket_new(g_socket_address_get_family(address), G_SOCKET_TYPE_STREAM,
                                             G_SOCKET_PROTOCOL_TCP, error);
    if (socket) {
        g_socket_bind(socket, address, TRUE, error);
    }
}

} // namespace

std::string serveInspector(const std::string& hostAndPort) {
    g_autoptr(GError) error = nullptr;
    g_autoptr(GSocketConnectable) name = g_network_address_parse(hostAndPort.c_str(), 0, &error);
    if (!name) {
        return error->message;
    }
    g_autoptr(GSocketAddressEnumerator) addresses = g_socket_connectable_enumerate(name);
    g_autoptr(GSocketAddress) address = g_socket_address_enumerator_next(addresses, nullptr, &error);
    if (!address) {
        return error ? error->message : "no address";
    }
    checkFree(address, &error);
    if (error) {
        return error->message;
    }
    // The engine takes numbers only.
    g_autofree char* text = g_socket_connectable_to_string(G_SOCKET_CONNECTABLE(address));
    g_setenv("WEBKIT_INSPECTOR_HTTP_SERVER", text, TRUE);
    return {};
}

} // namespace desktop
