// How a wrapper class states its script interface: a table with one row a name, in the order in which the
// names are interned. A row leads to an operation of the model; which arguments a method takes and what
// script gets back follow from the operation's C++ signature.
#ifndef TELIX_COMMON_SCRIPTINTERFACE_H
#define TELIX_COMMON_SCRIPTINTERFACE_H

#include <string>
#include <tuple>
#include <type_traits>
#include <utility>

#include "common/Log.h"
#include "common/PluginBase.h"
#include "common/ScriptValues.h"

// Each of these does its work on the model behind the wrapper and returns whether it took place: false from a
// writer or an invoker is a value or arguments that do not fit.
using ScriptReader = bool (*)(PluginBase& model, NPVariant& result);
using ScriptWriter = bool (*)(PluginBase& model, const NPVariant& value);
using ScriptInvoker = bool (*)(PluginBase& model, const NPVariant* args, unsigned int argCount,
                               NPVariant& result);

// The types that script sees of an operation, as its C++ signature gives them. The plug-in works without
// them; the reference for page authors is checked against them. The types of a function that reads its
// arguments by itself are unstated.
enum class ScriptType : uint8_t { Unstated, Nothing, Boolean, Number, String, Object };

struct ScriptTypes {
    ScriptType result = ScriptType::Unstated;
    ScriptType arguments[3] = {}; // the first Unstated ends them
};

// A function of a row with its types. A function without them converts to it.
template <class Function>
struct TypedFunction {
    Function function = nullptr;
    ScriptTypes types = {};

    constexpr TypedFunction() = default;
    constexpr TypedFunction(Function untyped) : function(untyped) {}
    constexpr TypedFunction(Function typed, ScriptTypes itsTypes) : function(typed), types(itsTypes) {}
    constexpr operator Function() const { return function; }
};

struct ScriptMember {
    const char* name;
    const char* logPrefix;
    const char* logName;
    ScriptReader read;     // of a property
    ScriptWriter write;    // of a property that script may write
    ScriptInvoker invoke;  // of a method
    int32_t constantValue; // of a constant, which is a property without a reader
    ScriptTypes types;     // of a property: the value read, and as the one argument the value written

    constexpr bool isMethod() const { return invoke != nullptr; }
    constexpr bool isConstant() const { return !isMethod() && !read; }

    // The row with another spelling of the name in the log.
    constexpr ScriptMember logged(const char* spelling) const {
        ScriptMember row = *this;
        row.logName = spelling;
        return row;
    }
};

constexpr ScriptMember property(const char* name, TypedFunction<ScriptReader> read,
                                TypedFunction<ScriptWriter> write = {}) {
    return {name, "pId_", name, read, write, nullptr, 0, {read.types.result, {write.types.arguments[0]}}};
}

constexpr ScriptMember constant(const char* name, int32_t value) {
    return {name, "cId_", name, nullptr, nullptr, nullptr, value, {ScriptType::Number}};
}

constexpr ScriptMember method(const char* name, TypedFunction<ScriptInvoker> invoke) {
    return {name, "mId_", name, nullptr, nullptr, invoke, 0, invoke.types};
}

namespace script_detail {

template <class Operation>
struct Signature;

template <class Model_, class Result_, class... Arguments_>
struct Signature<Result_ (Model_::*)(Arguments_...)> {
    using Model = Model_;
    using Result = Result_;
    using Arguments = std::tuple<std::decay_t<Arguments_>...>;
};

template <class Model_, class Result_, class... Arguments_>
struct Signature<Result_ (Model_::*)(Arguments_...) const> : Signature<Result_ (Model_::*)(Arguments_...)> {};

template <class Type>
constexpr ScriptType scriptTypeOf() {
    if constexpr (std::is_void_v<Type>) {
        return ScriptType::Nothing;
    } else if constexpr (std::is_same_v<Type, bool>) {
        return ScriptType::Boolean;
    } else if constexpr (std::is_arithmetic_v<Type> || std::is_enum_v<Type>) {
        return ScriptType::Number;
    } else if constexpr (std::is_pointer_v<Type>) {
        return ScriptType::Object;
    } else {
        static_assert(std::is_same_v<Type, std::string>, "no type of script");
        return ScriptType::String;
    }
}

template <class Result, class... Arguments>
constexpr ScriptTypes typesOf(const std::tuple<Arguments...>*) {
    static_assert(sizeof...(Arguments) <= sizeof(ScriptTypes::arguments));
    return {scriptTypeOf<Result>(), {scriptTypeOf<Arguments>()...}};
}

// The types of an operation of a model.
template <auto Operation>
constexpr ScriptTypes typesOf() {
    using Call = Signature<decltype(Operation)>;
    return typesOf<typename Call::Result>(static_cast<const typename Call::Arguments*>(nullptr));
}

template <class... Types, size_t... Index>
bool argumentsFit(const NPVariant* args, const std::tuple<Types...>*, std::index_sequence<Index...>) {
    return (ScriptArgument<Types>::fits(args[Index]) && ...);
}

template <class... Types, size_t... Index>
std::tuple<Types...> readArguments(const NPVariant* args, const std::tuple<Types...>*,
                                   std::index_sequence<Index...>) {
    // A call's arguments may be evaluated in any order; those of a braced list are evaluated as they stand.
    return std::tuple<Types...>{ScriptArgument<Types>::read(args[Index])...};
}

} // namespace script_detail

