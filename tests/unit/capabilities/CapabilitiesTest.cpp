// The capabilities object: the parser that it puts into the page, the description, the query by name and the
// counts.
#include <cstdlib>
#include <cstring>
#include <limits>

#include "common/PluginBase.h"
#include "tests/support/BorderTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

const char kParserScript[] =
    "window.parseCapabilityDescString = function(xmlCapaDesc){\tvar domParserForCapabilities = new "
    "DOMParser();"
    " \tXMLCapabilitiesDoc = domParserForCapabilities.parseFromString(xmlCapaDesc, 'text/xml');"
    "\treturn XMLCapabilitiesDoc;};";

class CapabilitiesTest : public BorderTest {
protected:
    // What the page does once the script has run: every text becomes a new document.
    void pageParses() {
        browser.window().method("parseCapabilityDescString",
                                [this](const Values&) { return Value(browser.scriptObject("Document")); });
    }

    std::vector<Values> parses() const { return browser.window().calls("parseCapabilityDescString"); }

    void descriptionIs(const char* xml) {
        platform.TELIX_JS_CAP_GetXmlCapabilities = [xml](char** out) {
            *out = xml ? strdup(xml) : nullptr;
            return TELIX_RETCODE_SUCCESS;
        };
    }

    void answerIs(___UINT8 answer, TELIX_RETCODE_ENUM_T result = TELIX_RETCODE_SUCCESS) {
        platform.TELIX_JS_CAP_HasCapability = [this, answer, result](const char* profile,
                                                                     ___UINT8* supported) {
            profiles.emplace_back(profile);
            *supported = answer;
            return result;
        };
    }

    EmbeddedObject object = browser.embed("application/oipfcapabilities", {{"id", "caps"}});
    std::vector<std::string> profiles; // that the platform was asked for
};

// Life.

TEST_F(CapabilitiesTest, IsMadeForItsTypeInAnyCase) {
    EXPECT_EQ(static_cast<PluginBase*>(object.model())->getObjectId(), 700);
    const EmbeddedObject other = browser.embed("Application/OIPFCapabilities");
    EXPECT_EQ(static_cast<PluginBase*>(other.model())->getObjectId(), 700);
}

TEST_F(CapabilitiesTest, PutsItsParserIntoThePageBeforeAnythingElse) {
    EXPECT_EQ(browser.scripts(), std::vector<std::string>{kParserScript});
    log.expectInOrder({"NPN_Evaluate window \"" + std::string(kParserScript) + "\"", "NPN_SetValue 3 0"});
}

TEST_F(CapabilitiesTest, IsMadeAlsoIfTheParserScriptFails) {
    browser.whenEvaluatingTextFrom("window.parseCapabilityDescString").throws();
    const EmbeddedObject other = browser.embed("application/oipfcapabilities");
    EXPECT_EQ(other.error(), NPERR_NO_ERROR);
    EXPECT_NE(other.model(), nullptr);
}

TEST_F(CapabilitiesTest, HandsOutOneScriptObject) {
    const ObjectRef script = object.scriptObject();
    EXPECT_EQ(browser.classNameOf(script.object()), "JSCapabilities");
    EXPECT_EQ(script.pluginReferences(), 1);
    object.dropScriptObject();
    EXPECT_EQ(object.scriptObject(), script);
    EXPECT_EQ(script.pluginReferences(), 1);
}

TEST_F(CapabilitiesTest, FetchesItsNamesInTheirOrder) {
    log.clear();
    object.scriptObject();
    EXPECT_THAT(log.startingWith("NPN_GetStringIdentifier"),
                ElementsAre("NPN_GetStringIdentifier \"xmlCapabilities\"",
                            "NPN_GetStringIdentifier \"hasCapability\"",
                            "NPN_GetStringIdentifier \"extraSDVideoDecodes\"",
                            "NPN_GetStringIdentifier \"extraHDVideoDecodes\""));
}

TEST_F(CapabilitiesTest, GivesBackItsObjectsInOrderAtTheEnd) {
    pageParses();
    descriptionIs("<x/>");
    object.get("xmlCapabilities");
    object.dropScriptObject();
    log.clear();
    EXPECT_EQ(object.destroy(), NPERR_NO_ERROR);
    EXPECT_THAT(log.startingWith("NPN_ReleaseObject"),
                ElementsAre("NPN_ReleaseObject JSCapabilities", "NPN_ReleaseObject Document",
                            "NPN_ReleaseObject caps"));
}

