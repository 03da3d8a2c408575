/* A host in C that speaks to strings and arrays through tables of functions which it declares by itself.
 *
 * It knows nothing of the library: no header of it, no class, only the order of the slots and the conventions of this
 * platform's C++ ABI, by which an object begins with the address of its table and the table ends with two entries for
 * the destructor, the second of which also releases the memory. One part of it works on strings and arrays that are
 * handed to it, the other has strings and arrays of its own, which it hands out.
 */
#ifndef KVT_TESTS_CODEC_FOREIGN_HOST_H
#define KVT_TESTS_CODEC_FOREIGN_HOST_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#else
#include <stdbool.h>
#endif

struct HostString;
struct HostArray;

struct HostStringSlots {
    void (*assignText)(struct HostString* self, const char* text);
    const char* (*text)(const struct HostString* self);
    void (*assignBytes)(struct HostString* self, const char* data, uint32_t byteLength);
    const char* (*data)(const struct HostString* self);
    uint32_t (*byteLength)(const struct HostString* self);
    void (*parsable[4])(struct HostString* self);
    void (*destroy)(struct HostString* self);
    void (*destroyAndRelease)(struct HostString* self);
};

struct HostString {
    const struct HostStringSlots* slots;
};

struct HostArraySlots {
    void (*append)(struct HostArray* self, const struct HostString* string);
    void (*appendText)(struct HostArray* self, const char* text);
    const char* (*elementText)(const struct HostArray* self, uint32_t index);
    int (*getElement)(const struct HostArray* self, uint32_t index, struct HostString* target);
    int (*setElement)(struct HostArray* self, uint32_t index, const struct HostString* source);
    uint32_t (*entries)(const struct HostArray* self);
    void (*clear)(struct HostArray* self);
    bool (*contains)(const struct HostArray* self, const struct HostString* string);
    bool (*containsText)(const struct HostArray* self, const char* text);
    void (*appendCsv)(struct HostArray* self, const char* text);
    void (*appendTokens)(struct HostArray* self, const char* text, const char* delimiters);
    uint32_t (*removeAll)(struct HostArray* self, const struct HostString* string);
    uint32_t (*removeAllText)(struct HostArray* self, const char* text);
    struct HostString* (*element)(struct HostArray* self, uint32_t index);
    void (*destroy)(struct HostArray* self);
    void (*destroyAndRelease)(struct HostArray* self);
};

struct HostArray {
    const struct HostArraySlots* slots;
};

/* ---- What the host does to strings that it is handed. A unit has 1, 2 or 4 bytes. */

/* The number of units that equal the ASCII character. */
uint32_t hostCount(const struct HostString* string, uint32_t unitSize, char character);
/* Turns the order of the units around. */
void hostReverse(struct HostString* string, uint32_t unitSize);
/* Writes the units of `source` behind those of `target`. */
void hostAppend(struct HostString* target, const struct HostString* source);
/* Sets the text up to its terminating zero unit, through the string's own text: what was behind the zero is gone. */
void hostCutAtZero(struct HostString* string);

/* ---- What it does to arrays. */

/* The elements' bytes, one element behind the other, by elementText; at most `room` bytes. The number of bytes. */
uint32_t hostConcatenate(struct HostArray* array, char* bytes, uint32_t room);
/* Makes `target` a copy of `source`, element by element, by getElement into one string that is carried along. */
void hostCopy(struct HostArray* target, const struct HostArray* source, struct HostString* carrier);
/* Swaps the first with the last, the second with the last but one, and so on, by setElement. */
void hostReverseElements(struct HostArray* array, struct HostString* carrier);
/* Leaves one of each group of equal elements, in the order of their first places, by contains and removeAll. Takes
 * an empty array to work in. The number of elements that went. */
uint32_t hostRemoveDuplicates(struct HostArray* array, struct HostArray* seen);

/* ---- Its own strings and arrays. */

/* A string that holds a copy of the bytes; with no bytes, its data is null. */
struct HostString* hostNewString(const char* data, uint32_t byteLength);
/* An array of `count` empty strings. */
struct HostArray* hostNewArray(uint32_t count);
/* Each releases what the host has made, through the last entry of its table. */
void hostReleaseString(struct HostString* string);
void hostReleaseArray(struct HostArray* array);

/* Calls of slots of the host's own objects that nothing should call when it only reads them, since the start. */
extern uint32_t hostUnexpectedCalls;

#ifdef __cplusplus
}
#endif

#endif
