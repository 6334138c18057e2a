// The parental control manager with its rating schemes as a page sees them.
#include <deque>

#include "src/parental/JSParentalControlManager.h"
#include "src/parental/JSParentalRating.h"
#include "src/parental/JSParentalRatingScheme.h"
#include "src/parental/JSParentalRatingSchemeCollection.h"
#include "tests/support/SubObjectTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

// The platform's rating schemes: records, and the strings that they point at.
class SchemeRecords {
public:
    // `ratings` are names with their icons; without a name the record has none.
    void add(uint32_t handle, const char* name, std::vector<std::pair<std::string, std::string>> ratings) {
        m_arrays.push_back({});
        std::vector<char*>& names = m_arrays.back();
        m_arrays.push_back({});
        std::vector<char*>& icons = m_arrays.back();
        for (auto& [rating, icon] : ratings) {
            names.push_back(keep(rating));
            icons.push_back(keep(icon));
        }
        m_records.push_back({handle, static_cast<uint32_t>(ratings.size()), name ? keep(name) : nullptr,
                             names.data(), icons.data()});
    }

    // Overwrites everything, as a platform may once the call is over.
    void spoil() {
        for (std::string& text : m_texts) {
            std::fill(text.begin(), text.end(), '?');
        }
        m_records.assign(m_records.size(), {});
    }

    uint32_t count() const { return static_cast<uint32_t>(m_records.size()); }
    PARENTALRATTINGSCHEME_STRUCT_T_TAG* data() { return m_records.data(); }

private:
    char* keep(const std::string& text) {
        m_texts.push_back(text);
        return m_texts.back().data();
    }

    std::vector<PARENTALRATTINGSCHEME_STRUCT_T_TAG> m_records;
    std::deque<std::string> m_texts;
    std::deque<std::vector<char*>> m_arrays;
};

class ParentalControlTest : public SubObjectTest {
protected:
    ParentalControlTest() {
        platform.TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes =
            [this](uint32_t* count, PARENTALRATTINGSCHEME_STRUCT_T_TAG** out) {
                EXPECT_EQ(*count, 0U) << "the result is preset";
                if (refuses) {
                    return 1;
                }
                *count = records.count();
                *out = records.data();
                return 0;
            };
    }

    // A collection outlives its manager by the reference of its creation, and keeps its schemes.
    void TearDown() override {
        if (collectionWasMade) {
            leftBehind("JSParentalRatingSchemeCollection", 1);
            leftBehind("JSParentalRatingScheme", 2 * static_cast<int>(schemesMade));
        }
        leftBehind("JSParentalRating", thresholdsMade); // one reference each
        SubObjectTest::TearDown();
    }

    // The page's collection of the records so far.
    ObjectRef schemes() {
        collectionWasMade = true;
        schemesMade = records.count();
        return host.get("parentalRatingSchemes").object();
    }

    // A scheme of one record.
    ObjectRef schemeOf(const char* name, std::vector<std::pair<std::string, std::string>> ratings = {},
                       uint32_t handle = 60) {
        SchemeRecords own;
        own.add(handle, name, std::move(ratings));
        return make<JSParentalRatingScheme>(
            [&own](ParentalRatingScheme& model) { model.setHandle(*own.data()); });
    }

    void tellThreshold(int32_t threshold) {
        platform.TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold = [threshold](uint32_t, int32_t* out) {
            *out = threshold;
            return 0;
        };
    }

    SchemeRecords records;
    bool refuses = false;
    bool collectionWasMade = false;
    uint32_t schemesMade = 0;
    int thresholdsMade = 0;
};

TEST_F(ParentalControlTest, TheManagerIsMadeByItsMimeTypeAndHasOneReadOnlyProperty) {
    EXPECT_EQ(host.error(), NPERR_NO_ERROR);
    EXPECT_EQ(host.scriptObject().name(), "JSParentalControlManager");
    refuses = true;
    expectReadOnly(host.scriptObject(), {"parentalRatingSchemes"});
    expectNothingElse(host.scriptObject());
}

TEST_F(ParentalControlTest, TheBrowserGetsOneWrapperWithAReferenceEachTime) {
    const ObjectRef wrapper = host.scriptObject();
    EXPECT_EQ(wrapper.pluginReferences(), 1) << "the manager's own";
    host.dropScriptObject();
    EXPECT_EQ(host.scriptObject(), wrapper);
    EXPECT_EQ(browser.liveCount("JSParentalControlManager"), 1U);
}