TEST_F(CapabilitiesTest, TellsOfItsEndInTheLog) {
    char line[100];
    std::snprintf(line, sizeof line, "OIPFCAPABILITIES_OBJ_ID delete :: %p \n", object.model());
    EXPECT_THAT(logOf(1, [&] { object.destroy(); }), HasSubstr(line));
}

TEST_F(CapabilitiesTest, ItsScriptObjectIsDeadWithoutIt) {
    object.scriptObject();
    object.destroy();
    EXPECT_FALSE(object.call("hasCapability", "x").succeeded);
    EXPECT_FALSE(object.get("xmlCapabilities").succeeded);
    EXPECT_FALSE(object.get("extraSDVideoDecodes").succeeded);
    EXPECT_EQ(log.count("TELIX"), 0U);
}

// The table.

TEST_F(CapabilitiesTest, HasThreePropertiesAndOneMethod) {
    for (const char* name : {"xmlCapabilities", "extraSDVideoDecodes", "extraHDVideoDecodes"}) {
        EXPECT_TRUE(object.hasProperty(name)) << name;
        EXPECT_FALSE(object.hasMethod(name)) << name;
        EXPECT_FALSE(object.call(name).succeeded) << name;
    }
    EXPECT_TRUE(object.hasMethod("hasCapability"));
    EXPECT_FALSE(object.hasProperty("hasCapability"));
    EXPECT_FALSE(object.get("hasCapability").succeeded);
    EXPECT_FALSE(object.hasProperty("xmlcapabilities"));
    EXPECT_FALSE(object.scriptObject().callDefault());
    NPVariant result{};
    result.type = NPVariantType_Int32;
    NPObject* script = object.scriptObject().object();
    EXPECT_FALSE(script->_class->getProperty(script, Name("other").identifier(), &result));
    EXPECT_EQ(result.type, NPVariantType_Void);
}

TEST_F(CapabilitiesTest, NothingCanBeAssigned) {
    for (const char* name :
         {"xmlCapabilities", "extraSDVideoDecodes", "extraHDVideoDecodes", "hasCapability", "other"}) {
        for (const Value& value :
             Values{1, "1", true, nullptr, undefined, Value(browser.scriptObject("o"))}) {
            EXPECT_FALSE(object.set(name, value).succeeded) << name << " = " << value;
        }
    }
}

TEST_F(CapabilitiesTest, LogsWhatIsReadAndCalled) {
    object.scriptObject();
    for (const char* name : {"xmlCapabilities", "extraSDVideoDecodes", "extraHDVideoDecodes"}) {
        EXPECT_THAT(logOf(11, [&] { object.get(name); }),
                    HasSubstr(logLine("CAPABILITIES", "GetProperty", " pId_" + std::string(name) + "\n")));
    }
    EXPECT_THAT(logOf(11, [&] { object.call("hasCapability", "x"); }),
                HasSubstr(logLine("CAPABILITIES", "Invoke", " mId_hasCapability\n")));
}

// The description.

TEST_F(CapabilitiesTest, TheDescriptionIsAskedForAndParsedOnce) {
    pageParses();
    descriptionIs("<profilelist/>");
    log.clear();
    const ObjectRef document = object.get("xmlCapabilities").object();
    EXPECT_EQ(object.get("xmlCapabilities"), Value(document));
    EXPECT_EQ(parses(), std::vector<Values>{{"<profilelist/>"}});
    EXPECT_THAT(log.startingWith("TELIX"), ElementsAre("TELIX_JS_CAP_GetXmlCapabilities(out)"));
    EXPECT_EQ(log.count("NPN_ReleaseVariantValue"), 0U);
    // The reference that came with the parser's result.
    EXPECT_EQ(document.pluginReferences(), 1);
}

TEST_F(CapabilitiesTest, TheParserIsCalledInThePagesWindowWithTheTextAlone) {
    pageParses();
    descriptionIs("<profilelist/>");
    log.clear();
    object.get("xmlCapabilities");
    EXPECT_TRUE(log.contains("NPN_Invoke window.parseCapabilityDescString(\"<profilelist/>\")"));
}

TEST_F(CapabilitiesTest, TextThatIsNoXmlGivesWhateverThePageMakesOfIt) {
    pageParses();
    descriptionIs("no <xml");
    EXPECT_TRUE(object.get("xmlCapabilities").value.isObject());
    EXPECT_EQ(parses(), std::vector<Values>{{"no <xml"}});
}

