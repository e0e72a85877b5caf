// HashLink runtime interface for native extensions: the part of the VM's
// header that native libraries use, with the VM's names, layouts and
// prototypes, so a library built against it also builds against a real
// HashLink installation.
#ifndef HL_H
#define HL_H

#include <stddef.h>
#include <stdint.h>
#ifndef __cplusplus
#include <stdbool.h>
#endif

#if defined(_64BITS) || defined(__x86_64__) || defined(_M_X64) || defined(__LP64__)
#define HL_64
#endif

#if defined(_WIN32)
#define HL_WIN
#endif

#if defined(_MSC_VER)
#define HL_VCC
#endif

#ifdef __cplusplus
#define HL_EXTERN_C extern "C"
#else
#define HL_EXTERN_C
#endif

// HL_API declares what libhl exports (functions and data).
#ifdef HL_WIN
#ifdef LIBHL_EXPORTS
#define HL_API extern __declspec(dllexport)
#else
#define HL_API extern __declspec(dllimport)
#endif
#define HL_EXPORT __declspec(dllexport)
#else
#define HL_API extern __attribute__((visibility("default")))
#define HL_EXPORT __attribute__((visibility("default")))
#endif

#ifdef HL_VCC
#define HL_NO_RETURN(f) __declspec(noreturn) f
#else
#define HL_NO_RETURN(f) f __attribute__((noreturn))
#endif

#ifdef HL_WIN
typedef wchar_t uchar;
#define USTR(str) L##str
#else
#ifndef __cplusplus
#include <uchar.h>
#endif
typedef char16_t uchar;
#define USTR(str) u##str
#endif

typedef unsigned char vbyte;
typedef int64_t int64;
typedef uint64_t uint64;

typedef enum {
    HVOID = 0,
    HUI8 = 1,
    HUI16 = 2,
    HI32 = 3,
    HI64 = 4,
    HF32 = 5,
    HF64 = 6,
    HBOOL = 7,
    HBYTES = 8,
    HDYN = 9,
    HFUN = 10,
    HOBJ = 11,
    HARRAY = 12,
    HTYPE = 13,
    HREF = 14,
    HVIRTUAL = 15,
    HDYNOBJ = 16,
    HABSTRACT = 17,
    HENUM = 18,
    HNULL = 19,
    HMETHOD = 20,
    HSTRUCT = 21,
    HPACKED = 22,
    HGUID = 23,
    // ---------
    HLAST = 24,
    _H_FORCE_INT = 0x7FFFFFFF
} hl_type_kind;

typedef struct hl_type hl_type;
typedef struct hl_runtime_obj hl_runtime_obj;
typedef struct hl_module_context hl_module_context;
typedef struct hl_type_enum hl_type_enum;
typedef struct hl_type_virtual hl_type_virtual;

typedef struct {
    hl_type **args;
    hl_type *ret;
    int nargs;
    // only set on a closure type: the full function type
    hl_type *parent;
    // fake hl_type head used as the type of a closure that carries a value
    struct {
        hl_type_kind kind;
        void *p;
    } closure_type;
    // the function type minus its first argument
    struct {
        hl_type **args;
        hl_type *ret;
        int nargs;
        hl_type *parent;
    } closure;
} hl_type_fun;

typedef struct {
    const uchar *name;
    hl_type *t;
    int hashed_name;
} hl_obj_field;

typedef struct {
    const uchar *name;
    int findex;
    int pindex;
    int hashed_name;
} hl_obj_proto;

typedef struct {
    int nfields;
    int nproto;
    int nbindings;
    const uchar *name;
    hl_type *super;
    hl_obj_field *fields;
    hl_obj_proto *proto;
    int *bindings;
    void **global_value;
    hl_module_context *m;
    hl_runtime_obj *rt;
} hl_type_obj;

struct hl_type {
    hl_type_kind kind;
    union {
        const uchar *abs_name;
        hl_type_fun *fun;
        hl_type_obj *obj;
        hl_type_enum *tenum;
        hl_type_virtual *virt;
        hl_type *tparam;
    };
    void **vobj_proto;
    unsigned int *mark_bits;
};

typedef struct {
    hl_type *t;
#ifndef HL_64
    int __pad;
#endif
    union {
        bool b;
        unsigned char ui8;
        unsigned short ui16;
        int i;
        float f;
        double d;
        vbyte *bytes;
        void *ptr;
        int64 i64;
    } v;
} vdynamic;

