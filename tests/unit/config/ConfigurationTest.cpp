// The embedded configuration object and the device's settings that it gives.
#include <cstring>

#include "src/config/OipfConfiguration.h"
#include "tests/support/BorderTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

namespace {

class OipfConfigurationTest : public BorderTest {
protected:
    EmbeddedObject object = browser.embed("application/oipfconfiguration", {{"id", "config"}});
};

TEST_F(OipfConfigurationTest, IsMadeForItsTypeInAnyCase) {
    EXPECT_EQ(static_cast<PluginBase*>(object.model())->getObjectId(), 500);
    const EmbeddedObject other = browser.embed("APPLICATION/OIPFConfiguration");
    EXPECT_EQ(static_cast<PluginBase*>(other.model())->getObjectId(), 500);
    EXPECT_EQ(static_cast<PluginBase*>(object.model())->getId(), "config");
}

TEST_F(OipfConfigurationTest, HandsOutOneScriptObject) {
    const ObjectRef script = object.scriptObject();
    EXPECT_EQ(browser.classNameOf(script.object()), "JSOipfConfiguration");
    EXPECT_EQ(script.pluginReferences(), 1);
    object.dropScriptObject();
    EXPECT_EQ(object.scriptObject(), script);
    EXPECT_EQ(script.pluginReferences(), 1);
}

TEST_F(OipfConfigurationTest, FetchesItsNamesInTheirOrder) {
    log.clear();
    object.scriptObject();
    EXPECT_THAT(
        log.startingWith("NPN_GetStringIdentifier"),
        ElementsAre("NPN_GetStringIdentifier \"keyset\"", "NPN_GetStringIdentifier \"configuration\""));
}

TEST_F(OipfConfigurationTest, RepeatedReadsGiveTheSameObjects) {
    const ObjectRef settings = object.get("configuration").object();
    const ObjectRef keys = object.get("keyset").object();
    EXPECT_EQ(object.get("configuration"), Value(settings));
    EXPECT_EQ(object.get("keyset"), Value(keys));
    EXPECT_EQ(browser.classNameOf(settings.object()), "JSConfiguration");
    EXPECT_EQ(browser.classNameOf(keys.object()), "JSKeySet");
    EXPECT_EQ(settings.pluginReferences(), 1);
    EXPECT_EQ(keys.pluginReferences(), 1);
}

TEST_F(OipfConfigurationTest, ReadsNullIfTheBrowserMakesNoObjectAndTriesAgain) {
    object.scriptObject();
    for (const char* name : {"keyset", "configuration"}) {
        browser.refuse("NPN_CreateObject", 1);
        EXPECT_EQ(object.get(name), Value(nullptr)) << name;
        EXPECT_TRUE(object.get(name).value.isObject()) << name;
    }
}

TEST_F(OipfConfigurationTest, HasTwoPropertiesAndNoMethod) {
    for (const char* name : {"keyset", "configuration"}) {
        EXPECT_TRUE(object.hasProperty(name)) << name;
        EXPECT_FALSE(object.hasMethod(name)) << name;
        EXPECT_FALSE(object.call(name).succeeded) << name;
    }
    EXPECT_FALSE(object.hasProperty("keySet"));
    EXPECT_FALSE(object.scriptObject().callDefault());
    NPVariant result{};
    result.type = NPVariantType_Int32;
    NPObject* script = object.scriptObject().object();
    EXPECT_FALSE(script->_class->getProperty(script, Name("other").identifier(), &result));
    EXPECT_EQ(result.type, NPVariantType_Void);
}

TEST_F(OipfConfigurationTest, NothingCanBeAssigned) {
    const ObjectRef keys = object.get("keyset").object();
    for (const char* name : {"keyset", "configuration", "other"}) {
        for (const Value& value :
             Values{1, "1", true, nullptr, undefined, Value(browser.scriptObject("o"))}) {
            EXPECT_FALSE(object.set(name, value).succeeded) << name << " = " << value;
        }
    }
    EXPECT_EQ(object.get("keyset"), Value(keys));
}

TEST_F(OipfConfigurationTest, LogsThatMethodsAreLookedForAndCalledButNotThatPropertiesAreWritten) {
    object.scriptObject();
    EXPECT_THAT(logOf(3, [&] { object.hasMethod("keyset"); }),
                HasSubstr(" PLUGIN >>> CONFIG :: HasMethod :: "));
    EXPECT_THAT(logOf(3, [&] { object.call("keyset"); }), HasSubstr(" PLUGIN >>> CONFIG :: Invoke :: "));
    EXPECT_THAT(logOf(3, [&] { object.set("keyset", 1); }), Not(HasSubstr("SetProperty")));
    EXPECT_THAT(logOf(3, [&] { object.get("keyset"); }),
                HasSubstr(logLine("CONFIG", "GetProperty", " pId_keyset\n")));
}

TEST_F(OipfConfigurationTest, GivesBackItsObjectsInOrderAtTheEnd) {
    object.scriptObject();
    object.dropScriptObject();
    object.get("configuration");
    object.get("keyset");
    object.dropScriptObject();
    log.clear();
    EXPECT_EQ(object.destroy(), NPERR_NO_ERROR);
    EXPECT_THAT(log.startingWith("NPN_ReleaseObject"),
                ElementsAre("NPN_ReleaseObject JSOipfConfiguration", "NPN_ReleaseObject JSKeySet",
                            "NPN_ReleaseObject JSConfiguration", "NPN_ReleaseObject config"));
    EXPECT_EQ(object.model(), nullptr);
}

TEST_F(OipfConfigurationTest, TellsOfItsEndInTheLog) {
    char line[100];
    std::snprintf(line, sizeof line, "OIPFCONFIGURATION_OBJ_ID delete :: %p \n", object.model());
    EXPECT_THAT(logOf(1, [&] { object.destroy(); }), HasSubstr(line));
}

TEST_F(OipfConfigurationTest, ItsSubObjectsOutliveIt) {
    const ObjectRef settings = object.get("configuration").object();
    const ObjectRef keys = object.get("keyset").object();
    object.destroy();
    platform.TELIX_JS_APP_Config_GetCountryId = [](char** out) {
        *out = strdup("fin");
        return 0;
    };
    EXPECT_EQ(settings.get("countryId"), Value("fin"));
    EXPECT_EQ(keys.get("value"), Value(0));
    EXPECT_EQ(keys.call("setValue", 1), Value(0));
}

TEST_F(OipfConfigurationTest, ItsScriptObjectIsDeadWithoutIt) {
    object.scriptObject();
    object.destroy();
    EXPECT_FALSE(object.get("keyset").succeeded);
    EXPECT_FALSE(object.get("configuration").succeeded);
}

// The settings, all three alike.

struct Setting {
    const char* name;
    ScriptedCall<TELIX_RETCODE_ENUM_T(char**)> RecordingPlatform::*call;
    const char* platformCall;
};

void PrintTo(const Setting& setting, std::ostream* stream) {
    *stream << setting.name;
}

class ConfigurationTest : public BorderTest, public ::testing::WithParamInterface<Setting> {
protected:
    using Call = ScriptedCall<TELIX_RETCODE_ENUM_T(char**)>;

