// A page that embeds an object of every kind at once, reads every property and calls every method, on a set
// without the platform library: no fault, and no output but the loader's. The walk finds the objects and
// their names by itself; what it asks for is a row for each method.
#include <gmock/gmock.h>

#include <map>
#include <set>

#include "common/ObjectKind.h"
#include "common/ScriptReferences.h"
#include "src/avcomponent/JSAVcomponent.h"
#include "tests/loader/LoaderOutput.h"
#include "tests/support/ScriptedBrowser.h"

using ::testing::AllOf;
using ::testing::Each;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Not;

namespace {

struct MethodRow {
    Values arguments;
    bool succeeds = true;
};

// Reads and calls everything on an object, and on the objects that come of it.
class Walk {
public:
    Walk(ScriptedBrowser& page, std::map<std::string, MethodRow> methods)
        : m_browser(page), m_methods(std::move(methods)) {}

    void through(const ObjectRef& object, const std::string& route) {
        learnNames();
        const std::string className = m_browser.classNameOf(object.object());
        m_classes.insert(className);
        for (const std::string& name : m_names[className]) {
            const std::string place = className + "." + name;
            SCOPED_TRACE(route + ", " + place);
            EXPECT_NE(object.hasProperty(name), object.hasMethod(name));
            if (object.hasProperty(name)) {
                const Outcome outcome = object.get(name);
                EXPECT_TRUE(outcome.succeeded);
                follow(outcome.value, place);
            } else if (m_methods.count(place) == 0) {
                ADD_FAILURE() << "No row for this method.";
            } else {
                const MethodRow& row = m_methods[place];
                m_called.insert(place);
                const Outcome outcome = object.callWith(name, row.arguments);
                EXPECT_EQ(outcome.succeeded, row.succeeds);
                follow(outcome.value, place);
            }
            m_browser.pump();
        }
    }

    const std::set<std::string>& classes() const { return m_classes; }
    size_t called() const { return m_called.size(); }

private:
    // One object of each way to it: applications make applications without end.
    void follow(const Value& value, const std::string& place) {
        if (value.isObject() && m_routes.insert(place).second) {
            through(value.object(), place);
        }
    }

    // The names of a class are those that each of its objects fetches when it is made.
    void learnNames() {
        const std::string creation = "NPN_CreateObject ";
        const std::string fetch = "NPN_GetStringIdentifier \"";
        std::vector<std::string>* names = nullptr;
        for (const std::string& entry : m_browser.log().everything()) {
            if (entry.rfind(creation, 0) == 0) {
                const std::string object = entry.substr(creation.size());
                names = &m_names[object.substr(0, object.find('#'))];
                names->clear();
            } else if (names && entry.rfind(fetch, 0) == 0) {
                names->push_back(entry.substr(fetch.size(), entry.size() - fetch.size() - 1));
            } else {
                names = nullptr;
            }
        }
        m_browser.log().clear();
    }

