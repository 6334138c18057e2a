// A plug-in for the tests of browsers: script sees what the browser has asked of it, and has it call the
// browser.
//
// Its type is application/x-telix-test. The object of an instance has the properties and methods of the
// tables at the end; `journal` has a line for each call of the browser in the process, over all pages, until
// clear().
#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <deque>
#include <fstream>
#include <functional>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "npapi/npfunctions.h"

namespace {

NPNetscapeFuncs* s_browser = nullptr;
std::string s_journal;
int s_liveInstances = 0;
int s_liveObjects = 0;

constexpr uint32_t kItems = 3;
constexpr uint32_t kPositions = 16; // that a plug-in may read, whatever the count

void note(const std::string& line) {
    s_journal += line + '\n';
}

// --- Values

NPIdentifier id(const std::string& name) {
    return s_browser->getstringidentifier(name.c_str());
}

std::string textOf(const NPVariant& value) {
    return value.type == NPVariantType_String
               ? std::string(value.value.stringValue.UTF8Characters, value.value.stringValue.UTF8Length)
               : std::string();
}

double numberOf(const NPVariant& value) {
    return value.type == NPVariantType_Double  ? value.value.doubleValue
           : value.type == NPVariantType_Int32 ? value.value.intValue
                                               : 0;
}

NPObject* objectOf(const NPVariant& value) {
    return value.type == NPVariantType_Object ? value.value.objectValue : nullptr;
}

NPVariant text(const std::string& content) {
    auto* const copy = static_cast<char*>(s_browser->memalloc(static_cast<uint32_t>(content.size() + 1)));
    std::memcpy(copy, content.c_str(), content.size() + 1);
    NPVariant value = {};
    value.type = NPVariantType_String;
    value.value.stringValue = {copy, static_cast<uint32_t>(content.size())};
    return value;
}

NPVariant number(int content) {
    NPVariant value = {};
    value.type = NPVariantType_Int32;
    value.value.intValue = content;
    return value;
}

NPVariant boolean(bool content) {
    NPVariant value = {};
    value.type = NPVariantType_Bool;
    value.value.boolValue = content;
    return value;
}

NPVariant nothing() {
    return {};
}

// Takes over the reference.
NPVariant object(NPObject* content) {
    NPVariant value = {};
    value.type = content ? NPVariantType_Object : NPVariantType_Null;
    value.value.objectValue = content;
    return value;
}

// A copy that the browser will own.
NPVariant copy(const NPVariant& value) {
    if (value.type == NPVariantType_String) {
        return text(textOf(value));
    }
    if (value.type == NPVariantType_Object) {
        s_browser->retainobject(value.value.objectValue);
    }
    return value;
}

const char* kindOf(const NPVariant& value) {
    static constexpr const char* kNames[] = {"void", "null", "bool", "int32", "double", "string", "object"};
    return kNames[value.type];
}

// --- Instances and objects

struct Embedded {
    NPP npp;
    int number;
    std::string attributes;
    NPWindow window = {};
    NPObject* scriptable = nullptr;
    uint16_t streamMode = NP_NORMAL;
    bool refusesStreams = false;
    int writesToRefuse = 0;
    int32_t dropAfter = -1; // bytes of a stream
    std::deque<int32_t> readyResults;
    std::deque<int32_t> writeResults;
    std::string file; // that the last stream was given as, and what was in it
    std::string fileContent;
    std::string headers;
    std::string content;
    std::set<NPObject*> callbacks; // of timers
};

enum class Kind { Main, Sub, Function };

struct TestObject : NPObject {
    NPP npp;
    Kind kind;
    NPVariant value = {};
    NPObject* kept = nullptr;
};

TestObject& self(NPObject* object) {
    return *static_cast<TestObject*>(object);
}

Embedded* embedded(NPObject* object) {
    return static_cast<Embedded*>(self(object).npp->pdata);
}

extern NPClass kMainClass;
extern NPClass kSubClass;
extern NPClass kFunctionClass;

struct Call {
    NPObject* object;
    const NPVariant* args;
    uint32_t count;
    NPP npp() const { return self(object).npp; }
};

// How many arguments follow the first ones.
uint32_t rest(const Call& call, uint32_t first) {
    return call.count > first ? call.count - first : 0;
}

using Method = bool (*)(const Call& call, NPVariant& result);

// A call on the page's main thread later, of a function that script has given.
struct Later {
    NPP npp;
    NPObject* function;
};

void callLater(void* data) {
    auto* const later = static_cast<Later*>(data);
    NPVariant result = {};
    s_browser->invokeDefault(later->npp, later->function, nullptr, 0, &result);
    s_browser->releasevariantvalue(&result);
    s_browser->releaseobject(later->function);
    delete later;
}

void onTimer(NPP npp, uint32_t timer) {
    note("timer " + std::to_string(timer != 0));
    auto* const instance = static_cast<Embedded*>(npp->pdata);
    for (NPObject* const function : std::set<NPObject*>(instance->callbacks)) {
        NPVariant result = {};
        s_browser->invokeDefault(npp, function, nullptr, 0, &result);
        s_browser->releasevariantvalue(&result);
    }
}

bool addTo(std::deque<int32_t>& results, const Call& call) {
    for (uint32_t i = 0; i < call.count; i++) {
        results.push_back(static_cast<int32_t>(numberOf(call.args[i])));
    }
    return true;
}

int32_t nextOf(std::deque<int32_t>& results, int32_t otherwise) {
    if (results.empty()) {
        return otherwise;
    }
    const int32_t result = results.front();
    results.pop_front();
    return result;
}

struct MethodRow {
    const char* name;
    Method run;
};

const MethodRow kMethods[] = {
    {"echo",
     [](const Call& call, NPVariant& result) {
         result = copy(call.args[0]);
         return true;
     }},
    {"nothing", [](const Call&, NPVariant&) { return true; }},
    {"fail", [](const Call&, NPVariant&) { return false; }},
    {"throwText",
     [](const Call& call, NPVariant&) {
         s_browser->setexception(call.object, textOf(call.args[0]).c_str());
         return true;
     }},
    // The kinds of as many arguments as plug-ins read, and their number.
    {"positions",
     [](const Call& call, NPVariant& result) {
         std::string kinds = std::to_string(call.count);
         for (uint32_t i = 0; i < kPositions; i++) {
             kinds += std::string(" ") + kindOf(call.args[i]);
         }
         result = text(kinds);
         return true;
     }},
    {"last",
     [](const Call& call, NPVariant& result) {
         result = copy(call.args[call.count > 0 ? call.count - 1 : 0]);
         return true;
     }},
    {"sub",
     [](const Call& call, NPVariant& result) {
         result = object(s_browser->createobject(call.npp(), &kSubClass));
         return true;
     }},
    {"function",
     [](const Call& call, NPVariant& result) {
         result = object(s_browser->createobject(call.npp(), &kFunctionClass));
         return true;
     }},
    {"keep",
     [](const Call& call, NPVariant&) {
         TestObject& holder = self(call.object);
         NPObject* const before = holder.kept;
         holder.kept = objectOf(call.args[0]) ? s_browser->retainobject(objectOf(call.args[0])) : nullptr;
         s_browser->releaseobject(before);
         return true;
     }},
    {"kept",
     [](const Call& call, NPVariant& result) {
         NPObject* const kept = self(call.object).kept;
         result = object(kept ? s_browser->retainobject(kept) : nullptr);
         return true;
     }},
    {"isKept",
     [](const Call& call, NPVariant& result) {
         result = boolean(objectOf(call.args[0]) && objectOf(call.args[0]) == self(call.object).kept);
         return true;
     }},
    {"call",
     [](const Call& call, NPVariant& result) {
         return objectOf(call.args[0]) && s_browser->invokeDefault(call.npp(), objectOf(call.args[0]),
                                                                   call.args + 1, rest(call, 1), &result);
     }},
    {"callMethod",
     [](const Call& call, NPVariant& result) {
         return s_browser->invoke(call.npp(), objectOf(call.args[0]), id(textOf(call.args[1])), call.args + 2,
                                  rest(call, 2), &result);
     }},
    {"construct",
     [](const Call& call, NPVariant& result) {
         return s_browser->construct(call.npp(), objectOf(call.args[0]), call.args + 1, rest(call, 1),
                                     &result);
     }},
    // Whether it was done, as the plug-in sees it.
    {"tries",
     [](const Call& call, NPVariant& result) {
         NPVariant value = {};
         const bool isDone = s_browser->invokeDefault(call.npp(), objectOf(call.args[0]), call.args + 1,
                                                      rest(call, 1), &value);
         result = text(std::string(isDone ? "done " : "failed ") + kindOf(value));
         s_browser->releasevariantvalue(&value);
         return true;
     }},
    {"evaluate",
     [](const Call& call, NPVariant& result) {
         NPObject* window = nullptr;
         if (s_browser->getvalue(call.npp(), NPNVWindowNPObject, &window) != NPERR_NO_ERROR) {
             return false;
         }
         NPString script = call.args[0].value.stringValue;
         const bool isDone = s_browser->evaluate(call.npp(), window, &script, &result);
         s_browser->releaseobject(window);
         return isDone;
     }},
    {"read",
     [](const Call& call, NPVariant& result) {
         return s_browser->getproperty(call.npp(), objectOf(call.args[0]), id(textOf(call.args[1])), &result);
     }},
    {"write",
     [](const Call& call, NPVariant&) {
         return s_browser->setproperty(call.npp(), objectOf(call.args[0]), id(textOf(call.args[1])),
                                       &call.args[2]);
     }},
    {"deleteName",
     [](const Call& call, NPVariant& result) {
         result =
             boolean(s_browser->removeproperty(call.npp(), objectOf(call.args[0]), id(textOf(call.args[1]))));
         return true;
     }},
    {"has",
     [](const Call& call, NPVariant& result) {
         NPObject* const asked = objectOf(call.args[0]);
         const NPIdentifier name = id(textOf(call.args[1]));
         result = text(std::to_string(s_browser->hasproperty(call.npp(), asked, name)) + ' ' +
                       std::to_string(s_browser->hasmethod(call.npp(), asked, name)));
         return true;
     }},
    {"names",
     [](const Call& call, NPVariant& result) {
         NPIdentifier* names = nullptr;
         uint32_t count = 0;
         if (!s_browser->enumerate(call.npp(), objectOf(call.args[0]), &names, &count)) {
             return false;
         }
         std::string all;
         for (uint32_t i = 0; i < count; i++) {
             char* const name = s_browser->utf8fromidentifier(names[i]);
             all += std::string(i > 0 ? " " : "") + name;
             s_browser->memfree(name);
         }
         s_browser->memfree(names);
         result = text(all);
         return true;
     }},
    {"element",
     [](const Call& call, NPVariant& result) {
         NPObject* element = nullptr;
         const NPError error = s_browser->getvalue(call.npp(), NPNVPluginElementNPObject, &element);
         result = object(element);
         return error == NPERR_NO_ERROR;
     }},
    {"userAgent",
     [](const Call& call, NPVariant& result) {
         result = text(s_browser->uagent(call.npp()));
         return true;
     }},
    {"status",
     [](const Call& call, NPVariant&) {
         s_browser->status(call.npp(), textOf(call.args[0]).c_str());
         return true;
     }},
    // Has the browser call the function from another thread.
    {"async",
     [](const Call& call, NPVariant&) {
         auto* const later = new Later{call.npp(), s_browser->retainobject(objectOf(call.args[0]))};
         std::thread([later] { s_browser->pluginthreadasynccall(later->npp, callLater, later); }).join();
         return true;
     }},
    // Runs the function in a turn of the main loop, with the plug-in on the stack below script.
    {"timer",
     [](const Call& call, NPVariant& result) {
         embedded(call.object)->callbacks.insert(s_browser->retainobject(objectOf(call.args[2])));
         result = number(static_cast<int>(
             s_browser->scheduletimer(call.npp(), static_cast<uint32_t>(numberOf(call.args[0])),
                                      call.args[1].value.boolValue, onTimer)));
         return true;
     }},
    {"stopTimer",
     [](const Call& call, NPVariant&) {
         s_browser->unscheduletimer(call.npp(), static_cast<uint32_t>(numberOf(call.args[0])));
         return true;
     }},
    {"get",
     [](const Call& call, NPVariant& result) {
         const std::string target = textOf(call.args[1]);
         result = number(s_browser->geturl(call.npp(), textOf(call.args[0]).c_str(),
                                           target.empty() ? nullptr : target.c_str()));
         return true;
     }},
    {"getNotify",
     [](const Call& call, NPVariant& result) {
         const std::string target = textOf(call.args[1]);
         result = number(s_browser->geturlnotify(call.npp(), textOf(call.args[0]).c_str(),
                                                 target.empty() ? nullptr : target.c_str(), call.npp()));
         return true;
     }},
    {"post",
     [](const Call& call, NPVariant& result) {
         const std::string body = textOf(call.args[1]);
         result = number(s_browser->posturl(call.npp(), textOf(call.args[0]).c_str(), nullptr,
                                            static_cast<uint32_t>(body.size()), body.data(), false));
         return true;
     }},
    {"postNotify",
     [](const Call& call, NPVariant& result) {
         const std::string body = textOf(call.args[1]);
         result = number(s_browser->posturlnotify(call.npp(), textOf(call.args[0]).c_str(), nullptr,
                                                  static_cast<uint32_t>(body.size()), body.data(), false,
                                                  call.npp()));
         return true;
     }},
    // streams(mode, refuses, writes to refuse, bytes after which to drop): how later streams are treated.
    {"streams",
     [](const Call& call, NPVariant&) {
         Embedded& instance = *embedded(call.object);
         instance.streamMode = static_cast<uint16_t>(numberOf(call.args[0]));
         instance.refusesStreams = call.args[1].type == NPVariantType_Bool && call.args[1].value.boolValue;
         instance.writesToRefuse = static_cast<int>(numberOf(call.args[2]));
         instance.dropAfter =
             call.args[3].type == NPVariantType_Void ? -1 : static_cast<int32_t>(numberOf(call.args[3]));
         return true;
     }},
    // readyResults(number...), writeResults(number...): what the next calls return that offer data of a
    // stream, instead of taking everything.
    {"readyResults",
     [](const Call& call, NPVariant&) { return addTo(embedded(call.object)->readyResults, call); }},
    {"writeResults",
     [](const Call& call, NPVariant&) { return addTo(embedded(call.object)->writeResults, call); }},
    {"clear",
     [](const Call&, NPVariant&) {
         s_journal.clear();
         return true;
     }},
};

// --- Properties

struct PropertyRow {
    const char* name;
    NPVariant (*read)(NPObject* object);
};

const PropertyRow kProperties[] = {
    {"attributes", [](NPObject* object) { return text(embedded(object)->attributes); }},
    {"place",
     [](NPObject* object) {
         const NPWindow& window = embedded(object)->window;
         return text(std::to_string(window.x) + ' ' + std::to_string(window.y) + ' ' +
                     std::to_string(window.width) + ' ' + std::to_string(window.height));
     }},
    {"clip",
     [](NPObject* object) {
         const NPRect& clip = embedded(object)->window.clipRect;
         return text(std::to_string(clip.left) + ' ' + std::to_string(clip.top) + ' ' +
                     std::to_string(clip.right) + ' ' + std::to_string(clip.bottom));
     }},
    {"number", [](NPObject* object) { return number(embedded(object)->number); }},
    {"journal", [](NPObject*) { return text(s_journal); }},
    {"instances", [](NPObject*) { return number(s_liveInstances); }},
    {"objects", [](NPObject*) { return number(s_liveObjects); }},
    {"headers", [](NPObject* object) { return text(embedded(object)->headers); }},
    {"content", [](NPObject* object) { return text(embedded(object)->content); }},
    {"file", [](NPObject* object) { return text(embedded(object)->file); }},
    {"fileContent", [](NPObject* object) { return text(embedded(object)->fileContent); }},
    {"kind", [](NPObject* object) { return text(kindOf(self(object).value)); }},
    {"value", [](NPObject* object) { return copy(self(object).value); }},
    {"readOnly", [](NPObject*) { return number(42); }},
    {"nothingThere", [](NPObject*) { return nothing(); }},
    // Names that elements have, too.
    {"width", [](NPObject*) { return text("the plug-in's"); }},
    {"title", [](NPObject*) { return text("the plug-in's"); }},
    {"length", [](NPObject*) { return number(kItems); }},
};

template <typename Row, size_t count>
const Row* find(const Row (&rows)[count], NPIdentifier name) {
    for (const Row& row : rows) {
        if (id(row.name) == name) {
            return &row;
        }
    }
    return nullptr;
}

// The index that a name stands for, or -1.
int itemOf(NPIdentifier name) {
    char* const digits = s_browser->utf8fromidentifier(name);
    const bool isIndex = digits && *digits >= '0' && *digits <= '9' && std::strlen(digits) < 3;
    const int index = isIndex ? std::atoi(digits) : -1;
    std::free(digits);
    return index < static_cast<int>(kItems) ? index : -1;
}

// --- The class of the objects

NPObject* allocate(NPP npp, Kind kind) {
    auto* const object = new TestObject;
    object->npp = npp;
    object->kind = kind;
    s_liveObjects++;
    return object;
}

void deallocate(NPObject* object) {
    TestObject& dying = self(object);
    s_browser->releasevariantvalue(&dying.value);
    s_browser->releaseobject(dying.kept);
    s_liveObjects--;
    delete &dying;
}

bool hasMethod(NPObject*, NPIdentifier name) {
    return find(kMethods, name) != nullptr;
}

bool invoke(NPObject* object, NPIdentifier name, const NPVariant* args, uint32_t count, NPVariant* result) {
    const MethodRow* const method = find(kMethods, name);
    return method && method->run({object, args, count}, *result);
}

bool hasProperty(NPObject*, NPIdentifier name) {
    return find(kProperties, name) || itemOf(name) >= 0;
}

bool getProperty(NPObject* object, NPIdentifier name, NPVariant* result) {
    if (const PropertyRow* const property = find(kProperties, name)) {
        *result = property->read(object);
        return true;
    }
    const int item = itemOf(name);
    *result = item >= 0 ? text("item " + std::to_string(item)) : nothing();
    return item >= 0;
}

bool setProperty(NPObject* object, NPIdentifier name, const NPVariant* value) {
    if (name == id("title")) { // refuses with an exception
        s_browser->setexception(object, "no title");
        return false;
    }
    if (name != id("value")) {
        return false;
    }
    NPVariant before = self(object).value;
    self(object).value = copy(*value);
    s_browser->releasevariantvalue(&before);
    return true;
}

bool removeProperty(NPObject* object, NPIdentifier name) {
    if (name != id("value")) {
        return false;
    }
    s_browser->releasevariantvalue(&self(object).value);
    return true;
}

bool enumerate(NPObject*, NPIdentifier** names, uint32_t* count) {
    *count = 2;
    *names = static_cast<NPIdentifier*>(s_browser->memalloc(2 * sizeof(NPIdentifier)));
    (*names)[0] = id("value");
    (*names)[1] = id("length");
    return true;
}

bool callFunction(NPObject*, const NPVariant* args, uint32_t count, NPVariant* result) {
    *result = count > 0 ? copy(args[0]) : nothing();
    return true;
}

bool constructObject(NPObject* object, const NPVariant* args, uint32_t count, NPVariant* result) {
    NPObject* const made = s_browser->createobject(self(object).npp, &kSubClass);
    self(made).value = count > 0 ? copy(args[0]) : nothing();
    result->type = NPVariantType_Object;
    result->value.objectValue = made;
    return true;
}

void invalidate(NPObject*) {
    note("invalidate");
}

template <Kind kind>
NPObject* allocateObject(NPP npp, NPClass*) {
    return allocate(npp, kind);
}

NPClass kMainClass = {NP_CLASS_STRUCT_VERSION,
                      allocateObject<Kind::Main>,
                      deallocate,
                      nullptr,
                      hasMethod,
                      invoke,
                      callFunction,
                      hasProperty,
                      getProperty,
                      setProperty,
                      removeProperty,
                      enumerate,
                      constructObject};
NPClass kSubClass = {NP_CLASS_STRUCT_VERSION,
                     allocateObject<Kind::Sub>,
                     deallocate,
                     invalidate,
                     hasMethod,
                     invoke,
                     callFunction,
                     hasProperty,
                     getProperty,
                     setProperty,
                     removeProperty,
                     enumerate,
                     constructObject};
NPClass kFunctionClass = {NP_CLASS_STRUCT_VERSION,
                          allocateObject<Kind::Function>,
                          deallocate,
                          nullptr,
                          nullptr,
                          nullptr,
                          callFunction,
                          nullptr,
                          nullptr,
                          nullptr,
                          nullptr,
                          nullptr,
                          constructObject};

// --- Calls of the browser

NPError newInstance(NPMIMEType type, NPP npp, uint16_t mode, int16_t argc, char* argn[], char* argv[],
                    NPSavedData*) {
    static int s_lastNumber = 0;
    std::string attributes;
    bool isRefused = false;
    for (int i = 0; i < argc; i++) {
        attributes += std::string(i > 0 ? " " : "") + argn[i] + '=' + argv[i];
        isRefused = isRefused || std::strcmp(argn[i], "refuse") == 0;
    }
    if (isRefused || mode != NP_EMBED) {
        note("refuse");
        return NPERR_GENERIC_ERROR;
    }
    auto* const instance = new Embedded{};
    instance->npp = npp;
    instance->number = ++s_lastNumber;
    instance->attributes = attributes;
    instance->streamMode = NP_NORMAL;
    instance->dropAfter = -1;
    npp->pdata = instance;
    s_liveInstances++;
    note("new " + std::to_string(instance->number) + ' ' + type);
    s_browser->setvalue(npp, NPPVpluginWindowBool, nullptr);
    return NPERR_NO_ERROR;
}

Embedded& instanceOf(NPP npp) {
    return *static_cast<Embedded*>(npp->pdata);
}

NPError destroyInstance(NPP npp, NPSavedData**) {
    Embedded& instance = instanceOf(npp);
    note("destroy " + std::to_string(instance.number));
    for (NPObject* const function : instance.callbacks) {
        s_browser->releaseobject(function);
    }
    if (instance.scriptable) {
        s_browser->releaseobject(instance.scriptable);
    }
    s_liveInstances--;
    npp->pdata = nullptr;
    delete &instance;
    return NPERR_NO_ERROR;
}

NPError setWindow(NPP npp, NPWindow* window) {
    Embedded& instance = instanceOf(npp);
    instance.window = *window;
    note("window " + std::to_string(instance.number) + ' ' + std::to_string(window->x) + ' ' +
         std::to_string(window->y) + ' ' + std::to_string(window->width) + ' ' +
         std::to_string(window->height));
    return NPERR_NO_ERROR;
}

NPError newStream(NPP npp, NPMIMEType type, NPStream* stream, NPBool, uint16_t* mode) {
    Embedded& instance = instanceOf(npp);
    instance.headers = stream->headers ? stream->headers : "";
    instance.content.clear();
    note(std::string("stream ") + stream->url + ' ' + type + ' ' + std::to_string(stream->end));
    *mode = instance.streamMode;
    if (instance.refusesStreams) {
        s_browser->destroystream(npp, stream, NPRES_DONE);
    }
    return NPERR_NO_ERROR;
}

int32_t writeReady(NPP npp, NPStream*) {
    Embedded& instance = instanceOf(npp);
    return instance.writesToRefuse > 0 && instance.writesToRefuse-- > 0 ? 0
                                                                        : nextOf(instance.readyResults, 1000);
}

int32_t writeStream(NPP npp, NPStream* stream, int32_t offset, int32_t length, void* buffer) {
    Embedded& instance = instanceOf(npp);
    if (static_cast<size_t>(offset) != instance.content.size() ||
        static_cast<char*>(buffer)[length] != '\0') {
        note("misplaced data");
    }
    if (length <= 0) {
        note("no data");
    }
    const int32_t taken = nextOf(instance.writeResults, length);
    instance.content.append(static_cast<char*>(buffer), static_cast<size_t>(std::max(taken, 0)));
    if (instance.dropAfter >= 0 && offset + length > instance.dropAfter) {
        s_browser->destroystream(npp, stream, NPRES_USER_BREAK);
    }
    return taken;
}

NPError destroyStream(NPP npp, NPStream*, NPReason reason) {
    note("end " + std::to_string(reason) + ' ' + std::to_string(instanceOf(npp).content.size()));
    return NPERR_NO_ERROR;
}

void streamAsFile(NPP npp, NPStream*, const char* name) {
    note(std::string("file ") + (name && *name == '/' ? "given" : "missing"));
    Embedded& instance = instanceOf(npp);
    instance.file = name ? name : "";
    std::ifstream file(instance.file);
    instance.fileContent.assign(std::istreambuf_iterator<char>(file), {});
}

void urlNotify(NPP npp, const char* url, NPReason reason, void* data) {
    note(std::string("notify ") + url + ' ' + std::to_string(reason) +
         (data == npp ? "" : " without its data"));
}

NPError getValue(NPP npp, NPPVariable variable, void* value) {
    switch (variable) {
    case NPPVpluginNameString:
        *static_cast<const char**>(value) = "Test plug-in";
        return NPERR_NO_ERROR;
    case NPPVpluginDescriptionString:
        *static_cast<const char**>(value) = "Tests browsers";
        return NPERR_NO_ERROR;
    case NPPVpluginScriptableNPObject: {
        Embedded& instance = instanceOf(npp);
        if (!instance.scriptable) {
            instance.scriptable = s_browser->createobject(npp, &kMainClass);
        }
        *static_cast<NPObject**>(value) = s_browser->retainobject(instance.scriptable);
        return NPERR_NO_ERROR;
    }
    default:
        return NPERR_GENERIC_ERROR;
    }
}

} // namespace

#define TELIX_EXPORT extern "C" __attribute__((visibility("default")))

TELIX_EXPORT NPError NP_Initialize(NPNetscapeFuncs* browser, NPPluginFuncs* plugin) {
    s_browser = browser;
    plugin->newp = newInstance;
    plugin->destroy = destroyInstance;
    plugin->setwindow = setWindow;
    plugin->newstream = newStream;
    plugin->destroystream = destroyStream;
    plugin->asfile = streamAsFile;
    plugin->writeready = writeReady;
    plugin->write = writeStream;
    plugin->urlnotify = urlNotify;
    plugin->getvalue = getValue;
    return NPERR_NO_ERROR;
}

TELIX_EXPORT NPError NP_Shutdown() {
    return NPERR_NO_ERROR;
}

TELIX_EXPORT const char* NP_GetMIMEDescription() {
    return "application/x-telix-test:tst:Tests;application/x-telix-other::Other tests;";
}

TELIX_EXPORT NPError NP_GetValue(void*, NPPVariable variable, void* value) {
    return getValue(nullptr, variable, value);
}
