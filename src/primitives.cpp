// The primitive table, closure cells, and the conversion of values between
// the library and the VM.
#include "state.h"

#include <cstring>
#include <new>

static_assert(offsetof(InitConfig, productName) == 8, "InitConfig layout");
static_assert(offsetof(InitConfig, loginToken) == 80, "InitConfig layout");
static_assert(offsetof(InitConfig, loginType) == 88, "InitConfig layout");
static_assert(offsetof(InitConfig, externalType) == 92, "InitConfig layout");
static_assert(offsetof(InitConfig, enableOverlay) == 96, "InitConfig layout");

#define INIT_CONFIG _OBJ(_BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _I32 _I32 _BOOL)

DEFINE_PRIM(_BOOL, init, INIT_CONFIG _FUN(_VOID, _I32 _BYTES _BYTES _BYTES));
DEFINE_PRIM(_VOID, notify_invite_received, _FUN(_VOID, _BYTES _BYTES));
DEFINE_PRIM(_VOID, notify_invite_accepted, _FUN(_VOID, _BYTES _BYTES));
DEFINE_PRIM(_VOID, update, _NO_ARG);
DEFINE_PRIM(_VOID, set_achievement, _BYTES);
DEFINE_PRIM(_VOID, query_ownership, _ARR _FUN(_VOID, _ARR));
DEFINE_PRIM(_VOID, query_achievements, _FUN(_VOID, _ARR));
DEFINE_PRIM(_VOID, show_friends, _NO_ARG);
DEFINE_PRIM(_VOID, query_friends, _FUN(_VOID, _ARR));
DEFINE_PRIM(_VOID, send_invite, _BYTES _BYTES);
DEFINE_PRIM(_VOID, reject_invite, _BYTES);
DEFINE_PRIM(_VOID, accept_invite, _BYTES _FUN(_VOID, _BYTES _BYTES));
DEFINE_PRIM(_VOID, create_lobby, _BYTES _FUN(_VOID, _BYTES));
DEFINE_PRIM(_VOID, leave_lobby, _BYTES _FUN(_VOID, _I32));
DEFINE_PRIM(_VOID, destroy_lobby, _BYTES _FUN(_VOID, _I32));
DEFINE_PRIM(_VOID, exit, _NO_ARG);
// Without a descriptor a Haxe game could not reach the checkout at all.
DEFINE_PRIM(_VOID, store_checkout, _BYTES);

closure_cell *closure_cell_new(vclosure *closure)
{
    if (!closure)
        return nullptr;
    closure_cell *cell = new closure_cell;
    hl_add_root(cell);
    cell->closure = closure;
    return cell;
}

void closure_cell_free(closure_cell *cell)
{
    if (!cell)
        return;
    hl_remove_root(cell);
    delete cell;
}

// The first Haxe exception thrown by a game closure during a tick, rooted
// until hleos_update rethrows it.
static vdynamic *g_pending_exception = nullptr;

void call_closure(vclosure *closure, vdynamic **args, int count)
{
    if (!closure)
        return;
    bool is_exception = false;
    vdynamic *result = hl_dyn_call_safe(closure, args, count, &is_exception);
    if (is_exception && !g_pending_exception) {
        g_pending_exception = result;
        hl_add_root(&g_pending_exception);
    }
}

// Called by hleos_update after the tick: hands the trapped exception back to
// the game, whose frames are the only ones left between here and its handler.
void rethrow_pending_exception()
{
    if (!g_pending_exception)
        return;
    vdynamic *exception = g_pending_exception;
    g_pending_exception = nullptr;
    hl_remove_root(&g_pending_exception);
    hl_rethrow(exception);
}

static vdynamic box_i32(int value)
{
    vdynamic box;
    std::memset(&box, 0, sizeof box);
    box.t = &hlt_i32;
    box.v.i = value;
    return box;
}

static vdynamic box_bytes(vbyte *value)
{
    vdynamic box;
    std::memset(&box, 0, sizeof box);
    box.t = &hlt_bytes;
    box.v.bytes = value;
    return box;
}

void deliver_i32(vclosure *closure, int value)
{
    if (!closure)
        return;
    vdynamic arg = box_i32(value);
    vdynamic *args[1] = {&arg};
    call_closure(closure, args, 1);
}

void deliver_bytes(vclosure *closure, vbyte *value)
{
    if (!closure)
        return;
    vdynamic arg = box_bytes(value);
    vdynamic *args[1] = {&arg};
    call_closure(closure, args, 1);
}

void deliver_bytes2(vclosure *closure, vbyte *first, vbyte *second)
{
    if (!closure)
        return;
    vdynamic a = box_bytes(first);
    vdynamic b = box_bytes(second);
    vdynamic *args[2] = {&a, &b};
    call_closure(closure, args, 2);
}

void deliver_array(vclosure *closure, varray *value)
{
    if (!closure)
        return;
    // An array is a dynamic value of its own: it stands in the vector unboxed.
    vdynamic *args[1] = {reinterpret_cast<vdynamic *>(value)};
    call_closure(closure, args, 1);
}

void deliver_login(vclosure *closure, int result, vbyte *account, vbyte *name, vbyte *token)
{
    if (!closure)
        return;
    vdynamic code = box_i32(result);
    vdynamic a = box_bytes(account);
    vdynamic n = box_bytes(name);
    vdynamic t = box_bytes(token);
    vdynamic *args[4] = {&code, &a, &n, &t};
    call_closure(closure, args, 4);
}

vbyte *to_vm_bytes(const char *text)
{
    if (!text)
        return nullptr;
    return hl_copy_bytes(reinterpret_cast<const vbyte *>(text), static_cast<int>(std::strlen(text) + 1));
}

void set_bytes_field(vdynobj *record, const char *name, vbyte *value)
{
    hl_dyn_setp(reinterpret_cast<vdynamic *>(record), hl_hash_utf8(name), &hlt_bytes, value);
}

void set_bool_field(vdynobj *record, const char *name, bool value)
{
    hl_dyn_seti(reinterpret_cast<vdynamic *>(record), hl_hash_utf8(name), &hlt_bool, value ? 1 : 0);
}

vbyte *get_bytes_field(vdynobj *record, const char *name)
{
    return static_cast<vbyte *>(hl_dyn_getp(reinterpret_cast<vdynamic *>(record), hl_hash_utf8(name), &hlt_bytes));
}

void copy_text(char *out, size_t size, const char *text)
{
    if (size == 0)
        return;
    size_t n = 0;
    if (text)
        while (n + 1 < size && text[n])
            ++n;
    std::memcpy(out, text ? text : "", n);
    out[n] = 0;
}
