// An A/V component as a page sees it, over both families of platform calls.
#include "src/avcomponent/JSAVcomponent.h"
#include "tests/support/SubObjectTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

const std::vector<const char*> kFetched = {"encoding",         "encrypted",     "aspectRatio",    "language",
                                           "audioDescription", "audioChannels", "hearingImpaired"};

// The parameter is the kind of object that the component came from.
class AVcomponentTest : public SubObjectTest, public ::testing::WithParamInterface<AVcompObjType_T> {
protected:
    ObjectRef componentOf(uint32_t handle, AVcompType_T type = AVCOMP_TYPE_AUDIO) {
        return make<JSAVcomponent>([this, handle, type](AVcomponent& model) {
            model.setHandle(handle);
            model.setType(type);
            model.setObjType(GetParam());
        });
    }

    std::string family() const {
        return GetParam() == AVCOMP_OBJ_AVCONTROL ? "TELIX_JS_AV_AVComponent_" : "TELIX_JS_VB_AVComponent_";
    }

    // Gives every getter of the family under test an answer.
    void answerAll(const std::string& text, uint8_t flag, float ratio, uint32_t number, int32_t result = 0) {
        const auto giveText = [text, result](uint32_t, uint32_t, char** out) {
            EXPECT_EQ(*out, nullptr) << "the result is preset";
            if (result == 0) {
                *out = platformText(text);
            }
            return result;
        };
        const auto giveFlag = give(flag, result);
        if (GetParam() == AVCOMP_OBJ_AVCONTROL) {
            platform.TELIX_JS_AV_AVComponent_GetEncoding = giveText;
            platform.TELIX_JS_AV_AVComponent_GetLanguage = giveText;
            platform.TELIX_JS_AV_AVComponent_GetEncrypted = giveFlag;
            platform.TELIX_JS_AV_AVComponent_GetAudioDescription = giveFlag;
            platform.TELIX_JS_AV_AVComponent_GetHearingImpaired = giveFlag;
            platform.TELIX_JS_AV_AVComponent_GetAspectRatio = give(ratio, result);
            platform.TELIX_JS_AV_AVComponent_GetAudioChannels = give(number, result);
        } else {
            platform.TELIX_JS_VB_AVComponent_GetEncoding = giveText;
            platform.TELIX_JS_VB_AVComponent_GetLanguage = giveText;
            platform.TELIX_JS_VB_AVComponent_GetEncrypted = giveFlag;
            platform.TELIX_JS_VB_AVComponent_GetAudioDescription = giveFlag;
            platform.TELIX_JS_VB_AVComponent_GetHearingImpaired = giveFlag;
            platform.TELIX_JS_VB_AVComponent_GetAspectRatio = give(ratio, result);
            platform.TELIX_JS_VB_AVComponent_GetAudioChannels = give(number, result);
        }
    }

    template <class Type>
    static std::function<int32_t(uint32_t, uint32_t, Type*)> give(Type value, int32_t result) {
        return [value, result](uint32_t, uint32_t, Type* out) {
            EXPECT_EQ(*out, Type{}) << "the result is preset";
            *out = value;
            return result;
        };
    }

    // Every fetched property's call, in the order of kFetched.
    std::vector<std::string> callsFor(const std::string& arguments) const {
        std::vector<std::string> calls;
        for (const char* name : {"GetEncoding", "GetEncrypted", "GetAspectRatio", "GetLanguage",
                                 "GetAudioDescription", "GetAudioChannels", "GetHearingImpaired"}) {
            calls.push_back(family() + name + "(" + arguments + ", out)");
        }
        return calls;
    }

    static void readAll(const ObjectRef& component) {
        for (const char* name : kFetched) {
            EXPECT_TRUE(component.get(name)) << name;
        }
    }
};

INSTANTIATE_TEST_SUITE_P(OfBothFamilies, AVcomponentTest,
                         ::testing::Values(AVCOMP_OBJ_AVCONTROL, AVCOMP_OBJ_VIDEOBROADCAST),
                         [](const auto& info) {
                             return info.param == AVCOMP_OBJ_AVCONTROL ? "AVControl" : "VideoBroadcast";
                         });

TEST_P(AVcomponentTest, AsksForItsNamesInTableOrder) {
    EXPECT_THAT(namesOf<JSAVcomponent>(),
                ElementsAre("type", "encoding", "encrypted", "aspectRatio", "language", "audioDescription",
                            "audioChannels", "hearingImpaired"));
}

