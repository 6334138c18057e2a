// What passes between a model's operations and script: filling a result, and testing and reading an argument,
// each chosen by the C++ type. Browser thread only.
#ifndef TELIX_COMMON_SCRIPTVALUES_H
#define TELIX_COMMON_SCRIPTVALUES_H

#include <string>

#include "common/PluginUtils.h"
#include "npapi/npruntime.h"

inline void setVoid(NPVariant& result) {
    result.type = NPVariantType_Void;
}

inline void setNull(NPVariant& result) {
    result.type = NPVariantType_Null;
    result.value.objectValue = nullptr;
}

inline void setResult(NPVariant& result, bool value) {
    result.type = NPVariantType_Bool;
    result.value.boolValue = value;
}

inline void setResult(NPVariant& result, int32_t value) {
    result.type = NPVariantType_Int32;
    result.value.intValue = value;
}

// Script integers are signed: the upper half of the range reads as negative.
inline void setResult(NPVariant& result, uint32_t value) {
    setResult(result, static_cast<int32_t>(value));
}

inline void setResult(NPVariant& result, double value) {
    result.type = NPVariantType_Double;
    result.value.doubleValue = value;
}

// An object whose reference passes to the browser; null reads as null.
inline void setResult(NPVariant& result, NPObject* object) {
    if (!object) {
        setNull(result);
        return;
    }
    result.type = NPVariantType_Object;
    result.value.objectValue = object;
}

// Copies the string into the browser's memory, without a terminating zero. False, with the result untouched,
// if there was no memory.
bool setText(NPVariant& result, const char* text, size_t length);

// A string; null if it is empty or there was no memory.
void setResult(NPVariant& result, const std::string& text);

// A string, the empty one too, in a zero-terminated block of the C heap instead of the browser's memory.
void setDuplicatedText(NPVariant& result, const std::string& text);

// How script hands over an argument of a C++ type: whether the variant fits, and its value.
template <class Type>
struct ScriptArgument;

template <>
struct ScriptArgument<bool> {
    static bool fits(const NPVariant& value) { return value.type == NPVariantType_Bool; }
    static bool read(const NPVariant& value) { return value.value.boolValue; }
};

template <>
struct ScriptArgument<int32_t> {
    static bool fits(const NPVariant& value) { return isNumberValue(value); }
    static int32_t read(const NPVariant& value) { return toInt32(numberValue(value)); }
};

template <>
struct ScriptArgument<uint32_t> {
    static bool fits(const NPVariant& value) { return isNumberValue(value); }
    static uint32_t read(const NPVariant& value) { return toUint32(numberValue(value)); }
};

template <>
struct ScriptArgument<double> {
    static bool fits(const NPVariant& value) { return isNumberValue(value); }
    static double read(const NPVariant& value) { return numberValue(value); }
};

template <>
struct ScriptArgument<std::string> {
    static bool fits(const NPVariant& value) { return value.type == NPVariantType_String; }
    static std::string read(const NPVariant& value) { return stringValue(value.value.stringValue); }
};

// The object stays the browser's.
template <>
struct ScriptArgument<NPObject*> {
    static bool fits(const NPVariant& value) { return value.type == NPVariantType_Object; }
    static NPObject* read(const NPVariant& value) { return value.value.objectValue; }
};

#endif
