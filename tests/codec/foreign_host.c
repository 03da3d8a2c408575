/* The host of foreign_host.h. */
#include "foreign_host.h"

#include <stdlib.h>
#include <string.h>

/* Strings of more bytes than this are beyond what the tests hand over. */
enum { roomForText = 4096 };

uint32_t hostCount(const struct HostString* string, uint32_t unitSize, char character) {
    const char* const data = string->slots->data(string);
    const uint32_t byteLength = string->slots->byteLength(string);
    char unit[4] = {0, 0, 0, 0};
    memcpy(unit, &character, 1);
    uint32_t found = 0;
    for (uint32_t at = 0; at + unitSize <= byteLength; at += unitSize) {
        found += memcmp(data + at, unit, unitSize) == 0;
    }
    return found;
}

void hostReverse(struct HostString* string, uint32_t unitSize) {
    char turned[roomForText];
    const char* const data = string->slots->data(string);
    const uint32_t byteLength = string->slots->byteLength(string);
    for (uint32_t at = 0; at < byteLength; at += unitSize) {
        memcpy(turned + at, data + byteLength - unitSize - at, unitSize);
    }
    string->slots->assignBytes(string, turned, byteLength);
}

void hostAppend(struct HostString* target, const struct HostString* source) {
    char joined[roomForText];
    const uint32_t first = target->slots->byteLength(target);
    const uint32_t second = source->slots->byteLength(source);
    memcpy(joined, target->slots->data(target), first);
    memcpy(joined + first, source->slots->data(source), second);
    target->slots->assignBytes(target, joined, first + second);
}

void hostCutAtZero(struct HostString* string) {
    string->slots->assignText(string, string->slots->text(string));
}

uint32_t hostConcatenate(struct HostArray* array, char* bytes, uint32_t room) {
    const uint32_t entries = array->slots->entries(array);
    uint32_t used = 0;
    for (uint32_t i = 0; i < entries; ++i) {
        const struct HostString* const element = array->slots->element(array, i);
        const uint32_t length = element->slots->byteLength(element);
        if (length > room - used) {
            break;
        }
        memcpy(bytes + used, array->slots->elementText(array, i), length);
        used += length;
    }
    return used;
}

void hostCopy(struct HostArray* target, const struct HostArray* source, struct HostString* carrier) {
    target->slots->clear(target);
    for (uint32_t i = 0; source->slots->getElement(source, i, carrier) == 0; ++i) {
        target->slots->append(target, carrier);
    }
}

void hostReverseElements(struct HostArray* array, struct HostString* carrier) {
    const uint32_t entries = array->slots->entries(array);
    for (uint32_t i = 0; i < entries / 2; ++i) {
        array->slots->getElement(array, i, carrier);
        array->slots->setElement(array, i, array->slots->element(array, entries - 1 - i));
        array->slots->setElement(array, entries - 1 - i, carrier);
    }
}

uint32_t hostRemoveDuplicates(struct HostArray* array, struct HostArray* seen) {
    const uint32_t before = array->slots->entries(array);
    while (array->slots->entries(array) > 0) {
        /* The element is in the array that it is removed from. */
        const struct HostString* const first = array->slots->element(array, 0);
        if (!seen->slots->contains(seen, first)) {
            seen->slots->append(seen, first);
        }
        array->slots->removeAll(array, first);
    }
    for (uint32_t i = 0; i < seen->slots->entries(seen); ++i) {
        array->slots->append(array, seen->slots->element(seen, i));
    }
    return before - array->slots->entries(array);
}

/* ---- The host's own string */

uint32_t hostUnexpectedCalls = 0;

struct OwnString {
    struct HostString base;
    char* bytes;
    uint32_t byteLength;
};

static void ownAssignBytes(struct HostString* self, const char* data, uint32_t byteLength) {
    struct OwnString* const string = (struct OwnString*)self;
    char* bytes = NULL;
    if (byteLength > 0) {
        bytes = malloc(byteLength);
        memcpy(bytes, data, byteLength);
    }
    free(string->bytes);
    string->bytes = bytes;
    string->byteLength = byteLength;
}

static void ownAssignText(struct HostString* self, const char* text) {
    (void)text;
    (void)self;
    ++hostUnexpectedCalls;
}

static const char* ownText(const struct HostString* self) {
    (void)self;
    ++hostUnexpectedCalls;
    return "the text of slot 2";
}

static const char* ownData(const struct HostString* self) {
    return ((const struct OwnString*)self)->bytes;
}

static uint32_t ownByteLength(const struct HostString* self) {
    return ((const struct OwnString*)self)->byteLength;
}

static void ownParsable(struct HostString* self) {
    (void)self;
    ++hostUnexpectedCalls;
}

static void ownDestroy(struct HostString* self) {
    free(((struct OwnString*)self)->bytes);
}

static void ownDestroyAndRelease(struct HostString* self) {
    ownDestroy(self);
    free(self);
}

