// A list of A/V components as a page sees it.
#include "src/avcomponent/JSAVcomponent.h"
#include "src/avcomponent/JSAVcomponentList.h"
#include "tests/support/SubObjectTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

namespace {

class AVcomponentListTest : public SubObjectTest {
protected:
    void TearDown() override {
        leftBehind("JSAVcomponent", componentsLeftBehind);
        SubObjectTest::TearDown();
    }

    // A list whose components outlive it on purpose.
    ObjectRef listOf(std::vector<uint32_t> handles, AVcompType_T type = AVCOMP_TYPE_AUDIO,
                     AVcompObjType_T objType = AVCOMP_OBJ_VIDEOBROADCAST) {
        componentsLeftBehind += static_cast<int>(handles.size());
        handles.push_back(0); // so that there is an array even for none
        return make<JSAVcomponentList>([&](AVcomponentList& model) {
            model.initialize(handles.data(), type, objType, static_cast<unsigned>(handles.size() - 1));
        });
    }

    // Has both families give a component's handle as its number of channels.
    void tellHandles() {
        const auto tell = [](uint32_t handle, uint32_t, uint32_t* out) {
            *out = handle;
            return 0;
        };
        platform.TELIX_JS_VB_AVComponent_GetAudioChannels = tell;
        platform.TELIX_JS_AV_AVComponent_GetAudioChannels = tell;
    }

