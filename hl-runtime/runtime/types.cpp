// libhl's own type objects, type sizes, and the signature strings the VM
// derives from types.
#include "internal.h"

#include <cstdio>
#include <string>

extern "C" {

HL_EXPORT hl_type hlt_void = {HVOID, {nullptr}, nullptr, nullptr};
HL_EXPORT hl_type hlt_i32 = {HI32, {nullptr}, nullptr, nullptr};
HL_EXPORT hl_type hlt_i64 = {HI64, {nullptr}, nullptr, nullptr};
HL_EXPORT hl_type hlt_f32 = {HF32, {nullptr}, nullptr, nullptr};
HL_EXPORT hl_type hlt_f64 = {HF64, {nullptr}, nullptr, nullptr};
HL_EXPORT hl_type hlt_bool = {HBOOL, {nullptr}, nullptr, nullptr};
HL_EXPORT hl_type hlt_bytes = {HBYTES, {nullptr}, nullptr, nullptr};
HL_EXPORT hl_type hlt_dyn = {HDYN, {nullptr}, nullptr, nullptr};
HL_EXPORT hl_type hlt_array = {HARRAY, {nullptr}, nullptr, nullptr};
HL_EXPORT hl_type hlt_dynobj = {HDYNOBJ, {nullptr}, nullptr, nullptr};
HL_EXPORT hl_type hlt_abstract = {HABSTRACT, {USTR("<abstract>")}, nullptr, nullptr};

}  // extern "C"

namespace hlrt {

int type_size(const hl_type *t)
{
    switch (t->kind) {
    case HVOID:
        return 0;
    case HUI8:
    case HBOOL:
        return 1;
    case HUI16:
        return 2;
    case HI32:
    case HF32:
        return 4;
    case HI64:
    case HF64:
        return 8;
    default:
        return static_cast<int>(sizeof(void *));
    }
}

const char *kind_name(int kind)
{
    static const char *const names[] = {
        "void", "ui8", "ui16", "i32", "i64", "f32", "f64", "bool", "bytes", "dynamic", "function", "object",
        "array", "type", "ref", "virtual", "dynobj", "abstract", "enum", "null", "method", "struct", "packed", "guid",
    };
    if (kind < 0 || kind >= HLAST)
        return "<invalid kind>";
    return names[kind];
}

const char *kind_enum_name(int kind)
{
    static const char *const names[] = {
        "HVOID", "HUI8", "HUI16", "HI32", "HI64", "HF32", "HF64", "HBOOL", "HBYTES", "HDYN", "HFUN", "HOBJ",
        "HARRAY", "HTYPE", "HREF", "HVIRTUAL", "HDYNOBJ", "HABSTRACT", "HENUM", "HNULL", "HMETHOD", "HSTRUCT",
        "HPACKED", "HGUID",
    };
    if (kind < 0 || kind >= HLAST)
        return "<invalid kind>";
    return names[kind];
}

static void append_signature(std::string &out, const hl_type *t)
{
    static const char kTypeChars[] = "vcsilfdbBDPOATR??X?N?S?g";
    if (!t || t->kind < 0 || t->kind >= HLAST) {
        out += '#';
        return;
    }
    out += kTypeChars[t->kind];
    switch (t->kind) {
    case HFUN:
        for (int i = 0; i < t->fun->nargs; ++i)
            append_signature(out, t->fun->args[i]);
        out += '_';
        append_signature(out, t->fun->ret);
        break;
    case HOBJ: {
        // Fields of the super chain come first, root class first.
        const hl_type *chain[64];
        int depth = 0;
        for (const hl_type *c = t; c && depth < 64; c = c->obj->super)
            chain[depth++] = c;
        while (depth > 0) {
            const hl_type_obj *o = chain[--depth]->obj;
            for (int i = 0; i < o->nfields; ++i)
                append_signature(out, o->fields[i].t);
        }
        out += '_';
        break;
    }
    case HREF:
    case HNULL:
        append_signature(out, t->tparam);
        break;
    case HABSTRACT:
        for (const uchar *c = t->abs_name; c && *c; ++c)
            out += static_cast<char>(*c < 0x80 ? *c : '?');
        out += '_';
        break;
    default:
        break;
    }
}

std::string signature(const hl_type *t)
{
    std::string out;
    append_signature(out, t);
    return out;
}

std::string describe_value(const void *value)
{
    if (!value)
        return "null";
    if (is_block(value, BlockKind::Bytes))
        return "raw bytes (not a dynamic value)";
    if (is_block(value, BlockKind::Array))
        return "an array (HARRAY)";
    const hl_type *t = static_cast<const vdynamic *>(value)->t;
    if (!t)
        return "a value with a null type";
    char text[96];
    std::snprintf(text, sizeof text, "a value of kind %s (%s)", kind_name(t->kind), kind_enum_name(t->kind));
    return text;
}

}  // namespace hlrt
