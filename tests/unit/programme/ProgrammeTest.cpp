// A programme as a page sees it: every read and write goes to the platform.
#include "src/parental/JSParentalRating.h"
#include "src/parental/JSParentalRatingCollection.h"
#include "src/programme/JSProgramme.h"
#include "tests/support/SubObjectTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

class ProgrammeTest : public SubObjectTest {
protected:
    ObjectRef programmeOf(uint32_t handle) {
        return make<JSProgramme>([handle](Programme& model) { model.setProgrammeHandle(handle); });
    }

    // Has the platform give these values from now on.
    void tellTexts(const std::string& text) {
        const auto withLength = [text](uint32_t, char** out, uint8_t* length) {
            EXPECT_EQ(*out, nullptr) << "the results are preset";
            EXPECT_EQ(*length, 0) << "the results are preset";
            *out = platformText(text);
            *length = static_cast<uint8_t>(text.size());
            return 0;
        };
        platform.TELIX_JS_SI_GetName = withLength;
        platform.TELIX_JS_SI_GetDescription = withLength;
        platform.TELIX_JS_SI_GetChannelID = [text](uint32_t, char** out) {
            EXPECT_EQ(*out, nullptr) << "the result is preset";
            *out = platformText(text);
            return 0;
        };
    }
    void tellNumbers(uint32_t number) {
        const auto tell = [number](uint32_t, uint32_t* out) {
            EXPECT_EQ(*out, 0U) << "the result is preset";
            *out = number;
            return 0;
        };
        platform.TELIX_JS_SI_GetStartTime = tell;
        platform.TELIX_JS_SI_GetDuration = tell;
    }
    // Has the platform refuse every read and write, whatever it writes into its results.
    void refuseAll() {
        const auto withLength = [](uint32_t, char**, uint8_t* length) {
            *length = 3;
            return 1;
        };
        const auto number = [](uint32_t, uint32_t* out) {
            *out = 99;
            return 1;
        };
        platform.TELIX_JS_SI_GetName = withLength;
        platform.TELIX_JS_SI_GetDescription = withLength;
        platform.TELIX_JS_SI_GetChannelID = [](uint32_t, char** out) {
            *out = platformText("given and refused"); // freed all the same
            return 1;
        };
        platform.TELIX_JS_SI_GetStartTime = number;
        platform.TELIX_JS_SI_GetDuration = number;
        refuseWrites();
    }
    void refuseWrites() {
        const auto text = [](uint32_t, const char*) { return 1; };
        const auto number = [](uint32_t, uint32_t) { return 1; };
        platform.TELIX_JS_SI_SetName = text;
        platform.TELIX_JS_SI_SetDescription = text;
        platform.TELIX_JS_SI_SetChannelID = text;
        platform.TELIX_JS_SI_SetStartTime = number;
        platform.TELIX_JS_SI_SetDuration = number;
    }
    // Has the platform read nothing back, so that reads show what the programme itself keeps.
    void refuseReads() {
        refuseAll();
        platform.TELIX_JS_SI_SetName = nullptr;
        platform.TELIX_JS_SI_SetDescription = nullptr;
        platform.TELIX_JS_SI_SetChannelID = nullptr;
        platform.TELIX_JS_SI_SetStartTime = nullptr;
        platform.TELIX_JS_SI_SetDuration = nullptr;
    }

    // Gives each programme these ratings, whose objects outlive it on purpose.
    void giveRatings(std::vector<uint32_t> handles) {
        ratings = std::move(handles);
        platform.TELIX_JS_SI_GetParentalRatingHandles = [this](uint32_t, uint32_t* count, uint32_t** out) {
            EXPECT_EQ(*count, 0U) << "the results are preset";
            EXPECT_EQ(*out, nullptr) << "the results are preset";
            *count = static_cast<uint32_t>(ratings.size());
            *out = ratings.data();
            return 0;
        };
    }

    std::vector<uint32_t> ratings;
};

TEST_F(ProgrammeTest, AsksForItsNamesInTableOrder) {
    EXPECT_THAT(namesOf<JSProgramme>(),
                ElementsAre("name", "startTime", "duration", "description", "channelID", "parentalRating"));
}