    ScriptedBrowser& m_browser;
    std::map<std::string, MethodRow> m_methods;
    std::map<std::string, std::vector<std::string>> m_names; // by class
    std::set<std::string> m_classes;
    std::set<std::string> m_called;
    std::set<std::string> m_routes;
};

// 0 for an instance without a model.
std::vector<unsigned short> kindsOf(const std::vector<EmbeddedObject>& objects) {
    std::vector<unsigned short> kinds;
    for (const EmbeddedObject& object : objects) {
        const auto* model = static_cast<const PluginBase*>(object.model());
        kinds.push_back(model ? model->getObjectId() : static_cast<unsigned short>(0));
    }
    return kinds;
}

// One object of each kind.
std::vector<EmbeddedObject> embedAll(ScriptedBrowser& browser) {
    std::vector<EmbeddedObject> objects;
    for (const ObjectKind* const* kind = kObjectKinds; *kind; ++kind) {
        const std::string type = (*kind)->mimeTypes[0];
        const Attributes attributes{{"id", "object" + std::to_string((*kind)->id)},
                                    {"data", "http://media.example/a"}};
        EmbeddedObject object = browser.embed(type, attributes);
        if ((*kind)->id == 300) {
            // An A/V control object needs a player; the one of a page of its own does without.
            EXPECT_EQ(object.error(), NPERR_GENERIC_ERROR);
            EXPECT_EQ(object.model(), nullptr);
            object = browser.embed(type, attributes, NP_FULL);
        }
        objects.push_back(object);
    }
    return objects;
}

// The arguments with which each method of the objects is called.
std::map<std::string, MethodRow> methodRows(ScriptedBrowser& browser, NPP npp) {
    // No set, no components: one is made for the calls.
    const Value component = ObjectRef::adopt(createScriptObject<JSAVcomponent>(npp));
    const Value listener = browser.function("listener");
    return {
        {"JSApplicationManager.getOwnerApplication", {{browser.document()}}},
        {"JSApplication.createApplication", {{"http://page.example/", true}}},
        {"JSApplication.destroyApplication", {}},
        {"JSApplication.show", {}},
        {"JSApplication.hide", {}},
        {"JSApplicationPrivateData.getFreeMem", {}},
        {"JSKeySet.setValue", {{0x1F}}},
        {"JSAVControl.play", {{1}}},
        {"JSAVControl.seek", {{1000}}},
        {"JSAVControl.stop", {}},
        {"JSAVControl.next", {}},
        {"JSAVControl.previous", {}},
        {"JSAVControl.getComponents", {{0}}},
        {"JSAVControl.getCurrentActiveComponents", {{0}}},
        {"JSAVControl.selectComponent", {{component}}},
        {"JSAVControl.unselectComponent", {{component}}},
        {"JSAVControl.setVolume", {{50}}},
        {"JSAVControl.setFullScreen", {{true}}},
        {"JSAVControl.queue", {{"http://media.example/b"}}},
        {"JSVideoBroadcast.getChannelConfig", {}},
        {"JSVideoBroadcast.setChannelByTriplet", {{1, 2, 3}}},
        {"JSVideoBroadcast.bindToCurrentChannel", {}},
        {"JSVideoBroadcast.setChannel", {{nullptr}}},
        {"JSVideoBroadcast.prevChannel", {}},
        {"JSVideoBroadcast.nextChannel", {}},
        {"JSVideoBroadcast.setFullScreen", {{true}}},
        {"JSVideoBroadcast.release", {}},
        {"JSVideoBroadcast.addCarouselListener", {{"a", listener, "b"}, false}},
        {"JSVideoBroadcast.addStreamEventListener", {{"http://page.example/events", "name", listener}}},
        {"JSVideoBroadcast.removeStreamEventListener", {{"http://page.example/events", "name", listener}}},
        {"JSVideoBroadcast.selectComponent", {{component}}},
        {"JSVideoBroadcast.unselectComponent", {{component}}},
        {"JSVideoBroadcast.createChannelObject", {{11, 1, 2, 3}}},
        {"JSVideoBroadcast.getComponents", {{0}}},
        {"JSVideoBroadcast.getCurrentActiveComponents", {{0}}},
        {"JSVideoBroadcast.stop", {}},
        {"JSCapabilities.hasCapability", {{"OITF_HD_UIPROF"}}},
        {"JSDRMAgent.sendDRMMessage", {{"type", "message", "system"}}},
    };
}

void usePage(ScriptedBrowser& browser) {
    const std::vector<EmbeddedObject> objects = embedAll(browser);
    EXPECT_THAT(kindsOf(objects), ElementsAre(200, 300, 400, 500, 600, 700, 800));

    const std::map<std::string, MethodRow> methods = methodRows(browser, objects[0].npp());
    Walk walk(browser, methods);
    for (const EmbeddedObject& object : objects) {
        ASSERT_TRUE(object.scriptObject());
        walk.through(object.scriptObject(), "the page");
    }
    for (const EmbeddedObject& object : objects) {
        EXPECT_EQ(object.destroy(), NPERR_NO_ERROR);
    }
    browser.pump();
    // The lists are not among these: without a platform there are none. Each row has been needed.
    EXPECT_THAT(walk.classes(),
                ElementsAre("JSAVControl", "JSApplication", "JSApplicationManager",
                            "JSApplicationPrivateData", "JSCapabilities", "JSChannelConfig",
                            "JSConfiguration", "JSDRMAgent", "JSKeySet", "JSOipfConfiguration",
                            "JSParentalControlManager", "JSVideoBroadcast"));
    EXPECT_EQ(walk.called(), methods.size());
}

TEST(AllObjects, LiveSideBySideWithoutThePlatformLibrary) {
    ScriptedBrowser browser;
    ASSERT_EQ(browser.initialize(), NPERR_NO_ERROR);
    browser.whenEvaluatingTextFrom("window.createHbbTVApplication").gives(true);
    std::string printed;
    std::vector<std::string> warnings;
    {
        LoaderOutput output;
        usePage(browser);
        printed = output.printed();
        warnings = output.warnings();
    }
    EXPECT_THAT(
        warnings,
        AllOf(Not(IsEmpty()),
              Each("Library:: libtelix.so, not found in the path " TELIX_TEST_LIBRARY_DIRECTORY " .\n")));
    // Failures inside are printed too, and shown by this.
    for (size_t at = 0; (at = printed.find(kLoadLine)) != std::string::npos;) {
        printed.erase(at, std::string(kLoadLine).size());
    }
    EXPECT_EQ(printed, "");
}

} // namespace
