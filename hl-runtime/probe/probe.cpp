// A minimal native library, built to check the host's loader and the hdll
// macros of hl.h the way a real extension uses them.
#define HL_NAME(n) probe_##n
#include <hl.h>

#include <cstring>

struct ProbeConfig {
    hl_type *t;
    vbyte *text[10];
    int first;
    int second;
    bool flag;
};

// Calls log(first, text[0], text[9], null) and returns flag.
HL_PRIM bool HL_NAME(init)(ProbeConfig *config, vclosure *log)
{
    if (log) {
        vdynamic code = {&hlt_i32, {}};
        code.v.i = config->first;
        vdynamic a = {&hlt_bytes, {}};
        a.v.bytes = config->text[0];
        vdynamic b = {&hlt_bytes, {}};
        b.v.bytes = config->text[9];
        vdynamic *args[4] = {&code, &a, &b, nullptr};
        bool is_exception = false;
        hl_dyn_call_safe(log, args, 4, &is_exception);
    }
    return config->flag;
}

HL_PRIM void HL_NAME(tick)() {}

// Calls back with a VM copy of text; an exception from the callback is
// handed back to the caller once the callback has returned.
HL_PRIM void HL_NAME(echo)(vbyte *text, vclosure *callback)
{
    vdynamic arg = {&hlt_bytes, {}};
    arg.v.bytes = text ? hl_copy_bytes(text, static_cast<int>(std::strlen(reinterpret_cast<char *>(text)) + 1)) : nullptr;
    vdynamic *args[1] = {&arg};
    bool is_exception = false;
    vdynamic *result = hl_dyn_call_safe(callback, args, 1, &is_exception);
    if (is_exception)
        hl_rethrow(result);
}

DEFINE_PRIM(_BOOL, init, _OBJ(_BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _I32 _I32 _BOOL)
                             _FUN(_VOID, _I32 _BYTES _BYTES _BYTES));
DEFINE_PRIM(_VOID, tick, _NO_ARG);
DEFINE_PRIM(_VOID, echo, _BYTES _FUN(_VOID, _BYTES));

// A descriptor that leaves the signature untouched, and one that disables the check.
HL_PRIM void *hlp_quiet(const char **sign)
{
    (void)sign;
    return reinterpret_cast<void *>(&probe_tick);
}

HL_PRIM void *hlp_unchecked(const char **sign)
{
    *sign = nullptr;
    return reinterpret_cast<void *>(&probe_tick);
}