TEST_F(ParentalControlTest, AsksForNamesInTableOrder) {
    EXPECT_THAT(namesOf<JSParentalRatingSchemeCollection>(),
                ElementsAre("length", "item", "getParentalRatingScheme"));
    EXPECT_THAT(namesOf<JSParentalRatingScheme>(),
                ElementsAre("name", "length", "threshold", "indexOf", "item", "iconUri"));
}

TEST_F(ParentalControlTest, TheSchemesAreOneCollectionReadOnce) {
    records.add(60, "dvb-si", {});
    const ObjectRef collection = schemes();
    EXPECT_EQ(host.get("parentalRatingSchemes").object(), collection);
    EXPECT_EQ(platform.TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes.count(), 1U);
    EXPECT_EQ(collection.get("length"), 1);
    EXPECT_EQ(collection.pluginReferences(), 2) << "of the creation, and the manager's";
}

TEST_F(ParentalControlTest, ARefusalReadsAsNullAndIsAskedForAgain) {
    refuses = true;
    EXPECT_EQ(host.get("parentalRatingSchemes"), nullptr);
    refuses = false;
    records.add(60, "mpaa", {});
    EXPECT_EQ(schemes().get("length"), 1);
    EXPECT_EQ(platform.TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes.count(), 2U);
}

TEST_F(ParentalControlTest, ACollectionThatTheBrowserDoesNotMakeReadsAsNullAndIsTriedAgain) {
    host.scriptObject();
    browser.refuse("NPN_CreateObject", 1);
    EXPECT_EQ(host.get("parentalRatingSchemes"), nullptr);
    EXPECT_EQ(schemes().get("length"), 0);
}

TEST_F(ParentalControlTest, NoSchemesGiveAnEmptyCollection) {
    const ObjectRef collection = schemes();
    EXPECT_EQ(collection.get("length"), 0);
    EXPECT_EQ(collection.call("item", 0), nullptr);
    EXPECT_FALSE(collection.hasProperty("0"));
    EXPECT_EQ(collection.call("getParentalRatingScheme", "mpaa"), nullptr);
    EXPECT_EQ(host.get("parentalRatingSchemes").object(), collection);
}

TEST_F(ParentalControlTest, ACountWithoutAnArrayGivesAnEmptyCollection) {
    platform.TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes = [](uint32_t* count,
                                                                       PARENTALRATTINGSCHEME_STRUCT_T_TAG**) {
        *count = 3;
        return 0;
    };
    EXPECT_EQ(schemes().get("length"), 0);
}

TEST_F(ParentalControlTest, TheManagersEndDropsItsReferencesButOne) {
    const ObjectRef collection = schemes();
    const ObjectRef wrapper = host.scriptObject();
    host.destroy();
    EXPECT_EQ(collection.pluginReferences(), 1);
    EXPECT_EQ(wrapper.pluginReferences(), 0);
    EXPECT_FALSE(wrapper.get("parentalRatingSchemes").succeeded) << "the wrapper has lost its model";
    EXPECT_EQ(collection.get("length"), 0);
}

TEST_F(ParentalControlTest, TheCollectionHasOneReadOnlyPropertyAndTwoMethods) {
    records.add(60, "mpaa", {});
    const ObjectRef collection = schemes();
    expectReadOnly(collection, {"length", "0"});
    expectMethods(collection, {"item", "getParentalRatingScheme"});
    expectNothingElse(collection);
}

TEST_F(ParentalControlTest, TheCollectionHoldsASchemeForEachRecordInOrder) {
    records.add(60, "mpaa", {});
    records.add(61, "dvb-si", {});
    const ObjectRef collection = schemes();
    EXPECT_EQ(collection.call("item", 0).object().get("name"), "mpaa");
    EXPECT_EQ(collection.call("item", 1).object().get("name"), "dvb-si");
    EXPECT_EQ(collection.get("0").object(), collection.call("item", 0).object());
    EXPECT_EQ(collection.get("1x").object(), collection.call("item", 1.9).object());
    EXPECT_EQ(collection.call("item", -1).object(), collection.call("item", 0).object());
    EXPECT_EQ(collection.call("item", 2), nullptr);
    for (const char* name : {"2", "-1", "x1"}) {
        EXPECT_FALSE(collection.hasProperty(name)) << name;
        EXPECT_FALSE(collection.get(name).succeeded) << name;
    }
}

