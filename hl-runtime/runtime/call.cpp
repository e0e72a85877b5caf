// Calling closures with an argument vector, and Haxe exceptions.
//
// hl_dyn_call here is stricter than the VM's: the vector must match the
// closure's declared type exactly (count and the kind of every entry), since
// a vector the VM would misread is a crash or garbage in a real game.
//
// Exceptions travel as in the VM: a throw longjmps to the innermost trap of
// the thread (hl_dyn_call_safe, or a host's trap around a primitive call).
#include "internal.h"

#include <csetjmp>
#include <cstdint>
#include <mutex>
#include <string>
#include <vector>

namespace hlrt {

namespace {

struct Trap {
    std::jmp_buf buf;
    Trap *prev;
    vdynamic *exception;
    // hl_dyn_call's trap: an exception reaching it would unwind native frames.
    bool barrier;
    vclosure *saved_closure;
    size_t saved_calls;
};

struct ActiveCall {
    vclosure *closure;
    vdynamic **args;
    int nargs;
};

thread_local Trap *t_trap = nullptr;
thread_local vclosure *t_closure = nullptr;
thread_local std::vector<ActiveCall> t_calls;

std::mutex g_rethrown_lock;
std::vector<vdynamic *> g_rethrown;

// The VM allows at most 9 arguments, the bound value included.
constexpr int kMaxArgs = 9;
using AnyFunction = intptr_t (*)(intptr_t, intptr_t, intptr_t, intptr_t, intptr_t, intptr_t, intptr_t, intptr_t,
                                 intptr_t);

vdynamic g_true = {&hlt_bool, {true}};
vdynamic g_false = {&hlt_bool, {false}};

void enter(Trap *trap, bool barrier)
{
    trap->prev = t_trap;
    trap->exception = nullptr;
    trap->barrier = barrier;
    trap->saved_closure = t_closure;
    trap->saved_calls = t_calls.size();
    t_trap = trap;
}

void leave(Trap *trap) { t_trap = trap->prev; }

// After a longjmp to trap: the frames in between are gone.
vdynamic *caught(Trap *trap)
{
    t_closure = trap->saved_closure;
    t_calls.resize(trap->saved_calls);
    return trap->exception;
}

// Every argument is passed in an integer register or stack slot (the stand-in
// supports no float parameters), so one call shape reaches any such function.
#if defined(__clang__)
__attribute__((no_sanitize("function")))
#endif
intptr_t invoke(void *fun, const intptr_t *a)
{
    AnyFunction f = reinterpret_cast<AnyFunction>(fun);
    return f(a[0], a[1], a[2], a[3], a[4], a[5], a[6], a[7], a[8]);
}

[[noreturn]] void mismatch(vclosure *c, int index, int nargs, const hl_type *param, const vdynamic *arg,
                           const char *expected)
{
    fail("hl_dyn_call: argument %d of %d for a closure of type %s: expects %s (%s), got %s", index + 1, nargs,
         signature(c->t).c_str(), expected, kind_enum_name(param->kind), describe_value(arg).c_str());
}

// The value the callee receives for one entry of the vector.
intptr_t convert(vclosure *c, int index, int nargs, const hl_type *param, vdynamic *arg)
{
    hl_type_kind kind = param->kind;
    bool raw_bytes = arg && is_block(arg, BlockKind::Bytes);
    bool array = arg && is_block(arg, BlockKind::Array);
    switch (kind) {
    case HI32:
    case HUI8:
    case HUI16:
    case HBOOL: {
        if (!arg || raw_bytes || array || !arg->t || arg->t->kind != kind)
            mismatch(c, index, nargs, param, arg, kind == HBOOL ? "a bool box" : "a number box of that kind");
        if (kind == HBOOL)
            return arg->v.b ? 1 : 0;
        if (kind == HUI8)
            return arg->v.ui8;
        if (kind == HUI16)
            return arg->v.ui16;
        return arg->v.i;
    }
    case HBYTES:
        if (!arg)
            return 0;
        if (raw_bytes || array || !arg->t || arg->t->kind != HBYTES)
            mismatch(c, index, nargs, param, arg, "a bytes box or null");
        return reinterpret_cast<intptr_t>(arg->v.bytes);
    case HARRAY:
        if (!arg || array)
            return reinterpret_cast<intptr_t>(arg);
        if (!raw_bytes && arg->t && arg->t->kind == HARRAY && is_block(arg->v.ptr, BlockKind::Array))
            fail("hl_dyn_call: argument %d of %d for a closure of type %s: expects the varray itself or null "
                 "(HARRAY), got a box holding an array: pass the array unboxed",
                 index + 1, nargs, signature(c->t).c_str());
        mismatch(c, index, nargs, param, arg, "the varray itself or null");
    case HOBJ:
    case HDYNOBJ:
    case HFUN:
    case HVIRTUAL:
    case HENUM:
        if (!arg)
            return 0;
        if (raw_bytes || array || !arg->t || arg->t->kind != kind)
            mismatch(c, index, nargs, param, arg, "the value itself or null");
        return reinterpret_cast<intptr_t>(arg);
    case HDYN:
        if (raw_bytes)
            mismatch(c, index, nargs, param, arg, "a dynamic value or null");
        return reinterpret_cast<intptr_t>(arg);
    case HNULL:
        if (!arg)
            return 0;
        if (raw_bytes || array || !arg->t || arg->t->kind != param->tparam->kind)
            mismatch(c, index, nargs, param, arg, "a box of the parameter type or null");
        return reinterpret_cast<intptr_t>(arg);
    case HABSTRACT:
    case HREF:
    case HTYPE:
        if (!arg)
            return 0;
        if (raw_bytes || array || !arg->t || arg->t->kind != kind)
            mismatch(c, index, nargs, param, arg, "a box of that type or null");
        return reinterpret_cast<intptr_t>(arg->v.ptr);
    default:
        fail("hl_dyn_call: parameter %d of %s has kind %s, which this runtime cannot pass", index + 1,
             signature(c->t).c_str(), kind_enum_name(kind));
    }
}

vdynamic *box_result(const hl_type *ret, intptr_t r)
{
    switch (ret->kind) {
    case HVOID:
        return nullptr;
    case HBOOL:
        return (r & 0xFF) ? &g_true : &g_false;
    case HUI8:
    case HUI16:
    case HI32:
    case HI64: {
        vdynamic *d = hl_alloc_dynamic(const_cast<hl_type *>(ret));
        if (ret->kind == HI64)
            d->v.i64 = r;
        else if (ret->kind == HI32)
            d->v.i = static_cast<int>(r);
        else if (ret->kind == HUI16)
            d->v.ui16 = static_cast<unsigned short>(r);
        else
            d->v.ui8 = static_cast<unsigned char>(r);
        return d;
    }
    case HBYTES:
    case HABSTRACT:
    case HREF:
    case HTYPE: {
        if (!r)
            return nullptr;
        vdynamic *d = hl_alloc_dynamic(const_cast<hl_type *>(ret));
        d->v.ptr = reinterpret_cast<void *>(r);
        return d;
    }
    case HF32:
    case HF64:
        fail("hl_dyn_call: float results are not supported by this runtime");
    default:
        return reinterpret_cast<vdynamic *>(r);
    }
}

vdynamic *call_checked(vclosure *c, vdynamic **args, int nargs)
{
    if (!c)
        fail("hl_dyn_call: null closure");
    if (!c->t || c->t->kind != HFUN || !c->t->fun)
        fail("hl_dyn_call: %p is not a closure (its type is not a function type)", static_cast<void *>(c));
    if (c->hasValue == 2)
        fail("hl_dyn_call: Can't call closure with value (a run-time wrapper, hasValue 2)");
    if (c->hasValue != 0 && c->hasValue != 1)
        fail("hl_dyn_call: invalid hasValue %d", c->hasValue);
    const hl_type_fun *ft = c->t->fun;
    if (c->hasValue == 1) {
        const hl_type *full = ft->parent;
        if (!full || full->kind != HFUN || full->fun->nargs != ft->nargs + 1)
            fail("hl_dyn_call: a closure with a value must have the closure type of a function taking the value first");
    }
    if (nargs != ft->nargs)
        fail("hl_dyn_call: a closure of type %s takes %d argument(s), called with %d", signature(c->t).c_str(),
             ft->nargs, nargs);
    int total = nargs + (c->hasValue ? 1 : 0);
    if (total > kMaxArgs)
        fail("hl_dyn_call: Too many arguments (%d)", total);
    if (nargs > 0 && !args)
        fail("hl_dyn_call: null argument vector");

    intptr_t a[kMaxArgs] = {};
    int k = 0;
    if (c->hasValue)
        a[k++] = reinterpret_cast<intptr_t>(c->value);
    for (int i = 0; i < nargs; ++i)
        a[k++] = convert(c, i, nargs, ft->args[i], args[i]);

    vclosure *previous = t_closure;
    t_calls.push_back(ActiveCall{c, args, nargs});
    t_closure = c;
    intptr_t r = invoke(c->fun, a);
    t_closure = previous;
    t_calls.pop_back();
    return box_result(ft->ret, r);
}

}  // namespace

void for_each_active_call(void (*visit)(vclosure *c, vdynamic **args, int nargs, void *ctx), void *ctx)
{
    for (const ActiveCall &call : t_calls)
        visit(call.closure, call.args, call.nargs, ctx);
}

vclosure *current_closure() { return t_closure; }

int call_depth() { return static_cast<int>(t_calls.size()); }

void throw_value(vdynamic *exception)
{
    Trap *trap = t_trap;
    if (!trap)
        fail("uncaught Haxe exception through native frames: no trap on this thread (exception %p)",
             static_cast<void *>(exception));
    if (trap->barrier)
        fail("uncaught Haxe exception through native frames: a closure called with hl_dyn_call threw "
             "(exception %p); call game closures with hl_dyn_call_safe",
             static_cast<void *>(exception));
    t_trap = trap->prev;
    trap->exception = exception;
    std::longjmp(trap->buf, 1);
}

vdynamic *guarded_call(void (*fn)(void *), void *context)
{
    Trap trap;
    enter(&trap, false);
    if (setjmp(trap.buf) == 0) {
        fn(context);
        leave(&trap);
        return nullptr;
    }
    return caught(&trap);
}

std::vector<vdynamic *> rethrown()
{
    std::lock_guard<std::mutex> guard(g_rethrown_lock);
    return g_rethrown;
}

void clear_rethrown()
{
    std::lock_guard<std::mutex> guard(g_rethrown_lock);
    g_rethrown.clear();
}

}  // namespace hlrt

