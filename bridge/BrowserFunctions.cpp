// The browser's function table as the plug-in gets it.
#include "bridge/BrowserFunctions.h"

#include <cstdlib>
#include <cstring>
#include <string>

#include <glib.h>

#include "bridge/CallDepth.h"
#include "bridge/Identifiers.h"
#include "bridge/Instance.h"
#include "bridge/Objects.h"
#include "bridge/Page.h"
#include "bridge/Plugin.h"
#include "bridge/Variants.h"

namespace bridge {

namespace {

// What script is named by which the plug-in has evaluated.
constexpr char kEvaluatedName[] = "plug-in";
// What a plug-in is told that asks without a page.
constexpr char kUnknownUserAgent[] = "Mozilla/5.0";

// The page of an instance; null for none and for one that has ended.
Page* pageOf(NPP npp) {
    const auto instance = Instance::find(npp);
    return instance ? instance->page() : nullptr;
}

// A property of an object of the page, owned by the caller; void when there is none.
NPVariant propertyOf(NPObject* object, const char* name) {
    NPVariant value = voidVariant();
    if (object) {
        object->_class->getProperty(object, identifierFor(std::string_view(name)), &value);
    }
    return value;
}

NPVariant propertyOfNavigator(Page& page, const char* name) {
    const OwnedVariant window(objectVariant(page.window()));
    const OwnedVariant navigator(propertyOf(objectOf(window.get()), "navigator"));
    return propertyOf(objectOf(navigator.get()), name);
}

// Streams and URLs.

NPError open(NPP npp, const StreamRequest& request) {
    const auto instance = Instance::find(npp);
    if (!instance || !instance->page()) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    return instance->page()->streams().open(*instance, request);
}

StreamRequest requestFor(const char* url, const char* target) {
    StreamRequest request;
    request.url = url ? url : "";
    request.target = target ? target : "";
    return request;
}

NPError getUrl(NPP npp, const char* url, const char* target) {
    return open(npp, requestFor(url, target));
}

NPError getUrlNotify(NPP npp, const char* url, const char* target, void* notifyData) {
    StreamRequest request = requestFor(url, target);
    request.notifies = true;
    request.notifyData = notifyData;
    return open(npp, request);
}

// Headers stand before the body, with an empty line between.
void splitHeaders(StreamRequest& request) {
    for (const char* const separator : {"\r\n\r\n", "\n\n"}) {
        const size_t end = request.body.find(separator);
        if (end != std::string::npos) {
            request.headers = request.body.substr(0, end);
            request.body.erase(0, end + std::strlen(separator));
            return;
        }
    }
    // An empty line alone says that there are none.
    const size_t start = request.body.find_first_not_of("\r\n");
    if (start != std::string::npos && start > 0) {
        request.body.erase(0, start);
    }
}

NPError fillPost(StreamRequest& request, uint32_t length, const char* buffer, bool isFile, bool hasHeaders) {
    request.isPost = true;
    if (isFile) {
        const std::string name(buffer ? buffer : "", buffer ? length : 0);
        gchar* content = nullptr;
        gsize size = 0;
        if (!g_file_get_contents(name.c_str(), &content, &size, nullptr)) {
            return NPERR_FILE_NOT_FOUND;
        }
        request.body.assign(content, size);
        g_free(content);
    } else if (buffer) {
        request.body.assign(buffer, length);
    }
    if (isFile || hasHeaders) {
        splitHeaders(request);
    }
    return NPERR_NO_ERROR;
}

NPError postUrl(NPP npp, const char* url, const char* target, uint32_t length, const char* buffer,
                NPBool isFile) {
    StreamRequest request = requestFor(url, target);
    // A buffer in memory has no headers with this call; a file may have.
    const NPError error = fillPost(request, length, buffer, isFile != 0, false);
    return error == NPERR_NO_ERROR ? open(npp, request) : error;
}

NPError postUrlNotify(NPP npp, const char* url, const char* target, uint32_t length, const char* buffer,
                      NPBool isFile, void* notifyData) {
    StreamRequest request = requestFor(url, target);
    request.notifies = true;
    request.notifyData = notifyData;
    const NPError error = fillPost(request, length, buffer, isFile != 0, true);
    return error == NPERR_NO_ERROR ? open(npp, request) : error;
}

NPError destroyStream(NPP npp, NPStream* stream, NPReason reason) {
    const auto instance = Instance::find(npp);
    if (!instance || !instance->page()) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    return instance->page()->streams().destroy(*instance, stream, reason);
}

NPError requestRead(NPStream*, NPByteRange*) {
    return NPERR_STREAM_NOT_SEEKABLE;
}

// Streams from the plug-in to the browser.
NPError newStream(NPP, NPMIMEType, const char*, NPStream** stream) {
    if (stream) {
        *stream = nullptr;
    }
    return NPERR_GENERIC_ERROR;
}

int32_t writeStream(NPP, NPStream*, int32_t, void*) {
    return -1;
}

NPError getValueForUrl(NPP, NPNURLVariable, const char*, char** value, uint32_t* length) {
    if (value) {
        *value = nullptr;
    }
    if (length) {
        *length = 0;
    }
    return NPERR_GENERIC_ERROR;
}

NPError setValueForUrl(NPP, NPNURLVariable, const char*, const char*, uint32_t) {
    return NPERR_GENERIC_ERROR;
}

NPError getAuthenticationInfo(NPP, const char*, const char*, int32_t, const char*, const char*, char**,
                              uint32_t*, char**, uint32_t*) {
    return NPERR_GENERIC_ERROR;
}

void urlRedirectResponse(NPP, void*, NPBool) {}

// The browser.

void status(NPP npp, const char* message) {
    if (Page* const page = pageOf(npp)) {
        const OwnedVariant window(objectVariant(page->window()));
        const OwnedVariant text(stringVariant(message ? message : ""));
        if (NPObject* const object = objectOf(window.get())) {
            object->_class->setProperty(object, identifierFor(std::string_view("status")), &text.get());
        }
    }
}

const char* userAgent(NPP npp) {
    // The page's process has one. The plug-in may keep the address.
    static std::string text;
    Page* const page = pageOf(npp);
    if (page && text.empty()) {
        const OwnedVariant agent(propertyOfNavigator(*page, "userAgent"));
        text = textOf(agent.get());
    }
    return text.empty() ? kUnknownUserAgent : text.c_str();
}

template <typename Value>
NPError give(void* result, Value value) {
    *static_cast<Value*>(result) = value;
    return NPERR_NO_ERROR;
}

NPError giveObject(void* result, NPObject* object) {
    if (!object) {
        return NPERR_GENERIC_ERROR;
    }
    return give(result, object);
}

NPError getValue(NPP npp, NPNVariable variable, void* value) {
    if (!value) {
        return NPERR_INVALID_PARAM;
    }
    switch (variable) { // those that need no instance
    case NPNVjavascriptEnabledBool:
    case NPNVSupportsWindowless:
        return give<NPBool>(value, true);
    case NPNVasdEnabledBool:
    case NPNVSupportsXEmbedBool:
    case NPNVprivateModeBool:
        return give<NPBool>(value, false);
    default:
        break;
    }
    const auto instance = Instance::find(npp);
    Page* const page = instance ? instance->page() : nullptr;
    if (!page) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    switch (variable) {
    case NPNVWindowNPObject:
        return giveObject(value, page->window());
    case NPNVPluginElementNPObject:
        return giveObject(value, retainObject(instance->element()));
    case NPNVisOfflineBool: {
        const OwnedVariant isOnline(propertyOfNavigator(*page, "onLine"));
        return give<NPBool>(value,
                            isOnline.get().type == NPVariantType_Bool && !isOnline.get().value.boolValue);
    }
    default: // displays, toolkits and Java
        return NPERR_GENERIC_ERROR;
    }
}

NPError setValue(NPP npp, NPPVariable variable, void*) {
    const auto instance = Instance::find(npp);
    if (!instance) {
        return NPERR_INVALID_INSTANCE_ERROR;
    }
    return instance->setValue(variable);
}

void* memAlloc(uint32_t size) {
    return std::malloc(size);
}

uint32_t memFlush(uint32_t) {
    return 0; // no cache that could be given up
}

void reloadPlugins(NPBool) {}

void* getJavaEnv() {
    return nullptr;
}

void* getJavaPeer(NPP) {
    return nullptr;
}

void postCall(NPP, void (*function)(void*), void* data) {
    Plugin::postCall(function, data);
}

uint32_t scheduleTimer(NPP npp, uint32_t interval, NPBool repeats, void (*function)(NPP, uint32_t)) {
    const auto instance = Instance::find(npp);
    return instance ? instance->scheduleTimer(interval, repeats != 0, function) : 0;
}

void unscheduleTimer(NPP npp, uint32_t timer) {
    if (const auto instance = Instance::find(npp)) {
        instance->unscheduleTimer(timer);
    }
}

// Painting and input: the picture is the platform's, and the page has the keys.

void invalidateRect(NPP, NPRect*) {}

void invalidateRegion(NPP, NPRegion) {}

void forceRedraw(NPP) {}

void pushPopupsEnabledState(NPP, NPBool) {}

void popPopupsEnabledState(NPP) {}

NPError popUpContextMenu(NPP, NPMenu*) {
    return NPERR_GENERIC_ERROR;
}

NPBool convertPoint(NPP, double, double, NPCoordinateSpace, double*, double*, NPCoordinateSpace) {
    return false;
}

NPBool handleEvent(NPP, void*, NPBool) {
    return false;
}

NPBool unfocusInstance(NPP, NPFocusDirection) {
    return false;
}

NPError initAsyncSurface(NPP, NPSize*, NPImageFormat, void*, NPAsyncSurface*) {
    return NPERR_GENERIC_ERROR;
}

NPError finalizeAsyncSurface(NPP, NPAsyncSurface*) {
    return NPERR_GENERIC_ERROR;
}

void setCurrentAsyncSurface(NPP, NPAsyncSurface*, NPRect*) {}

// Identifiers.

NPIdentifier getStringIdentifier(const char* name) {
    return name ? identifierFor(std::string_view(name)) : nullptr;
}

void getStringIdentifiers(const char** names, int32_t count, NPIdentifier* identifiers) {
    for (int32_t i = 0; i < count; i++) {
        identifiers[i] = getStringIdentifier(names[i]);
    }
}

NPIdentifier getIntIdentifier(int32_t value) {
    return identifierFor(value);
}

bool identifierIsString(NPIdentifier identifier) {
    return identifier && identifierOf(identifier).isString;
}

char* utf8FromIdentifier(NPIdentifier identifier) {
    return identifier ? strdup(identifierOf(identifier).text.c_str()) : nullptr;
}

int32_t intFromIdentifier(NPIdentifier identifier) {
    return identifier ? identifierOf(identifier).number : 0;
}

// Objects: each call is one of the object's class, whoever's object it is.

template <typename Function, typename... Values>
bool callClass(Function function, Values... values) {
    const CallDepth depth;
    return function && function(values...);
}

// The same for a call with a result, which is void when there is none.
template <typename Function, typename... Values>
bool callForResult(NPVariant* result, Function function, Values... values) {
    NPVariant value = voidVariant();
    const bool isDone = callClass(function, values..., &value);
    if (result) {
        *result = isDone ? value : voidVariant();
    } else {
        releaseVariant(value);
    }
    return isDone;
}

bool invoke(NPP, NPObject* object, NPIdentifier name, const NPVariant* args, uint32_t count,
            NPVariant* result) {
    return callForResult(result, object && name ? object->_class->invoke : nullptr, object, name, args,
                         count);
}

bool invokeDefault(NPP, NPObject* object, const NPVariant* args, uint32_t count, NPVariant* result) {
    return callForResult(result, object ? object->_class->invokeDefault : nullptr, object, args, count);
}

bool construct(NPP, NPObject* object, const NPVariant* args, uint32_t count, NPVariant* result) {
    return callForResult(result, object ? object->_class->construct : nullptr, object, args, count);
}

// An object of which the result has the only reference ends with the instance.
void noteResult(NPP npp, const NPVariant& value) {
    ScriptObject* const object =
        value.type == NPVariantType_Object ? ScriptObject::from(value.value.objectValue) : nullptr;
    const auto instance = Instance::find(npp);
    if (object && object->engine && object->referenceCount == 1 && instance && instance->page()) {
        object->setEvaluatedFor(instance.get());
    }
}

bool evaluate(NPP npp, NPObject* object, NPString* script, NPVariant* result) {
    if (result) {
        *result = voidVariant();
    }
    const ScriptObject* const scope = object ? ScriptObject::from(object) : nullptr;
    if (!scope || !scope->engine || !script || !script->UTF8Characters) {
        return false;
    }
    const std::string source(script->UTF8Characters, script->UTF8Length);
    NPVariant value = voidVariant();
    const CallDepth depth;
    const bool isDone = scope->engine->evaluate(scope->handle, source, kEvaluatedName, &value);
    if (Page* const page = isDone ? nullptr : pageOf(npp)) {
        page->warn("failed-script", source);
    }
    if (result) {
        noteResult(npp, value);
        *result = value;
    } else {
        releaseVariant(value);
    }
    return isDone;
}

bool getProperty(NPP, NPObject* object, NPIdentifier name, NPVariant* result) {
    return callForResult(result, object && name ? object->_class->getProperty : nullptr, object, name);
}

bool setProperty(NPP, NPObject* object, NPIdentifier name, const NPVariant* value) {
    return callClass(object && name && value ? object->_class->setProperty : nullptr, object, name, value);
}

bool removeProperty(NPP, NPObject* object, NPIdentifier name) {
    return callClass(object && name ? object->_class->removeProperty : nullptr, object, name);
}

bool hasProperty(NPP, NPObject* object, NPIdentifier name) {
    return callClass(object && name ? object->_class->hasProperty : nullptr, object, name);
}

bool hasMethod(NPP, NPObject* object, NPIdentifier name) {
    return callClass(object && name ? object->_class->hasMethod : nullptr, object, name);
}

bool enumerate(NPP, NPObject* object, NPIdentifier** names, uint32_t* count) {
    if (!names || !count) {
        return false;
    }
    *names = nullptr;
    *count = 0;
    return callClass(object ? object->_class->enumerate : nullptr, object, names, count);
}

void setException(NPObject*, const char* message) {
    setPendingException(message);
}

void releaseVariantValue(NPVariant* variant) {
    if (variant) {
        releaseVariant(*variant);
    }
}

} // namespace

NPNetscapeFuncs* browserFunctions() {
    // In the order of the table.
    static NPNetscapeFuncs functions = {sizeof(NPNetscapeFuncs),
                                        (NP_VERSION_MAJOR << 8) | NP_VERSION_MINOR,
                                        getUrl,
                                        postUrl,
                                        requestRead,
                                        newStream,
                                        writeStream,
                                        destroyStream,
                                        status,
                                        userAgent,
                                        memAlloc,
                                        std::free,
                                        memFlush,
                                        reloadPlugins,
                                        getJavaEnv,
                                        getJavaPeer,
                                        getUrlNotify,
                                        postUrlNotify,
                                        getValue,
                                        setValue,
                                        invalidateRect,
                                        invalidateRegion,
                                        forceRedraw,
                                        getStringIdentifier,
                                        getStringIdentifiers,
                                        getIntIdentifier,
                                        identifierIsString,
                                        utf8FromIdentifier,
                                        intFromIdentifier,
                                        createObject,
                                        retainObject,
                                        releaseObject,
                                        invoke,
                                        invokeDefault,
                                        evaluate,
                                        getProperty,
                                        setProperty,
                                        removeProperty,
                                        hasProperty,
                                        hasMethod,
                                        releaseVariantValue,
                                        setException,
                                        pushPopupsEnabledState,
                                        popPopupsEnabledState,
                                        enumerate,
                                        postCall,
                                        construct,
                                        getValueForUrl,
                                        setValueForUrl,
                                        getAuthenticationInfo,
                                        scheduleTimer,
                                        unscheduleTimer,
                                        popUpContextMenu,
                                        convertPoint,
                                        handleEvent,
                                        unfocusInstance,
                                        urlRedirectResponse,
                                        initAsyncSurface,
                                        finalizeAsyncSurface,
                                        setCurrentAsyncSurface};
    return &functions;
}

} // namespace bridge
