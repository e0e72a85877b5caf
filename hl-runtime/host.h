// What the HashLink VM does to a native library, for tests, the demo host and
// benchmarks: load the hdll, resolve and check its primitives the way the VM
// binds natives, and build and read the VM values a game would pass.
#pragma once

#include <hl.h>
#include <hl_runtime_control.h>

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace host {

// ---------------------------------------------------------------------------
// Loading and binding.

// dlopen()s the hdll (RTLD_NOW | RTLD_LOCAL) as library `library`; on failure
// exits like the VM: "Failed to load library <library>.hdll".
void load(const std::string &path, const std::string &library = "tarnwick");
bool loaded();

// What a descriptor hlp_<name> reports, without any check.
struct Descriptor {
    bool found = false;                    // hlp_<name> exists
    void *function = nullptr;              // what the descriptor returned
    std::optional<std::string> signature;  // *sign after the call; nullopt when set to NULL
};
Descriptor describe(const std::string &name);

// Binds a primitive as the VM does: calls hlp_<name> and compares its
// signature with `declared` (NUL included). A missing descriptor or a
// mismatch prints the VM's fatal error to stdout and exits with status 1.
void *bind(const std::string &name, const std::string &declared);
template <typename F> F bind_as(const std::string &name, const std::string &declared)
{
    return reinterpret_cast<F>(bind(name, declared));
}

// A plain exported symbol of the loaded hdll, or null.
void *symbol(const std::string &name);

// Prints "<where> : FATAL ERROR : <message>" to stdout and exits with status 1.
[[noreturn]] void fatal(const char *where, const std::string &message);

// Sends this process's stdout to stderr from now on: death tests match only
// stderr, and the VM's fatal errors go to stdout.
void route_stdout_to_stderr();

// ---------------------------------------------------------------------------
// Types. Built from signature strings, as a module's own types: distinct
// objects from libhl's hlt_* globals. Cached per signature, never freed.

hl_type *type_of(const std::string &signature);  // "i", "B", "PiBBB_v", "OBBBBBBBBBBiib_"...

// Byte offset of field `index` of an HOBJ type (fields at natural alignment
// after the type pointer), and the instance size.
int field_offset(const hl_type *object_type, int index);
int object_size(const hl_type *object_type);

// A zeroed instance of an HOBJ type (tracked, not held).
void *make_object(hl_type *object_type);

// ---------------------------------------------------------------------------
// Closures made by tests.

struct Arg {
    hl_type_kind kind = HVOID;
    int i = 0;                          // HI32, HUI8, HUI16
    bool b = false;                     // HBOOL
    std::optional<std::string> bytes;   // HBYTES: content up to the NUL; nullopt for null
    long bytes_size = -1;               // HBYTES: allocated size of the VM copy, -1 if null or not a VM block
    void *ptr = nullptr;                // every pointer kind (bytes included)

    varray *array() const { return static_cast<varray *>(ptr); }
};

struct Call {
    std::vector<Arg> args;
    void *value = nullptr;  // the bound value of a closure with a value
};

struct ClosureBehaviour {
    // Run on each call, after it is recorded; may call primitives.
    std::function<void(const Call &)> on_call;
    // When not null: thrown as a Haxe exception after on_call.
    vdynamic *throws = nullptr;
    // Returned to the caller (for i32/bool/pointer results).
    intptr_t result = 0;
    // hasValue 1: `value` is passed first; its type is the function type's
    // first argument (the value's own type when it is a VM object).
    bool has_value = false;
    void *value = nullptr;
};

struct Closure {
    vclosure *vm = nullptr;  // the VM value: tracked, not held
    std::vector<Call> calls;
    ClosureBehaviour behaviour;
    bool collected = false;  // the collector freed `vm`

    size_t count() const { return calls.size(); }
    const Call &last() const { return calls.back(); }
};
using ClosureRef = std::shared_ptr<Closure>;

// A closure of the function type `signature` ("PiB_v"...).
ClosureRef make_closure(const std::string &signature, ClosureBehaviour behaviour = {});

// ---------------------------------------------------------------------------
// Values (all tracked, none held).

vbyte *bytes(const std::string &text);  // a NUL-terminated VM copy
vbyte *bytes_or_null(const std::optional<std::string> &text);
varray *bytes_array(const std::vector<std::string> &items);  // elements of hlt_bytes
varray *bytes_array(const std::vector<std::optional<std::string>> &items);
vdynamic *box_i32(int value);
vdynamic *box_bytes(vbyte *value);
// A Haxe exception value: a box holding the message's bytes.
vdynamic *exception(const std::string &message);
std::optional<std::string> exception_message(const vdynamic *exception);

// The game's configuration object, "OBBBBBBBBBBiib_".
struct InitConfigValues {
    std::optional<std::string> productName, productVersion, eosProductId, spare, sandboxId, deploymentId, clientId,
        clientSecret, loginId, loginToken;
    int loginType = 0;
    int externalType = 0;
    bool enableOverlay = false;
};
extern const char *const kInitConfigSignature;
void *init_config(const InitConfigValues &values);

// ---------------------------------------------------------------------------
// Readers.

// Content up to the NUL (null -> nullopt). A VM block without a NUL aborts.
std::optional<std::string> read_bytes(const vbyte *b);
long bytes_size(const vbyte *b);  // allocated size of a VM bytes block, -1 otherwise

int array_size(const varray *a);
std::vector<void *> array_slots(const varray *a);  // pointer elements
std::vector<std::optional<std::string>> array_bytes(const varray *a);

bool has_field(const vdynobj *o, const std::string &name);
std::optional<hl_type_kind> field_kind(const vdynobj *o, const std::string &name);
std::optional<std::string> field_bytes(const vdynobj *o, const std::string &name);  // nullopt: absent or null
std::optional<bool> field_bool(const vdynobj *o, const std::string &name);
std::optional<int> field_i32(const vdynobj *o, const std::string &name);

// ---------------------------------------------------------------------------
// Calls.

// Runs fn under a trap, as the VM does around a primitive call: returns the
// Haxe exception thrown or rethrown inside (its frames are left with
// longjmp), or null.
vdynamic *call_guarded(const std::function<void()> &fn);

// Holds a value for the lifetime of the guard.
class Held {
public:
    explicit Held(const void *value) : value_(value) { hlrt::hold(value_); }
    ~Held() { hlrt::release(value_); }
    Held(const Held &) = delete;
    Held &operator=(const Held &) = delete;

private:
    const void *value_;
};

}  // namespace host
