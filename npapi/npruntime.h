/* The scripting bridge (npruntime): identifiers, strings, variants, objects and classes.
 * Own declarations of the public binary interface. */
#ifndef TELIX_NPAPI_NPRUNTIME_H
#define TELIX_NPAPI_NPRUNTIME_H

#include "npapi/npapi.h"

#ifndef __cplusplus
#include <stdbool.h>
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* A property name or array index, interned by the browser: equal names have the same pointer until the
 * process exits. */
typedef void* NPIdentifier;

/* A UTF-8 string with a length; not necessarily null-terminated. */
typedef struct _NPString {
    const char* UTF8Characters;
    uint32_t UTF8Length;
} NPString;

typedef enum {
    NPVariantType_Void = 0,
    NPVariantType_Null = 1,
    NPVariantType_Bool = 2,
    NPVariantType_Int32 = 3,
    NPVariantType_Double = 4,
    NPVariantType_String = 5,
    NPVariantType_Object = 6
} NPVariantType;

typedef struct NPObject NPObject;
typedef struct NPClass NPClass;

/* A script value. The receiver of a result owns its string or object and releases it with
 * NPN_ReleaseVariantValue. */
typedef struct _NPVariant {
    NPVariantType type;
    union {
        bool boolValue;
        int32_t intValue;
        double doubleValue;
        NPString stringValue;
        NPObject* objectValue;
    } value;
} NPVariant;

/* A scriptable object. The browser initialises both fields on creation. */
struct NPObject {
    NPClass* _class;
    uint32_t referenceCount;
};

typedef NPObject* (*NPAllocateFunctionPtr)(NPP npp, NPClass* aClass);
typedef void (*NPDeallocateFunctionPtr)(NPObject* object);
typedef void (*NPInvalidateFunctionPtr)(NPObject* object);
typedef bool (*NPHasMethodFunctionPtr)(NPObject* object, NPIdentifier name);
typedef bool (*NPInvokeFunctionPtr)(NPObject* object, NPIdentifier name, const NPVariant* args,
                                    uint32_t argCount, NPVariant* result);
typedef bool (*NPInvokeDefaultFunctionPtr)(NPObject* object, const NPVariant* args, uint32_t argCount,
                                           NPVariant* result);
typedef bool (*NPHasPropertyFunctionPtr)(NPObject* object, NPIdentifier name);
typedef bool (*NPGetPropertyFunctionPtr)(NPObject* object, NPIdentifier name, NPVariant* result);
typedef bool (*NPSetPropertyFunctionPtr)(NPObject* object, NPIdentifier name, const NPVariant* value);
typedef bool (*NPRemovePropertyFunctionPtr)(NPObject* object, NPIdentifier name);
typedef bool (*NPEnumerationFunctionPtr)(NPObject* object, NPIdentifier** names, uint32_t* count);
typedef bool (*NPConstructFunctionPtr)(NPObject* object, const NPVariant* args, uint32_t argCount,
                                       NPVariant* result);

#define NP_CLASS_STRUCT_VERSION 3

/* The functions of a class of objects. */
struct NPClass {
    uint32_t structVersion;
    NPAllocateFunctionPtr allocate;
    NPDeallocateFunctionPtr deallocate;
    NPInvalidateFunctionPtr invalidate;
    NPHasMethodFunctionPtr hasMethod;
    NPInvokeFunctionPtr invoke;
    NPInvokeDefaultFunctionPtr invokeDefault;
    NPHasPropertyFunctionPtr hasProperty;
    NPGetPropertyFunctionPtr getProperty;
    NPSetPropertyFunctionPtr setProperty;
    NPRemovePropertyFunctionPtr removeProperty;
    NPEnumerationFunctionPtr enumerate;
    NPConstructFunctionPtr construct;
};

NPAPI_STATIC_ASSERT(sizeof(NPVariantType) == 4);
NPAPI_STATIC_ASSERT(sizeof(bool) == 1);
NPAPI_STATIC_ASSERT(sizeof(NPString) == NPAPI_BY_WORD(8, 16));
NPAPI_STATIC_ASSERT(offsetof(NPString, UTF8Length) == NPAPI_BY_WORD(4, 8));
/* The value is aligned as the stricter of a double and a pointer: of the 32-bit machines, x86 aligns a double
 * in a struct to 4 bytes, ARM and MIPS align it to 8. */
typedef struct _NPDoubleAlignment {
    char before;
    double value;
} NPDoubleAlignment;
NPAPI_STATIC_ASSERT(offsetof(NPVariant, value) == (offsetof(NPDoubleAlignment, value) > sizeof(void*)
                                                       ? offsetof(NPDoubleAlignment, value)
                                                       : sizeof(void*)));
NPAPI_STATIC_ASSERT(sizeof(NPVariant) == offsetof(NPVariant, value) + NPAPI_BY_WORD(8, 16));
NPAPI_STATIC_ASSERT(sizeof(NPObject) == NPAPI_BY_WORD(8, 16));
NPAPI_STATIC_ASSERT(offsetof(NPObject, referenceCount) == NPAPI_BY_WORD(4, 8));
NPAPI_STATIC_ASSERT(sizeof(NPClass) == NPAPI_BY_WORD(52, 104));
NPAPI_STATIC_ASSERT(offsetof(NPClass, allocate) == NPAPI_BY_WORD(4, 8));
NPAPI_STATIC_ASSERT(offsetof(NPClass, invoke) == NPAPI_BY_WORD(20, 40));
NPAPI_STATIC_ASSERT(offsetof(NPClass, getProperty) == NPAPI_BY_WORD(32, 64));
NPAPI_STATIC_ASSERT(offsetof(NPClass, construct) == NPAPI_BY_WORD(48, 96));

#ifdef __cplusplus
}
#endif

#endif