using namespace hlrt;

extern "C" {

HL_EXPORT vdynamic *hl_dyn_call(vclosure *c, vdynamic **args, int nargs)
{
    Trap trap;
    enter(&trap, true);
    if (setjmp(trap.buf) == 0) {
        vdynamic *result = call_checked(c, args, nargs);
        leave(&trap);
        return result;
    }
    // Unreachable: throw_value aborts at a barrier.
    fail("hl_dyn_call: exception reached the call's barrier");
}

HL_EXPORT vdynamic *hl_dyn_call_safe(vclosure *c, vdynamic **args, int nargs, bool *isException)
{
    if (!isException)
        fail("hl_dyn_call_safe: null isException");
    Trap trap;
    enter(&trap, false);
    if (setjmp(trap.buf) == 0) {
        vdynamic *result = call_checked(c, args, nargs);
        leave(&trap);
        *isException = false;
        return result;
    }
    *isException = true;
    return caught(&trap);
}

HL_EXPORT void hl_rethrow(vdynamic *v)
{
    {
        std::lock_guard<std::mutex> guard(g_rethrown_lock);
        g_rethrown.push_back(v);
    }
    if (!t_trap)
        fail("hl_rethrow: no trap around the current primitive call (exception %p)", static_cast<void *>(v));
    throw_value(v);
}

}  // extern "C"
