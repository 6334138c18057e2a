// The dispatch of the browser's calls: which kind is made for which type, which calls reach a kind, and how
// an object ends. The kinds here stand for the plug-in's own: one that takes everything and one that takes
// nothing.
#include "common/ObjectKind.h"
#include "common/PluginExports.h"
#include "tests/support/BorderTest.h"

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

// What reached a kind, in order.
std::vector<std::string> g_reached;

// What the kinds answer.
bool g_createsNothing = false;
NPError g_initResult = NPERR_NO_ERROR;
bool g_defersDestruction = false;

std::string textOf(const char* text) {
    return text ? text : "null";
}

class Model final : public PluginBase {
public:
    Model(NPP npp, unsigned short id) : PluginBase(npp, id) {
        g_reached.push_back("created " + std::to_string(id));
    }
    void close() { g_reached.push_back("closed " + std::to_string(getObjectId())); }
    ~Model() { g_reached.push_back("deleted " + std::to_string(getObjectId())); }
    NPObject* getJSObject() override {
        g_reached.push_back("getJSObject " + std::to_string(getObjectId()));
        return nullptr;
    }
};

PluginBase* create(NPP npp, unsigned short id) {
    return g_createsNothing ? nullptr : new Model(npp, id);
}

const char* const kTakingTypes[] = {"test/taking", "test/also-taking", nullptr};
const char* const kPlainTypes[] = {"test/plain", "test/taking", nullptr};
const char* const kSilentTypes[] = {"test/silent", nullptr};

const StreamOperations kStreamOperations = {
    [](PluginBase&, NPMIMEType type, NPStream* stream, NPBool seekable, uint16_t* stype) -> NPError {
        g_reached.push_back("newStream " + textOf(type) + " " + stream->url + " " + std::to_string(seekable));
        *stype = NP_ASFILE;
        return 31;
    },
    [](PluginBase&, NPStream* stream, NPReason reason) -> NPError {
        g_reached.push_back(std::string("destroyStream ") + stream->url + " " + std::to_string(reason));
        return 32;
    },
    [](PluginBase&, NPStream* stream) -> int32_t {
        g_reached.push_back(std::string("writeReady ") + stream->url);
        return 100000;
    },
    [](PluginBase&, NPStream* stream, int32_t offset, int32_t length, void* buffer) -> int32_t {
        g_reached.push_back(std::string("write ") + stream->url + " " + std::to_string(offset) + " " +
                            std::string(static_cast<char*>(buffer), static_cast<size_t>(length)));
        return 100001;
    },
    [](PluginBase&, const char* url, NPReason reason, void* data) {
        g_reached.push_back("urlNotify " + textOf(url) + " " + std::to_string(reason) +
                            (data ? " data" : ""));
    },
};

ObjectKind takingKind() {
    ObjectKind kind{};
    kind.id = 300;
    kind.destroyText = "TAKING_OBJ_ID delete :: %p \n";
    kind.mimeTypes = kTakingTypes;
    kind.create = create;
    kind.dispose = disposeOf<Model>;
    kind.init = [](PluginBase& model, const InstanceArguments& arguments) -> NPError {
        g_reached.push_back("init " + textOf(arguments.mimeType) + " " + std::to_string(arguments.mode) +
                            " " + std::to_string(arguments.argc));
        model.init(arguments.mode, arguments.argc, arguments.argn, arguments.argv);
        return g_initResult;
    };
    kind.deferDestruction = [](PluginBase&) {
        g_reached.push_back("deferDestruction");
        return g_defersDestruction;
    };
    kind.setWindow = [](PluginBase&, const NPWindow* window) -> NPError {
        g_reached.push_back("setWindow " + std::to_string(window->width));
        return 33;
    };
    kind.handleEvent = [](PluginBase&, void* event) -> int16_t {
        g_reached.push_back(event ? "handleEvent" : "handleEvent null");
        return 34;
    };
    kind.streams = &kStreamOperations;
    return kind;
}

ObjectKind plainKind(unsigned short id, const char* const* types, const char* destroyText) {
    ObjectKind kind{};
    kind.id = id;
    kind.destroyText = destroyText;
    kind.mimeTypes = types;
    kind.create = create;
    kind.dispose = disposeOf<Model>;
    return kind;
}

const ObjectKind kTaking = takingKind();
const ObjectKind kPlain = plainKind(500, kPlainTypes, "PLAIN_OBJ_ID delete\n");
const ObjectKind kSilent = plainKind(600, kSilentTypes, nullptr);

} // namespace

const ObjectKind* const kObjectKinds[] = {&kTaking, &kPlain, &kSilent, nullptr};

namespace {

class DispatchTest : public BorderTest {
protected:
    DispatchTest() {
        g_createsNothing = false;
        g_initResult = NPERR_NO_ERROR;
        g_defersDestruction = false;
        g_reached.clear();
    }