TEST_F(CapabilitiesTest, ARefusedDescriptionIsNullAndAskedForAgain) {
    pageParses();
    platform.TELIX_JS_CAP_GetXmlCapabilities = [](char**) { return 1; };
    EXPECT_EQ(object.get("xmlCapabilities"), Value(nullptr));
    EXPECT_THAT(parses(), IsEmpty());
    descriptionIs("<x/>");
    EXPECT_TRUE(object.get("xmlCapabilities").value.isObject());
    EXPECT_EQ(platform.TELIX_JS_CAP_GetXmlCapabilities.count(), 2U);
}

TEST_F(CapabilitiesTest, ATextThatThePlatformWritesAlthoughItRefusesIsNeitherUsedNorFreed) {
    pageParses();
    char* const written = strdup("<x/>");
    platform.TELIX_JS_CAP_GetXmlCapabilities = [written](char** out) {
        *out = written;
        return 1;
    };
    EXPECT_EQ(object.get("xmlCapabilities"), Value(nullptr));
    EXPECT_THAT(parses(), IsEmpty());
    EXPECT_STREQ(written, "<x/>");
    std::free(written);
}

TEST_F(CapabilitiesTest, SuccessWithoutATextIsAnEmptyText) {
    pageParses();
    descriptionIs(nullptr);
    EXPECT_TRUE(object.get("xmlCapabilities").value.isObject());
    EXPECT_EQ(parses(), std::vector<Values>{{""}});
}

TEST_F(CapabilitiesTest, AFailedParseIsNullAndTriedAgain) {
    descriptionIs("<x/>");
    browser.window().method("parseCapabilityDescString", [](const Values&) { return std::nullopt; });
    EXPECT_EQ(object.get("xmlCapabilities"), Value(nullptr));
    pageParses();
    EXPECT_TRUE(object.get("xmlCapabilities").value.isObject());
    EXPECT_EQ(platform.TELIX_JS_CAP_GetXmlCapabilities.count(), 2U);
    EXPECT_EQ(parses().size(), 2U);
}

TEST_F(CapabilitiesTest, AParserThatGivesNullIsTriedAgain) {
    descriptionIs("<x/>");
    browser.window().method("parseCapabilityDescString", [](const Values&) { return Value(nullptr); });
    EXPECT_EQ(object.get("xmlCapabilities"), Value(nullptr));
    pageParses();
    EXPECT_TRUE(object.get("xmlCapabilities").value.isObject());
}

TEST_F(CapabilitiesTest, AParserThatGivesSomethingElseThanAnObjectGivesNoDescription) {
    descriptionIs("<x/>");
    Value result;
    browser.window().method("parseCapabilityDescString", [&](const Values&) { return result; });
    for (const Value& other :
         {Value(undefined), Value(true), Value(7), Value(5e-310), Value("text"), Value("")}) {
        result = other;
        EXPECT_EQ(object.get("xmlCapabilities"), Value(nullptr)) << other;
    }
    pageParses();
    EXPECT_TRUE(object.get("xmlCapabilities").value.isObject());
}

TEST_F(CapabilitiesTest, AParserThatReadsTheDescriptionItselfLeavesOneDocument) {
    descriptionIs("<x/>");
    const ScriptObject inner = browser.scriptObject("inner");
    const ScriptObject outer = browser.scriptObject("outer");
    int depth = 0;
    browser.window().method("parseCapabilityDescString", [&](const Values&) {
        if (++depth == 1) {
            EXPECT_EQ(object.get("xmlCapabilities"), Value(inner));
            return Value(outer);
        }
        return Value(inner);
    });
    EXPECT_EQ(object.get("xmlCapabilities"), Value(outer));
    EXPECT_EQ(inner.pluginReferences(), 0);
    EXPECT_EQ(outer.pluginReferences(), 1);
}

TEST_F(CapabilitiesTest, LogsTheTypeOfTheParsersResult) {
    object.scriptObject();
    pageParses();
    descriptionIs("<x/>");
    EXPECT_THAT(logOf(11, [&] { object.get("xmlCapabilities"); }),
                HasSubstr(logLine("CAPABILITIES", "getxmlCapabilities", " NPN_Invoke Result Type = 6 \n")));
}

TEST_F(CapabilitiesTest, EachObjectHasItsOwnDocument) {
    pageParses();
    descriptionIs("<x/>");
    const EmbeddedObject other = browser.embed("application/oipfcapabilities");
    EXPECT_NE(object.get("xmlCapabilities").object(), other.get("xmlCapabilities").object());
}