TEST_P(AVcomponentTest, ReadsEveryPropertyFromItsFamilyWithHandleAndType) {
    answerAll("text", 1, 1.5F, 6);
    const ObjectRef component = componentOf(40, AVCOMP_TYPE_SUBTITLE);
    log.clear();
    EXPECT_EQ(component.get("type"), 2);
    EXPECT_EQ(component.get("encoding"), "text");
    EXPECT_EQ(component.get("encrypted"), true);
    EXPECT_EQ(component.get("aspectRatio"), 1.5);
    EXPECT_EQ(component.get("language"), "text");
    EXPECT_EQ(component.get("audioDescription"), true);
    EXPECT_EQ(component.get("audioChannels"), 6);
    EXPECT_EQ(component.get("hearingImpaired"), true);
    EXPECT_EQ(log.calls(), callsFor("40, 2"));
}

TEST_P(AVcomponentTest, IsReadOnlyThroughout) {
    answerAll("text", 1, 1.5F, 6);
    const ObjectRef component = componentOf(40);
    expectReadOnly(component, {"type", "encoding", "encrypted", "aspectRatio", "language", "audioDescription",
                               "audioChannels", "hearingImpaired"});
    expectNothingElse(component);
    EXPECT_EQ(component.get("language"), "text");
}

TEST_P(AVcomponentTest, TellsItsTypeInScriptsNumbers) {
    EXPECT_EQ(componentOf(1, AVCOMP_TYPE_VIDEO).get("type"), 0);
    EXPECT_EQ(componentOf(1, AVCOMP_TYPE_AUDIO).get("type"), 1);
    EXPECT_EQ(componentOf(1, AVCOMP_TYPE_SUBTITLE).get("type"), 2);
    EXPECT_EQ(make<JSAVcomponent>().get("type"), -1) << "before it is told";
}

TEST_P(AVcomponentTest, HandsTextsOutOfTheCHeapZeroTerminated) {
    answerAll("text", 1, 1.5F, 6);
    const ObjectRef component = componentOf(40);
    log.clear();
    for (const char* name : {"encoding", "language"}) {
        const Outcome read = component.get(name);
        EXPECT_EQ(read, "text");
        EXPECT_FALSE(read.inBrowserMemory) << name;
    }
    EXPECT_EQ(log.count("NPN_MemAlloc"), 0U);

    NPVariant raw{};
    ASSERT_TRUE(
        component.object()->_class->getProperty(component.object(), Name("encoding").identifier(), &raw));
    EXPECT_EQ(raw.value.stringValue.UTF8Length, 4U);
    EXPECT_STREQ(raw.value.stringValue.UTF8Characters, "text");
    std::free(const_cast<char*>(raw.value.stringValue.UTF8Characters));
}