TEST_F(ParentalControlTest, TheCollectionsMethodsRefuseOtherTypes) {
    records.add(60, "mpaa", {});
    const ObjectRef collection = schemes();
    for (const Value& value :
         {Value(undefined), Value(nullptr), Value(true), Value("0"), Value(collection)}) {
        EXPECT_FALSE(collection.call("item", value).succeeded) << value;
    }
    for (const Value& value :
         {Value(undefined), Value(nullptr), Value(true), Value(0), Value(0.5), Value(collection)}) {
        EXPECT_FALSE(collection.call("getParentalRatingScheme", value).succeeded) << value;
    }
    EXPECT_FALSE(collection.call("item").succeeded);
    EXPECT_FALSE(collection.call("getParentalRatingScheme").succeeded);
}

TEST_F(ParentalControlTest, ASchemeIsFoundByItsExactNameTheFirstOfTwo) {
    records.add(60, "mpaa", {});
    records.add(61, "dvb-si", {});
    records.add(62, "dvb-si", {});
    const ObjectRef collection = schemes();
    EXPECT_EQ(collection.call("getParentalRatingScheme", "dvb-si").object(),
              collection.call("item", 1).object());
    EXPECT_EQ(collection.call("getParentalRatingScheme", "DVB-SI"), nullptr);
    EXPECT_EQ(collection.call("getParentalRatingScheme", "unknown"), nullptr);
    EXPECT_EQ(collection.call("getParentalRatingScheme", ""), nullptr);
    EXPECT_EQ(collection.call("item", 1).object().pluginReferences(), 2);
}

TEST_F(ParentalControlTest, ARecordWithoutANameIsAnEmptySchemeOfTheCollection) {
    records.add(60, nullptr, {{"PG", "icon"}});
    const ObjectRef collection = schemes();
    EXPECT_EQ(collection.get("length"), 1);
    const ObjectRef scheme = collection.call("item", 0).object();
    EXPECT_EQ(scheme.get("name"), nullptr);
    EXPECT_EQ(scheme.get("length"), 0);
    EXPECT_EQ(scheme.call("item", 0), nullptr);
    EXPECT_EQ(scheme.call("iconUri", 0.0), nullptr);
    EXPECT_EQ(scheme.call("indexOf", "PG"), -1);
    log.clear();
    EXPECT_EQ(scheme.get("threshold"), nullptr);
    EXPECT_THAT(log.calls(), IsEmpty()) << "it has no handle";
    EXPECT_EQ(collection.call("getParentalRatingScheme", "").object(), scheme);
}

TEST_F(ParentalControlTest, NothingOfThePlatformsRecordsIsNeededLater) {
    records.add(60, "mpaa", {{"PG", "pg.png"}});
    const ObjectRef collection = schemes();
    records.spoil();
    const ObjectRef scheme = collection.call("item", 0).object();
    EXPECT_EQ(scheme.get("name"), "mpaa");
    EXPECT_EQ(scheme.call("item", 0), "PG");
    EXPECT_EQ(scheme.call("iconUri", 0.0), "pg.png");
}

TEST_F(ParentalControlTest, EachSchemeHasTwoReferencesAtTheOutsetAndOneIsLeftBehind) {
    SchemeRecords own;
    own.add(60, "mpaa", {});
    own.add(61, "dvb-si", {});
    ObjectRef collection =
        make<JSParentalRatingSchemeCollection>([&own](ParentalRatingSchemeCollection& model) {
            model.initializeCollection(own.count(), own.data());
        });
    const ObjectRef scheme = collection.call("item", 1).object();
    EXPECT_EQ(scheme.pluginReferences(), 2);
    log.clear();
    collection = {};
    EXPECT_EQ(scheme.pluginReferences(), 1);
    EXPECT_THAT(
        log.startingWith("NPN_ReleaseObject"),
        ElementsAre("NPN_ReleaseObject JSParentalRatingScheme#2", "NPN_ReleaseObject JSParentalRatingScheme"))
        << "from the last to the first";
    leftBehind("JSParentalRatingScheme", 2);
}

TEST_F(ParentalControlTest, CreatesUntilTheBrowserMakesEveryScheme) {
    records.add(60, "mpaa", {});
    records.add(61, "dvb-si", {});
    host.scriptObject();
    browser.refuse("NPN_CreateObject", 3, 2); // after the collection and the first scheme
    const ObjectRef collection = schemes();
    EXPECT_EQ(collection.get("length"), 2);
    EXPECT_EQ(collection.call("item", 1).object().get("name"), "dvb-si");
}

