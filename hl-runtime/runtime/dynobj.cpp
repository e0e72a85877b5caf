// Anonymous objects (vdynobj) with the VM's layout: a lookup table sorted by
// field hash, non-pointer values packed in raw_data, pointer values in values.
#include "internal.h"

#include <cstdint>
#include <cstdlib>
#include <cstring>

namespace hlrt {

namespace {

int field_slot(const hl_field_lookup *l) { return l->field_index & HL_DYNOBJ_INDEX_MASK; }
int field_order(const hl_field_lookup *l) { return l->field_index >> HL_DYNOBJ_INDEX_SHIFT; }

hl_field_lookup *find_field(vdynobj *o, int hash)
{
    int lo = 0, hi = o->nfields;
    while (lo < hi) {
        int mid = (lo + hi) / 2;
        int h = o->lookup[mid].hashed_name;
        if (h == hash)
            return &o->lookup[mid];
        if (h < hash)
            lo = mid + 1;
        else
            hi = mid;
    }
    return nullptr;
}

// Storage for `used` bytes: arrays grow to powers of two (at least 64 bytes),
// so filling an object field by field reallocates a few times, not per field.
size_t capacity_for(size_t used)
{
    size_t c = 64;
    while (c < used)
        c *= 2;
    return c;
}

void *grow(void *p, size_t used_before, size_t used_after)
{
    if (p && capacity_for(used_before) >= used_after)
        return p;
    void *q = std::realloc(p, capacity_for(used_after));
    if (!q)
        fail("out of memory growing a dynamic object");
    return q;
}

hl_field_lookup *add_field(vdynobj *o, int hash, hl_type *t)
{
    int order = 0;
    for (int i = 0; i < o->nfields; ++i)
        if (field_order(&o->lookup[i]) >= order)
            order = field_order(&o->lookup[i]) + 1;

    int slot;
    if (is_pointer_kind(t->kind)) {
        slot = o->nvalues++;
        o->values = static_cast<void **>(grow(o->values, sizeof(void *) * static_cast<size_t>(slot),
                                              sizeof(void *) * static_cast<size_t>(o->nvalues)));
        o->values[slot] = nullptr;
    } else {
        int size = type_size(t);
        int align = size > 0 ? size : 1;
        slot = (o->raw_size + align - 1) / align * align;
        int end = slot + size;
        o->raw_data = static_cast<char *>(grow(o->raw_data, static_cast<size_t>(o->raw_size), static_cast<size_t>(end)));
        std::memset(o->raw_data + o->raw_size, 0, static_cast<size_t>(end - o->raw_size));
        o->raw_size = end;
    }

    o->lookup = static_cast<hl_field_lookup *>(grow(o->lookup, sizeof(hl_field_lookup) * static_cast<size_t>(o->nfields),
                                                    sizeof(hl_field_lookup) * static_cast<size_t>(o->nfields + 1)));
    int pos = 0;
    while (pos < o->nfields && o->lookup[pos].hashed_name < hash)
        ++pos;
    std::memmove(&o->lookup[pos + 1], &o->lookup[pos], sizeof(hl_field_lookup) * static_cast<size_t>(o->nfields - pos));
    o->lookup[pos].t = t;
    o->lookup[pos].hashed_name = hash;
    o->lookup[pos].field_index = (order << HL_DYNOBJ_INDEX_SHIFT) | slot;
    ++o->nfields;
    return &o->lookup[pos];
}

void remove_field(vdynobj *o, hl_field_lookup *l)
{
    // The old storage stays allocated but unused; a stale pointer slot is
    // cleared so that it keeps nothing alive.
    if (is_pointer_kind(l->t->kind))
        o->values[field_slot(l)] = nullptr;
    int pos = static_cast<int>(l - o->lookup);
    std::memmove(&o->lookup[pos], &o->lookup[pos + 1], sizeof(hl_field_lookup) * static_cast<size_t>(o->nfields - pos - 1));
    --o->nfields;
}

// The field to store a value of type t into: created when missing, retyped
// when its storage fits, recreated otherwise.
hl_field_lookup *field_for_write(vdynobj *o, int hash, hl_type *t)
{
    hl_field_lookup *l = find_field(o, hash);
    if (!l)
        return add_field(o, hash, t);
    if (l->t == t)
        return l;
    if (is_pointer_kind(l->t->kind) == is_pointer_kind(t->kind) && type_size(l->t) == type_size(t)) {
        l->t = t;
        return l;
    }
    remove_field(o, l);
    return add_field(o, hash, t);
}

vdynobj *as_dynobj(vdynamic *d, const char *function)
{
    if (!d)
        fail("%s: Invalid field access on null", function);
    if (!d->t || d->t->kind != HDYNOBJ)
        fail("%s: only anonymous objects (HDYNOBJ) are supported here, got %s", function, describe_value(d).c_str());
    return reinterpret_cast<vdynobj *>(d);
}

bool same_kind(const hl_type *a, const hl_type *b)
{
    if (a == b)
        return true;
    if (a->kind != b->kind)
        return false;
    // Basic kinds compare by kind; composite types must be the same object.
    switch (a->kind) {
    case HOBJ:
    case HFUN:
    case HVIRTUAL:
    case HENUM:
    case HREF:
    case HNULL:
    case HABSTRACT:
    case HSTRUCT:
        return false;
    default:
        return true;
    }
}

}  // namespace

void dynobj_release(vdynobj *o)
{
    std::free(o->lookup);
    std::free(o->raw_data);
    std::free(o->values);
}

}  // namespace hlrt

