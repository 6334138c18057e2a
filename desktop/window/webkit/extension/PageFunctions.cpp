// What the window adds to the window object of every page: the functions that create, destroy, show and hide
// applications, the key codes of the remote control, and support for HbbTV documents.
#include "desktop/window/webkit/extension/PageFunctions.h"

#include <sys/socket.h>

#include <cerrno>

#include "desktop/window/shared/PageScript.h"

namespace desktop {

namespace {

// The object that scripts/pagefunctions.js takes from the window object.
constexpr char kHostObject[] = "telixTvBrowser";

int hostChannel = -1;

// The page that calls.
struct Caller {
    uint64_t page;
};

ssize_t withoutInterruption(ssize_t (*call)(int, void*, std::size_t), void* data, std::size_t size) {
    ssize_t result = 0;
    do {
        result = call(hostChannel, data, size);
    } while (result < 0 && errno == EINTR);
    return result;
}

gboolean createApplication(const char* url, gpointer data) {
    const auto* caller = static_cast<Caller*>(data);
    g_autoptr(JSCValue) base = jsc_context_evaluate(jsc_context_get_current(), "document.baseURI", -1);
    g_autofree char* baseUrl = jsc_value_to_string(base);
    g_autofree char* absolute = g_uri_resolve_relative(baseUrl, url, G_URI_FLAGS_PARSE_RELAXED, nullptr);
    return callWindow(caller->page, "create", absolute ? absolute : url);
}

// The functions without arguments, by their names in the host object.
struct Function {
    const char* name;
    void (*call)(gpointer caller);
};
constexpr Function kFunctions[] = {
    {"destroyApplication",
     [](gpointer caller) { callWindow(static_cast<Caller*>(caller)->page, "destroy", ""); }},
    {"showApplication", [](gpointer caller) { callWindow(static_cast<Caller*>(caller)->page, "show", ""); }},
    {"hideApplication", [](gpointer caller) { callWindow(static_cast<Caller*>(caller)->page, "hide", ""); }}};

void deleteCaller(gpointer caller) {
    delete static_cast<Caller*>(caller);
}

void setFunction(JSCValue* host, const char* name, JSCValue* function) {
    jsc_value_object_set_property(host, name, function);
    g_object_unref(function);
}

void onWindowObjectCleared(WebKitScriptWorld* world, WebKitWebPage* page, WebKitFrame* frame, gpointer) {
    g_autoptr(JSCContext) context = webkit_frame_get_js_context_for_script_world(frame, world);
    g_autoptr(JSCValue) host = jsc_value_new_object(context, nullptr, nullptr);
    const Caller caller{webkit_web_page_get_id(page)};
    setFunction(host, "createApplication",
                jsc_value_new_function(context, "createApplication", G_CALLBACK(createApplication),
                                       new Caller(caller), deleteCaller, G_TYPE_BOOLEAN, 1, G_TYPE_STRING));
    for (const auto& function : kFunctions) {
        setFunction(host, function.name,
                    jsc_value_new_function(context, function.name, G_CALLBACK(function.call),
                                           new Caller(caller), deleteCaller, G_TYPE_NONE, 0));
    }
    jsc_context_set_value(context, kHostObject, host);
    for (const auto& script : {pageFunctionsScript(), hbbtvDocumentScript()}) {
        g_autoptr(JSCValue) result = jsc_context_evaluate(context, script.c_str(), -1);
    }
}

} // namespace

bool callWindow(uint64_t page, const char* function, const std::string& argument) {
    std::string message = std::to_string(page) + '\n' + function + '\n' + argument;
    const auto sendMessage = [](int channel, void* data, std::size_t size) {
        return send(channel, data, size, MSG_NOSIGNAL);
    };
    const auto receive = [](int channel, void* data, std::size_t size) {
        return recv(channel, data, size, 0);
    };
    if (withoutInterruption(sendMessage, message.data(), message.size()) < 0) {
        return false;
    }
    char reply = 0;
    return withoutInterruption(receive, &reply, 1) == 1 && reply == '1';
}

void addPageFunctions(int channel) {
    hostChannel = channel;
    g_signal_connect(webkit_script_world_get_default(), "window-object-cleared",
                     G_CALLBACK(onWindowObjectCleared), nullptr);
}

} // namespace desktop
