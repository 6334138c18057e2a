// The scriptable object base: the way from the browser's class record to a model's operation and back. The
// wrapper here stands for all: every kind of property, method and result, and array notation.
#include "common/ScriptWrapper.h"

#include <limits>

#include "common/ScriptReferences.h"
#include "tests/support/BorderTest.h"

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;
using ::testing::Not;

namespace {

// A model with one operation of each shape. Its items are page objects.
class Shelf final : public PluginBase {
public:
    explicit Shelf(NPP npp) : PluginBase(npp) { ++alive; }
    ~Shelf() {
        releaseHeld(m_listener);
        --alive;
    }

    bool isOpen() { return true; }
    int32_t depth() { return m_depth; }
    void setDepth(int32_t depth) { m_depth = depth; }
    uint32_t highNumber() { return 0x80000000U; }
    double weight() { return 2.5; }
    std::string label() { return m_label; }
    void setLabel(const std::string& label) {
        m_label = label;
        if (onLabel) {
            onLabel();
        }
    }
    NPObject* listener() { return handOut(m_listener); }
    void setListener(NPObject* listener) { replaceListener(m_listener, listener); }
    uint32_t length() { return static_cast<uint32_t>(items.size()); }
    NPObject* item(uint32_t index) { return index < items.size() ? handOut(items[index]) : nullptr; }
    void clear() { m_depth = 0; }
    std::string join(const std::string& text, uint32_t number, bool flag) {
        return text + " " + std::to_string(number) + (flag ? " yes" : " no");
    }
    void note(const std::string&, const std::string&, const std::string&) {}
    NPObject* echo(NPObject* object) { return handOut(object); }

    static inline int alive = 0;
    static inline std::function<void()> onLabel;
    static inline std::vector<NPObject*> items;

private:
    int32_t m_depth = 7;
    std::string m_label = "label";
    NPObject* m_listener = nullptr;
};

bool readDuplicate(PluginBase& model, NPVariant& result) {
    setDuplicatedText(result, static_cast<Shelf&>(model).label());
    return true;
}

constexpr ScriptMember kShelfMembers[] = {
    property("isOpen", reader<&Shelf::isOpen>),
    property("depth", reader<&Shelf::depth>, writer<&Shelf::setDepth>),
    property("highNumber", reader<&Shelf::highNumber>),
    property("weight", reader<&Shelf::weight>),
    property("label", reader<&Shelf::label>, writer<&Shelf::setLabel>),
    property("duplicate", readDuplicate),
    property("onChange", reader<&Shelf::listener>, listenerWriter<&Shelf::setListener>),
    property("length", reader<&Shelf::length>),
    constant("LIMIT", 12),
    method("item", invoker<&Shelf::item>),
    method("clear", invoker<&Shelf::clear>),
    method("join", invoker<&Shelf::join>),
    method("note", invoker<&Shelf::note>),
    method("echo", invoker<&Shelf::echo>),
};

constexpr ScriptArray kShelfItems = scriptArray<&Shelf::length, &Shelf::item>(LogModule::CHANNEL, " ");
constexpr ScriptClass kShelfClass =
    ScriptClass("JSShelf", LogModule::CHANNEL, kShelfMembers).withArray(&kShelfItems);

class JSShelf final : public SubObjectWrapper<Shelf, std::size(kShelfMembers)> {
public:
    explicit JSShelf(NPP npp) : SubObjectWrapper(npp, kShelfClass) {}
};

class ScriptWrapperTest : public BorderTest {
protected:
    ScriptWrapperTest() {
        shelf = ObjectRef::adopt(createScriptObject<JSShelf>(tv.npp()));
        log.clear();
    }
    ~ScriptWrapperTest() override { Shelf::items.clear(); }

