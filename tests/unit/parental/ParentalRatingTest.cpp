// Parental ratings and their collection as a page sees them.
#include "src/parental/JSParentalRating.h"
#include "src/parental/JSParentalRatingCollection.h"
#include "tests/support/SubObjectTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

namespace {

class ParentalRatingTest : public SubObjectTest {
protected:
    ObjectRef ratingOf(uint32_t handle) {
        return make<JSParentalRating>(
            [handle](ParentalRating& model) { model.setParentalRatingHandle(handle); });
    }

    ObjectRef thresholdOf(uint32_t threshold, const std::string& scheme = "scheme", uint32_t handle = 50) {
        return make<JSParentalRating>([&](ParentalRating& model) {
            model.setParentalRatingHandle(handle);
            model.setThresholdProperties(threshold, scheme);
        });
    }

    void tellTexts(const std::string& text) {
        const auto tell = [text](uint32_t, char** out) {
            EXPECT_EQ(*out, nullptr) << "the result is preset";
            *out = platformText(text);
            return 0;
        };
        platform.TELIX_JS_SI_PARENTALRATING_GetName = tell;
        platform.TELIX_JS_SI_PARENTALRATING_GetScheme = tell;
        platform.TELIX_JS_SI_PARENTALRATING_GetRegion = tell;
    }

    void tellNumbers(int32_t number) {
        const auto tell = [number](uint32_t, int32_t* out) {
            *out = number;
            return 0;
        };
        platform.TELIX_JS_SI_PARENTALRATING_GetValue = tell;
        platform.TELIX_JS_SI_PARENTALRATING_GetLabels = tell;
    }

