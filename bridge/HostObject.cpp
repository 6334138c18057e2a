// The object by which the page script calls its page.
#include "bridge/HostObject.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include "bridge/CallDepth.h"
#include "bridge/Identifiers.h"
#include "bridge/Objects.h"
#include "bridge/Page.h"
#include "bridge/Text.h"
#include "bridge/Variants.h"

namespace bridge {

namespace {

// How the program of a javascript: URL is named in messages of the console.
constexpr char kScriptUrlName[] = "javascript:";

struct HostObject : NPObject {
    Page* page;
};

// The arguments of a call. Those that are not there are void, which reads as empty, zero and null.
class Parameters {
public:
    Parameters(const NPVariant* args, uint32_t count) : m_args(args), m_count(count) {}

    uint32_t count() const { return m_count; }
    std::string text(uint32_t index) const {
        return std::string(index < m_count ? textOf(m_args[index]) : "");
    }
    double number(uint32_t index) const { return index < m_count ? numberOf(m_args[index]) : 0; }
    uint32_t natural(uint32_t index) const { return static_cast<uint32_t>(within(index, 0, UINT32_MAX)); }
    // The same, but 0 for a number that is too large.
    uint32_t naturalOrUnknown(uint32_t index) const {
        return number(index) <= UINT32_MAX ? natural(index) : 0;
    }
    // Half the range, so that the difference of two of them is an integer, too.
    int integer(uint32_t index) const {
        return static_cast<int>(within(index, INT32_MIN / 2, INT32_MAX / 2));
    }
    NPVariant value(uint32_t index) const { return index < m_count ? m_args[index] : voidVariant(); }
    NPObject* object(uint32_t index) const { return index < m_count ? objectOf(m_args[index]) : nullptr; }

private:
    double within(uint32_t index, double least, double most) const {
        const double value = number(index);
        return std::isnan(value) ? 0 : std::clamp(value, least, most);
    }

