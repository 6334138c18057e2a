// A collection of programmes as a page sees it, and the search for ratings that events make.
#include <map>

#include "src/parental/JSParentalRating.h"
#include "src/programme/JSProgramme.h"
#include "src/programme/JSProgrammeCollection.h"
#include "tests/support/SubObjectTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;

namespace {

class ProgrammeCollectionTest : public SubObjectTest {
protected:
    void TearDown() override {
        leftBehind("JSProgramme", programmesLeftBehind);
        SubObjectTest::TearDown();
    }

    // A collection whose programmes outlive it on purpose.
    ObjectRef collectionOf(std::vector<uint32_t> handles) {
        programmesLeftBehind += static_cast<int>(handles.size());
        return make<JSProgrammeCollection>([&](ProgrammeCollection& model) {
            model.initialize(static_cast<unsigned>(handles.size()), handles.data());
        });
    }

    // Gives programmes their ratings; the platform refuses programmes that are not named.
    void giveRatings(std::map<uint32_t, std::vector<uint32_t>> ratings) {
        ratingsOf = std::move(ratings);
        platform.TELIX_JS_SI_GetParentalRatingHandles = [this](uint32_t programme, uint32_t* count,
                                                               uint32_t** out) {
            const auto found = ratingsOf.find(programme);
            if (found == ratingsOf.end()) {
                return 1;
            }
            *count = static_cast<uint32_t>(found->second.size());
            *out = found->second.data();
            return 0;
        };
    }

    // A programme that yields a name made from its handle.
    void tellNames() {
        platform.TELIX_JS_SI_GetName = [](uint32_t handle, char** out, uint8_t* length) {
            const std::string name = "programme " + std::to_string(handle);
            *out = platformText(name);
            *length = static_cast<uint8_t>(name.size());
            return 0;
        };
    }

    // The rating for a handle, its reference taken over by the page.
    ObjectRef ratingFor(const ObjectRef& collection, uint32_t handle) {
        NPObject* rating = modelOf<JSProgrammeCollection>(collection).getJSParentalRatingForHandle(handle);
        return rating ? ObjectRef::adopt(rating) : ObjectRef();
    }

