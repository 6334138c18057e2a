// One document with its instances of the plug-in.
#include "bridge/Page.h"

#include <utility>

#include <glib.h>

#include "bridge/CallDepth.h"
#include "bridge/HostObject.h"
#include "bridge/Identifiers.h"
#include "bridge/PageScript.h"
#include "bridge/Plugin.h"

namespace bridge {

namespace {

// The host object belongs to no instance of the plug-in, but to a record like one.
const NPPluginFuncs kNoCalls = {};

// How the page script is named in messages of the console.
constexpr char kScriptName[] = "telix-webkit-bridge:page.js";

} // namespace

std::shared_ptr<Page> Page::create(Plugin& plugin, const std::string& idPrefix,
                                   const MakeEngine& makeEngine) {
    std::shared_ptr<Page> page(new Page(plugin, idPrefix));
    page->m_engine = makeEngine(*page);
    page->m_scriptObjects = std::make_unique<ScriptObjects>(*page->m_engine);
    page->m_host = std::make_shared<Instance>(*page, kNoCalls, nullptr);
    return page;
}

Page::~Page() {
    close();
}

bool Page::start() {
    OwnedVariant script;
    if (!m_engine->evaluate(m_engine->globalObject(), kPageScript, kScriptName, &script)) {
        return false;
    }
    NPObject* const function = objectOf(script.get());
    if (!function) {
        return false;
    }
    // What the script has to know of the plug-in follows the host object, three arguments for each type.
    std::vector<std::string_view> texts = {m_plugin.name(), m_plugin.description(), m_plugin.fileName(),
                                           m_idPrefix};
    for (const MimeType& type : m_plugin.mimeTypes()) {
        texts.insert(texts.end(), {type.type, type.suffixes, type.description});
    }
    Arguments arguments(static_cast<uint32_t>(1 + texts.size()));
    arguments[0] = objectVariant(createHostObject(*this, m_host->npp()));
    for (uint32_t i = 0; i < texts.size(); i++) {
        arguments[i + 1] = stringVariant(texts[i]);
    }
    OwnedVariant result;
    return function->_class->invokeDefault(function, arguments.data(), arguments.count(), &result);
}

NPObject* Page::window() {
    return retainedObjectFor(m_engine->globalObject());
}

NPObject* Page::retainedObjectFor(ScriptHandle object) {
    return m_hasEnded ? nullptr : m_scriptObjects->retained(object);
}

uint32_t Page::createInstance(NPObject* element, const std::string& mimeType,
                              const std::vector<Instance::Parameter>& parameters) {
    if (m_hasEnded) {
        return 0;
    }
    const auto instance = std::make_shared<Instance>(*this, m_plugin.calls(), element);
    const uint32_t number = ++m_lastNumber;
    m_instances.emplace(number, instance);
    if (!instance->start(mimeType, parameters)) {
        endInstance(number);
        return 0;
    }
    return number;
}

std::shared_ptr<Instance> Page::instance(uint32_t number) const {
    const auto found = m_instances.find(number);
    return found == m_instances.end() ? nullptr : found->second;
}

void Page::endInstance(uint32_t number) {
    auto node = m_instances.extract(number);
    if (node.empty()) {
        return;
    }
    const std::shared_ptr<Instance> instance = node.mapped();
    if (CallDepth::isPluginOnStack()) {
        instance->disconnect();
        runWithoutPlugin([instance] { instance->end(); });
    } else {
        instance->end();
    }
}

void Page::attachScript(NPObject* functions) {
    releaseObject(std::exchange(m_script, retainObject(functions)));
}

bool Page::callScript(const char* function, const Arguments& arguments) {
    OwnedVariant result;
    return callScript(function, arguments, &result);
}

bool Page::callScript(const char* function, const Arguments& arguments, NPVariant* result) {
    return m_script && m_script->_class->invoke(m_script, identifierFor(std::string_view(function)),
                                                arguments.data(), arguments.count(), result);
}

void Page::warn(const char* what, const std::string& subject) {
    Arguments arguments(2);
    arguments[0] = stringVariant(what);
    arguments[1] = stringVariant(subject);
    callScript("warn", arguments);
}

void Page::endInstances() {
    while (!m_instances.empty()) {
        endInstance(m_instances.begin()->first);
    }
}

void Page::end() {
    if (std::exchange(m_hasEnded, true)) {
        return;
    }
    endInstances();
    m_scriptObjects->end();
    runWithoutPlugin([page = shared_from_this()] { page->close(); });
}

// Ends what script may still have been using when end() was called.
void Page::close() {
    endInstances();
    if (m_host) {
        std::exchange(m_host, nullptr)->end();
    }
    releaseObject(std::exchange(m_script, nullptr));
    m_scriptObjects->end();
    m_engine->close();
}

namespace {

// After how many milliseconds a main loop within a call of the plug-in tries again.
constexpr unsigned kRetryInterval = 10;

gboolean runOrRetry(gpointer data) {
    std::unique_ptr<std::function<void()>> function(static_cast<std::function<void()>*>(data));
    if (CallDepth::isPluginOnStack()) {
        g_timeout_add(kRetryInterval, runOrRetry, function.release());
    } else {
        (*function)();
    }
    return G_SOURCE_REMOVE;
}

} // namespace

void runWithoutPlugin(std::function<void()> function) {
    g_idle_add_full(G_PRIORITY_DEFAULT, runOrRetry, new std::function<void()>(std::move(function)), nullptr);
}

} // namespace bridge
