// Control interface of the HashLink runtime stand-in (libhl), for tests, the
// demo host and benchmarks. A real libhl has none of this: a library must
// never include this header.
#pragma once

#include <hl.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#if defined(_WIN32)
#ifdef LIBHL_EXPORTS
#define HLRT_API __declspec(dllexport)
#else
#define HLRT_API __declspec(dllimport)
#endif
#else
#define HLRT_API __attribute__((visibility("default")))
#endif

namespace hlrt {

// ---------------------------------------------------------------------------
// Heap. Every VM value is a tracked block. Collectable blocks live until a
// collection finds them unreachable; permanent blocks (module types) never die.

enum class BlockKind {
    Bytes,    // hl_alloc_bytes / hl_copy_bytes: never scanned
    Array,    // hl_alloc_array: elements scanned when their type is a pointer kind
    DynObj,   // hl_alloc_dynobj: pointer fields scanned
    Box,      // hl_alloc_dynamic and boxed results: v.ptr scanned for pointer types
    Closure,  // closures: the bound value scanned
    Object,   // class instances: scanned conservatively, word by word
    Type,     // hl_type and its parts
};

// Called when a collection frees a block, outside the runtime's lock.
using Finalizer = void (*)(void *block, void *context);

HLRT_API void *alloc_block(BlockKind kind, size_t size);  // zeroed, collectable
HLRT_API void *alloc_permanent(BlockKind kind, size_t size);  // zeroed, never collected
HLRT_API void set_finalizer(void *block, Finalizer finalizer, void *context);

// Frees every collectable block not reachable from a registered root, a held
// value, or the closures and arguments of the hl_dyn_call frames in progress.
// Returns the number of blocks freed. Nothing else ever runs a collection.
HLRT_API size_t collect();

// Values the caller keeps reachable, counted: each hold needs one release.
HLRT_API void hold(const void *value);
HLRT_API void release(const void *value);
HLRT_API void release_all();
HLRT_API size_t held_count();

HLRT_API size_t live_value_count();              // collectable blocks alive
HLRT_API size_t live_count(BlockKind kind);      // collectable blocks of one kind
HLRT_API bool is_live(const void *block);        // start of a live block (permanent ones included)
HLRT_API bool is_block(const void *block, BlockKind kind);
HLRT_API long block_size(const void *block);     // allocated size, -1 when not the start of a live block

// Registered roots: addresses of pointer slots, one entry per hl_add_root call.
HLRT_API size_t root_count();
HLRT_API std::vector<void *> roots();

// ---------------------------------------------------------------------------
// Calls and Haxe exceptions.

// The closure whose code hl_dyn_call is running on this thread (innermost).
HLRT_API vclosure *current_closure();
// Number of hl_dyn_call frames in progress on this thread.
HLRT_API int call_depth();

// Throws a Haxe exception value to the innermost trap of this thread, as the
// VM's throw does. Without a trap the process aborts.
[[noreturn]] HLRT_API void throw_value(vdynamic *exception);

// Runs fn(context) under a trap, as the VM does around a primitive call:
// returns the exception thrown (or rethrown) inside, or null. The frames
// between the trap and the throw are left with longjmp (no destructors run).
HLRT_API vdynamic *guarded_call(void (*fn)(void *), void *context);

// Every value passed to hl_rethrow, in order.
HLRT_API std::vector<vdynamic *> rethrown();
HLRT_API void clear_rethrown();

// ---------------------------------------------------------------------------
// Console: every hl_sys_print call is one captured line.

struct ConsoleLine {
    std::u16string utf16;  // the units as printed, without the terminator
    std::string utf8;
};

HLRT_API std::vector<ConsoleLine> console();
HLRT_API std::vector<std::string> console_utf8();
HLRT_API void clear_console();
// Echo printed lines to stdout (also enabled by HLRT_ECHO=1 in the environment).
HLRT_API void set_console_echo(bool echo);

// ---------------------------------------------------------------------------
// Helpers.

// The VM's signature string of a type ("i", "B", "PiB_v", "OBi_"...).
HLRT_API std::string signature(const hl_type *t);
HLRT_API const char *kind_name(int kind);         // "i32", "bytes", "array"...
HLRT_API std::string utf16_to_utf8(const char16_t *units, size_t count);

// Clears the console, the rethrown values and every hold.
HLRT_API void reset();

}  // namespace hlrt