    Call& call() { return platform.*GetParam().call; }
    Outcome read() const { return settings.get(GetParam().name); }

    void platformAnswers(const char* text, TELIX_RETCODE_ENUM_T result = TELIX_RETCODE_SUCCESS) {
        call() = [text, result](char** out) {
            *out = text ? strdup(text) : nullptr;
            return result;
        };
    }

    EmbeddedObject object = browser.embed("application/oipfconfiguration");
    ObjectRef settings = object.get("configuration").object();
};

INSTANTIATE_TEST_SUITE_P(
    AllSettings, ConfigurationTest,
    ::testing::Values(Setting{"preferredAudioLanguage",
                              &RecordingPlatform::TELIX_JS_APP_Config_GetPreferredAudioLanguage,
                              "TELIX_JS_APP_Config_GetPreferredAudioLanguage(out)"},
                      Setting{"preferredSubtitleLanguage",
                              &RecordingPlatform::TELIX_JS_APP_Config_GetPreferredSubtitleLanguage,
                              "TELIX_JS_APP_Config_GetPreferredSubtitleLanguage(out)"},
                      Setting{"countryId", &RecordingPlatform::TELIX_JS_APP_Config_GetCountryId,
                              "TELIX_JS_APP_Config_GetCountryId(out)"}),
    [](const auto& info) { return info.param.name; });

TEST_P(ConfigurationTest, IsAskedForOnceWhenTheAnswerIsNotEmpty) {
    platformAnswers("deu");
    log.clear();
    const Outcome first = read();
    EXPECT_EQ(first, Value("deu"));
    EXPECT_TRUE(first.inBrowserMemory);
    platformAnswers("fra");
    EXPECT_EQ(read(), Value("deu"));
    EXPECT_THAT(log.startingWith("TELIX"), ElementsAre(GetParam().platformCall));
}

TEST_P(ConfigurationTest, AnEmptyAnswerIsNullAndAskedForAgain) {
    platformAnswers("");
    EXPECT_EQ(read(), Value(nullptr));
    EXPECT_EQ(read(), Value(nullptr));
    platformAnswers("deu");
    EXPECT_EQ(read(), Value("deu"));
    EXPECT_EQ(call().count(), 3U);
}

TEST_P(ConfigurationTest, ARefusalIsNullAndAskedForAgain) {
    platformAnswers(nullptr, 1);
    EXPECT_EQ(read(), Value(nullptr));
    platformAnswers("deu");
    EXPECT_EQ(read(), Value("deu"));
    EXPECT_EQ(call().count(), 2U);
}

TEST_P(ConfigurationTest, ATextOfARefusedCallIsFreedAndNotUsed) {
    platformAnswers("deu", 1);
    EXPECT_EQ(read(), Value(nullptr));
}

TEST_P(ConfigurationTest, SuccessWithoutATextIsAnEmptyText) {
    platformAnswers(nullptr);
    EXPECT_EQ(read(), Value(nullptr));
    EXPECT_EQ(read(), Value(nullptr));
    EXPECT_EQ(call().count(), 2U);
}

TEST_P(ConfigurationTest, IsNullIfTheBrowserHasNoMemoryAndKeptAllTheSame) {
    platformAnswers("deu");
    browser.refuse("NPN_MemAlloc", 1);
    EXPECT_EQ(read(), Value(nullptr));
    EXPECT_EQ(read(), Value("deu"));
    EXPECT_EQ(call().count(), 1U);
}

TEST_P(ConfigurationTest, EachObjectKeepsItsOwnAnswer) {
    platformAnswers("deu");
    read();
    platformAnswers("fra");
    const EmbeddedObject other = browser.embed("application/oipfconfiguration");
    EXPECT_EQ(other.get("configuration").object().get(GetParam().name), Value("fra"));
    EXPECT_EQ(read(), Value("deu"));
}

TEST_P(ConfigurationTest, IsReadOnlyAndNoMethod) {
    platformAnswers("deu");
    for (const Value& value : Values{1, "eng", true, nullptr, undefined, Value(browser.scriptObject("o"))}) {
        EXPECT_FALSE(settings.set(GetParam().name, value)) << value;
    }
    EXPECT_FALSE(settings.hasMethod(GetParam().name));
    EXPECT_FALSE(settings.call(GetParam().name).succeeded);
    EXPECT_EQ(read(), Value("deu"));
}

TEST_P(ConfigurationTest, IsLogged) {
    EXPECT_THAT(logOf(3, [&] { read(); }),
                HasSubstr(logLine("CONFIG", "GetProperty", " pId_" + std::string(GetParam().name) + "\n")));
}

TEST_F(OipfConfigurationTest, TheSettingsFetchTheirNamesInOrder) {
    object.scriptObject();
    log.clear();
    object.get("configuration");
    EXPECT_THAT(log.startingWith("NPN_GetStringIdentifier"),
                ElementsAre("NPN_GetStringIdentifier \"preferredAudioLanguage\"",
                            "NPN_GetStringIdentifier \"preferredSubtitleLanguage\"",
                            "NPN_GetStringIdentifier \"countryId\""));
}

TEST_F(OipfConfigurationTest, TheSettingsHaveNothingElse) {
    const ObjectRef settings = object.get("configuration").object();
    EXPECT_FALSE(settings.hasProperty("country"));
    EXPECT_FALSE(settings.get("country").succeeded);
    EXPECT_FALSE(settings.set("country", "fin").succeeded);
    EXPECT_FALSE(settings.hasMethod("country"));
    EXPECT_FALSE(settings.callDefault());
    EXPECT_EQ(log.count("TELIX"), 0U);
}

} // namespace