using namespace hlrt;

extern "C" {

HL_EXPORT int hl_hash_utf8(const char *str)
{
    uint32_t h = 0;
    for (const char *c = str; *c; ++c)
        h = 223u * h + static_cast<uint32_t>(static_cast<int>(*c));
    int32_t signed_h = static_cast<int32_t>(h);
    return signed_h % 0x1FFFFF7B;
}

HL_EXPORT vdynobj *hl_alloc_dynobj(void)
{
    vdynobj *o = static_cast<vdynobj *>(alloc_block(BlockKind::DynObj, sizeof(vdynobj)));
    o->t = &hlt_dynobj;
    return o;
}

HL_EXPORT void hl_dyn_setp(vdynamic *d, int hfield, hl_type *t, void *ptr)
{
    vdynobj *o = as_dynobj(d, "hl_dyn_setp");
    if (!t || !is_pointer_kind(t->kind))
        fail("hl_dyn_setp: the value type must be a pointer kind, got %s", t ? kind_name(t->kind) : "null");
    hl_field_lookup *l = field_for_write(o, hfield, t);
    o->values[field_slot(l)] = ptr;
}

HL_EXPORT void hl_dyn_seti(vdynamic *d, int hfield, hl_type *t, int value)
{
    vdynobj *o = as_dynobj(d, "hl_dyn_seti");
    if (!t || is_pointer_kind(t->kind) || t->kind == HVOID)
        fail("hl_dyn_seti: the value type must be a number or bool kind, got %s", t ? kind_name(t->kind) : "null");
    hl_field_lookup *l = field_for_write(o, hfield, t);
    char *at = o->raw_data + field_slot(l);
    switch (l->t->kind) {
    case HBOOL: *reinterpret_cast<bool *>(at) = value != 0; break;
    case HUI8: *reinterpret_cast<unsigned char *>(at) = static_cast<unsigned char>(value); break;
    case HUI16: *reinterpret_cast<unsigned short *>(at) = static_cast<unsigned short>(value); break;
    case HI32: std::memcpy(at, &value, sizeof value); break;
    case HI64: { int64 v = value; std::memcpy(at, &v, sizeof v); break; }
    case HF32: { float v = static_cast<float>(value); std::memcpy(at, &v, sizeof v); break; }
    case HF64: { double v = value; std::memcpy(at, &v, sizeof v); break; }
    default: fail("hl_dyn_seti: cannot store into a %s field", kind_name(l->t->kind));
    }
}

HL_EXPORT void *hl_dyn_getp(vdynamic *d, int hfield, hl_type *t)
{
    vdynobj *o = as_dynobj(d, "hl_dyn_getp");
    hl_field_lookup *l = find_field(o, hfield);
    if (!l)
        return nullptr;
    if (!t || !same_kind(l->t, t))
        fail("hl_dyn_getp: Can't cast %s to %s", kind_name(l->t->kind), t ? kind_name(t->kind) : "null");
    return o->values[field_slot(l)];
}

HL_EXPORT int hl_dyn_geti(vdynamic *d, int hfield, hl_type *t)
{
    vdynobj *o = as_dynobj(d, "hl_dyn_geti");
    hl_field_lookup *l = find_field(o, hfield);
    if (!l)
        return 0;
    if (!t || is_pointer_kind(t->kind) || is_pointer_kind(l->t->kind))
        fail("hl_dyn_geti: Can't cast %s to %s", kind_name(l->t->kind), t ? kind_name(t->kind) : "null");
    const char *at = o->raw_data + field_slot(l);
    switch (l->t->kind) {
    case HBOOL: return *reinterpret_cast<const bool *>(at) ? 1 : 0;
    case HUI8: return *reinterpret_cast<const unsigned char *>(at);
    case HUI16: return *reinterpret_cast<const unsigned short *>(at);
    case HI32: { int v; std::memcpy(&v, at, sizeof v); return v; }
    case HI64: { int64 v; std::memcpy(&v, at, sizeof v); return static_cast<int>(v); }
    case HF32: { float v; std::memcpy(&v, at, sizeof v); return static_cast<int>(v); }
    case HF64: { double v; std::memcpy(&v, at, sizeof v); return static_cast<int>(v); }
    default: fail("hl_dyn_geti: cannot read a %s field", kind_name(l->t->kind));
    }
}

}  // extern "C"
