// The native object base: attributes, and the model's way upward to the page.
#include "common/PluginBase.h"

#include <optional>

#include "tests/support/BorderTest.h"

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

namespace {

struct Model final : PluginBase {
    using PluginBase::m_autoStart;
    using PluginBase::m_height;
    using PluginBase::m_pluginObject;
    using PluginBase::m_width;
    using PluginBase::m_window;
    using PluginBase::m_windowObject;
    using PluginBase::PluginBase;
};

class PluginBaseTest : public BorderTest {
    std::optional<Model> m_model;

protected:
    PluginBaseTest() { log.clear(); }
    void TearDown() override {
        m_model.reset();
        BorderTest::TearDown();
    }

    NPError init(Attributes attributes, unsigned short mode = NP_EMBED) {
        std::vector<char*> names;
        std::vector<char*> values;
        for (auto& attribute : attributes) {
            names.push_back(attribute.first.data());
            values.push_back(attribute.second.data());
        }
        return model.init(mode, static_cast<int>(names.size()), names.data(), values.data());
    }

    // What becomes of a URL on a page.
    std::string resolved(const std::string& page, const std::string& address) {
        browser.setAddress(page);
        return model.getBaseURL(address);
    }

    // The element of an instance that has no model of the plug-in's own.
    EmbeddedObject tv = browser.embed("application/none", {{"id", "tv"}});
    Model& model = m_model.emplace(tv.npp(), 400);
};

TEST_F(PluginBaseTest, BeginsUninitialisedWithItsKind) {
    EXPECT_EQ(model.getObjectId(), 400);
    EXPECT_EQ(Model(tv.npp()).getObjectId(), 0);
    EXPECT_EQ(model.getBrowser(), tv.npp());
    EXPECT_EQ(model.getPluginState(), 3);
    EXPECT_EQ(model.getPluginMode(), 0);
    EXPECT_EQ(model.getURL(), "");
    EXPECT_EQ(model.getId(), "");
    EXPECT_FALSE(model.isFullScreen());
    EXPECT_TRUE(model.m_autoStart);
    EXPECT_EQ(model.m_width, 0);
    EXPECT_EQ(model.m_height, 0);
    EXPECT_EQ(model.m_windowObject, nullptr);
    EXPECT_EQ(model.m_pluginObject, nullptr);
    EXPECT_EQ(model.m_window.width, 0U);
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(PluginBaseTest, AccessorsKeepWhatTheyAreGiven) {
    model.setURL("http://page.example/a.mp4");
    EXPECT_EQ(model.getURL(), "http://page.example/a.mp4");
    model.setFullScreen(true);
    EXPECT_TRUE(model.isFullScreen());
    model.setPluginState(PLUGIN_STATE_DESTROYING);
    EXPECT_EQ(model.getPluginState(), 1);
    model.setAutoStart(false);
    EXPECT_FALSE(model.m_autoStart);
}

TEST_F(PluginBaseTest, InitTellsTheBrowserAndFetchesWindowAndElementInThisOrder) {
    EXPECT_EQ(init({{"id", "tv"}}, NP_FULL), NPERR_NO_ERROR);
    EXPECT_THAT(log.everything(),
                ElementsAre("NPN_SetValue 3 0", "NPN_SetValue 4 1", "NPN_GetValue 15", "NPN_GetValue 16"));
    EXPECT_EQ(model.getPluginMode(), 2);
    EXPECT_EQ(model.getPluginState(), 0);
    EXPECT_EQ(model.getNPWindowObj(), browser.window().object());
    EXPECT_EQ(model.getNPPluginObj(), tv.element().object());
    EXPECT_EQ(log.count("NPN_GetValue"), 2U); // both are kept
}

TEST_F(PluginBaseTest, InitSucceedsEvenIfTheBrowserRefusesEverything) {
    browser.refuse("NPN_SetValue");
    browser.refuse("NPN_GetValue");
    EXPECT_EQ(init({}), NPERR_NO_ERROR);
    EXPECT_EQ(model.getPluginState(), 0);
    EXPECT_EQ(model.getNPWindowObj(), nullptr);
    EXPECT_EQ(model.getNPPluginObj(), nullptr);
}

TEST_F(PluginBaseTest, AMissingWindowOrElementIsAskedForAgain) {
    browser.refuse("NPN_GetValue", 2);
    init({});
    EXPECT_EQ(model.getNPWindowObj(), browser.window().object());
    EXPECT_EQ(model.getNPPluginObj(), tv.element().object());
    EXPECT_EQ(log.count("NPN_GetValue"), 4U);
}

TEST_F(PluginBaseTest, TheElementIsReleasedAtTheEndAndTheWindowIsNot) {
    {
        Model other(tv.npp());
        other.init(NP_EMBED, 0, nullptr, nullptr);
        EXPECT_EQ(tv.element().pluginReferences(), 1);
        EXPECT_EQ(browser.window().pluginReferences(), 1);
    }
    EXPECT_EQ(tv.element().pluginReferences(), 0);
    EXPECT_EQ(browser.window().pluginReferences(), 1);
}

TEST_F(PluginBaseTest, AModelThatNeverFetchedTheElementReleasesNothing) {
    { const Model other(tv.npp()); }
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(PluginBaseTest, TheLastOfTheAddressAttributesWins) {
    init({{"src", "a.mp4"}, {"url", "b.mp4"}});
    EXPECT_EQ(model.getURL(), "b.mp4");
    init({{"url", "b.mp4"}, {"src", "a.mp4"}});
    EXPECT_EQ(model.getURL(), "http://page.example/app/a.mp4");
    init({{"data", "http://a.example/1"}, {"src1", "http://a.example/2"}, {"src", "http://a.example/3"}});
    EXPECT_EQ(model.getURL(), "http://a.example/3");
    init({{"src1", "http://a.example/2"}, {"data", "http://a.example/1"}});
    EXPECT_EQ(model.getURL(), "http://a.example/1");
}

TEST_F(PluginBaseTest, AttributeNamesAreReadInAnyCase) {
    init({{"SRC", "http://a.example/1"}, {"Id", "Tv"}, {"WIDTH", "5"}, {"autostart", "false"}});
    EXPECT_EQ(model.getURL(), "http://a.example/1");
    EXPECT_EQ(model.getId(), "Tv");
    EXPECT_EQ(model.m_width, 5);
    EXPECT_FALSE(model.m_autoStart);
}

TEST_F(PluginBaseTest, UrlIsTakenAsItStands) {
    init({{"url", "relative/a.mp4"}});
    EXPECT_EQ(model.getURL(), "relative/a.mp4");
    EXPECT_EQ(log.count("NPN_Evaluate"), 0U);
}

TEST_F(PluginBaseTest, AnEmptyOrAbsoluteAddressDoesNotAskThePage) {
    model.setURL("before");
    init({{"data", ""}});
    EXPECT_EQ(model.getURL(), "");
    init({{"data", "rtsp://a.example/1"}});
    EXPECT_EQ(model.getURL(), "rtsp://a.example/1");
    EXPECT_EQ(log.count("NPN_Evaluate"), 0U);
}

TEST_F(PluginBaseTest, AutoStartIsClearedByFalseInAnyCaseAndByNothingElse) {
    init({{"autoStart", "no"}});
    EXPECT_TRUE(model.m_autoStart);
    init({{"autoStart", "true"}});
    EXPECT_TRUE(model.m_autoStart);
    init({{"autoStart", "FALSE"}});
    EXPECT_FALSE(model.m_autoStart);
}

TEST_F(PluginBaseTest, FullscreenIsKnownAndWithoutEffect) {
    init({{"fullscreen", "true"}});
    EXPECT_FALSE(model.isFullScreen());
    init({{"fullscreen", "false"}});
    EXPECT_FALSE(model.isFullScreen());
}

TEST_F(PluginBaseTest, WidthAndHeightAreTheLeadingDigits) {
    init({{"width", "640px"}, {"height", "-3"}});
    EXPECT_EQ(model.m_width, 640);
    EXPECT_EQ(model.m_height, -3);
    init({{"width", "wide"}});
    EXPECT_EQ(model.m_width, 0);
}

TEST_F(PluginBaseTest, OtherAttributesAreIgnored) {
    init({{"class", "x"}, {"type", "video/broadcast"}, {"onclick", "true"}});
    EXPECT_EQ(model.getURL(), "");
    EXPECT_EQ(model.getId(), "");
}

TEST_F(PluginBaseTest, SetWindowKeepsACopyAndNullKeepsTheOldOne) {
    NPWindow window{};
    window.x = 10;
    window.width = 640;
    model.setWindow(&window);
    window.width = 1;
    EXPECT_EQ(model.m_window.x, 10);
    EXPECT_EQ(model.m_window.width, 640U);
    model.setWindow(nullptr);
    EXPECT_EQ(model.m_window.width, 640U);
}

TEST_F(PluginBaseTest, InvokeJScriptEvaluatesOnTheWindow) {
    browser.whenEvaluating("f()").gives(true);
    EXPECT_TRUE(model.invokeJScript("f()"));
    EXPECT_THAT(log.everything(),
                ElementsAre("NPN_GetValue 15", "NPN_Evaluate window \"f()\"", "NPN_ReleaseVariantValue"));
}

TEST_F(PluginBaseTest, InvokeJScriptEvaluatesAScriptBeyondAZeroByte) {
    const std::string script("f('a\0b')", 9);
    browser.whenEvaluating(script).gives(true);
    EXPECT_TRUE(model.invokeJScript(script));
}

TEST_F(PluginBaseTest, InvokeJScriptIsTrueForTheBooleanTrueOnly) {
    browser.whenEvaluating("true").gives(true);
    browser.whenEvaluating("false").gives(false);
    browser.whenEvaluating("1").gives(1);
    browser.whenEvaluating("throw").throws();
    EXPECT_TRUE(model.invokeJScript("true"));
    EXPECT_FALSE(model.invokeJScript("false"));
    EXPECT_FALSE(model.invokeJScript("1"));
    EXPECT_FALSE(model.invokeJScript("undefined"));
    EXPECT_FALSE(model.invokeJScript("throw"));
}

TEST_F(PluginBaseTest, InvokeJScriptLeavesAResultOfAnotherTypeUnreleased) {
    const ScriptFunction result = browser.function("result");
    browser.whenEvaluating("object").gives(result);
    browser.whenEvaluating("text").gives("text");
    EXPECT_FALSE(model.invokeJScript("object"));
    EXPECT_FALSE(model.invokeJScript("text"));
    EXPECT_EQ(log.count("NPN_ReleaseVariantValue"), 0U);
    leftBehind(result);
    memoryLeftBehind();
}

TEST_F(PluginBaseTest, WithoutAWindowAScriptFails) {
    browser.refuse("NPN_GetValue");
    browser.whenEvaluating("true").gives(true);
    EXPECT_FALSE(model.invokeJScript("true"));
    EXPECT_TRUE(log.contains("NPN_Evaluate null \"true\""));
}

TEST_F(PluginBaseTest, InvokeJScriptFuncCallsTheFunctionWithTheArguments) {
    const ScriptFunction listener = browser.function("listener");
    ArgumentArray arguments({1, "two"});
    EXPECT_TRUE(model.invokeJScriptFunc(listener.object(), const_cast<NPVariant*>(arguments.data()), 2));
    EXPECT_EQ(listener.last(), (Values{1, "two"}));
    EXPECT_THAT(log.everything(),
                ElementsAre("NPN_InvokeDefault listener(1, \"two\")", "NPN_ReleaseVariantValue"));
}

TEST_F(PluginBaseTest, InvokeJScriptFuncWithoutArgumentsPassesNoneWhateverTheCount) {
    const ScriptFunction listener = browser.function("listener");
    EXPECT_TRUE(model.invokeJScriptFunc(listener.object(), nullptr, 3));
    EXPECT_EQ(listener.last(), Values{});
}

TEST_F(PluginBaseTest, InvokeJScriptFuncReleasesTheResultAndReportsFailure) {
    const ScriptFunction listener = browser.function("listener");
    const ScriptObject result = browser.scriptObject("result");
    listener.does([&](const Values&) { return Value(result); });
    EXPECT_TRUE(model.invokeJScriptFunc(listener.object(), nullptr, 0));
    EXPECT_EQ(result.pluginReferences(), 0);
    listener.throws();
    EXPECT_FALSE(model.invokeJScriptFunc(listener.object(), nullptr, 0));
    EXPECT_EQ(log.count("NPN_ReleaseVariantValue"), 2U);
}

TEST_F(PluginBaseTest, ARelativeAddressTakesThePlaceOfThePagesName) {
    EXPECT_EQ(resolved("scheme://host/dir/p.html?x=1", "a.mp4"), "scheme://host/dir/a.mp4");
    EXPECT_EQ(resolved("scheme://host/dir/", "a.mp4"), "scheme://host/dir/a.mp4");
    EXPECT_EQ(resolved("scheme://host", "a.mp4"), "scheme://a.mp4");
}

TEST_F(PluginBaseTest, ASlashInTheQueryCounts) {
    EXPECT_EQ(resolved("scheme://host/p.html?u=/x/y", "a.mp4"), "scheme://host/p.html?u=/x/a.mp4");
}

TEST_F(PluginBaseTest, TheQuestionMarkMattersOnlyWithoutAnySlash) {
    EXPECT_EQ(resolved("page?x=1", "a.mp4"), "pagea.mp4");
    EXPECT_EQ(resolved("page", "a.mp4"), "a.mp4");
}

TEST_F(PluginBaseTest, AnAddressFromTheRootIsCutInsideTheScheme) {
    EXPECT_EQ(resolved("scheme://host/dir/p.html", "/a.mp4"), "scheme:/a.mp4");
    EXPECT_EQ(resolved("about:blank", "/a.mp4"), "");
}

TEST_F(PluginBaseTest, APagesAddressIsReadBeyondAZeroByte) {
    EXPECT_EQ(resolved(std::string("scheme://ho\0st/p.html", 21), "a.mp4"),
              std::string("scheme://ho\0st/a.mp4", 20));
}

TEST_F(PluginBaseTest, ResolvingReleasesThePagesAddress) {
    EXPECT_EQ(resolved("scheme://host/", "a.mp4"), "scheme://host/a.mp4");
    EXPECT_EQ(resolved("about:blank", "/a.mp4"), "");
    EXPECT_THAT(log.everything(),
                ElementsAre("NPN_GetValue 15", "NPN_Evaluate window \"document.location.href\"",
                            "NPN_ReleaseVariantValue", "NPN_Evaluate window \"document.location.href\"",
                            "NPN_ReleaseVariantValue"));
    EXPECT_EQ(browser.memoryBlocks(), 0U);
}

TEST_F(PluginBaseTest, AnAddressIsLostWhenThePageDoesNotTellItsOwn) {
    browser.whenEvaluating("document.location.href").throws();
    init({{"url", "http://a.example/"}, {"data", "a.mp4"}});
    EXPECT_EQ(model.getURL(), "");
    browser.whenEvaluating("document.location.href").gives(5);
    EXPECT_EQ(model.getBaseURL("a.mp4"), "");
    const ScriptObject location = browser.scriptObject("location");
    browser.whenEvaluating("document.location.href").gives(location);
    EXPECT_EQ(model.getBaseURL("a.mp4"), "");
    leftBehind(location); // a result of another type isn't released
    EXPECT_EQ(log.count("NPN_ReleaseVariantValue"), 0U);
}

TEST_F(PluginBaseTest, SetObjectStyleSetsImageThenColour) {
    model.setObjectStyle("url(tv:)");
    EXPECT_THAT(
        log.everything(),
        ElementsAre("NPN_GetStringIdentifier \"style\"", "NPN_GetStringIdentifier \"backgroundImage\"",
                    "NPN_GetStringIdentifier \"backgroundColor\"", "NPN_GetValue 16",
                    "NPN_GetProperty tv.style", "NPN_SetProperty tv.style.backgroundImage = \"url(tv:)\"",
                    "NPN_SetProperty tv.style.backgroundColor = \"transparent\"", "NPN_ReleaseVariantValue"));
    EXPECT_EQ(tv.element().get("style").object().get("backgroundImage"), "url(tv:)");
}

TEST_F(PluginBaseTest, AnEmptyStyleSetsOnlyTheColour) {
    model.setObjectStyle("");
    const ObjectRef style = tv.element().get("style").object();
    EXPECT_FALSE(style.hasProperty("backgroundImage"));
    EXPECT_EQ(style.get("backgroundColor"), "transparent");
}

TEST_F(PluginBaseTest, AStyleEndsAtItsFirstZeroByte) {
    model.setObjectStyle(std::string("url\0(tv:)", 9));
    EXPECT_EQ(tv.element().get("style").object().get("backgroundImage"), "url");
}

TEST_F(PluginBaseTest, AnElementWithoutStyleIsLeftAlone) {
    tv.element().set("style", "none");
    model.setObjectStyle("url(tv:)");
    tv.element().refuse("style");
    model.setObjectStyle("url(tv:)");
    EXPECT_EQ(log.count("NPN_SetProperty"), 0U);
    EXPECT_EQ(log.count("NPN_ReleaseVariantValue"), 0U);
    memoryLeftBehind(); // the text that stood for a style isn't released
}

TEST_F(PluginBaseTest, LogsUnderCommon) {
    EXPECT_THAT(
        logOf(9,
              [this] {
                  init({{"id", "tv"}, {"src", "http://a.example/1"}, {"url", "u"}});
              }),
        AllOf(HasSubstr(logLine("COMMON", "init", "PluginBase::Mode: 1 , Argc:  3 \n")),
              HasSubstr(logLine("COMMON", "init", "ID attribute value:: tv \n")),
              HasSubstr(logLine("COMMON", "init", "data value in PluginBase::init:: http://a.example/1 \n")),
              Not(HasSubstr("PluginBase::init:: u \n"))));
    EXPECT_THAT(logOf(9, [this] { model.setWindow(nullptr); }),
                logLine("COMMON", "setWindow", "Window: is NULL \n"));
    NPWindow window{};
    EXPECT_THAT(logOf(9, [&] { model.setWindow(&window); }), HasSubstr(":: setWindow :: Window: 0x"));
    EXPECT_THAT(logOf(9, [this] { model.invokeJScript("f()"); }),
                HasSubstr(logLine("COMMON", "invokeJScript", "JScript:  f()   \n")));
    const ScriptFunction listener = browser.function("listener");
    EXPECT_THAT(logOf(9, [&] { model.invokeJScriptFunc(listener.object(), nullptr, 0); }),
                AllOf(HasSubstr(":: invokeJScriptFunc :: Javascript function object: 0x"),
                      HasSubstr(" will be invoked\n")));
    EXPECT_THAT(
        logOf(9, [this] { model.setObjectStyle("x"); }),
        AllOf(HasSubstr(logLine("COMMON", "setObjectStyle", " is called \n")),
              HasSubstr(logLine("COMMON", "setObjectStyle", "backgroundImage style property is set \n"))));
    tv.element().refuse("style");
    EXPECT_THAT(logOf(9, [this] { model.setObjectStyle("x"); }),
                HasSubstr(logLine("COMMON", "setObjectStyle", "NPN_GetProperty(styleId) failed.\n")));
    EXPECT_EQ(logOf(6, [this] { init({{"id", "tv"}}); }), "");
}

} // namespace
