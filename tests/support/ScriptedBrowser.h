// The browser of the unit tests: the browser side of the plug-in interface around a page that tests script.
// It keeps the accounts of references and memory, fails the test on any use of a dead object, release of a
// reference that isn't the plug-in's and call from a wrong thread, and logs what crosses the border.
//
// Of the language it knows only that a text with an unterminated string literal doesn't run; what a script
// does is what the test says with whenEvaluating(), and scripts that dispatch DOM events do.
#ifndef TELIX_TESTS_SUPPORT_SCRIPTEDBROWSER_H
#define TELIX_TESTS_SUPPORT_SCRIPTEDBROWSER_H

#include <chrono>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "npapi/npfunctions.h"
#include "tests/support/BorderLog.h"
#include "tests/support/EmbeddedObject.h"
#include "tests/support/PageObjects.h"
#include "tests/support/Value.h"

// A DOM event that a script dispatched at an element.
struct DomEvent {
    std::string type;
    std::string elementId;
    bool bubbles = false;
    bool cancelable = false;
    std::map<std::string, std::string> fields; // of a stream event: name, data, text, status
};
bool operator==(const DomEvent& left, const DomEvent& right);
std::ostream& operator<<(std::ostream& stream, const DomEvent& event);

// A text that the plug-in has evaluated.
struct Evaluation {
    std::string text;
    ObjectRef scope;
};

// What the page does with certain scripts.
class EvaluationRule {
public:
    using Body = std::function<std::optional<Value>(const Evaluation&)>;
    // The text runs with this value, throws, or does what the function does.
    void gives(const Value& value);
    void throws();
    void does(Body body) { m_body = std::move(body); }

private:
    friend class ScriptedBrowser;
    std::function<bool(const Evaluation&)> m_matches;
    Body m_body;
};

// One live object of the page or the plug-in.
struct LiveObject {
    NPObject* object;
    std::string name;      // as in the log, such as "JSChannel#2"
    std::string className; // the same without the number
    int references;
    int pluginReferences; // those not of the page
};

class ScriptedBrowser {
public:
    ScriptedBrowser();
    ~ScriptedBrowser();
    ScriptedBrowser(const ScriptedBrowser&) = delete;
    ScriptedBrowser& operator=(const ScriptedBrowser&) = delete;

    // The one browser of the running test. Objects and values of the page need it.
    static ScriptedBrowser& current();
    static bool exists();

    BorderLog& log() { return m_log; }

    // NP_Initialize with both tables, and NP_Shutdown.
    NPError initialize();
    NPError shutdown();
    NPNetscapeFuncs& table() { return m_table; }
    NPPluginFuncs& plugin() { return m_plugin; }

    // NPP_New for an element with these attributes. Its id, if it has one, is in the attributes.
    EmbeddedObject embed(const std::string& mimeType, const Attributes& attributes = {},
                         uint16_t mode = NP_EMBED);

    // The page.
    ScriptObject window() const { return m_window; }
    ScriptObject document() const { return m_document; }
    ScriptFunction function(const std::string& name) const { return ScriptFunction::make(name); }
    ScriptObject scriptObject(const std::string& name) const { return ScriptObject::make(name); }
    std::string address() const { return m_address; }
    void setAddress(const std::string& address) { m_address = address; }

    // Says what the page does with a script; the last rule that matches counts. Other scripts run and give
    // undefined, but for the page's URL and the dispatch of DOM events.
    EvaluationRule& whenEvaluating(const std::string& text);
    EvaluationRule& whenEvaluatingTextFrom(const std::string& prefix);
    EvaluationRule& whenEvaluatingIf(std::function<bool(const Evaluation&)> matches);
    // Every text that was evaluated so far, in order.
    std::vector<std::string> scripts() const { return m_scripts; }
    // The last of them; the test fails if there was none.
    std::string lastScript() const;

    // DOM events dispatched so far, and what the page does at the moment of one.
    std::vector<DomEvent> events() const { return m_events; }
    std::vector<std::string> eventTypes() const;
    void onEvent(const std::string& type, std::function<void(const DomEvent&)> listener);

    // What the page does whenever the plug-in runs script of it or touches one of its objects, before
    // anything else; not while it is doing just that. Null for nothing.
    void onEnteringPage(std::function<void()> action) { m_onEnteringPage = std::move(action); }
    // NPP_Destroy for every element that is left. The page keeps its references.
    void removeElements();