    EmbeddedObject embedAndForget(const std::string& type) {
        EmbeddedObject object = browser.embed(type);
        g_reached.clear();
        log.clear();
        return object;
    }
};

TEST_F(DispatchTest, TheFirstKindThatClaimsATypeMakesTheModel) {
    EXPECT_NE(browser.embed("test/taking").model(), nullptr);
    EXPECT_THAT(g_reached, ElementsAre("created 300", "init test/taking 1 0"));
    g_reached.clear();
    browser.embed("TEST/Also-Taking", {{"id", "x"}}, NP_FULL);
    EXPECT_THAT(g_reached, ElementsAre("created 300", "init TEST/Also-Taking 2 1"));
}

TEST_F(DispatchTest, AKindWithoutInitOfItsOwnTakesTheBases) {
    const EmbeddedObject object = browser.embed("test/plain", {{"id", "x"}}, NP_FULL);
    EXPECT_EQ(object.error(), NPERR_NO_ERROR);
    auto* model = static_cast<PluginBase*>(object.model());
    EXPECT_EQ(model->getObjectId(), 500);
    EXPECT_EQ(model->getId(), "x");
    EXPECT_EQ(model->getPluginMode(), NP_FULL);
}

TEST_F(DispatchTest, AFailedInitIsTheResultAndDeletesTheModel) {
    g_initResult = NPERR_OUT_OF_MEMORY_ERROR;
    const EmbeddedObject object = browser.embed("test/taking");
    EXPECT_EQ(object.error(), NPERR_OUT_OF_MEMORY_ERROR);
    EXPECT_EQ(object.model(), nullptr);
    EXPECT_THAT(g_reached, ElementsAre("created 300", "init test/taking 1 0", "closed 300", "deleted 300"));
}

TEST_F(DispatchTest, AFailedInitLeavesTheInstanceAsItWas) {
    int before = 0;
    NPP_t instance{&before, nullptr};
    g_initResult = NPERR_GENERIC_ERROR;
    char type[] = "test/taking";
    EXPECT_EQ(NPP_New(type, &instance, NP_EMBED, 0, nullptr, nullptr, nullptr), NPERR_GENERIC_ERROR);
    EXPECT_EQ(instance.pdata, &before);
}

TEST_F(DispatchTest, AKindThatMakesNothingIsSkippedSilently) {
    g_createsNothing = true;
    const EmbeddedObject object = browser.embed("test/plain");
    EXPECT_EQ(object.error(), NPERR_NO_ERROR);
    EXPECT_EQ(object.model(), nullptr);
}

TEST_F(DispatchTest, EveryKindIsAskedForItsScriptableObject) {
    for (const char* type : {"test/taking", "test/plain", "test/silent"}) {
        const EmbeddedObject object = embedAndForget(type);
        NPObject* scriptable = browser.window().object();
        EXPECT_EQ(NPP_GetValue(object.npp(), NPPVpluginScriptableNPObject, &scriptable), NPERR_NO_ERROR)
            << type;
        EXPECT_EQ(scriptable, nullptr); // what the model gave
        EXPECT_THAT(g_reached, ElementsAre(HasSubstr("getJSObject"))) << type;
    }
}

TEST_F(DispatchTest, AModelOfAnUnknownKindHasNoScriptableObject) {
    Model stranger(nullptr, 999);
    g_reached.clear();
    NPP_t instance{static_cast<PluginBase*>(&stranger), nullptr};
    NPObject* scriptable = nullptr;
    EXPECT_EQ(NPP_GetValue(&instance, NPPVpluginScriptableNPObject, &scriptable), NPERR_GENERIC_ERROR);
    EXPECT_THAT(g_reached, IsEmpty());
    EXPECT_EQ(NPP_Destroy(&instance, nullptr), NPERR_NO_ERROR);
    EXPECT_EQ(instance.pdata, nullptr);
    EXPECT_THAT(g_reached, IsEmpty());
}

TEST_F(DispatchTest, AKindWithStreamsReceivesThem) {
    const EmbeddedObject object = embedAndForget("test/taking");
    BrowserStream& stream = object.newStream("http://a.example/1", "", "video/mp4");
    EXPECT_EQ(stream.error(), 31);
    EXPECT_EQ(stream.mode(), NP_ASFILE);
    EXPECT_EQ(stream.writeReady(), 100000);
    EXPECT_EQ(stream.write("abc"), 100001);
    EXPECT_EQ(stream.write("de"), 100001);
    EXPECT_EQ(stream.destroy(NPRES_USER_BREAK), 32);
    int data = 0;
    object.urlNotify("http://a.example/1", NPRES_NETWORK_ERR, &data);
    EXPECT_THAT(g_reached,
                ElementsAre("newStream video/mp4 http://a.example/1 0", "writeReady http://a.example/1",
                            "write http://a.example/1 0 abc", "write http://a.example/1 3 de",
                            "destroyStream http://a.example/1 2", "urlNotify http://a.example/1 1 data"));
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(DispatchTest, AKindWithoutStreamsRefusesThem) {
    const EmbeddedObject object = embedAndForget("test/plain");
    BrowserStream& stream = object.newStream("http://a.example/1");
    EXPECT_EQ(stream.error(), NPERR_NO_ERROR);
    EXPECT_EQ(stream.writeReady(), 8192);
    EXPECT_EQ(stream.write("abc"), 8192);
    EXPECT_EQ(stream.destroy(NPRES_NETWORK_ERR), NPERR_NO_ERROR);
    object.urlNotify("http://a.example/1", NPRES_NETWORK_ERR);
    EXPECT_THAT(g_reached, IsEmpty());
    EXPECT_THAT(log.everything(), ElementsAre("NPN_DestroyStream \"http://a.example/1\" 0",
                                              "NPN_DestroyStream \"http://a.example/1\" 0"));
}

TEST_F(DispatchTest, AKindWithWindowsReceivesThemButNeverNull) {
    const EmbeddedObject object = embedAndForget("test/taking");
    EXPECT_EQ(object.setWindow(0, 0, 640, 480), 33);
    EXPECT_EQ(object.setNullWindow(), NPERR_NO_ERROR);
    EXPECT_THAT(g_reached, ElementsAre("setWindow 640"));
}

TEST_F(DispatchTest, AKindWithoutWindowsIgnoresThem) {
    const EmbeddedObject object = embedAndForget("test/plain");
    EXPECT_EQ(object.setWindow(0, 0, 640, 480), NPERR_NO_ERROR);
    EXPECT_THAT(g_reached, IsEmpty());
}

TEST_F(DispatchTest, OnlyAKindThatTakesWindowsLogsTheRecord) {
    const EmbeddedObject object = embedAndForget("test/taking");
    EXPECT_THAT(logOf(9, [&] { object.setWindow(0, 0, 640, 480); }),
                AllOf(HasSubstr(" PLUGIN >>> COMMON :: setWindow :: is called. instance: 0x"),
                      HasSubstr(", instance->pdata: 0x"), HasSubstr("setWindow :: NPWindow* Value:( 0x")));
    EXPECT_THAT(logOf(9, [&] { object.setNullWindow(); }), ::testing::Not(HasSubstr("NPWindow* Value")));
}

TEST_F(DispatchTest, EventsReachTheKindThatTakesThem) {
    const EmbeddedObject takes = embedAndForget("test/taking");
    int event = 0;
    EXPECT_EQ(takes.handleEvent(&event), 34);
    EXPECT_EQ(takes.handleEvent(nullptr), 34);
    EXPECT_THAT(g_reached, ElementsAre("handleEvent", "handleEvent null"));
    EXPECT_EQ(embedAndForget("test/plain").handleEvent(&event), 0);
}

TEST_F(DispatchTest, DestroyDeletesTheModelAndClearsTheInstance) {
    const EmbeddedObject object = embedAndForget("test/plain");
    EXPECT_EQ(object.destroy(), NPERR_NO_ERROR);
    EXPECT_THAT(g_reached, ElementsAre("closed 500", "deleted 500"));
    EXPECT_EQ(object.model(), nullptr);
}

TEST_F(DispatchTest, AKindMaySeeToItsOwnEnd) {
    const EmbeddedObject object = embedAndForget("test/taking");
    auto* model = static_cast<Model*>(static_cast<PluginBase*>(object.model()));
    g_defersDestruction = true;
    EXPECT_EQ(object.destroy(), NPERR_NO_ERROR);
    EXPECT_EQ(object.model(), nullptr);
    EXPECT_THAT(g_reached, ElementsAre("deferDestruction"));
    delete model;
}

TEST_F(DispatchTest, AKindThatDeclinesToDeferIsDeletedAtOnce) {
    const EmbeddedObject object = embedAndForget("test/taking");
    object.destroy();
    EXPECT_THAT(g_reached, ElementsAre("deferDestruction", "closed 300", "deleted 300"));
}

TEST_F(DispatchTest, EachKindHasItsOwnLineInTheLogOrNone) {
    EXPECT_THAT(logOf(9, [this] { browser.embed("test/taking").destroy(); }),
                HasSubstr(" PLUGIN >>> COMMON :: destroyInst :: TAKING_OBJ_ID delete :: 0x"));
    EXPECT_THAT(logOf(9, [this] { browser.embed("test/plain").destroy(); }),
                HasSubstr(logLine("COMMON", "destroyInst", "PLAIN_OBJ_ID delete\n")));
    EXPECT_THAT(logOf(9, [this] { browser.embed("test/silent").destroy(); }),
                ::testing::Not(HasSubstr(" delete")));
}

TEST_F(DispatchTest, AnInstanceWithoutModelIsHarmless) {
    NPP_t instance{};
    NPWindow window{};
    NPStream stream{};
    stream.url = "u";
    EXPECT_EQ(NPP_SetWindow(&instance, &window), NPERR_NO_ERROR);
    EXPECT_EQ(NPP_HandleEvent(&instance, nullptr), 0);
    EXPECT_EQ(NPP_WriteReady(&instance, &stream), 8192);
    EXPECT_EQ(NPP_Destroy(&instance, nullptr), NPERR_NO_ERROR);
    EXPECT_THAT(g_reached, IsEmpty());
}

} // namespace