    std::map<uint32_t, std::vector<uint32_t>> ratingsOf;
    int programmesLeftBehind = 0; // one reference each
};

TEST_F(ProgrammeCollectionTest, AsksForItsNamesInTableOrder) {
    EXPECT_THAT(namesOf<JSProgrammeCollection>(), ElementsAre("item", "length"));
}

TEST_F(ProgrammeCollectionTest, LengthIsReadOnlyAndItemAMethod) {
    const ObjectRef collection = collectionOf({1});
    expectReadOnly(collection, {"length", "0"});
    expectMethods(collection, {"item"});
    expectNothingElse(collection);
    EXPECT_EQ(collection.get("length"), 1);
}

TEST_F(ProgrammeCollectionTest, HoldsAProgrammeForEachHandleInOrder) {
    tellNames();
    const ObjectRef collection = collectionOf({30, 10});
    EXPECT_EQ(collection.get("length"), 2);
    EXPECT_EQ(collection.call("item", 0).object().get("name"), "programme 30");
    EXPECT_EQ(collection.call("item", 1).object().get("name"), "programme 10");
}

TEST_F(ProgrammeCollectionTest, ItemTakesAnyNumberTruncatedAndIsNullAtTheLength) {
    const ObjectRef collection = collectionOf({1, 2});
    const ObjectRef first = collection.call("item", 0).object();
    const ObjectRef second = collection.call("item", 1).object();
    EXPECT_NE(first, second);
    EXPECT_EQ(collection.call("item", 1.9).object(), second);
    EXPECT_EQ(collection.call("item", -1).object(), first);
    EXPECT_EQ(collection.call("item", 2), nullptr);
    for (const Value& value :
         {Value(undefined), Value(nullptr), Value(true), Value("0"), Value(collection)}) {
        EXPECT_FALSE(collection.call("item", value).succeeded) << value;
    }
    EXPECT_FALSE(collection.call("item").succeeded);
}

TEST_F(ProgrammeCollectionTest, ArrayNotationGivesTheObjectsOfItem) {
    const ObjectRef collection = collectionOf({1, 2});
    EXPECT_EQ(collection.get("0").object(), collection.call("item", 0).object());
    EXPECT_EQ(collection.get("1x").object(), collection.call("item", 1).object());
    for (const char* name : {"2", "-1", "x1"}) {
        EXPECT_FALSE(collection.hasProperty(name)) << name;
        EXPECT_FALSE(collection.get(name).succeeded) << name;
    }
}

TEST_F(ProgrammeCollectionTest, AnEmptyCollectionHasNoItem) {
    const ObjectRef collection = collectionOf({});
    EXPECT_EQ(collection.get("length"), 0);
    EXPECT_EQ(collection.call("item", 0), nullptr);
    EXPECT_FALSE(collection.hasProperty("0"));
}

TEST_F(ProgrammeCollectionTest, EachProgrammeHasTwoReferencesAtTheOutsetAndOneIsLeftBehind) {
    ObjectRef collection = collectionOf({1, 2});
    const ObjectRef programme = collection.call("item", 1).object();
    EXPECT_EQ(programme.pluginReferences(), 2);
    log.clear();
    collection = {};
    EXPECT_EQ(programme.pluginReferences(), 1);
    EXPECT_THAT(log.startingWith("NPN_ReleaseObject"),
                ElementsAre("NPN_ReleaseObject JSProgramme#2", "NPN_ReleaseObject JSProgramme"))
        << "from the last to the first";
}

TEST_F(ProgrammeCollectionTest, CreatesUntilTheBrowserMakesEveryProgramme) {
    tellNames();
    browser.refuse("NPN_CreateObject", 3, 2); // after the collection and the first programme
    const ObjectRef collection = collectionOf({1, 2});
    EXPECT_EQ(collection.get("length"), 2);
    EXPECT_EQ(collection.call("item", 1).object().get("name"), "programme 2");
}

TEST_F(ProgrammeCollectionTest, FindsTheRatingThatTheFirstProgrammeHolds) {
    giveRatings({{1, {41, 42}}, {2, {43}}});
    const ObjectRef collection = collectionOf({1, 2});
    const ObjectRef rating = ratingFor(collection, 42);
    EXPECT_EQ(modelOf<JSParentalRating>(rating).getParentalRatingHandle(), 42U);
    EXPECT_EQ(rating.pluginReferences(), 3) << "two from the outset, and one of the two that were handed out";
    const ObjectRef ratings = collection.call("item", 0).object().get("parentalRating").object();
    EXPECT_EQ(ratings.call("item", 1).object(), rating);
    EXPECT_EQ(ratings.pluginReferences(), 2) << "the programme's, and the one that the search never releases";
    EXPECT_EQ(browser.liveCount("JSParentalRatingCollection"), 1U) << "the search went no further";
    // The programme is never released, nor what it holds.
    leftBehind("JSParentalRatingCollection", 2);
    leftBehind("JSParentalRating", 2 + 3);
}

TEST_F(ProgrammeCollectionTest, ARatingThatNoProgrammeHoldsIsANewObjectOfTheFirst) {
    giveRatings({{1, {41}}, {2, {43}}});
    const ObjectRef collection = collectionOf({1, 2});
    const ObjectRef rating = ratingFor(collection, 43);
    EXPECT_EQ(modelOf<JSParentalRating>(rating).getParentalRatingHandle(), 43U);
    EXPECT_EQ(rating.pluginReferences(), 1) << "the second of the two that were handed out";
    EXPECT_NE(ratingFor(collection, 43), rating) << "another at every call";
    EXPECT_EQ(collection.call("item", 0).object().get("parentalRating").object().get("length"), 1);
    leftBehind("JSParentalRatingCollection", 1 + 2);
    leftBehind("JSParentalRating", 2 + 1 + 1);
}

TEST_F(ProgrammeCollectionTest, PassesProgrammesThatYieldNoRatings) {
    giveRatings({{3, {43}}});
    const ObjectRef collection = collectionOf({1, 2, 3});
    log.clear();
    const ObjectRef rating = ratingFor(collection, 43);
    EXPECT_THAT(log.startingWith("TELIX_JS_SI_GetParentalRatingHandles"),
                ElementsAre("TELIX_JS_SI_GetParentalRatingHandles(1, out, out)",
                            "TELIX_JS_SI_GetParentalRatingHandles(2, out, out)",
                            "TELIX_JS_SI_GetParentalRatingHandles(3, out, out)"));
    EXPECT_EQ(rating.pluginReferences(), 3);
    leftBehind("JSParentalRatingCollection", 1 + 1);
    leftBehind("JSParentalRating", 3);
}

TEST_F(ProgrammeCollectionTest, GoesOnWhereTheBrowserMakesNoNewRating) {
    giveRatings({{1, {}}, {2, {43}}});
    const ObjectRef collection = collectionOf({1, 2});
    browser.refuse("NPN_CreateObject", 1, 1); // the first collection is made, its new rating is not
    const ObjectRef rating = ratingFor(collection, 43);
    EXPECT_EQ(rating.pluginReferences(), 3) << "the rating that the second programme holds";
    EXPECT_EQ(browser.liveCount("JSParentalRatingCollection"), 2U);
    leftBehind("JSParentalRatingCollection", (1 + 1) + (1 + 1));
    leftBehind("JSParentalRating", 3);
}

TEST_F(ProgrammeCollectionTest, WithoutAnyRatingsThereIsNoRatingObject) {
    giveRatings({});
    EXPECT_FALSE(ratingFor(collectionOf({1, 2}), 43));
    EXPECT_FALSE(ratingFor(collectionOf({}), 43));
}

TEST_F(ProgrammeCollectionTest, LogsUnderItsModule) {
    const std::string text = logOf(7, [this] { EXPECT_TRUE(collectionOf({1}).get("0")); });
    EXPECT_THAT(text, HasSubstr(logLine("PROGRAMME", "GetProperty", "Array Notation Index:-- 0 --\n")));
    EXPECT_THAT(text, HasSubstr(logLine("PROGRAMME", "getitem", "ProgrammeCollection getitem\n")));
}

} // namespace