    // Has the browser refuse calls of an entry ("NPN_MemAlloc"): the first `after` calls pass, the next
    // `times` fail.
    void refuse(const std::string& entry, unsigned times = ~0U, unsigned after = 0);
    void permit(const std::string& entry) { m_refusals.erase(entry); }

    // Runs the GLib default context and the plug-in's asynchronous calls until nothing is pending.
    void pump();
    // The same until the condition holds, timers included. The test fails if it doesn't within the bound.
    bool pumpUntil(const std::function<bool()>& condition,
                   std::chrono::milliseconds bound = std::chrono::seconds(10));
    size_t pendingAsyncCalls() const;

    // Accounts, oldest object first.
    std::vector<LiveObject> liveObjects() const;
    std::string report() const;
    size_t liveCount(const std::string& className) const;
    size_t memoryBlocks() const { return m_blocks.size(); }

    // Destroys the instances that are left and drops every reference of the page, those in the test's own
    // variables included.
    void closePage();

    // The identifiers of this process; equal names have equal identifiers for good.
    static NPIdentifier identifier(const std::string& name);
    static NPIdentifier identifier(int32_t value);
    static std::string textOf(NPIdentifier identifier);

    // For the values of the page.
    ObjectRef newPageObject(const std::string& name);
    bool pageRetain(NPObject* object);
    void pageRelease(NPObject* object);
    bool pageAdopt(NPObject* object);
    void addPageReference(ObjectRef* reference) { m_pageReferences.insert(reference); }
    void removePageReference(ObjectRef* reference) { m_pageReferences.erase(reference); }
    void giveReference(NPObject* object);
    int pluginReferences(NPObject* object) const;
    std::string nameOf(NPObject* object) const;
    std::string classNameOf(NPObject* object) const;
    void* newBlock(size_t size);
    char* newBlockOf(const std::string& text);
    void freeBlock(void* block);
    bool isBrowserMemory(const void* block) const { return m_blocks.count(block) > 0; }

private:
    friend struct BrowserTable;

    struct Account {
        std::string name;
        std::string className;
        unsigned serial;
        int pageReferences;
    };
    struct Refusal {
        unsigned after;
        unsigned times;
    };
    struct AsyncCall {
        void (*function)(void*);
        void* data;
    };

    // Logs a call of the table and returns whether it may go on: on the browser thread, and not to be
    // refused.
    template <class Text>
    bool enter(const char* entry, Text text);
    bool enter(const char* entry);
    bool isLive(NPObject* object, const char* entry) const;
    void enterPage();
    Account& account(NPObject* object, const std::string& className);
    void dropReference(NPObject* object);
    bool evaluate(NPObject* scope, const std::string& text, NPVariant* result);
    std::optional<Value> runScript(const Evaluation& evaluation);
    std::optional<Value> dispatchEvent(const std::string& text, bool isStreamEvent);
    EmbeddedObject::Record* recordOf(NPP npp) const;
    bool runAsyncCall();

    BorderLog m_log;
    NPNetscapeFuncs m_table;
    NPPluginFuncs m_plugin{};
    bool m_initialized = false;
    std::thread::id m_thread = std::this_thread::get_id();

    std::map<NPObject*, Account> m_accounts;
    std::set<ObjectRef*> m_pageReferences;
    std::map<std::string, unsigned> m_numbers; // of the names given so far
    unsigned m_serial = 0;
    std::vector<std::unique_ptr<PageObject>> m_deadPageObjects; // kept, so that no address comes again
    std::set<const void*> m_blocks;
    std::map<std::string, Refusal> m_refusals;

    std::vector<std::shared_ptr<EmbeddedObject::Record>> m_instances;
    ScriptObject m_window;
    ScriptObject m_document;
    std::string m_address = "http://page.example/app/index.html";
    std::deque<EvaluationRule> m_rules;
    std::vector<std::string> m_scripts;
    std::vector<DomEvent> m_events;
    std::vector<std::pair<std::string, std::function<void(const DomEvent&)>>> m_listeners;
    std::function<void()> m_onEnteringPage;

    mutable std::mutex m_asyncMutex;
    std::deque<AsyncCall> m_asyncCalls;
};

#endif
