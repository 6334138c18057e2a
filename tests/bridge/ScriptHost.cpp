// A JavaScript context without a browser, with a page of the bridge and the test plug-in in it.
#include "tests/bridge/ScriptHost.h"

#include <chrono>

#include <glib.h>
#include <jsc/jsc.h>

#include "bridge/GObjectEngine.h"
#include "bridge/Identifiers.h"
#include "bridge/JscApiEngine.h"

extern "C" {
NPError NP_Initialize(NPNetscapeFuncs* browser, NPPluginFuncs* plugin);
NPError NP_Shutdown();
const char* NP_GetMIMEDescription();
NPError NP_GetValue(void* future, NPPVariable variable, void* value);
// Of the engine, for its own tests: collects at once, and everything.
JS_EXPORT void JSSynchronousGarbageCollectForDebugging(JSContextRef context);
}

namespace {

constexpr auto kPatience = std::chrono::seconds(20);

std::string quoted(const std::string& text) {
    std::string literal = "`";
    for (const char character : text) {
        literal += character == '`' || character == '\\' || character == '$' ? "\\" : "";
        literal += character;
    }
    return literal + '`';
}

// A program whose value is that of the source as text.
std::string programOf(const std::string& source) {
    return "(function () { try { return String((0, eval)(" + quoted(source) +
           ")); } catch (error) { return 'threw ' + (error.message === undefined ? "
           "error : error.message); } }())";
}

} // namespace

std::string nameOf(const testing::TestParamInfo<EngineKind>& kind) {
    return kind.param == EngineKind::CApi ? "CApi" : "GObject";
}

// One of the two is null.
struct ScriptHost::Context {
    explicit Context(EngineKind kind)
        : cApi(kind == EngineKind::CApi ? JSGlobalContextCreate(nullptr) : nullptr),
          gobject(kind == EngineKind::GObject ? jsc_context_new() : nullptr) {}
    // That of another frame of the page.
    explicit Context(const Context* frame) {
        if (frame->cApi) {
            cApi = JSGlobalContextCreateInGroup(JSContextGetGroup(frame->cApi), nullptr);
        } else {
            gobject = jsc_context_new_with_virtual_machine(jsc_context_get_virtual_machine(frame->gobject));
        }
    }
    Context(const Context&) = delete;
    Context& operator=(const Context&) = delete;
    ~Context() {
        if (cApi) {
            JSGlobalContextRelease(cApi);
        }
        g_clear_object(&gobject);
    }

    // The value of a program, which is a string.
    std::string run(const std::string& program) const {
        if (gobject) {
            g_autoptr(JSCValue) value = jsc_context_evaluate(gobject, program.c_str(), -1);
            g_autofree gchar* text = jsc_value_to_string(value);
            return text;
        }
        const JSStringRef source = JSStringCreateWithUTF8CString(program.c_str());
        const JSStringRef text =
            JSValueToStringCopy(cApi, JSEvaluateScript(cApi, source, nullptr, nullptr, 1, nullptr), nullptr);
        JSStringRelease(source);
        std::string result(JSStringGetMaximumUTF8CStringSize(text), '\0');
        result.resize(JSStringGetUTF8CString(text, result.data(), result.size()) - 1);
        JSStringRelease(text);
        return result;
    }

    // Takes over a global variable of another frame.
    void take(const char* name, const Context& frame) const {
        if (gobject) {
            g_autoptr(JSCValue) value = jsc_context_get_value(frame.gobject, name);
            jsc_context_set_value(gobject, name, value);
            return;
        }
        const JSStringRef property = JSStringCreateWithUTF8CString(name);
        const JSValueRef value =
            JSObjectGetProperty(frame.cApi, JSContextGetGlobalObject(frame.cApi), property, nullptr);
        JSObjectSetProperty(cApi, JSContextGetGlobalObject(cApi), property, value, kJSPropertyAttributeNone,
                            nullptr);
        JSStringRelease(property);
    }

    JSGlobalContextRef cApi = nullptr;
    JSCContext* gobject = nullptr;
};

ScriptHost::ScriptHost() : m_context(std::make_unique<Context>(GetParam())) {
    std::string error;
    plugin =
        bridge::Plugin::initialize({NP_Initialize, NP_Shutdown, NP_GetMIMEDescription, NP_GetValue}, error);
    page = bridge::Page::create(
        *plugin, "", [this](bridge::ScriptEngine::Client& client) -> std::unique_ptr<bridge::ScriptEngine> {
            if (m_context->cApi) {
                return std::make_unique<bridge::JscApiEngine>(m_context->cApi, client);
            }
            return std::make_unique<bridge::GObjectEngine>(m_context->gobject, client);
        });
}

ScriptHost::~ScriptHost() {
    if (page) {
        endPage();
    }
    runMainLoop();
    plugin = nullptr;
}

void ScriptHost::endPage() {
    page->end();
    runMainLoop();
    page = nullptr;
    runMainLoop();
}

void ScriptHost::runMainLoop() {
    while (g_main_context_iteration(nullptr, false)) {
    }
}

bool ScriptHost::runUntil(const std::function<bool()>& condition) {
    const auto end = std::chrono::steady_clock::now() + kPatience;
    while (!condition()) {
        if (std::chrono::steady_clock::now() > end) {
            return false;
        }
        g_usleep(1000);
        runMainLoop();
    }
    return true;
}

std::string ScriptHost::script(const std::string& source) {
    bridge::OwnedVariant result;
    page->engine().evaluate(page->engine().globalObject(), programOf(source), "test", &result);
    return std::string(bridge::textOf(result.get()));
}

std::string ScriptHost::scriptOfAnotherFrame(const std::string& source) {
    if (!m_otherFrame) {
        m_otherFrame = std::make_unique<Context>(m_context.get());
        m_otherFrame->take("plugin", *m_context);
    }
    return m_otherFrame->run(programOf(source));
}

uint32_t ScriptHost::addInstance(const std::string& variable,
                                 const std::vector<bridge::Instance::Parameter>& parameters) {
    bridge::OwnedVariant element;
    page->engine().evaluate(page->engine().globalObject(), "({ isElement: true })", "test", &element);
    const uint32_t number =
        page->createInstance(bridge::objectOf(element.get()), "application/x-telix-test", parameters);
    if (const auto instance = page->instance(number)) {
        const bridge::OwnedVariant object(bridge::objectVariant(instance->scriptableObject()));
        const bridge::OwnedVariant window(bridge::objectVariant(page->window()));
        browser.setproperty(instance->npp(), bridge::objectOf(window.get()),
                            browser.getstringidentifier(variable.c_str()), &object.get());
    }
    return number;
}

bool ScriptHost::collectUntil(const std::function<bool()>& condition) {
    // What the stack happens to hold is not collected, so that a part of the objects may need another stack.
    return runUntil([&] {
        if (m_context->cApi) {
            JSSynchronousGarbageCollectForDebugging(m_context->cApi);
        } else {
            // The engine collects all generations when what it keeps has grown.
            script("if (!globalThis.kept || kept.length > 40) { globalThis.kept = []; }"
                   "kept.push(Array.from({ length: 100000 }, function () { return {}; })); 0");
        }
        runMainLoop();
        return condition();
    });
}

bridge::OwnedVariant ScriptHost::evaluated(const std::string& source) {
    NPVariant value = bridge::voidVariant();
    page->engine().evaluate(page->engine().globalObject(), source, "test", &value);
    return bridge::OwnedVariant(value);
}