    void refuseAll() {
        const auto text = [](uint32_t, char**) { return 1; };
        const auto number = [](uint32_t, int32_t* out) {
            *out = 99;
            return 1;
        };
        platform.TELIX_JS_SI_PARENTALRATING_GetName = text;
        platform.TELIX_JS_SI_PARENTALRATING_GetScheme = text;
        platform.TELIX_JS_SI_PARENTALRATING_GetRegion = text;
        platform.TELIX_JS_SI_PARENTALRATING_GetValue = number;
        platform.TELIX_JS_SI_PARENTALRATING_GetLabels = number;
    }
};

TEST_F(ParentalRatingTest, AsksForItsNamesInTableOrder) {
    EXPECT_THAT(namesOf<JSParentalRating>(), ElementsAre("name", "scheme", "value", "labels", "region"));
}

TEST_F(ParentalRatingTest, ReadsEveryPropertyFromThePlatformThroughItsHandle) {
    tellTexts("PG");
    tellNumbers(12);
    const ObjectRef rating = ratingOf(50);
    log.clear();
    EXPECT_EQ(rating.get("name"), "PG");
    EXPECT_EQ(rating.get("scheme"), "PG");
    EXPECT_EQ(rating.get("value"), 12);
    EXPECT_EQ(rating.get("labels"), 12);
    EXPECT_EQ(rating.get("region"), "PG");
    EXPECT_THAT(log.calls(), ElementsAre("TELIX_JS_SI_PARENTALRATING_GetName(50, out)",
                                         "TELIX_JS_SI_PARENTALRATING_GetScheme(50, out)",
                                         "TELIX_JS_SI_PARENTALRATING_GetValue(50, out)",
                                         "TELIX_JS_SI_PARENTALRATING_GetLabels(50, out)",
                                         "TELIX_JS_SI_PARENTALRATING_GetRegion(50, out)"));
}

TEST_F(ParentalRatingTest, IsReadOnlyThroughout) {
    tellTexts("PG");
    tellNumbers(12);
    const ObjectRef rating = ratingOf(50);
    expectReadOnly(rating, {"name", "scheme", "value", "labels", "region"});
    expectNothingElse(rating);
    EXPECT_EQ(rating.get("name"), "PG");
}

TEST_F(ParentalRatingTest, HandsTextsOutInTheBrowsersMemoryOrAsNull) {
    tellTexts("PG");
    const ObjectRef rating = ratingOf(50);
    for (const char* name : {"name", "scheme", "region"}) {
        EXPECT_TRUE(rating.get(name).inBrowserMemory) << name;
    }
    browser.refuse("NPN_MemAlloc");
    for (const char* name : {"name", "scheme", "region"}) {
        EXPECT_EQ(rating.get(name), nullptr) << name;
    }
}

TEST_F(ParentalRatingTest, AsksForTextsOnceAndForNumbersAtEveryRead) {
    tellTexts("PG");
    tellNumbers(12);
    const ObjectRef rating = ratingOf(50);
    for (int i = 0; i < 2; ++i) {
        for (const char* name : {"name", "scheme", "value", "labels", "region"}) {
            EXPECT_TRUE(rating.get(name)) << name;
        }
    }
    EXPECT_EQ(platform.TELIX_JS_SI_PARENTALRATING_GetName.count(), 1U);
    EXPECT_EQ(platform.TELIX_JS_SI_PARENTALRATING_GetScheme.count(), 1U);
    EXPECT_EQ(platform.TELIX_JS_SI_PARENTALRATING_GetRegion.count(), 1U);
    EXPECT_EQ(platform.TELIX_JS_SI_PARENTALRATING_GetValue.count(), 2U);
    EXPECT_EQ(platform.TELIX_JS_SI_PARENTALRATING_GetLabels.count(), 2U);
}

TEST_F(ParentalRatingTest, AnEmptyTextIsNullButAnEmptyRegionIsVoidAndBothAreAskedForAgain) {
    tellTexts("");
    const ObjectRef rating = ratingOf(50);
    EXPECT_EQ(rating.get("name"), nullptr);
    EXPECT_EQ(rating.get("scheme"), nullptr);
    EXPECT_EQ(rating.get("region"), undefined);
    tellTexts("late");
    for (const char* name : {"name", "scheme", "region"}) {
        EXPECT_EQ(rating.get(name), "late") << name;
    }
}

TEST_F(ParentalRatingTest, ASuccessfulAnswerWithoutATextIsEmpty) {
    const ObjectRef rating = ratingOf(50);
    EXPECT_EQ(rating.get("name"), nullptr);
    EXPECT_EQ(rating.get("scheme"), nullptr);
    EXPECT_EQ(rating.get("region"), undefined);
}

TEST_F(ParentalRatingTest, ReadsStartValuesWhileThePlatformRefusesAndTheLastNumbersLater) {
    refuseAll();
    const ObjectRef rating = ratingOf(50);
    EXPECT_EQ(rating.get("name"), nullptr);
    EXPECT_EQ(rating.get("scheme"), nullptr);
    EXPECT_EQ(rating.get("region"), undefined);
    EXPECT_EQ(rating.get("value"), 0);
    EXPECT_EQ(rating.get("labels"), 0);
    tellNumbers(12);
    EXPECT_EQ(rating.get("value"), 12);
    EXPECT_EQ(rating.get("labels"), 12);
    refuseAll();
    EXPECT_EQ(rating.get("value"), 12);
    EXPECT_EQ(rating.get("labels"), 12);
}

TEST_F(ParentalRatingTest, WithoutAHandleReadsStartValuesAndAsksNothing) {
    tellTexts("PG");
    tellNumbers(12);
    const ObjectRef rating = ratingOf(0);
    log.clear();
    EXPECT_EQ(rating.get("name"), nullptr);
    EXPECT_EQ(rating.get("scheme"), nullptr);
    EXPECT_EQ(rating.get("region"), undefined);
    EXPECT_EQ(rating.get("value"), 0);
    EXPECT_EQ(rating.get("labels"), 0);
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_F(ParentalRatingTest, AThresholdTellsItsOwnValuesAndNeverAsksThePlatform) {
    tellTexts("PG");
    tellNumbers(99);
    for (const uint32_t handle : {0U, 12U, 50U}) {
        const ObjectRef rating = thresholdOf(12, "dvb-si", handle);
        log.clear();
        EXPECT_EQ(rating.get("name"), "12");
        EXPECT_EQ(rating.get("value"), 12);
        EXPECT_EQ(rating.get("scheme"), "dvb-si");
        EXPECT_EQ(rating.get("region"), "undefined");
        EXPECT_EQ(rating.get("labels"), 0);
        EXPECT_THAT(log.calls(), IsEmpty());
    }
}

TEST_F(ParentalRatingTest, AThresholdOfANamelessSchemeAsksNothingEither) {
    tellTexts("PG");
    const ObjectRef rating = thresholdOf(12, "");
    log.clear();
    EXPECT_EQ(rating.get("scheme"), nullptr);
    EXPECT_THAT(log.calls(), IsEmpty());
}

TEST_F(ParentalRatingTest, AThresholdIsWrittenAsASignedNumber) {
    const ObjectRef rating = thresholdOf(0xFFFFFFFF);
    EXPECT_EQ(rating.get("name"), "-1");
    EXPECT_EQ(rating.get("value"), -1);
}

TEST_F(ParentalRatingTest, LogsUnderItsModule) {
    const std::string text = logOf(8, [this] {
        const ObjectRef rating = thresholdOf(12);
        rating.set("name", 1);
        rating.call("name");
    });
    EXPECT_THAT(text,
                HasSubstr(logLine("PARENTAL", "setThresholdProperties", " Buffer value is:: ( 12 )\n")));
    for (const char* function : {"SetProperty", "HasMethod", "Invoke"}) {
        EXPECT_THAT(text, HasSubstr(std::string("PARENTAL :: ") + function + " :: "));
    }
}

class ParentalRatingCollectionTest : public SubObjectTest {
protected:
    void TearDown() override {
        leftBehind("JSParentalRating", ratingsLeftBehind);
        SubObjectTest::TearDown();
    }

    // A collection whose ratings outlive it on purpose.
    ObjectRef collectionOf(std::vector<uint32_t> handles) {
        ratingsLeftBehind += static_cast<int>(handles.size());
        return make<JSParentalRatingCollection>([&](ParentalRatingCollection& model) {
            model.initializeParentalRatting(static_cast<unsigned>(handles.size()), handles.data());
        });
    }

    uint32_t handleOf(const ObjectRef& rating) {
        return modelOf<JSParentalRating>(rating).getParentalRatingHandle();
    }

    int ratingsLeftBehind = 0; // one reference each
};

TEST_F(ParentalRatingCollectionTest, AsksForItsNamesInTableOrder) {
    EXPECT_THAT(namesOf<JSParentalRatingCollection>(), ElementsAre("item", "length"));
}

TEST_F(ParentalRatingCollectionTest, LengthIsReadOnlyAndItemAMethod) {
    const ObjectRef collection = collectionOf({1});
    expectReadOnly(collection, {"length", "0"});
    expectMethods(collection, {"item"});
    expectNothingElse(collection);
    EXPECT_EQ(collection.get("length"), 1);
}

TEST_F(ParentalRatingCollectionTest, HoldsARatingForEachHandleInOrder) {
    const ObjectRef collection = collectionOf({8, 6});
    EXPECT_EQ(collection.get("length"), 2);
    EXPECT_EQ(handleOf(collection.call("item", 0).object()), 8U);
    EXPECT_EQ(handleOf(collection.call("item", 1).object()), 6U);
}

TEST_F(ParentalRatingCollectionTest, AnEmptyCollectionHasLengthZeroAndNoItem) {
    const ObjectRef collection = make<JSParentalRatingCollection>(
        [](ParentalRatingCollection& model) { model.initializeParentalRatting(0, nullptr); });
    EXPECT_EQ(collection.get("length"), 0);
    EXPECT_EQ(collection.call("item", 0), nullptr);
    EXPECT_FALSE(collection.hasProperty("0"));
    EXPECT_FALSE(collection.get("0").succeeded);
}

TEST_F(ParentalRatingCollectionTest, ItemTakesAnyNumberTruncated) {
    const ObjectRef collection = collectionOf({8, 6});
    EXPECT_EQ(handleOf(collection.call("item", 0.5).object()), 8U);
    EXPECT_EQ(handleOf(collection.call("item", 1.9).object()), 6U);
    EXPECT_EQ(handleOf(collection.call("item", -3).object()), 8U);
    EXPECT_EQ(collection.call("item", 2), nullptr);
    for (const Value& value :
         {Value(undefined), Value(nullptr), Value(true), Value("0"), Value(collection)}) {
        EXPECT_FALSE(collection.call("item", value).succeeded) << value;
    }
    EXPECT_FALSE(collection.call("item").succeeded);
}

TEST_F(ParentalRatingCollectionTest, ArrayNotationGivesTheObjectsOfItem) {
    const ObjectRef collection = collectionOf({8, 6});
    EXPECT_EQ(collection.get("0").object(), collection.call("item", 0).object());
    EXPECT_EQ(collection.get("1x").object(), collection.call("item", 1).object());
    for (const char* name : {"2", "-1", "x1"}) {
        EXPECT_FALSE(collection.hasProperty(name)) << name;
        EXPECT_FALSE(collection.get(name).succeeded) << name;
    }
}

TEST_F(ParentalRatingCollectionTest, EachRatingHasTwoReferencesAtTheOutsetAndOneIsLeftBehind) {
    ObjectRef collection = collectionOf({8, 6});
    const ObjectRef rating = collection.call("item", 1).object();
    EXPECT_EQ(rating.pluginReferences(), 2);
    log.clear();
    collection = {};
    EXPECT_EQ(rating.pluginReferences(), 1);
    EXPECT_THAT(log.startingWith("NPN_ReleaseObject"),
                ElementsAre("NPN_ReleaseObject JSParentalRating#2", "NPN_ReleaseObject JSParentalRating"))
        << "from the last to the first";
}

TEST_F(ParentalRatingCollectionTest, HasItsFullLengthBeforeItsRatingsAreThere) {
    const ObjectRef collection = make<JSParentalRatingCollection>();
    static ParentalRatingCollection* filling;
    static NPN_CreateObjectProcPtr create;
    static std::vector<uint32_t> lengths;
    filling = &modelOf<JSParentalRatingCollection>(collection);
    create = browser.table().createobject;
    lengths.clear();
    browser.table().createobject = [](NPP npp, NPClass* objectClass) {
        lengths.push_back(filling->getLength());
        EXPECT_EQ(filling->getitem(1), nullptr);
        return create(npp, objectClass);
    };
    const uint32_t handles[] = {8, 6};
    filling->initializeParentalRatting(2, handles);
    browser.table().createobject = create;
    EXPECT_THAT(lengths, ElementsAre(2U, 2U));
    ratingsLeftBehind += 2;
}

TEST_F(ParentalRatingCollectionTest, CreatesUntilTheBrowserMakesEveryRating) {
    browser.refuse("NPN_CreateObject", 3, 2); // after the collection and the first rating
    const ObjectRef collection = collectionOf({8, 6});
    EXPECT_EQ(collection.get("length"), 2);
    EXPECT_EQ(handleOf(collection.call("item", 1).object()), 6U);
}

TEST_F(ParentalRatingCollectionTest, TheRatingOfAHeldHandleIsTheHeldObject) {
    const ObjectRef collection = collectionOf({8, 6, 6});
    ParentalRatingCollection& model = modelOf<JSParentalRatingCollection>(collection);
    const ObjectRef rating = ObjectRef::adopt(model.getJSParentalRatingForHandle(6));
    EXPECT_EQ(rating, collection.call("item", 1).object());
    EXPECT_EQ(rating.pluginReferences(), 2);
}

TEST_F(ParentalRatingCollectionTest, TheRatingOfAnotherHandleIsANewObjectAtEveryCall) {
    for (const ObjectRef& collection : {collectionOf({8}), collectionOf({})}) {
        ParentalRatingCollection& model = modelOf<JSParentalRatingCollection>(collection);
        const Value length = collection.get("length").value;
        const ObjectRef rating = ObjectRef::adopt(model.getJSParentalRatingForHandle(9));
        const ObjectRef another = ObjectRef::adopt(model.getJSParentalRatingForHandle(9));
        EXPECT_NE(rating, another);
        EXPECT_EQ(handleOf(rating), 9U);
        EXPECT_EQ(rating.pluginReferences(), 0) << "the caller's alone";
        EXPECT_EQ(collection.get("length"), length);
    }
}

TEST_F(ParentalRatingCollectionTest, ThereIsNoNewRatingIfTheBrowserMakesNone) {
    const ObjectRef collection = collectionOf({8});
    browser.refuse("NPN_CreateObject", 1);
    EXPECT_EQ(modelOf<JSParentalRatingCollection>(collection).getJSParentalRatingForHandle(9), nullptr);
}

TEST_F(ParentalRatingCollectionTest, LogsArrayNotationUnderTheChannelsModuleAndTheRestUnderItsOwn) {
    const auto use = [this] {
        const ObjectRef collection = collectionOf({8});
        EXPECT_TRUE(collection.get("0"));
        EXPECT_FALSE(collection.set("length", 1).succeeded);
    };
    EXPECT_THAT(logOf(4, use),
                HasSubstr(logLine("CHANNEL", "GetProperty", " Array Notation Index:-- 0 --\n")));
    const std::string own = logOf(8, use);
    EXPECT_THAT(own,
                HasSubstr(logLine("PARENTAL", "initializeParentalRatting", " addParentalRattingObject \n")));
    EXPECT_THAT(own, HasSubstr("PARENTAL :: SetProperty :: "));
    EXPECT_THAT(own, Not(HasSubstr("Array Notation Index")));
}

} // namespace