    const NPVariant* m_args;
    uint32_t m_count;
};

// attach(functions): what the page calls, see Page::callScript().
NPVariant attach(Page& page, const Parameters& parameters) {
    page.attachScript(parameters.object(0));
    return voidVariant();
}

// create(element, type, name, value, name, value...): the number of the new instance, 0 when there is none.
NPVariant create(Page& page, const Parameters& parameters) {
    std::vector<Instance::Parameter> attributes;
    for (uint32_t i = 2; i + 1 < parameters.count(); i += 2) {
        attributes.emplace_back(parameters.text(i), parameters.text(i + 1));
    }
    return doubleVariant(page.createInstance(parameters.object(0), parameters.text(1), attributes));
}

// object(instance): its script object, or null.
NPVariant object(Page& page, const Parameters& parameters) {
    const auto instance = page.instance(parameters.natural(0));
    return objectVariant(instance ? instance->scriptableObject() : nullptr);
}

// write(object, name, value): whether the plug-in's object has that name, and has got the value.
NPVariant write(Page&, const Parameters& parameters) {
    NPObject* const object = parameters.object(0);
    if (!object || ScriptObject::from(object)) {
        return boolVariant(false);
    }
    const NPIdentifier name = identifierOfScriptName(parameters.text(1));
    switch (PluginObject::of(object).write(name, parameters.value(2))) {
    case PluginObject::Write::Done:
        return boolVariant(true);
    case PluginObject::Write::Failed:
        setPendingException(PluginObject::takeError().c_str());
        return voidVariant();
    default:
        return boolVariant(false);
    }
}

// place(instance, x, y, width, height, clip left, clip top, clip right, clip bottom)
NPVariant place(Page& page, const Parameters& parameters) {
    if (const auto instance = page.instance(parameters.natural(0))) {
        instance->setWindow({parameters.integer(1), parameters.integer(2), parameters.integer(3),
                             parameters.integer(4), parameters.integer(5), parameters.integer(6),
                             parameters.integer(7), parameters.integer(8)});
    }
    return voidVariant();
}

// open(instance, URL): the stream of the element's own URL.
NPVariant open(Page& page, const Parameters& parameters) {
    if (const auto instance = page.instance(parameters.natural(0))) {
        StreamRequest request;
        request.url = parameters.text(1);
        page.streams().open(*instance, request);
    }
    return voidVariant();
}

// destroy(instance)
NPVariant destroy(Page& page, const Parameters& parameters) {
    page.endInstance(parameters.natural(0));
    return voidVariant();
}

// end(): the document goes for good.
NPVariant end(Page& page, const Parameters&) {
    page.end();
    return voidVariant();
}

// run(source): the value of a program.
NPVariant run(Page& page, const Parameters& parameters) {
    NPVariant result = voidVariant();
    page.engine().evaluate(page.engine().globalObject(), parameters.text(0), kScriptUrlName, &result);
    return result;
}

// response(stream, URL, type, headers, length, modified)
NPVariant response(Page& page, const Parameters& parameters) {
    page.streams().onResponse(parameters.natural(0),
                              {parameters.text(1), parameters.text(2), parameters.text(3),
                               parameters.naturalOrUnknown(4), parameters.naturalOrUnknown(5)});
    return voidVariant();
}

// data(stream, bytes)
NPVariant data(Page& page, const Parameters& parameters) {
    page.streams().onData(parameters.natural(0), bytesFromText(parameters.text(1)));
    return voidVariant();
}

// done(stream, reason)
NPVariant done(Page& page, const Parameters& parameters) {
    page.streams().onEnd(parameters.natural(0), static_cast<NPReason>(parameters.integer(1)));
    return voidVariant();
}

struct Method {
    const char* name;
    NPVariant (*run)(Page& page, const Parameters& parameters);
};

constexpr Method kMethods[] = {
    {"attach", attach}, {"create", create},   {"object", object}, {"place", place},
    {"open", open},     {"destroy", destroy}, {"end", end},       {"response", response},
    {"data", data},     {"done", done},       {"run", run},       {"write", write},
};

const Method* findMethod(NPIdentifier name) {
    const std::string& text = identifierOf(name).text;
    const auto* const found = std::find_if(std::begin(kMethods), std::end(kMethods),
                                           [&text](const Method& method) { return text == method.name; });
    return found == std::end(kMethods) ? nullptr : found;
}

NPClass kHostClass = {
    NP_CLASS_STRUCT_VERSION,
    [](NPP, NPClass*) -> NPObject* { return new HostObject{}; },
    [](NPObject* object) { delete static_cast<HostObject*>(object); },
    nullptr,
    [](NPObject*, NPIdentifier name) { return findMethod(name) != nullptr; },
    [](NPObject* object, NPIdentifier name, const NPVariant* args, uint32_t count, NPVariant* result) {
        const Method* const method = findMethod(name);
        if (!method) {
            return false;
        }
        const CallDepth::Own own;
        *result = method->run(*static_cast<HostObject*>(object)->page, Parameters(args, count));
        return true;
    },
    nullptr,
    nullptr,
    nullptr,
    nullptr,
    nullptr,
    nullptr,
    nullptr};

} // namespace

NPObject* createHostObject(Page& page, NPP instance) {
    NPObject* const object = createObject(instance, &kHostClass);
    static_cast<HostObject*>(object)->page = &page;
    return object;
}

std::string textFromBytes(std::string_view bytes) {
    std::u16string text;
    text.reserve(bytes.size());
    for (const char byte : bytes) {
        text += static_cast<char16_t>(static_cast<unsigned char>(byte));
    }
    return utf8From(text);
}

std::string bytesFromText(std::string_view text) {
    std::string bytes;
    for (const char16_t character : utf16From(text)) {
        bytes += static_cast<char>(character & 0xFF);
    }
    return bytes;
}

} // namespace bridge