TEST_F(ProgrammeTest, ReadsEveryPropertyFromThePlatformThroughItsHandle) {
    tellTexts("news");
    tellNumbers(3600);
    const ObjectRef programme = programmeOf(9);
    log.clear();
    EXPECT_EQ(programme.get("name"), "news");
    EXPECT_EQ(programme.get("startTime"), 3600);
    EXPECT_EQ(programme.get("duration"), 3600);
    EXPECT_EQ(programme.get("description"), "news");
    EXPECT_EQ(programme.get("channelID"), "news");
    EXPECT_TRUE(programme.get("parentalRating").value.isObject());
    EXPECT_THAT(log.calls(),
                ElementsAre("TELIX_JS_SI_GetName(9, out, out)", "TELIX_JS_SI_GetStartTime(9, out)",
                            "TELIX_JS_SI_GetDuration(9, out)", "TELIX_JS_SI_GetDescription(9, out, out)",
                            "TELIX_JS_SI_GetChannelID(9, out)",
                            "TELIX_JS_SI_GetParentalRatingHandles(9, out, out)",
                            "NPN_CreateObject JSParentalRatingCollection"));
}

TEST_F(ProgrammeTest, HandsTextsOutInTheBrowsersMemoryOrAsNull) {
    tellTexts("news");
    const ObjectRef programme = programmeOf(9);
    for (const char* name : {"name", "description", "channelID"}) {
        EXPECT_TRUE(programme.get(name).inBrowserMemory) << name;
    }
    browser.refuse("NPN_MemAlloc");
    for (const char* name : {"name", "description", "channelID"}) {
        EXPECT_EQ(programme.get(name), nullptr) << name;
    }
}

TEST_F(ProgrammeTest, AsksAtEveryReadAndShowsTheLatestValue) {
    const ObjectRef programme = programmeOf(9);
    for (const char* text : {"news", "weather"}) {
        tellTexts(text);
        for (const char* name : {"name", "description", "channelID"}) {
            EXPECT_EQ(programme.get(name), text) << name;
        }
    }
    for (const int number : {100, 0}) {
        tellNumbers(static_cast<uint32_t>(number));
        EXPECT_EQ(programme.get("startTime"), number);
        EXPECT_EQ(programme.get("duration"), number);
    }
    EXPECT_EQ(platform.TELIX_JS_SI_GetName.count(), 2U);
    EXPECT_EQ(platform.TELIX_JS_SI_GetStartTime.count(), 2U);
}

TEST_F(ProgrammeTest, KeepsTheLastValuesWhenThePlatformRefusesLater) {
    tellTexts("news");
    tellNumbers(3600);
    const ObjectRef programme = programmeOf(9);
    for (const char* name : {"name", "startTime", "duration", "description", "channelID"}) {
        EXPECT_TRUE(programme.get(name)) << name;
    }
    refuseAll();
    for (const char* name : {"name", "description", "channelID"}) {
        EXPECT_EQ(programme.get(name), "news") << name;
    }
    EXPECT_EQ(programme.get("startTime"), 3600);
    EXPECT_EQ(programme.get("duration"), 3600);
}

TEST_F(ProgrammeTest, ReadsStartValuesWhileThePlatformRefuses) {
    refuseAll();
    const ObjectRef programme = programmeOf(9);
    for (const char* name : {"name", "description", "channelID"}) {
        EXPECT_EQ(programme.get(name), nullptr) << name;
    }
    EXPECT_EQ(programme.get("startTime"), 0);
    EXPECT_EQ(programme.get("duration"), 0);
}

TEST_F(ProgrammeTest, TakesExactlyTheLengthThatComesWithAText) {
    const auto tell = [](uint32_t, char** out, uint8_t* length) {
        *out = platformText(std::string("a\0b and more", 12));
        *length = 3;
        return 0;
    };
    platform.TELIX_JS_SI_GetName = tell;
    platform.TELIX_JS_SI_GetDescription = tell;
    const ObjectRef programme = programmeOf(9);
    EXPECT_EQ(programme.get("name"), std::string("a\0b", 3));
    EXPECT_EQ(programme.get("description"), std::string("a\0b", 3));
}

TEST_F(ProgrammeTest, TakesATextOfTheGreatestLength) {
    tellTexts(std::string(255, 'x'));
    EXPECT_EQ(programmeOf(9).get("name"), std::string(255, 'x'));
}

TEST_F(ProgrammeTest, ATextOfLengthZeroChangesNothingAndIsNotFreed) {
    tellTexts("news");
    const ObjectRef programme = programmeOf(9);
    EXPECT_TRUE(programme.get("name"));
    EXPECT_TRUE(programme.get("description"));
    char* text = platformText("kept");
    const auto tell = [text](uint32_t, char** out, uint8_t* length) {
        *out = text;
        *length = 0;
        return 0;
    };
    platform.TELIX_JS_SI_GetName = tell;
    platform.TELIX_JS_SI_GetDescription = tell;
    EXPECT_EQ(programme.get("name"), "news");
    EXPECT_EQ(programme.get("description"), "news");
    EXPECT_STREQ(text, "kept");
    std::free(text);
}