TEST_P(AVcomponentTest, FetchesEachPropertyOnce) {
    answerAll("first", 1, 1.5F, 6);
    const ObjectRef component = componentOf(40);
    readAll(component);
    answerAll("second", 0, 2.5F, 2);
    log.clear();
    EXPECT_EQ(component.get("encoding"), "first");
    EXPECT_EQ(component.get("encrypted"), true);
    EXPECT_EQ(component.get("aspectRatio"), 1.5);
    EXPECT_EQ(component.get("language"), "first");
    EXPECT_EQ(component.get("audioDescription"), true);
    EXPECT_EQ(component.get("audioChannels"), 6);
    EXPECT_EQ(component.get("hearingImpaired"), true);
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_P(AVcomponentTest, KeepsFalseAndZeroOnceThePlatformHasToldThem) {
    answerAll("text", 0, 0.0F, 0);
    const ObjectRef component = componentOf(40);
    readAll(component);
    answerAll("text", 1, 1.0F, 1);
    log.clear();
    EXPECT_EQ(component.get("encrypted"), false);
    EXPECT_EQ(component.get("aspectRatio"), 0.0);
    EXPECT_EQ(component.get("audioDescription"), false);
    EXPECT_EQ(component.get("audioChannels"), 0);
    EXPECT_EQ(component.get("hearingImpaired"), false);
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_P(AVcomponentTest, AsksAgainForATextThatCameEmpty) {
    answerAll("", 0, 0.0F, 0);
    const ObjectRef component = componentOf(40);
    EXPECT_EQ(component.get("encoding"), "");
    EXPECT_EQ(component.get("language"), "");
    answerAll("late", 0, 0.0F, 0);
    EXPECT_EQ(component.get("encoding"), "late");
    EXPECT_EQ(component.get("language"), "late");
}

TEST_P(AVcomponentTest, ReadsASuccessfulAnswerWithoutATextAsEmpty) {
    const ObjectRef component = componentOf(40);
    EXPECT_EQ(component.get("encoding"), "");
    EXPECT_EQ(component.get("language"), "");
}

TEST_P(AVcomponentTest, ReadsStartValuesWhileThePlatformFailsAndAsksAgain) {
    answerAll("text", 1, 1.5F, 6, 1);
    const ObjectRef component = componentOf(40);
    log.clear();
    EXPECT_EQ(component.get("encoding"), "");
    EXPECT_EQ(component.get("encrypted"), false);
    EXPECT_EQ(component.get("aspectRatio"), 0.0);
    const Outcome language = component.get("language");
    EXPECT_EQ(language, "") << "a text of length 0, not null";
    EXPECT_FALSE(language.inBrowserMemory);
    EXPECT_EQ(component.get("audioDescription"), false);
    EXPECT_EQ(component.get("audioChannels"), 0);
    EXPECT_EQ(component.get("hearingImpaired"), false);
    EXPECT_EQ(log.calls(), callsFor("40, 1"));

    answerAll("text", 1, 1.5F, 6);
    log.clear();
    readAll(component);
    EXPECT_EQ(log.calls(), callsFor("40, 1"));
    EXPECT_EQ(component.get("audioChannels"), 6);
}

TEST_P(AVcomponentTest, WithoutAHandleReadsItsStartValuesAndAsksNothing) {
    answerAll("text", 1, 1.5F, 6);
    const ObjectRef component = componentOf(0);
    log.clear();
    EXPECT_EQ(component.get("encoding"), "");
    EXPECT_EQ(component.get("encrypted"), false);
    EXPECT_EQ(component.get("aspectRatio"), 0.0);
    EXPECT_EQ(component.get("language"), "");
    EXPECT_EQ(component.get("audioDescription"), false);
    EXPECT_EQ(component.get("audioChannels"), 0);
    EXPECT_EQ(component.get("hearingImpaired"), false);
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_P(AVcomponentTest, TakesAnyNonZeroFlagForTrue) {
    answerAll("text", 0x80, 1.0F, 1);
    const ObjectRef component = componentOf(40);
    EXPECT_EQ(component.get("encrypted"), true);
    EXPECT_EQ(component.get("audioDescription"), true);
    EXPECT_EQ(component.get("hearingImpaired"), true);
}

TEST_P(AVcomponentTest, RoundsTheAspectRatioToTwoDecimals) {
    for (const auto& [told, read] : std::vector<std::pair<float, double>>{{1.3333334F, 1.33},
                                                                          {1.7777778F, 1.78},
                                                                          {2.35F, 2.35},
                                                                          {1.0F, 1.0},
                                                                          {0.004F, 0.0},
                                                                          {0.125F, 0.13}}) {
        answerAll("text", 1, told, 6);
        EXPECT_EQ(componentOf(40).get("aspectRatio"), read) << told;
    }
}

TEST_P(AVcomponentTest, BoundsAnAspectRatioThatIsNone) {
    answerAll("text", 1, -1.0F, 6);
    EXPECT_EQ(componentOf(40).get("aspectRatio"), 0.0);
    answerAll("text", 1, 1e30F, 6);
    EXPECT_EQ(componentOf(40).get("aspectRatio"), 4294967295.0 / 100.0);
}

TEST_P(AVcomponentTest, ReadsAudioChannelsOfAVideoComponentAsThePlatformTellsThem) {
    answerAll("text", 1, 1.5F, 2);
    EXPECT_EQ(componentOf(40, AVCOMP_TYPE_VIDEO).get("audioChannels"), 2);
}

TEST_P(AVcomponentTest, ReadsAudioChannelsAboveTheSignedRangeAsNegative) {
    answerAll("text", 1, 1.5F, 0xFFFFFFFF);
    EXPECT_EQ(componentOf(40).get("audioChannels"), -1);
}

TEST_P(AVcomponentTest, LogsItsConstructionAndItsEncoding) {
    const std::string text = logOf(10, [this] {
        answerAll("text", 1, 1.5F, 6);
        const ObjectRef component = componentOf(40);
        EXPECT_EQ(component.get("encoding"), "text");
        AVcomponent apart;
        EXPECT_EQ(apart.getEncoding(), "");
    });
    EXPECT_THAT(text, HasSubstr(logLine("AV_COMP", "AVcomponent", " override constructor is called \n")));
    EXPECT_THAT(text, HasSubstr(logLine("AV_COMP", "AVcomponent", " default constructor is called \n")));
    EXPECT_THAT(text, HasSubstr(logLine("AV_COMP", "getEncoding",
                                        " Encoding value returned from IF API= ( text ) \n")));
}

using UnassignedAVcomponentTest = SubObjectTest;

TEST_F(UnassignedAVcomponentTest, AComponentOfNoObjectTypeAsksNeitherFamily) {
    const ObjectRef component = make<JSAVcomponent>([](AVcomponent& model) { model.setHandle(40); });
    log.clear();
    for (const char* name : kFetched) {
        EXPECT_TRUE(component.get(name)) << name;
    }
    EXPECT_THAT(log.calls(), IsEmpty());
}

} // namespace