TEST_F(ParentalControlTest, ASchemeHasThreeReadOnlyPropertiesAndThreeMethods) {
    platform.TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold = [](uint32_t, int32_t*) { return 1; };
    const ObjectRef scheme = schemeOf("mpaa", {{"PG", ""}});
    expectReadOnly(scheme, {"name", "length", "threshold"});
    expectMethods(scheme, {"indexOf", "item", "iconUri"});
    expectNothingElse(scheme);
    EXPECT_FALSE(scheme.hasProperty("0")) << "a scheme has no array notation";
}

TEST_F(ParentalControlTest, ASchemeTellsNameLengthAndRatings) {
    const ObjectRef scheme = schemeOf("mpaa", {{"G", "g.png"}, {"PG", "pg.png"}, {"R", ""}});
    EXPECT_EQ(scheme.get("name"), "mpaa");
    EXPECT_EQ(scheme.get("length"), 3);
    EXPECT_EQ(scheme.call("item", 0), "G");
    EXPECT_EQ(scheme.call("item", 1.9), "PG");
    EXPECT_EQ(scheme.call("item", -1), "G");
    EXPECT_EQ(scheme.call("item", 3), nullptr) << "beyond the end";
    EXPECT_EQ(scheme.call("iconUri", 1.9), "pg.png");
    EXPECT_EQ(scheme.call("iconUri", -1.0), "g.png");
    EXPECT_EQ(scheme.call("iconUri", 2.0), nullptr) << "an empty text";
    EXPECT_EQ(scheme.call("iconUri", 3.0), nullptr) << "beyond the end";
}

TEST_F(ParentalControlTest, ASchemesTextsComeFromTheCHeap) {
    const ObjectRef scheme = schemeOf("mpaa", {{"G", "g.png"}});
    log.clear();
    EXPECT_FALSE(scheme.get("name").inBrowserMemory);
    EXPECT_FALSE(scheme.call("item", 0).inBrowserMemory);
    EXPECT_FALSE(scheme.call("iconUri", 0.0).inBrowserMemory);
    EXPECT_EQ(log.count("NPN_MemAlloc"), 0U);
}

TEST_F(ParentalControlTest, ANamelessSchemeReadsANullName) {
    const ObjectRef scheme = schemeOf("", {{"G", ""}});
    EXPECT_EQ(scheme.get("name"), nullptr);
    EXPECT_EQ(scheme.get("length"), 1);
}

TEST_F(ParentalControlTest, DvbSiTellsLengthZeroThoughItsRatingsCanBeHad) {
    const ObjectRef scheme = schemeOf("dvb-si", {{"4", "4.png"}, {"5", "5.png"}});
    EXPECT_EQ(scheme.get("length"), 0);
    EXPECT_EQ(scheme.call("item", 0), "4");
    EXPECT_EQ(scheme.call("iconUri", 1.0), "5.png");
    EXPECT_EQ(scheme.call("indexOf", "5"), 1);
}

TEST_F(ParentalControlTest, OnlyTheExactNameHidesTheLength) {
    EXPECT_EQ(schemeOf("DVB-SI", {{"4", ""}}).get("length"), 1);
    EXPECT_EQ(schemeOf("dvb-si ", {{"4", ""}}).get("length"), 1);
}

TEST_F(ParentalControlTest, IndexOfFindsTheFirstExactName) {
    const ObjectRef scheme = schemeOf("mpaa", {{"", ""}, {"PG", ""}, {"PG", ""}});
    EXPECT_EQ(scheme.call("indexOf", "PG"), 1);
    EXPECT_EQ(scheme.call("indexOf", "pg"), -1);
    EXPECT_EQ(scheme.call("indexOf", "unknown"), -1);
    EXPECT_EQ(scheme.call("indexOf", ""), -1) << "even where a rating has no name";
}

TEST_F(ParentalControlTest, IndexOfTakesATextAndItemANumber) {
    const ObjectRef scheme = schemeOf("mpaa", {{"PG", ""}});
    for (const Value& value :
         {Value(undefined), Value(nullptr), Value(true), Value(0), Value(0.5), Value(scheme)}) {
        EXPECT_FALSE(scheme.call("indexOf", value).succeeded) << value;
    }
    for (const Value& value : {Value(undefined), Value(nullptr), Value(true), Value("0"), Value(scheme)}) {
        EXPECT_FALSE(scheme.call("item", value).succeeded) << value;
    }
    EXPECT_FALSE(scheme.call("indexOf").succeeded);
    EXPECT_FALSE(scheme.call("item").succeeded);
}