TEST_F(ProgrammeTest, ALengthWithoutATextChangesNothing) {
    platform.TELIX_JS_SI_GetName = [](uint32_t, char**, uint8_t* length) {
        *length = 5;
        return 0;
    };
    EXPECT_EQ(programmeOf(9).get("name"), nullptr);
}

TEST_F(ProgrammeTest, AnEmptyOrMissingChannelIdReplacesTheLast) {
    tellTexts("news");
    const ObjectRef programme = programmeOf(9);
    EXPECT_EQ(programme.get("channelID"), "news");
    tellTexts("");
    EXPECT_EQ(programme.get("channelID"), nullptr);
    tellTexts("news");
    EXPECT_EQ(programme.get("channelID"), "news");
    platform.TELIX_JS_SI_GetChannelID = nullptr; // succeeds without a text
    EXPECT_EQ(programme.get("channelID"), nullptr);
}

TEST_F(ProgrammeTest, WritesGoToThePlatformFirstAndAreKept) {
    refuseReads();
    const ObjectRef programme = programmeOf(9);
    log.clear();
    EXPECT_TRUE(programme.set("name", "a"));
    EXPECT_TRUE(programme.set("startTime", 5));
    EXPECT_TRUE(programme.set("duration", 6));
    EXPECT_TRUE(programme.set("description", "b"));
    EXPECT_TRUE(programme.set("channelID", "c"));
    EXPECT_THAT(log.calls(),
                ElementsAre("TELIX_JS_SI_SetName(9, \"a\")", "TELIX_JS_SI_SetStartTime(9, 5)",
                            "TELIX_JS_SI_SetDuration(9, 6)", "TELIX_JS_SI_SetDescription(9, \"b\")",
                            "TELIX_JS_SI_SetChannelID(9, \"c\")"));
    EXPECT_EQ(programme.get("name"), "a");
    EXPECT_EQ(programme.get("startTime"), 5);
    EXPECT_EQ(programme.get("duration"), 6);
    EXPECT_EQ(programme.get("description"), "b");
    EXPECT_EQ(programme.get("channelID"), "c");
}

TEST_F(ProgrammeTest, ARefusedWriteLeavesTheFormerValueAndIsSilent) {
    refuseReads();
    const ObjectRef programme = programmeOf(9);
    for (const char* name : {"name", "description", "channelID"}) {
        EXPECT_TRUE(programme.set(name, "former")) << name;
    }
    for (const char* name : {"startTime", "duration"}) {
        EXPECT_TRUE(programme.set(name, 7)) << name;
    }
    refuseWrites();
    for (const char* name : {"name", "description", "channelID"}) {
        EXPECT_TRUE(programme.set(name, "new")) << name;
        EXPECT_EQ(programme.get(name), "former") << name;
    }
    for (const char* name : {"startTime", "duration"}) {
        EXPECT_TRUE(programme.set(name, 8)) << name;
        EXPECT_EQ(programme.get(name), 7) << name;
    }
}

TEST_F(ProgrammeTest, WrittenNumbersAreTruncatedToUnsigned) {
    refuseReads();
    const ObjectRef programme = programmeOf(9);
    for (const char* name : {"startTime", "duration"}) {
        for (const auto& [written, kept] : std::vector<std::pair<Value, int>>{
                 {1.5, 1}, {-3, 0}, {5000000000.0, -1}, {4294967294.0, -2}, {0, 0}}) {
            EXPECT_TRUE(programme.set(name, written)) << name << written;
            EXPECT_EQ(programme.get(name), kept) << name << written;
        }
    }
}

TEST_F(ProgrammeTest, AWrittenTextEndsAtItsFirstZeroAndMayBeEmpty) {
    refuseReads();
    const ObjectRef programme = programmeOf(9);
    log.clear();
    EXPECT_TRUE(programme.set("name", std::string("a\0b", 3)));
    EXPECT_TRUE(programme.set("description", ""));
    EXPECT_THAT(log.calls(),
                ElementsAre("TELIX_JS_SI_SetName(9, \"a\")", "TELIX_JS_SI_SetDescription(9, \"\")"));
    EXPECT_EQ(programme.get("name"), "a");
    EXPECT_EQ(programme.get("description"), nullptr);
}