// The query.

TEST_F(CapabilitiesTest, TheNameGoesToThePlatformUnchanged) {
    answerIs(1);
    EXPECT_EQ(object.call("hasCapability", " OITF_HD_UIPROF+DVB_S "), Value(true));
    answerIs(0);
    EXPECT_EQ(object.call("hasCapability", "what/ever \xC3\xA4"), Value(false));
    EXPECT_THAT(profiles, ElementsAre(" OITF_HD_UIPROF+DVB_S ", "what/ever \xC3\xA4"));
}

TEST_F(CapabilitiesTest, AnyAnswerButZeroIsYes) {
    answerIs(0xFF);
    EXPECT_EQ(object.call("hasCapability", "x"), Value(true));
}

TEST_F(CapabilitiesTest, ARefusalIsNoWhateverWasWritten) {
    answerIs(1, 1);
    EXPECT_EQ(object.call("hasCapability", "x"), Value(false));
}

TEST_F(CapabilitiesTest, AnEmptyNameIsNoWithoutAQuestion) {
    answerIs(1);
    EXPECT_EQ(object.call("hasCapability", ""), Value(false));
    EXPECT_THAT(profiles, IsEmpty());
}

TEST_F(CapabilitiesTest, ANameThatIsNoTextIsRefusedWithoutAQuestion) {
    answerIs(1);
    for (const Value& name : Values{1, 1.5, true, nullptr, undefined, Value(browser.scriptObject("o"))}) {
        EXPECT_FALSE(object.call("hasCapability", name)) << name;
    }
    EXPECT_FALSE(object.call("hasCapability"));
    EXPECT_THAT(profiles, IsEmpty());
}

TEST_F(CapabilitiesTest, FurtherArgumentsAreNotLookedAt) {
    answerIs(1);
    EXPECT_EQ(object.call("hasCapability", "x", 1, nullptr), Value(true));
}

// The counts, both alike.

struct Count {
    const char* name;
    ScriptedCall<TELIX_RETCODE_ENUM_T(uint32_t*)> RecordingPlatform::*call;
    const char* platformCall;
};

void PrintTo(const Count& count, std::ostream* stream) {
    *stream << count.name;
}

class CapabilityCountTest : public CapabilitiesTest, public ::testing::WithParamInterface<Count> {
protected:
    ScriptedCall<TELIX_RETCODE_ENUM_T(uint32_t*)>& call() { return platform.*GetParam().call; }
    Outcome read() const { return object.get(GetParam().name); }
    void platformAnswers(uint32_t count, TELIX_RETCODE_ENUM_T result = TELIX_RETCODE_SUCCESS) {
        call() = [count, result](uint32_t* out) {
            *out = count;
            return result;
        };
    }
};

INSTANTIATE_TEST_SUITE_P(
    BothDefinitions, CapabilityCountTest,
    ::testing::Values(Count{"extraSDVideoDecodes", &RecordingPlatform::TELIX_JS_CAP_GetExtraSDVideoDecodes,
                            "TELIX_JS_CAP_GetExtraSDVideoDecodes(out)"},
                      Count{"extraHDVideoDecodes", &RecordingPlatform::TELIX_JS_CAP_GetExtraHDVideoDecodes,
                            "TELIX_JS_CAP_GetExtraHDVideoDecodes(out)"}),
    [](const auto& info) { return info.param.name; });

TEST_P(CapabilityCountTest, IsAskedForAtEveryRead) {
    platformAnswers(2);
    log.clear();
    EXPECT_EQ(read(), Value(2));
    platformAnswers(1);
    EXPECT_EQ(read(), Value(1));
    EXPECT_THAT(log.startingWith("TELIX"), ElementsAre(GetParam().platformCall, GetParam().platformCall));
}

TEST_P(CapabilityCountTest, ARefusalGivesTheLastCountAtFirstZero) {
    platformAnswers(9, 1);
    EXPECT_EQ(read(), Value(0));
    platformAnswers(2);
    EXPECT_EQ(read(), Value(2));
    platformAnswers(9, 1);
    EXPECT_EQ(read(), Value(2));
}

TEST_P(CapabilityCountTest, ACountAboveTheSignedRangeReadsNegative) {
    platformAnswers(0xFFFFFFFF);
    EXPECT_EQ(read(), Value(-1));
}

} // namespace