typedef struct {
    hl_type *t;
    uchar *bytes;
    int length;
} vstring;

typedef struct {
    hl_type *t;
    hl_type *at;
    int size;
    int __pad;
} varray;

typedef struct _vclosure {
    hl_type *t;
    void *fun;
    int hasValue;
#ifdef HL_64
    int stackCount;
#endif
    void *value;
} vclosure;

typedef struct {
    vclosure cl;
    vclosure *wrappedFun;
} vclosure_wrapper;

typedef struct {
    hl_type *t;
    int hashed_name;
    int field_index;
} hl_field_lookup;

typedef struct _vvirtual vvirtual;
struct _vvirtual {
    hl_type *t;
    vdynamic *value;
    vvirtual *next;
};

typedef struct {
    hl_type *t;
    hl_field_lookup *lookup;
    char *raw_data;
    void **values;
    int nfields;
    int raw_size;
    int nvalues;
    vvirtual *virtuals;
} vdynobj;

#define HL_DYNOBJ_INDEX_SHIFT 17
#define HL_DYNOBJ_INDEX_MASK ((1 << HL_DYNOBJ_INDEX_SHIFT) - 1)

#define hl_aptr(a, t) ((t *)(((varray *)(a)) + 1))

#ifdef __cplusplus
extern "C" {
#endif

HL_API hl_type hlt_void;
HL_API hl_type hlt_i32;
HL_API hl_type hlt_i64;
HL_API hl_type hlt_f32;
HL_API hl_type hlt_f64;
HL_API hl_type hlt_bool;
HL_API hl_type hlt_bytes;
HL_API hl_type hlt_dyn;
HL_API hl_type hlt_array;
HL_API hl_type hlt_dynobj;
HL_API hl_type hlt_abstract;

HL_API void hl_add_root(void *ptr);
HL_API void hl_remove_root(void *ptr);

HL_API vbyte *hl_alloc_bytes(int size);
HL_API vbyte *hl_copy_bytes(const vbyte *byte, int size);
HL_API varray *hl_alloc_array(hl_type *t, int size);
HL_API vdynobj *hl_alloc_dynobj(void);
HL_API vdynamic *hl_alloc_dynamic(hl_type *t);

HL_API int hl_hash_utf8(const char *str);

HL_API void hl_dyn_setp(vdynamic *d, int hfield, hl_type *t, void *ptr);
HL_API void hl_dyn_seti(vdynamic *d, int hfield, hl_type *t, int value);
HL_API void *hl_dyn_getp(vdynamic *d, int hfield, hl_type *t);
HL_API int hl_dyn_geti(vdynamic *d, int hfield, hl_type *t);

HL_API vdynamic *hl_dyn_call(vclosure *c, vdynamic **args, int nargs);
HL_API vdynamic *hl_dyn_call_safe(vclosure *c, vdynamic **args, int nargs, bool *isException);
HL_API HL_NO_RETURN(void hl_rethrow(vdynamic *v));

#ifdef __cplusplus
}
#endif

// ---------------------------------------------------------------------------
// Native extensions (hdll): define HL_NAME(n) before including this header.

#ifdef HL_NAME
#define HL_PRIM HL_EXTERN_C HL_EXPORT
#define DEFINE_PRIM_WITH_NAME(t, name, args, realName) \
    HL_PRIM void *hlp_##realName(const char **sign) \
    { \
        *sign = _FUN(t, args); \
        return (void *)(&HL_NAME(name)); \
    }
#define DEFINE_PRIM(t, name, args) DEFINE_PRIM_WITH_NAME(t, name, args, name)
#endif

#define _VOID "v"
#define _I8 "c"
#define _I16 "s"
#define _I32 "i"
#define _I64 "l"
#define _F32 "f"
#define _F64 "d"
#define _BOOL "b"
#define _BYTES "B"
#define _DYN "D"
#define _FUN(t, args) "P" args "_" t
#define _OBJ(fields) "O" fields "_"
#define _ARR "A"
#define _TYPE "T"
#define _REF(t) "R" t
#define _ABSTRACT(name) "X" #name "_"
#define _NULL(t) "N" t
#define _STRUCT "S"
#define _GUID "g"
#define _STRING _OBJ(_BYTES _I32)
#define _NO_ARG ""

#endif
