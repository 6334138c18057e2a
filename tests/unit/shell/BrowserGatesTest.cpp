// The gates to the browser: each passes its arguments and the result on, and logs its call.
#include <cstring>

#include "common/BrowserGates.h"
#include "common/PluginExports.h"
#include "common/PluginUtils.h"
#include "tests/support/BorderTest.h"

using ::testing::IsNull;

namespace {

// Addresses that stand for arguments; nothing is read from them.
template <class Pointer>
Pointer address(uintptr_t number) {
    return reinterpret_cast<Pointer>(0x1000 + number);
}

// A browser's table whose entries note what they were given.
struct Note {
    std::string entry;
    std::vector<uintptr_t> arguments;
};
Note g_note;

template <class Argument>
uintptr_t asNumber(Argument argument) {
    if constexpr (std::is_pointer_v<Argument>) {
        return reinterpret_cast<uintptr_t>(argument);
    } else {
        return static_cast<uintptr_t>(argument);
    }
}

template <class... Arguments>
void note(const char* entry, Arguments... arguments) {
    g_note = {entry, {asNumber(arguments)...}};
}

// Each of these fills one part of the table.
void noteStreamsAndMemory(NPNetscapeFuncs& table) {
    table.geturl = [](NPP npp, const char* url, const char* target) -> NPError {
        note("geturl", npp, url, target);
        return 21;
    };
    table.posturl = [](NPP npp, const char* url, const char* target, uint32_t length, const char* buffer,
                       NPBool isFile) -> NPError {
        note("posturl", npp, url, target, length, buffer, isFile);
        return 22;
    };
    table.requestread = [](NPStream* stream, NPByteRange* ranges) -> NPError {
        note("requestread", stream, ranges);
        return 23;
    };
    table.newstream = [](NPP npp, NPMIMEType type, const char* target, NPStream** stream) -> NPError {
        note("newstream", npp, type, target, stream);
        return 24;
    };
    table.write = [](NPP npp, NPStream* stream, int32_t length, void* buffer) -> int32_t {
        note("write", npp, stream, length, buffer);
        return 70000;
    };
    table.destroystream = [](NPP npp, NPStream* stream, NPReason reason) -> NPError {
        note("destroystream", npp, stream, reason);
        return 26;
    };
    table.status = [](NPP npp, const char* message) { note("status", npp, message); };
    table.uagent = [](NPP npp) -> const char* {
        note("uagent", npp);
        return "agent";
    };
    table.memalloc = [](uint32_t size) -> void* {
        note("memalloc", size);
        return address<void*>(77);
    };
    table.memfree = [](void* block) { note("memfree", block); };
    table.memflush = [](uint32_t size) -> uint32_t {
        note("memflush", size);
        return 80000;
    };
    table.reloadplugins = [](NPBool pages) { note("reloadplugins", pages); };
    table.geturlnotify = [](NPP npp, const char* url, const char* target, void* data) -> NPError {
        note("geturlnotify", npp, url, target, data);
        return 27;
    };
    table.posturlnotify = [](NPP npp, const char* url, const char* target, uint32_t length,
                             const char* buffer, NPBool isFile, void* data) -> NPError {
        note("posturlnotify", npp, url, target, length, buffer, isFile, data);
        return 28;
    };
}

void noteValuesAndIdentifiers(NPNetscapeFuncs& table) {
    table.getvalue = [](NPP npp, NPNVariable variable, void* value) -> NPError {
        note("getvalue", npp, variable, value);
        return 29;
    };
    table.setvalue = [](NPP npp, NPPVariable variable, void* value) -> NPError {
        note("setvalue", npp, variable, value);
        return 30;
    };
    table.invalidaterect = [](NPP npp, NPRect* rect) { note("invalidaterect", npp, rect); };
    table.invalidateregion = [](NPP npp, NPRegion region) { note("invalidateregion", npp, region); };
    table.forceredraw = [](NPP npp) { note("forceredraw", npp); };
    table.getstringidentifier = [](const char* name) -> NPIdentifier {
        note("getstringidentifier", name);
        return address<NPIdentifier>(31);
    };
    table.getstringidentifiers = [](const char** names, int32_t count, NPIdentifier* identifiers) {
        note("getstringidentifiers", names, count, identifiers);
    };
    table.getintidentifier = [](int32_t value) -> NPIdentifier {
        note("getintidentifier", value);
        return address<NPIdentifier>(32);
    };
    table.identifierisstring = [](NPIdentifier identifier) {
        note("identifierisstring", identifier);
        return true;
    };
    table.utf8fromidentifier = [](NPIdentifier identifier) -> char* {
        note("utf8fromidentifier", identifier);
        return address<char*>(33);
    };
    table.intfromidentifier = [](NPIdentifier identifier) -> int32_t {
        note("intfromidentifier", identifier);
        return -34;
    };
}

void noteObjects(NPNetscapeFuncs& table) {
    table.createobject = [](NPP npp, NPClass* objectClass) -> NPObject* {
        note("createobject", npp, objectClass);
        return address<NPObject*>(35);
    };
    table.retainobject = [](NPObject* object) -> NPObject* {
        note("retainobject", object);
        return address<NPObject*>(36);
    };
    table.releaseobject = [](NPObject* object) { note("releaseobject", object); };
    table.invoke = [](NPP npp, NPObject* object, NPIdentifier name, const NPVariant* args, uint32_t count,
                      NPVariant* result) {
        note("invoke", npp, object, name, args, count, result);
        return true;
    };
    table.invokeDefault = [](NPP npp, NPObject* object, const NPVariant* args, uint32_t count,
                             NPVariant* result) {
        note("invokeDefault", npp, object, args, count, result);
        return true;
    };
    table.evaluate = [](NPP npp, NPObject* object, NPString* script, NPVariant* result) {
        note("evaluate", npp, object, script, result);
        return true;
    };
    table.getproperty = [](NPP npp, NPObject* object, NPIdentifier name, NPVariant* result) {
        note("getproperty", npp, object, name, result);
        return true;
    };
    table.setproperty = [](NPP npp, NPObject* object, NPIdentifier name, const NPVariant* value) {
        note("setproperty", npp, object, name, value);
        return true;
    };
    table.removeproperty = [](NPP npp, NPObject* object, NPIdentifier name) {
        note("removeproperty", npp, object, name);
        return true;
    };
    table.hasproperty = [](NPP npp, NPObject* object, NPIdentifier name) {
        note("hasproperty", npp, object, name);
        return true;
    };
    table.hasmethod = [](NPP npp, NPObject* object, NPIdentifier name) {
        note("hasmethod", npp, object, name);
        return true;
    };
    table.releasevariantvalue = [](NPVariant* variant) { note("releasevariantvalue", variant); };
    table.setexception = [](NPObject* object, const char* message) { note("setexception", object, message); };
    table.pluginthreadasynccall = [](NPP npp, void (*function)(void*), void* data) {
        note("pluginthreadasynccall", npp, function, data);
    };
}

NPNetscapeFuncs notingTable() {
    NPNetscapeFuncs table{};
    noteStreamsAndMemory(table);
    noteValuesAndIdentifiers(table);
    noteObjects(table);
    return table;
}

// One gate: the entry it leads to, and a call of it that returns whether the result came back.
struct Gate {
    const char* name;
    const char* entry;
    std::vector<uintptr_t> arguments;
    bool (*call)();
};

const uintptr_t kA1 = asNumber(address<char*>(1));
const uintptr_t kA2 = asNumber(address<char*>(2));
const uintptr_t kA3 = asNumber(address<char*>(3));
const uintptr_t kA4 = asNumber(address<char*>(4));
const uintptr_t kA5 = asNumber(address<char*>(5));

const NPP kNpp = address<NPP>(1);
void* const second = address<void*>(2);
void* const third = address<void*>(3);
void* const fourth = address<void*>(4);
void* const fifth = address<void*>(5);

const char* text(void* argument) {
    return static_cast<const char*>(argument);
}
NPObject* object(void* argument) {
    return static_cast<NPObject*>(argument);
}
NPVariant* variant(void* argument) {
    return static_cast<NPVariant*>(argument);
}
NPStream* stream(void* argument) {
    return static_cast<NPStream*>(argument);
}

const Gate kGates[] = {
    {"NPN_GetURL",
     "geturl",
     {kA1, kA2, kA3},
     [] { return NPN_GetURL(kNpp, text(second), text(third)) == 21; }},
    {"NPN_PostURL",
     "posturl",
     {kA1, kA2, kA3, 9, kA4, 1},
     [] { return NPN_PostURL(kNpp, text(second), text(third), 9, text(fourth), 1) == 22; }},
    {"NPN_RequestRead",
     "requestread",
     {kA2, kA3},
     [] { return NPN_RequestRead(stream(second), static_cast<NPByteRange*>(third)) == 23; }},
    {"NPN_NewStream",
     "newstream",
     {kA1, kA2, kA3, kA4},
     [] {
         return NPN_NewStream(kNpp, static_cast<char*>(second), text(third),
                              static_cast<NPStream**>(fourth)) == 24;
     }},
    {"NPN_Write",
     "write",
     {kA1, kA2, 9, kA3},
     [] { return NPN_Write(kNpp, stream(second), 9, third) == 70000; }},
    {"NPN_DestroyStream",
     "destroystream",
     {kA1, kA2, 2},
     [] { return NPN_DestroyStream(kNpp, stream(second), NPRES_USER_BREAK) == 26; }},
    {"NPN_Status", "status", {kA1, kA2}, [] { return NPN_Status(kNpp, text(second)), true; }},
    {"NPN_UserAgent", "uagent", {kA1}, [] { return std::strcmp(NPN_UserAgent(kNpp), "agent") == 0; }},
    {"NPN_MemAlloc", "memalloc", {9}, [] { return NPN_MemAlloc(9) == address<void*>(77); }},
    {"NPN_MemFree", "memfree", {kA2}, [] { return NPN_MemFree(second), true; }},
    {"NPN_MemFlush", "memflush", {9}, [] { return NPN_MemFlush(9) == 80000; }},
    {"NPN_ReloadPlugins", "reloadplugins", {1}, [] { return NPN_ReloadPlugins(1), true; }},
    {"NPN_GetURLNotify",
     "geturlnotify",
     {kA1, kA2, kA3, kA4},
     [] { return NPN_GetURLNotify(kNpp, text(second), text(third), fourth) == 27; }},
    {"NPN_PostURLNotify",
     "posturlnotify",
     {kA1, kA2, kA3, 9, kA4, 1, kA5},
     [] { return NPN_PostURLNotify(kNpp, text(second), text(third), 9, text(fourth), 1, fifth) == 28; }},
    {"NPN_GetValue",
     "getvalue",
     {kA1, 15, kA2},
     [] { return NPN_GetValue(kNpp, NPNVWindowNPObject, second) == 29; }},
    {"NPN_SetValue",
     "setvalue",
     {kA1, 3, kA2},
     [] { return NPN_SetValue(kNpp, NPPVpluginWindowBool, second) == 30; }},
    {"NPN_InvalidateRect",
     "invalidaterect",
     {kA1, kA2},
     [] { return NPN_InvalidateRect(kNpp, static_cast<NPRect*>(second)), true; }},
    {"NPN_InvalidateRegion",
     "invalidateregion",
     {kA1, kA2},
     [] { return NPN_InvalidateRegion(kNpp, second), true; }},
    {"NPN_ForceRedraw", "forceredraw", {kA1}, [] { return NPN_ForceRedraw(kNpp), true; }},
    {"NPN_GetStringIdentifier",
     "getstringidentifier",
     {kA2},
     [] { return NPN_GetStringIdentifier(text(second)) == address<NPIdentifier>(31); }},
    {"NPN_GetStringIdentifiers",
     "getstringidentifiers",
     {kA2, 9, kA3},
     [] {
         return NPN_GetStringIdentifiers(static_cast<const char**>(second), 9,
                                         static_cast<NPIdentifier*>(third)),
                true;
     }},
    {"NPN_GetStringIdentifier", // the integer form
     "getintidentifier",
     {9},
     [] { return NPN_GetStringIdentifier(9) == address<NPIdentifier>(32); }},
    {"NPN_IdentifierIsString", "identifierisstring", {kA2}, [] { return NPN_IdentifierIsString(second); }},
    {"NPN_UTF8FromIdentifier",
     "utf8fromidentifier",
     {kA2},
     [] { return NPN_UTF8FromIdentifier(second) == address<char*>(33); }},
    {"NPN_IntFromIdentifier",
     "intfromidentifier",
     {kA2},
     [] { return NPN_IntFromIdentifier(second) == -34; }},
    {"NPN_CreateObject",
     "createobject",
     {kA1, kA2},
     [] { return NPN_CreateObject(kNpp, static_cast<NPClass*>(second)) == address<NPObject*>(35); }},
    {"NPN_RetainObject",
     "retainobject",
     {kA2},
     [] { return NPN_RetainObject(object(second)) == address<NPObject*>(36); }},
    {"NPN_ReleaseObject", "releaseobject", {kA2}, [] { return NPN_ReleaseObject(object(second)), true; }},
    {"NPN_Invoke",
     "invoke",
     {kA1, kA2, kA3, kA4, 9, kA5},
     [] { return NPN_Invoke(kNpp, object(second), third, variant(fourth), 9, variant(fifth)); }},
    {"NPN_InvokeDefault",
     "invokeDefault",
     {kA1, kA2, kA3, 9, kA4},
     [] { return NPN_InvokeDefault(kNpp, object(second), variant(third), 9, variant(fourth)); }},
    {"NPN_Evaluate",
     "evaluate",
     {kA1, kA2, kA3, kA4},
     [] { return NPN_Evaluate(kNpp, object(second), static_cast<NPString*>(third), variant(fourth)); }},
    {"NPN_GetProperty",
     "getproperty",
     {kA1, kA2, kA3, kA4},
     [] { return NPN_GetProperty(kNpp, object(second), third, variant(fourth)); }},
    {"NPN_SetProperty",
     "setproperty",
     {kA1, kA2, kA3, kA4},
     [] { return NPN_SetProperty(kNpp, object(second), third, variant(fourth)); }},
    {"NPN_RemoveProperty",
     "removeproperty",
     {kA1, kA2, kA3},
     [] { return NPN_RemoveProperty(kNpp, object(second), third); }},
    {"NPN_HasProperty",
     "hasproperty",
     {kA1, kA2, kA3},
     [] { return NPN_HasProperty(kNpp, object(second), third); }},
    {"NPN_HasMethod",
     "hasmethod",
     {kA1, kA2, kA3},
     [] { return NPN_HasMethod(kNpp, object(second), third); }},
    {"NPN_ReleaseVariantValue",
     "releasevariantvalue",
     {kA2},
     [] { return NPN_ReleaseVariantValue(variant(second)), true; }},
    {"NPN_SetException",
     "setexception",
     {kA2, kA3},
     [] { return NPN_SetException(object(second), text(third)), true; }},
    {"NPN_PluginThreadAsyncCall",
     "pluginthreadasynccall",
     {kA1, kA2, kA3},
     [] { return NPN_PluginThreadAsyncCall(kNpp, reinterpret_cast<void (*)(void*)>(second), third), true; }},
};

class BrowserGatesTest : public BorderTest {
protected:
    BrowserGatesTest() { NPNFuncs = &m_table; }
    ~BrowserGatesTest() override { NPNFuncs = &browser.table(); }
    void TearDown() override {
        NPNFuncs = &browser.table();
        BorderTest::TearDown();
    }