// Whether the first arguments of a call fit the types of a tuple.
// quirk 1: the array is read as it stands, whatever its length.
template <class Tuple>
bool argumentsFit(const NPVariant* args) {
    return script_detail::argumentsFit(args, static_cast<const Tuple*>(nullptr),
                                       std::make_index_sequence<std::tuple_size_v<Tuple>>{});
}

// The values of arguments that fit. They are converted from the first to the last: a conversion logs and
// allocates.
template <class Tuple>
Tuple readArguments(const NPVariant* args) {
    return script_detail::readArguments(args, static_cast<const Tuple*>(nullptr),
                                        std::make_index_sequence<std::tuple_size_v<Tuple>>{});
}

namespace script_detail {

template <auto Getter>
bool readThrough(PluginBase& model, NPVariant& result) {
    using Call = script_detail::Signature<decltype(Getter)>;
    setResult(result, (static_cast<typename Call::Model&>(model).*Getter)());
    return true;
}

template <auto Setter>
bool writeThrough(PluginBase& model, const NPVariant& value) {
    using Call = script_detail::Signature<decltype(Setter)>;
    using Argument = ScriptArgument<std::tuple_element_t<0, typename Call::Arguments>>;
    if (!Argument::fits(value)) {
        return false;
    }
    (static_cast<typename Call::Model&>(model).*Setter)(Argument::read(value));
    return true;
}

// quirk 4: a value that is neither object nor null changes nothing, and the write succeeds.
template <auto Setter>
bool writeListenerThrough(PluginBase& model, const NPVariant& value) {
    using Call = script_detail::Signature<decltype(Setter)>;
    if (value.type == NPVariantType_Object) {
        (static_cast<typename Call::Model&>(model).*Setter)(value.value.objectValue);
    } else if (value.type == NPVariantType_Null) {
        (static_cast<typename Call::Model&>(model).*Setter)(nullptr);
    }
    return true;
}

template <auto Operation>
bool invokeOperation(PluginBase& model, const NPVariant* args, unsigned int, NPVariant& result) {
    using Call = script_detail::Signature<decltype(Operation)>;
    if (!argumentsFit<typename Call::Arguments>(args)) {
        return false;
    }
    const auto operation = [&model](const auto&... arguments) {
        return (static_cast<typename Call::Model&>(model).*Operation)(arguments...);
    };
    const auto arguments = readArguments<typename Call::Arguments>(args);
    if constexpr (std::is_void_v<typename Call::Result>) {
        std::apply(operation, arguments);
    } else {
        setResult(result, std::apply(operation, arguments));
    }
    return true;
}

} // namespace script_detail

// A property read through a getter of the model.
template <auto Getter>
constexpr TypedFunction<ScriptReader> reader{script_detail::readThrough<Getter>,
                                             script_detail::typesOf<Getter>()};

// A property written through a setter of the model; a value that is not of the setter's type is refused.
template <auto Setter>
constexpr TypedFunction<ScriptWriter> writer{script_detail::writeThrough<Setter>,
                                             script_detail::typesOf<Setter>()};

// A property that holds a script function: an object replaces it, null clears it.
template <auto Setter>
constexpr TypedFunction<ScriptWriter> listenerWriter{script_detail::writeListenerThrough<Setter>,
                                                     script_detail::typesOf<Setter>()};

// A method that is one operation of the model. The operation's result is script's; without one the browser's
// result is left as it was.
template <auto Operation>
constexpr TypedFunction<ScriptInvoker> invoker{script_detail::invokeOperation<Operation>,
                                               script_detail::typesOf<Operation>()};

// Array notation of the list classes: decimal names below `length` read `item`.
struct ScriptArray {
    uint32_t (*length)(PluginBase& model);
    NPObject* (*item)(PluginBase& model, uint32_t index);
    LogModule logModule;
    const char* logIndent; // what the log line begins with: some classes set it off by a blank
};

template <auto Length, auto Item>
constexpr ScriptArray scriptArray(LogModule logModule, const char* logIndent) {
    using List = typename script_detail::Signature<decltype(Length)>::Model;
    return {[](PluginBase& model) -> uint32_t { return (static_cast<List&>(model).*Length)(); },
            [](PluginBase& model, uint32_t index) { return (static_cast<List&>(model).*Item)(index); },
            logModule, logIndent};
}

#endif
