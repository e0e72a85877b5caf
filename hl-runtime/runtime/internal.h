// Shared declarations of the runtime stand-in's sources.
#pragma once

#include <hl.h>
#include <hl_runtime_control.h>

#include <cstddef>
#include <string>

namespace hlrt {

// Prints "hl runtime: <message>" to stderr and aborts: what the VM reports as
// an error (often a Haxe exception) is a test failure here.
[[noreturn]] void fail(const char *format, ...)
#if defined(__GNUC__)
    __attribute__((format(printf, 1, 2)))
#endif
    ;

inline bool is_pointer_kind(hl_type_kind kind) { return kind >= HBYTES; }

// Size of a value of this type in a field or an array slot.
int type_size(const hl_type *t);

// "HI32", "HBYTES"...: the kind's name in hl.h.
const char *kind_enum_name(int kind);

// Short description of what a dynamic pointer is, for error messages.
std::string describe_value(const void *value);

// Frees the storage a dynamic object keeps outside its block.
void dynobj_release(vdynobj *o);

// Marking hooks used by the collector for the calls in progress.
void for_each_active_call(void (*visit)(vclosure *c, vdynamic **args, int nargs, void *ctx), void *ctx);

}  // namespace hlrt