    int componentsLeftBehind = 0; // one reference each
};

TEST_F(AVcomponentListTest, AsksForItsNamesInTableOrder) {
    EXPECT_THAT(namesOf<JSAVcomponentList>(), ElementsAre("item", "length"));
}

TEST_F(AVcomponentListTest, LengthIsReadOnlyAndItemAMethod) {
    const ObjectRef list = listOf({1});
    expectReadOnly(list, {"length", "0"});
    expectMethods(list, {"item"});
    expectNothingElse(list);
    EXPECT_EQ(list.get("length"), 1);
}

TEST_F(AVcomponentListTest, HoldsAComponentForEachHandleInOrder) {
    tellHandles();
    const ObjectRef list = listOf({8, 6, 7}, AVCOMP_TYPE_SUBTITLE, AVCOMP_OBJ_VIDEOBROADCAST);
    EXPECT_EQ(list.get("length"), 3);
    log.clear();
    EXPECT_EQ(list.call("item", 0).object().get("audioChannels"), 8);
    EXPECT_EQ(list.call("item", 1).object().get("audioChannels"), 6);
    EXPECT_EQ(list.call("item", 2).object().get("audioChannels"), 7);
    EXPECT_EQ(list.call("item", 2).object().get("type"), 2);
    EXPECT_THAT(log.calls(), ElementsAre("TELIX_JS_VB_AVComponent_GetAudioChannels(8, 2, out)",
                                         "TELIX_JS_VB_AVComponent_GetAudioChannels(6, 2, out)",
                                         "TELIX_JS_VB_AVComponent_GetAudioChannels(7, 2, out)"));
}

TEST_F(AVcomponentListTest, ServesTheAVControlWithTheOtherFamily) {
    tellHandles();
    const ObjectRef list = listOf({8}, AVCOMP_TYPE_VIDEO, AVCOMP_OBJ_AVCONTROL);
    log.clear();
    EXPECT_EQ(list.call("item", 0).object().get("audioChannels"), 8);
    EXPECT_THAT(log.calls(), ElementsAre("TELIX_JS_AV_AVComponent_GetAudioChannels(8, 0, out)"));
}

TEST_F(AVcomponentListTest, AnEmptyListHasLengthZeroNoIndexAndNoItem) {
    const ObjectRef list = listOf({});
    EXPECT_EQ(list.get("length"), 0);
    EXPECT_FALSE(list.hasProperty("0"));
    EXPECT_FALSE(list.get("0").succeeded);
    EXPECT_EQ(list.call("item", 0), nullptr);
}

TEST_F(AVcomponentListTest, ItemTakesAnyNumberTruncatedAndSaturated) {
    const ObjectRef list = listOf({1, 2});
    const ObjectRef first = list.call("item", 0).object();
    const ObjectRef second = list.call("item", 1).object();
    EXPECT_NE(first, second);
    EXPECT_EQ(list.call("item", 1.9).object(), second);
    EXPECT_EQ(list.call("item", -1).object(), first);
    EXPECT_EQ(list.call("item", -1.5).object(), first);
    EXPECT_EQ(list.call("item", 2), nullptr);
    EXPECT_EQ(list.call("item", 1e20), nullptr);
}

TEST_F(AVcomponentListTest, ItemTakesNothingButANumber) {
    const ObjectRef list = listOf({1});
    for (const Value& value : {Value(undefined), Value(nullptr), Value(true), Value("0"), Value(list)}) {
        EXPECT_FALSE(list.call("item", value).succeeded) << value;
    }
    EXPECT_FALSE(list.call("item").succeeded);
}

TEST_F(AVcomponentListTest, ArrayNotationGivesTheObjectsOfItem) {
    const ObjectRef list = listOf({1, 2});
    EXPECT_EQ(list.get("0").object(), list.call("item", 0).object());
    EXPECT_EQ(list.get("1x").object(), list.call("item", 1).object());
    for (const char* name : {"2", "-1", "x1"}) {
        EXPECT_FALSE(list.hasProperty(name)) << name;
        EXPECT_FALSE(list.get(name).succeeded) << name;
    }
}

TEST_F(AVcomponentListTest, AReadThatFindsNothingLeavesTheResultAlone) {
    const ObjectRef list = listOf({1});
    NPVariant result{};
    result.type = NPVariantType_Int32;
    result.value.intValue = 77;
    EXPECT_FALSE(list.object()->_class->getProperty(list.object(), Name("1").identifier(), &result));
    EXPECT_EQ(result.type, NPVariantType_Int32);
    EXPECT_EQ(result.value.intValue, 77);
}

TEST_F(AVcomponentListTest, EachComponentHasTwoReferencesAtTheOutsetAndOneIsLeftBehind) {
    ObjectRef list = listOf({1, 2});
    const ObjectRef component = list.call("item", 1).object();
    EXPECT_EQ(component.pluginReferences(), 2);
    log.clear();
    list = {};
    EXPECT_EQ(component.pluginReferences(), 1);
    EXPECT_THAT(log.startingWith("NPN_ReleaseObject"),
                ElementsAre("NPN_ReleaseObject JSAVcomponent#2", "NPN_ReleaseObject JSAVcomponent"))
        << "from the last to the first";
}

TEST_F(AVcomponentListTest, CreatesUntilTheBrowserMakesEveryComponent) {
    const ObjectRef list = listOf({});
    browser.refuse("NPN_CreateObject", 4, 1); // after the first component
    const uint32_t handles[] = {1, 2, 3};
    modelOf<JSAVcomponentList>(list).initialize(handles, AVCOMP_TYPE_AUDIO, AVCOMP_OBJ_AVCONTROL, 3);
    componentsLeftBehind += 3;
    EXPECT_EQ(list.get("length"), 3);
}

TEST_F(AVcomponentListTest, ASecondFillOnlyAddsWhatIsMissing) {
    tellHandles();
    const ObjectRef list = listOf({1, 2});
    AVcomponentList& model = modelOf<JSAVcomponentList>(list);
    const uint32_t handles[] = {11, 12, 13};
    model.initialize(handles, AVCOMP_TYPE_AUDIO, AVCOMP_OBJ_AVCONTROL, 2);
    model.initialize(handles, AVCOMP_TYPE_AUDIO, AVCOMP_OBJ_AVCONTROL, 1);
    EXPECT_EQ(list.get("length"), 2);
    model.initialize(handles, AVCOMP_TYPE_AUDIO, AVCOMP_OBJ_AVCONTROL, 3);
    componentsLeftBehind += 1;
    EXPECT_EQ(list.get("length"), 3);
    EXPECT_EQ(list.get("0").object().get("audioChannels"), 1);
    EXPECT_EQ(list.get("2").object().get("audioChannels"), 13);
}

using AVcomponentListDeathTest = AVcomponentListTest;

TEST_F(AVcomponentListDeathTest, WithoutAnArrayItStopsEvenForNoComponent) {
    const ObjectRef list = listOf({});
    EXPECT_DEATH(
        modelOf<JSAVcomponentList>(list).initialize(nullptr, AVCOMP_TYPE_AUDIO, AVCOMP_OBJ_AVCONTROL, 0),
        "pHandles");
}

TEST_F(AVcomponentListTest, LogsArrayNotationUnderTheChannelsModule) {
    const auto read = [this] { EXPECT_TRUE(listOf({1}).get("0")); };
    const std::string line = logLine("CHANNEL", "GetProperty", " Array Notation Index:-- 0 --\n");
    EXPECT_THAT(logOf(4, read), HasSubstr(line));
    EXPECT_THAT(logOf(10, read), Not(HasSubstr("Array Notation Index")));
    EXPECT_THAT(logOf(10, [this] { listOf({}).set("length", 1); }), HasSubstr("AV_COMP :: SetProperty"));
}

} // namespace