TEST_F(ParentalControlTest, IconUriReadsAnythingAsTheBitsOfADouble) {
    const ObjectRef scheme = schemeOf("mpaa", {{"G", "g.png"}, {"PG", "pg.png"}});
    // The bits of each of these make a double between 0 and 1.
    for (const Value& value : {Value(1), Value(-1), Value(true), Value(nullptr), Value("1"), Value(scheme)}) {
        EXPECT_EQ(scheme.call("iconUri", value), "g.png") << value;
    }
    EXPECT_EQ(scheme.call("iconUri", 1.0), "pg.png");
}

TEST_F(ParentalControlTest, EachReadOfTheThresholdMakesARatingWithAReferenceLeftBehind) {
    tellThreshold(15);
    const ObjectRef scheme = schemeOf("mpaa");
    log.clear();
    const ObjectRef threshold = scheme.get("threshold").object();
    const ObjectRef another = scheme.get("threshold").object();
    thresholdsMade = 2;
    EXPECT_THAT(log.startingWith("TELIX"),
                ElementsAre("TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(60, out)",
                            "TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold(60, out)"));
    EXPECT_NE(threshold, another);
    log.clear();
    for (const ObjectRef& rating : {threshold, another}) {
        EXPECT_EQ(rating.pluginReferences(), 1);
        EXPECT_EQ(rating.get("name"), "15");
        EXPECT_EQ(rating.get("value"), 15);
        EXPECT_EQ(rating.get("scheme"), "mpaa");
        EXPECT_EQ(rating.get("region"), "undefined");
        EXPECT_EQ(rating.get("labels"), 0);
        EXPECT_EQ(modelOf<JSParentalRating>(rating).getParentalRatingHandle(), 15U);
    }
    EXPECT_EQ(log.count("TELIX"), 0U);
}

TEST_F(ParentalControlTest, AThresholdThatCannotBeHadReadsAsNull) {
    tellThreshold(15);
    const ObjectRef scheme = schemeOf("mpaa");
    browser.refuse("NPN_CreateObject", 1);
    EXPECT_EQ(scheme.get("threshold"), nullptr) << "the browser makes no object";
    platform.TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold = [](uint32_t, int32_t* out) {
        *out = 15;
        return 1;
    };
    EXPECT_EQ(scheme.get("threshold"), nullptr) << "the platform refuses";
    log.clear();
    EXPECT_EQ(schemeOf("mpaa", {}, 0).get("threshold"), nullptr) << "the scheme has no handle";
    EXPECT_EQ(log.count("TELIX"), 0U);
}

TEST_F(ParentalControlTest, LogsUnderItsModule) {
    const std::string text = logOf(8, [this] {
        tellThreshold(15);
        records.add(60, "mpaa", {});
        EXPECT_TRUE(schemes().get("0").object().get("threshold"));
    });
    EXPECT_THAT(text,
                HasSubstr(logLine("PARENTAL", "setHandle", " parentalRatingScheme.szName is:: ( mpaa )\n")));
    EXPECT_THAT(text,
                HasSubstr(logLine("PARENTAL", "getThreshold", " parentalRatingThreshold is:: ( 15 )\n")));
    EXPECT_THAT(text, HasSubstr(logLine("PARENTAL", "GetProperty", "Array Notation Index:-- 0 --\n")));
    collectionWasMade = false; // but in the process of the log
}

TEST_F(ParentalControlTest, AThresholdIsRetainedBeforeItIsFilled) {
    const std::string text = logOf(1, [this] {
        tellThreshold(15);
        records.add(60, "mpaa", {});
        EXPECT_TRUE(schemes().get("0").object().get("threshold"));
    });
    const size_t told = text.find("parentalRatingThreshold is:: ( 15 )");
    const size_t created = text.find("NPN_CreateObject", told);
    const size_t retained = text.find("NPN_RetainObject", created);
    const size_t filled = text.find("Buffer value is:: ( 15 )", told);
    EXPECT_TRUE(told < created && created < retained && retained < filled && filled != std::string::npos)
        << text;
    collectionWasMade = false; // but in the process of the log
}

} // namespace