    EmbeddedObject tv = browser.embed("application/none");
    ObjectRef shelf;
};

TEST_F(ScriptWrapperTest, TheClassRecordHoldsTheThunksInOrder) {
    const NPClass& record = *JSPluginBase::classOf<JSShelf>();
    EXPECT_EQ(record.structVersion, 3U);
    EXPECT_NE(record.allocate, nullptr);
    EXPECT_EQ(record.deallocate, JSPluginBase::_Deallocate);
    EXPECT_EQ(record.invalidate, JSPluginBase::_Invalidate);
    EXPECT_EQ(record.hasMethod, JSPluginBase::_HasMethod);
    EXPECT_EQ(record.invoke, JSPluginBase::_Invoke);
    EXPECT_EQ(record.invokeDefault, JSPluginBase::_InvokeDefault);
    EXPECT_EQ(record.hasProperty, JSPluginBase::_HasProperty);
    EXPECT_EQ(record.getProperty, JSPluginBase::_GetProperty);
    EXPECT_EQ(record.setProperty, JSPluginBase::_SetProperty);
    EXPECT_EQ(record.removeProperty, JSPluginBase::_RemoveProperty);
    EXPECT_EQ(record.enumerate, JSPluginBase::_Enumerate);
    EXPECT_EQ(record.construct, JSPluginBase::_Construct);
}

TEST_F(ScriptWrapperTest, DeallocatingNullDoesNothing) {
    JSPluginBase::_Deallocate(nullptr);
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(ScriptWrapperTest, AWrapperOwnsItsModel) {
    EXPECT_EQ(Shelf::alive, 1);
    EXPECT_EQ(wrapperOf<JSShelf>(shelf.object())->impl()->getBrowser(), tv.npp());
    shelf = {};
    EXPECT_EQ(Shelf::alive, 0);
}

TEST_F(ScriptWrapperTest, TheDestructorLogsFirstUnderItsOwnNameThenDeletesTheModel) {
    shelf.set("onChange", browser.function("listener")); // its release is what the model's end logs
    const std::string text = logOf(1, [this] { shelf = {}; });
    EXPECT_THAT(text,
                MatchesRegex(" PLUGIN >>> CHANNEL :: ~JSShelf :: Destructor called, This:-- 0x[0-9a-f]+ --\n"
                             " PLUGIN >>> COMMON :: NPN_ReleaseObject ::  is called\n"));
}

TEST_F(ScriptWrapperTest, TheWrapperOfAnEmbeddedObjectLogsItsDestructorToo) {
    EmbeddedObject manager = browser.embed("application/oipfparentalcontrolmanager");
    manager.scriptObject();
    manager.destroy();
    EXPECT_THAT(logOf(8, [&] { manager.dropScriptObject(); }),
                MatchesRegex(" PLUGIN >>> PARENTAL :: ~JSParentalControlManager :: Destructor called, .*\n"));
}

TEST_F(ScriptWrapperTest, TheWrapperOfNullIsNull) {
    EXPECT_EQ(wrapperOf<JSShelf>(nullptr), nullptr);
}

TEST_F(ScriptWrapperTest, TheWrapperOfAnObjectOfAnotherClassIsNull) {
    const ScriptObject plain = browser.scriptObject("plain");
    const EmbeddedObject manager = browser.embed("application/oipfparentalcontrolmanager");
    EXPECT_EQ(wrapperOf<JSShelf>(plain.object()), nullptr);
    EXPECT_EQ(wrapperOf<JSShelf>(manager.scriptObject().object()), nullptr);
    EXPECT_NE(wrapperOf<JSShelf>(shelf.object()), nullptr);
}

// A browser that frees an object while a call into it is under way: the object stays until the outermost call
// returns.
TEST_F(ScriptWrapperTest, AWrapperOutlivesTheCallsIntoIt) {
    NPClass* record = JSPluginBase::classOf<JSShelf>();
    NPObject* object = record->allocate(tv.npp(), record);
    object->_class = record;
    object->referenceCount = 1;
    const int before = Shelf::alive;
    const ArgumentArray label({Value("text")});
    NPVariant result{};
    int calls = 0;
    Shelf::onLabel = [&] {
        if (++calls == 1) {
            record->setProperty(object, Name("label").identifier(), label.data());
            record->invoke(object, Name("clear").identifier(), label.data(), 0, &result);
            EXPECT_EQ(Shelf::alive, before) << "an inner call has ended it";
        } else {
            record->deallocate(object);
            EXPECT_EQ(Shelf::alive, before);
        }
    };
    EXPECT_TRUE(record->setProperty(object, Name("label").identifier(), label.data()));
    Shelf::onLabel = nullptr;
    EXPECT_EQ(calls, 2);
    EXPECT_EQ(Shelf::alive, before - 1);
}

TEST_F(ScriptWrapperTest, NamesAreInternedOnceInTheOrderOfTheTable) {
    log.clear();
    const ObjectRef another = ObjectRef::adopt(createScriptObject<JSShelf>(tv.npp()));
    std::vector<std::string> expected = {"NPN_CreateObject JSShelf#2"};
    for (const ScriptMember& member : kShelfMembers) {
        expected.push_back("NPN_GetStringIdentifier \"" + std::string(member.name) + "\"");
    }
    EXPECT_EQ(log.everything(), expected);
    log.clear();
    EXPECT_TRUE(another.get("depth"));
    EXPECT_TRUE(another.call("clear"));
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(ScriptWrapperTest, ARefusedCreationGivesNull) {
    browser.refuse("NPN_CreateObject", 1);
    EXPECT_EQ(createScriptObject<JSShelf>(tv.npp()), nullptr);
    NPObject* slot = nullptr;
    browser.refuse("NPN_CreateObject", 1);
    EXPECT_EQ(handOutOnce<JSShelf>(tv.npp(), slot), nullptr);
    EXPECT_EQ(slot, nullptr);
}

TEST_F(ScriptWrapperTest, MethodsAndPropertiesAreToldApart) {
    EXPECT_TRUE(shelf.hasMethod("clear"));
    EXPECT_FALSE(shelf.hasProperty("clear"));
    EXPECT_TRUE(shelf.hasProperty("depth"));
    EXPECT_FALSE(shelf.hasMethod("depth"));
    EXPECT_TRUE(shelf.hasProperty("LIMIT"));
    EXPECT_FALSE(shelf.hasProperty("limit"));
    EXPECT_FALSE(shelf.hasMethod("unknown"));
    EXPECT_FALSE(shelf.get("clear"));
    EXPECT_FALSE(shelf.call("depth"));
    EXPECT_FALSE(shelf.get("unknown"));
    EXPECT_FALSE(shelf.call("unknown"));
}

TEST_F(ScriptWrapperTest, AnIdentifierOfTheSameTextObtainedLaterIsTheSameName) {
    EXPECT_TRUE(JSPluginBase::_HasMethod(shelf.object(), NPN_GetStringIdentifier("clear")));
    EXPECT_TRUE(JSPluginBase::_HasProperty(shelf.object(), NPN_GetStringIdentifier("depth")));
}

TEST_F(ScriptWrapperTest, NothingCanBeCalledRemovedEnumeratedOrConstructed) {
    EXPECT_FALSE(shelf.callDefault());
    EXPECT_FALSE(shelf.remove("depth"));
    EXPECT_FALSE(shelf.enumerate());
    EXPECT_FALSE(shelf.construct());
    EXPECT_EQ(shelf.get("depth"), 7);
}

TEST_F(ScriptWrapperTest, ResultsHaveTheTypeOfTheModels) {
    EXPECT_EQ(shelf.get("isOpen"), true);
    EXPECT_EQ(shelf.get("depth"), 7);
    EXPECT_EQ(shelf.get("highNumber"), std::numeric_limits<int32_t>::min());
    EXPECT_EQ(shelf.get("weight"), 2.5);
    EXPECT_EQ(shelf.get("label"), "label");
    EXPECT_EQ(shelf.get("LIMIT"), 12);
    EXPECT_EQ(shelf.get("onChange"), nullptr);
}

TEST_F(ScriptWrapperTest, AStringIsCopiedIntoTheBrowsersMemoryWithoutAZero) {
    EXPECT_TRUE(shelf.get("label").inBrowserMemory);
    EXPECT_THAT(log.everything(), ElementsAre("NPN_MemAlloc 5"));
}

TEST_F(ScriptWrapperTest, AnEmptyStringIsNull) {
    shelf.set("label", "");
    EXPECT_EQ(shelf.get("label"), nullptr);
    EXPECT_EQ(log.count("NPN_MemAlloc"), 0U);
}

TEST_F(ScriptWrapperTest, AStringWithoutMemoryIsNull) {
    browser.refuse("NPN_MemAlloc");
    EXPECT_EQ(shelf.get("label"), nullptr);
    EXPECT_EQ(shelf.call("join", "a", 1, true), nullptr);
}

TEST_F(ScriptWrapperTest, ADuplicatedStringComesFromTheCHeapTheEmptyOneToo) {
    const Outcome duplicate = shelf.get("duplicate");
    EXPECT_EQ(duplicate, "label");
    EXPECT_FALSE(duplicate.inBrowserMemory);
    shelf.set("label", "");
    EXPECT_EQ(shelf.get("duplicate"), "");
    EXPECT_EQ(log.count("NPN_MemAlloc"), 0U);
}

TEST_F(ScriptWrapperTest, AnOperationWithoutResultLeavesTheResultAsItWas) {
    NPVariant result{};
    result.type = NPVariantType_Int32;
    result.value.intValue = 99;
    const ArgumentArray none({});
    EXPECT_TRUE(JSPluginBase::_Invoke(shelf.object(), Name("clear").identifier(), none.data(), 0, &result));
    EXPECT_EQ(result.type, NPVariantType_Int32);
    EXPECT_EQ(result.value.intValue, 99);
}

TEST_F(ScriptWrapperTest, AReadThatMissesSetsTheResultToVoid) {
    NPVariant result{};
    result.type = NPVariantType_Int32;
    EXPECT_FALSE(JSPluginBase::_GetProperty(shelf.object(), Name("unknown").identifier(), &result));
    EXPECT_EQ(result.type, NPVariantType_Void);
}

TEST_F(ScriptWrapperTest, ArgumentsOfTheRightTypesReachTheModel) {
    EXPECT_EQ(shelf.call("join", "a", 1, true), "a 1 yes");
    EXPECT_EQ(shelf.call("join", "a", 2.9, false), "a 2 no");
    EXPECT_EQ(shelf.call("join", "a", -1.0, false), "a 0 no");
    EXPECT_EQ(shelf.call("join", "a", 5e9, false), "a 4294967295 no");
}

TEST_F(ScriptWrapperTest, ArgumentsAreConvertedFromTheFirstToTheLast) {
    const auto converted = [](const std::string& text) {
        return logLine("COMMON", "stringValue", "In stringValue() function, string is: " + text + ". \n");
    };
    EXPECT_EQ(logOf(9, [this] { EXPECT_TRUE(shelf.call("note", "a", "b", "c")); }),
              converted("a") + converted("b") + converted("c"));
}

TEST_F(ScriptWrapperTest, AStringOfScriptEndsAtItsFirstZeroByte) {
    const std::string text("ab\0cd", 5);
    EXPECT_EQ(shelf.call("join", text, 1, true), "ab 1 yes");
    EXPECT_TRUE(shelf.set("label", text));
    EXPECT_EQ(shelf.get("label"), "ab");
}

TEST_F(ScriptWrapperTest, ArgumentsOfOtherTypesFailTheCall) {
    EXPECT_FALSE(shelf.call("join", 1, 1, true));
    EXPECT_FALSE(shelf.call("join", "a", "1", true));
    EXPECT_FALSE(shelf.call("join", "a", true, true));
    EXPECT_FALSE(shelf.call("join", "a", 1, 1));
    EXPECT_FALSE(shelf.call("join", "a", 1, nullptr));
    EXPECT_FALSE(shelf.call("join"));
    EXPECT_FALSE(shelf.call("echo", nullptr));
    EXPECT_FALSE(shelf.call("echo", undefined));
}

TEST_F(ScriptWrapperTest, FurtherArgumentsAreIgnoredAndTheCountIsNotLookedAt) {
    EXPECT_EQ(shelf.call("join", "a", 1, true, "more"), "a 1 yes");
    const ArgumentArray array({"a", 1, true});
    NPVariant result{};
    EXPECT_TRUE(JSPluginBase::_Invoke(shelf.object(), Name("join").identifier(), array.data(), 0, &result));
    EXPECT_EQ(Value::take(result), "a 1 yes");
}

TEST_F(ScriptWrapperTest, AnObjectGoesThroughWithTheReferenceThatTheModelAdds) {
    const ScriptObject object = browser.scriptObject("object");
    EXPECT_EQ(shelf.call("echo", object), object);
    EXPECT_EQ(object.pluginReferences(), 0);
}

TEST_F(ScriptWrapperTest, AWriteTakesAValueOfTheRightTypeOnly) {
    EXPECT_TRUE(shelf.set("depth", 3.7));
    EXPECT_EQ(shelf.get("depth"), 3);
    EXPECT_FALSE(shelf.set("depth", "4"));
    EXPECT_FALSE(shelf.set("depth", nullptr));
    EXPECT_EQ(shelf.get("depth"), 3);
    EXPECT_TRUE(shelf.set("label", "new"));
    EXPECT_EQ(shelf.get("label"), "new");
    EXPECT_FALSE(shelf.set("label", 5));
}

TEST_F(ScriptWrapperTest, WhatIsNotWritableRefusesAWrite) {
    EXPECT_FALSE(shelf.set("isOpen", false));
    EXPECT_FALSE(shelf.set("LIMIT", 1));
    EXPECT_FALSE(shelf.set("clear", 1));
    EXPECT_FALSE(shelf.set("unknown", 1));
    EXPECT_FALSE(shelf.set("0", 1));
}

TEST_F(ScriptWrapperTest, AListenerIsKeptReplacedAndCleared) {
    const ScriptFunction first = browser.function("first");
    const ScriptFunction second = browser.function("second");
    EXPECT_TRUE(shelf.set("onChange", first));
    EXPECT_EQ(shelf.get("onChange"), first);
    EXPECT_EQ(first.pluginReferences(), 1);
    EXPECT_TRUE(shelf.set("onChange", second));
    EXPECT_EQ(first.pluginReferences(), 0);
    EXPECT_EQ(second.pluginReferences(), 1);
    EXPECT_TRUE(shelf.set("onChange", nullptr));
    EXPECT_EQ(second.pluginReferences(), 0);
    EXPECT_EQ(shelf.get("onChange"), nullptr);
}

TEST_F(ScriptWrapperTest, AListenerWrittenAsAnythingElseStays) {
    const ScriptFunction listener = browser.function("listener");
    shelf.set("onChange", listener);
    for (const Value& value : {Value(5), Value(0.5), Value("text"), Value(true), Value()}) {
        EXPECT_TRUE(shelf.set("onChange", value)) << value;
        EXPECT_EQ(shelf.get("onChange"), listener) << value;
    }
}

TEST_F(ScriptWrapperTest, AListenerIsReleasedWithTheModel) {
    const ScriptFunction listener = browser.function("listener");
    shelf.set("onChange", listener);
    shelf = {};
    EXPECT_EQ(listener.pluginReferences(), 0);
}

TEST_F(ScriptWrapperTest, ArrayNotationReadsTheItemsBelowTheLength) {
    const ScriptObject items[] = {browser.scriptObject("a"), browser.scriptObject("b"),
                                  browser.scriptObject("c")};
    for (const ScriptObject& item : items) {
        Shelf::items.push_back(item.object());
    }
    EXPECT_EQ(shelf.get("0"), items[0]);
    EXPECT_EQ(shelf.get("2"), items[2]);
    EXPECT_FALSE(shelf.hasProperty("3"));
    EXPECT_FALSE(shelf.get("3"));
    EXPECT_FALSE(shelf.hasProperty("a"));
    EXPECT_FALSE(shelf.hasProperty("-1"));
    EXPECT_EQ(shelf.get("2x"), items[2]);
    EXPECT_FALSE(shelf.hasMethod("0"));
    EXPECT_EQ(items[2].pluginReferences(), 0);
}

TEST_F(ScriptWrapperTest, AnItemThatIsNullReadsAsNull) {
    Shelf::items = {nullptr};
    EXPECT_EQ(shelf.get("0"), nullptr);
    EXPECT_EQ(shelf.call("item", 0), nullptr);
}

TEST_F(ScriptWrapperTest, NamedAccessDoesNoStringWork) {
    shelf.get("depth");
    shelf.call("clear");
    EXPECT_EQ(log.count("NPN_UTF8FromIdentifier"), 0U);
    shelf.hasProperty("1");
    EXPECT_EQ(log.count("NPN_UTF8FromIdentifier"), 1U);
}

TEST_F(ScriptWrapperTest, TheNameOfAMethodIsLookedAtAsAnIndexOfTheListAndIsNone) {
    Shelf::items = {nullptr};
    const NPIdentifier name = Name("item").identifier();
    EXPECT_FALSE(JSPluginBase::_HasProperty(shelf.object(), name));
    EXPECT_THAT(log.everything(), ElementsAre("NPN_UTF8FromIdentifier item"));
    NPVariant result{};
    result.type = NPVariantType_Int32;
    EXPECT_FALSE(JSPluginBase::_GetProperty(shelf.object(), name, &result));
    EXPECT_EQ(result.type, NPVariantType_Void);
    EXPECT_EQ(log.count("NPN_UTF8FromIdentifier item"), 2U);
    EXPECT_EQ(log.count("NPN_"), 2U);
}

TEST_F(ScriptWrapperTest, LogsUnderTheModuleOfTheClass) {
    Shelf::items = {nullptr};
    EXPECT_THAT(logOf(4,
                      [this] {
                          shelf.get("depth");
                          shelf.get("LIMIT");
                          shelf.call("clear");
                          shelf.get("0");
                      }),
                AllOf(HasSubstr("CHANNEL :: GetProperty ::  pId_depth\n"),
                      HasSubstr("CHANNEL :: GetProperty ::  cId_LIMIT\n"),
                      HasSubstr("CHANNEL :: Invoke ::  mId_clear\n"),
                      HasSubstr("CHANNEL :: GetProperty ::  Array Notation Index:-- 0 --\n"),
                      Not(HasSubstr("COMMON"))));
}

// A class that changes nothing of what the base does.
class BareWrapper final : public JSPluginBase {
public:
    explicit BareWrapper(NPP) {}
    bool HasMethod(NPIdentifier name) override { return JSPluginBase::HasMethod(name); }
    bool Invoke(NPIdentifier name, const NPVariant* args, unsigned int argCount, NPVariant* result) override {
        return JSPluginBase::Invoke(name, args, argCount, result);
    }
    bool InvokeDefault(const NPVariant* args, unsigned int argCount, NPVariant* result) override {
        return JSPluginBase::InvokeDefault(args, argCount, result);
    }
    bool HasProperty(NPIdentifier name) override { return JSPluginBase::HasProperty(name); }
    bool GetProperty(NPIdentifier name, NPVariant* result) override {
        return JSPluginBase::GetProperty(name, result);
    }
    bool SetProperty(NPIdentifier name, const NPVariant* value) override {
        return JSPluginBase::SetProperty(name, value);
    }
};

TEST_F(ScriptWrapperTest, TheBaseRefusesEverythingAndLogsEachCall) {
    const ObjectRef bare = ObjectRef::adopt(createScriptObject<BareWrapper>(tv.npp()));
    EXPECT_FALSE(bare.hasMethod("x"));
    EXPECT_FALSE(bare.call("x"));
    EXPECT_FALSE(bare.callDefault());
    EXPECT_FALSE(bare.hasProperty("x"));
    EXPECT_FALSE(bare.set("x", 1));
    NPVariant result{};
    result.type = NPVariantType_Int32;
    EXPECT_FALSE(JSPluginBase::_GetProperty(bare.object(), Name("x").identifier(), &result));
    EXPECT_EQ(result.type, NPVariantType_Void);

    NPObject* object = bare.object();
    const std::string text = " JSPluginBase class\n";
    EXPECT_EQ(logOf(9,
                    [&] {
                        NPIdentifier* names = nullptr;
                        unsigned int count = 0;
                        JSPluginBase::_Invalidate(object);
                        JSPluginBase::_HasMethod(object, nullptr);
                        JSPluginBase::_Invoke(object, nullptr, nullptr, 0, &result);
                        JSPluginBase::_InvokeDefault(object, nullptr, 0, &result);
                        JSPluginBase::_HasProperty(object, nullptr);
                        JSPluginBase::_GetProperty(object, nullptr, &result);
                        JSPluginBase::_SetProperty(object, nullptr, &result);
                        JSPluginBase::_RemoveProperty(object, nullptr);
                        JSPluginBase::_Enumerate(object, &names, &count);
                        JSPluginBase::_Construct(object, nullptr, 0, &result);
                    }),
              logLine("COMMON", "Invalidate", text) + logLine("COMMON", "HasMethod", text) +
                  logLine("COMMON", "Invoke", text) + logLine("COMMON", "InvokeDefault", text) +
                  logLine("COMMON", "HasProperty", text) + logLine("COMMON", "GetProperty", text) +
                  logLine("COMMON", "SetProperty", text) + logLine("COMMON", "RemoveProperty", text) +
                  logLine("COMMON", "Enumerate", text) + logLine("COMMON", "Construct", text));
    EXPECT_EQ(logOf(9, [&] { shelf.callDefault(); }), "");
}

} // namespace