/* Before the functions a table has the distance to the whole object and the run-time type, which nothing asks but a
 * sanitizer: that of the interface itself, under the name which the C++ ABI gives it. */
extern const char interfaceOfStrings[] __asm__("_ZTI10IZQTString");
extern const char interfaceOfArrays[] __asm__("_ZTI15IZQTStringArray");

static const struct {
    intptr_t toWholeObject;
    const void* type;
    struct HostStringSlots slots;
} ownStringTable = {0,
                    interfaceOfStrings,
                    {ownAssignText,
                     ownText,
                     ownAssignBytes,
                     ownData,
                     ownByteLength,
                     {ownParsable, ownParsable, ownParsable, ownParsable},
                     ownDestroy,
                     ownDestroyAndRelease}};

struct HostString* hostNewString(const char* data, uint32_t byteLength) {
    struct OwnString* const string = malloc(sizeof *string);
    string->base.slots = &ownStringTable.slots;
    string->bytes = NULL;
    ownAssignBytes(&string->base, data, byteLength);
    return &string->base;
}

void hostReleaseString(struct HostString* string) {
    string->slots->destroyAndRelease(string);
}

/* ---- The host's own array: strings side by side, of which only the number and the elements can be had */

struct OwnArray {
    struct HostArray base;
    uint32_t count;
    struct HostString** elements;
};

static void arrayAppend(struct HostArray* self, const struct HostString* string) {
    (void)self;
    (void)string;
    ++hostUnexpectedCalls;
}

static void arrayTakeText(struct HostArray* self, const char* text) {
    (void)self;
    (void)text;
    ++hostUnexpectedCalls;
}

static const char* arrayElementText(const struct HostArray* self, uint32_t index) {
    (void)self;
    (void)index;
    ++hostUnexpectedCalls;
    return "";
}

static int arrayGetElement(const struct HostArray* self, uint32_t index, struct HostString* target) {
    (void)self;
    (void)index;
    (void)target;
    ++hostUnexpectedCalls;
    return 1;
}

static int arraySetElement(struct HostArray* self, uint32_t index, const struct HostString* source) {
    (void)self;
    (void)index;
    (void)source;
    ++hostUnexpectedCalls;
    return 1;
}

static uint32_t arrayEntries(const struct HostArray* self) {
    return ((const struct OwnArray*)self)->count;
}

static void arrayClear(struct HostArray* self) {
    (void)self;
    ++hostUnexpectedCalls;
}

static bool arrayContains(const struct HostArray* self, const struct HostString* string) {
    (void)self;
    (void)string;
    ++hostUnexpectedCalls;
    return false;
}

static bool arrayContainsText(const struct HostArray* self, const char* text) {
    (void)self;
    (void)text;
    ++hostUnexpectedCalls;
    return false;
}

static void arrayTakeTokens(struct HostArray* self, const char* text, const char* delimiters) {
    (void)self;
    (void)text;
    (void)delimiters;
    ++hostUnexpectedCalls;
}

static uint32_t arrayRemoveAll(struct HostArray* self, const struct HostString* string) {
    (void)self;
    (void)string;
    ++hostUnexpectedCalls;
    return 0;
}

static uint32_t arrayRemoveAllText(struct HostArray* self, const char* text) {
    (void)self;
    (void)text;
    ++hostUnexpectedCalls;
    return 0;
}

static struct HostString* arrayElement(struct HostArray* self, uint32_t index) {
    return ((struct OwnArray*)self)->elements[index];
}

static void arrayDestroy(struct HostArray* self) {
    struct OwnArray* const array = (struct OwnArray*)self;
    for (uint32_t i = 0; i < array->count; ++i) {
        hostReleaseString(array->elements[i]);
    }
    free(array->elements);
}

static void arrayDestroyAndRelease(struct HostArray* self) {
    arrayDestroy(self);
    free(self);
}

static const struct {
    intptr_t toWholeObject;
    const void* type;
    struct HostArraySlots slots;
} ownArrayTable = {0,
                   interfaceOfArrays,
                   {arrayAppend, arrayTakeText, arrayElementText, arrayGetElement, arraySetElement,
                    arrayEntries, arrayClear, arrayContains, arrayContainsText, arrayTakeText,
                    arrayTakeTokens, arrayRemoveAll, arrayRemoveAllText, arrayElement, arrayDestroy,
                    arrayDestroyAndRelease}};

struct HostArray* hostNewArray(uint32_t count) {
    struct OwnArray* const array = malloc(sizeof *array);
    array->base.slots = &ownArrayTable.slots;
    array->count = count;
    array->elements = malloc((count + 1) * sizeof *array->elements);
    for (uint32_t i = 0; i < count; ++i) {
        array->elements[i] = hostNewString("", 0);
    }
    return &array->base;
}

void hostReleaseArray(struct HostArray* array) {
    array->slots->destroyAndRelease(array);
}