    NPNetscapeFuncs m_table = notingTable();
};

TEST_F(BrowserGatesTest, EachGatePassesArgumentsAndResultOn) {
    EXPECT_EQ(std::size(kGates), 39U);
    for (const Gate& gate : kGates) {
        g_note = {};
        EXPECT_TRUE(gate.call()) << gate.name;
        EXPECT_EQ(g_note.entry, gate.entry);
        EXPECT_EQ(g_note.arguments, gate.arguments) << gate.name;
    }
}

TEST_F(BrowserGatesTest, FalseComesBackAsFalse) {
    m_table.hasmethod = [](NPP, NPObject*, NPIdentifier) { return false; };
    m_table.evaluate = [](NPP, NPObject*, NPString*, NPVariant*) { return false; };
    EXPECT_FALSE(NPN_HasMethod(nullptr, nullptr, nullptr));
    EXPECT_FALSE(NPN_Evaluate(nullptr, nullptr, nullptr, nullptr));
}

TEST_F(BrowserGatesTest, AMissingEntryForStringIdentifiersGivesNull) {
    m_table.getstringidentifier = nullptr;
    EXPECT_THAT(NPN_GetStringIdentifier("name"), IsNull());
}

TEST_F(BrowserGatesTest, EachGateLogsOneLineUnderCommon) {
    for (const int level : {9, 1}) {
        for (const Gate& gate : kGates) {
            EXPECT_EQ(logOf(level, [&] { gate.call(); }), logLine("COMMON", gate.name, " is called\n"));
        }
    }
}

TEST_F(BrowserGatesTest, OtherModulesLogNoGate) {
    for (const int level : {0, 2, 3, 4, 5, 6, 7, 8, 10, 11, 12, 13}) {
        EXPECT_EQ(logOf(level,
                        [] {
                            for (const Gate& gate : kGates) {
                                gate.call();
                            }
                        }),
                  "")
            << level;
    }
}

TEST_F(BrowserGatesTest, ALogLevelOfZeroIsReadAgainAndAnyOtherStays) {
    EXPECT_EQ(logOf(0,
                    [] {
                        NPN_MemFlush(1);
                        setenv("LOG_MODULE", "9", 1);
                        NPN_MemFlush(1);
                        setenv("LOG_MODULE", "2", 1);
                        NPN_MemFlush(1);
                        unsetenv("LOG_MODULE");
                        NPN_MemFlush(1);
                    }),
              logLine("COMMON", "NPN_MemFlush", " is called\n") +
                  logLine("COMMON", "NPN_MemFlush", " is called\n") +
                  logLine("COMMON", "NPN_MemFlush", " is called\n"));
}

TEST_F(BrowserGatesTest, EachSourceFileKeepsALogLevelOfItsOwn) {
    const auto readString = [](const char* text) {
        stringValue(NPString{text, static_cast<uint32_t>(std::strlen(text))});
    };
    EXPECT_EQ(logOf(9,
                    [&] {
                        NPN_MemFlush(1); // from here on the gates' level
                        setenv("LOG_MODULE", "2", 1);
                        readString("first"); // and from here on that of the values
                        NPN_MemFlush(1);
                        setenv("LOG_MODULE", "9", 1);
                        readString("second");
                        NPP_SetValue(nullptr, NPNVxDisplay, nullptr); // of a third file
                    }),
              logLine("COMMON", "NPN_MemFlush", " is called\n") +
                  logLine("COMMON", "NPN_MemFlush", " is called\n") +
                  logLine("COMMON", "setValue", " is called \n"));
}

} // namespace