TEST_F(ProgrammeTest, TextsTakeTextsAndNumbersTakeNumbers) {
    const ObjectRef programme = programmeOf(9);
    log.clear();
    for (const Value& value :
         {Value(undefined), Value(nullptr), Value(true), Value(1), Value(1.5), Value(programme)}) {
        for (const char* name : {"name", "description", "channelID"}) {
            EXPECT_FALSE(programme.set(name, value).succeeded) << name << value;
        }
    }
    for (const Value& value : {Value(undefined), Value(nullptr), Value(true), Value("1"), Value(programme)}) {
        for (const char* name : {"startTime", "duration"}) {
            EXPECT_FALSE(programme.set(name, value).succeeded) << name << value;
        }
    }
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_F(ProgrammeTest, RatingsAreReadOnlyAndThereAreNoMethods) {
    const ObjectRef programme = programmeOf(9);
    expectReadOnly(programme, {"parentalRating"});
    expectNothingElse(programme);
    for (const char* name : {"name", "startTime", "duration", "description", "channelID"}) {
        EXPECT_TRUE(programme.hasProperty(name)) << name;
        EXPECT_FALSE(programme.hasMethod(name)) << name;
        EXPECT_FALSE(programme.call(name, 1).succeeded) << name;
    }
}

TEST_F(ProgrammeTest, WithoutAHandleReadsEmptyValuesAndWritesChangeNothing) {
    tellTexts("news");
    tellNumbers(3600);
    const ObjectRef programme = programmeOf(0);
    log.clear();
    for (const char* name : {"name", "description", "channelID"}) {
        EXPECT_TRUE(programme.set(name, "written")) << name;
        EXPECT_EQ(programme.get(name), nullptr) << name;
    }
    for (const char* name : {"startTime", "duration"}) {
        EXPECT_TRUE(programme.set(name, 5)) << name;
        EXPECT_EQ(programme.get(name), 0) << name;
    }
    EXPECT_EQ(programme.get("parentalRating"), nullptr);
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_F(ProgrammeTest, ParentalRatingIsOneCollectionReadOnce) {
    giveRatings({41, 42});
    leftBehind("JSParentalRating", 2); // one reference each
    const ObjectRef programme = programmeOf(9);
    const ObjectRef collection = programme.get("parentalRating").object();
    EXPECT_EQ(programme.get("parentalRating").object(), collection);
    EXPECT_EQ(platform.TELIX_JS_SI_GetParentalRatingHandles.count(), 1U);
    EXPECT_EQ(collection.get("length"), 2);
    EXPECT_EQ(modelOf<JSParentalRating>(collection.call("item", 1).object()).getParentalRatingHandle(), 42U);
    EXPECT_EQ(collection.pluginReferences(), 1) << "the programme's own";
}

TEST_F(ProgrammeTest, RefusedRatingsReadAsNullAndAreAskedForAgain) {
    platform.TELIX_JS_SI_GetParentalRatingHandles = [](uint32_t, uint32_t*, uint32_t**) { return 1; };
    const ObjectRef programme = programmeOf(9);
    EXPECT_EQ(programme.get("parentalRating"), nullptr);
    giveRatings({});
    EXPECT_EQ(programme.get("parentalRating").object().get("length"), 0);
    EXPECT_EQ(platform.TELIX_JS_SI_GetParentalRatingHandles.count(), 2U);
}

TEST_F(ProgrammeTest, RatingsThatTheBrowserDoesNotMakeReadAsNullAndAreAskedForAgain) {
    giveRatings({});
    const ObjectRef programme = programmeOf(9);
    browser.refuse("NPN_CreateObject", 1);
    EXPECT_EQ(programme.get("parentalRating"), nullptr);
    EXPECT_TRUE(programme.get("parentalRating").value.isObject());
}

TEST_F(ProgrammeTest, ReleasesItsRatingsAtItsEnd) {
    giveRatings({});
    ObjectRef programme = programmeOf(9);
    const ObjectRef collection = programme.get("parentalRating").object();
    programme = {};
    EXPECT_EQ(browser.liveCount("JSProgramme"), 0U);
    EXPECT_EQ(collection.pluginReferences(), 0);
    EXPECT_EQ(collection.get("length"), 0);
}

TEST_F(ProgrammeTest, LogsUnderItsModule) {
    const std::string text = logOf(7, [this] {
        const ObjectRef programme = programmeOf(9);
        EXPECT_TRUE(programme.set("name", "a"));
        EXPECT_TRUE(programme.get("name"));
        programme.call("name");
    });
    EXPECT_THAT(text, HasSubstr("PROGRAMME :: setName :: "));
    EXPECT_THAT(text, HasSubstr(logLine("PROGRAMME", "GetProperty", " pId_name\n")));
    for (const char* function : {"HasMethod", "Invoke"}) {
        EXPECT_THAT(text, HasSubstr(logLine("PROGRAMME", function, "JSProgramme class\n")));
    }
}

} // namespace
