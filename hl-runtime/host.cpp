// The host side of the runtime stand-in: loading and binding an hdll as the
// VM does, module types from signature strings, test closures, and value
// builders and readers.
#include "host.h"

#include <dlfcn.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>
#include <mutex>

namespace host {

namespace {

[[noreturn]] void usage_error(const std::string &message)
{
    std::fflush(stdout);
    std::fprintf(stderr, "hl host: %s\n", message.c_str());
    std::abort();
}

// ---------------------------------------------------------------------------
// Loader state.

// The VM's descriptor output variable is reused from one native to the next:
// a descriptor that does not write it is checked against the previous string.
const char kUnsetSignature[] = "<signature not set by the descriptor>";

struct Loader {
    void *handle = nullptr;
    std::string library;
    const char *last_sign = kUnsetSignature;
};

Loader &loader()
{
    static Loader l;
    return l;
}

using DescriptorFunction = void *(*)(const char **sign);

DescriptorFunction find_descriptor(const std::string &name)
{
    if (!loader().handle)
        usage_error("no hdll loaded (call host::load first)");
    return reinterpret_cast<DescriptorFunction>(dlsym(loader().handle, ("hlp_" + name).c_str()));
}

// ---------------------------------------------------------------------------
// Types.

int value_size(const hl_type *t)
{
    switch (t->kind) {
    case HVOID: return 0;
    case HUI8:
    case HBOOL: return 1;
    case HUI16: return 2;
    case HI32:
    case HF32: return 4;
    default: return static_cast<int>(sizeof(void *));
    }
}

template <typename T> T *permanent(size_t count = 1)
{
    return static_cast<T *>(hlrt::alloc_permanent(hlrt::BlockKind::Type, sizeof(T) * (count ? count : 1)));
}

const uchar *permanent_text(const std::string &ascii)
{
    uchar *text = permanent<uchar>(ascii.size() + 1);
    for (size_t i = 0; i < ascii.size(); ++i)
        text[i] = static_cast<uchar>(static_cast<unsigned char>(ascii[i]));
    return text;
}

hl_type *new_type(hl_type_kind kind)
{
    hl_type *t = permanent<hl_type>();
    t->kind = kind;
    return t;
}

hl_type *function_type(const std::vector<hl_type *> &args, hl_type *ret)
{
    hl_type *t = new_type(HFUN);
    hl_type_fun *f = permanent<hl_type_fun>();
    int n = static_cast<int>(args.size());
    f->args = permanent<hl_type *>(args.size());
    for (int i = 0; i < n; ++i)
        f->args[i] = args[static_cast<size_t>(i)];
    f->nargs = n;
    f->ret = ret;
    // The closure view: this function minus its first argument, used as the
    // type of a closure that carries that argument as its value.
    f->closure_type.kind = HFUN;
    f->closure_type.p = &f->closure;
    f->closure.args = n > 0 ? f->args + 1 : nullptr;
    f->closure.nargs = n > 0 ? n - 1 : 0;
    f->closure.ret = ret;
    f->closure.parent = t;
    t->fun = f;
    return t;
}

// Parses a signature into module types. Abstract names may contain '_', so
// where each one ends is settled first by a search over the whole string.
class SignatureParser {
public:
    explicit SignatureParser(const std::string &text) : s_(text) {}

    hl_type *parse_all()
    {
        if (!valid_type(0, [&](size_t end) { return end == s_.size(); }))
            usage_error("invalid type signature \"" + s_ + "\"");
        return parse();
    }

private:
    using Continuation = std::function<bool(size_t)>;

    bool valid_type(size_t p, const Continuation &k)
    {
        if (p >= s_.size())
            return false;
        switch (s_[p]) {
        case 'v': case 'c': case 's': case 'i': case 'l': case 'f': case 'd': case 'b': case 'B': case 'D':
        case 'A': case 'T': case 'S': case 'g': case '?':
            return k(p + 1);
        case 'R':
        case 'N':
            return valid_type(p + 1, k);
        case 'X':
            for (size_t e = s_.find('_', p + 1); e != std::string::npos; e = s_.find('_', e + 1)) {
                if (k(e + 1)) {
                    abstract_end_[p] = e;
                    return true;
                }
            }
            return false;
        case 'P':
            return valid_list(p + 1, [&](size_t q) { return valid_type(q, k); });
        case 'O':
            return valid_list(p + 1, k);
        default:
            return false;
        }
    }

    // Types up to a '_' (no type starts with one), then the continuation.
    bool valid_list(size_t p, const Continuation &k)
    {
        if (p < s_.size() && s_[p] == '_')
            return k(p + 1);
        return valid_type(p, [&](size_t q) { return valid_list(q, k); });
    }

    hl_type *parse()
    {
        size_t at = pos_;
        char c = s_[pos_++];
        switch (c) {
        case 'v': return new_type(HVOID);
        case 'c': return new_type(HUI8);
        case 's': return new_type(HUI16);
        case 'i': return new_type(HI32);
        case 'l': return new_type(HI64);
        case 'f': return new_type(HF32);
        case 'd': return new_type(HF64);
        case 'b': return new_type(HBOOL);
        case 'B': return new_type(HBYTES);
        case 'D': return new_type(HDYN);
        case 'A': return new_type(HARRAY);
        case 'T': return new_type(HTYPE);
        case 'S': return new_type(HSTRUCT);
        case 'g': return new_type(HGUID);
        case '?': return new_type(HDYNOBJ);
        case 'R':
        case 'N': {
            hl_type *t = new_type(c == 'R' ? HREF : HNULL);
            t->tparam = parse();
            return t;
        }
        case 'X': {
            size_t end = abstract_end_.at(at);
            hl_type *t = new_type(HABSTRACT);
            t->abs_name = permanent_text(s_.substr(pos_, end - pos_));
            pos_ = end + 1;
            return t;
        }
        case 'P': {
            std::vector<hl_type *> args = parse_list();
            hl_type *ret = parse();
            return function_type(args, ret);
        }
        default: {  // 'O'
            std::vector<hl_type *> fields = parse_list();
            hl_type *t = new_type(HOBJ);
            hl_type_obj *o = permanent<hl_type_obj>();
            o->nfields = static_cast<int>(fields.size());
            o->name = permanent_text("HostObject");
            o->fields = permanent<hl_obj_field>(fields.size());
            for (size_t i = 0; i < fields.size(); ++i) {
                std::string name = "f" + std::to_string(i);
                o->fields[i].name = permanent_text(name);
                o->fields[i].t = fields[i];
                o->fields[i].hashed_name = hl_hash_utf8(name.c_str());
            }
            t->obj = o;
            return t;
        }
        }
    }

    std::vector<hl_type *> parse_list()
    {
        std::vector<hl_type *> types;
        while (s_[pos_] != '_')
            types.push_back(parse());
        ++pos_;
        return types;
    }

    const std::string &s_;
    size_t pos_ = 0;
    std::map<size_t, size_t> abstract_end_;
};

struct TypeCache {
    std::mutex lock;
    std::map<std::string, hl_type *> by_signature;
    std::map<std::pair<std::string, const hl_type *>, hl_type *> with_value;
};

TypeCache &type_cache()
{
    static TypeCache *c = new TypeCache;
    return *c;
}

void require_object_type(const hl_type *t)
{
    if (!t || t->kind != HOBJ || !t->obj)
        usage_error("not an object type");
}

// ---------------------------------------------------------------------------
// Closures.

// The VM value of a test closure: the closure followed by its owner.
struct HostClosure {
    vclosure cl;
    ClosureRef *owner;
};

Arg decode(const hl_type *t, intptr_t raw)
{
    Arg arg;
    arg.kind = t->kind;
    switch (t->kind) {
    case HI32: arg.i = static_cast<int>(raw); break;
    case HUI8: arg.i = static_cast<unsigned char>(raw); break;
    case HUI16: arg.i = static_cast<unsigned short>(raw); break;
    case HBOOL: arg.b = (raw & 0xFF) != 0; break;
    case HBYTES:
        arg.ptr = reinterpret_cast<void *>(raw);
        arg.bytes = read_bytes(static_cast<const vbyte *>(arg.ptr));
        arg.bytes_size = arg.ptr ? hlrt::block_size(arg.ptr) : -1;
        break;
    default: arg.ptr = reinterpret_cast<void *>(raw); break;
    }
    return arg;
}

intptr_t dispatch(HostClosure *hc, const intptr_t *a, vdynamic **exception)
{
    ClosureRef keep = *hc->owner;
    const hl_type_fun *ft = hc->cl.t->fun;
    int first = hc->cl.hasValue ? 1 : 0;
    Call call;
    if (hc->cl.hasValue)
        call.value = reinterpret_cast<void *>(a[0]);
    for (int i = 0; i < ft->nargs; ++i)
        call.args.push_back(decode(ft->args[i], a[first + i]));
    keep->calls.push_back(call);
    // A copy: the callback may replace the behaviour while it runs.
    std::function<void(const Call &)> on_call = keep->behaviour.on_call;
    if (on_call)
        on_call(call);
    *exception = keep->behaviour.throws;
    return keep->behaviour.result;
}

intptr_t closure_entry(intptr_t a0, intptr_t a1, intptr_t a2, intptr_t a3, intptr_t a4, intptr_t a5, intptr_t a6,
                       intptr_t a7, intptr_t a8)
{
    vclosure *c = hlrt::current_closure();
    if (!c || c->fun != reinterpret_cast<void *>(&closure_entry))
        usage_error("a test closure was called directly, not through hl_dyn_call");
    const intptr_t a[9] = {a0, a1, a2, a3, a4, a5, a6, a7, a8};
    vdynamic *exception = nullptr;
    intptr_t result = dispatch(reinterpret_cast<HostClosure *>(c), a, &exception);
    // Only trivially destructible locals are left in this frame.
    if (exception)
        hlrt::throw_value(exception);
    return result;
}

void closure_finalizer(void *block, void *)
{
    HostClosure *hc = static_cast<HostClosure *>(block);
    (*hc->owner)->collected = true;
    delete hc->owner;
}

void guarded_entry(void *context) { (*static_cast<const std::function<void()> *>(context))(); }

const hl_field_lookup *find_field(const vdynobj *o, const std::string &name)
{
    if (!o)
        usage_error("field read on a null object");
    int hash = hl_hash_utf8(name.c_str());
    for (int i = 0; i < o->nfields; ++i)
        if (o->lookup[i].hashed_name == hash)
            return &o->lookup[i];
    return nullptr;
}

}  // namespace

// ---------------------------------------------------------------------------
// Loading and binding.

void fatal(const char *where, const std::string &message)
{
    std::printf("%s : FATAL ERROR : %s\n", where, message.c_str());
    std::fflush(stdout);
    std::exit(1);
}

void route_stdout_to_stderr()
{
    std::fflush(stdout);
    dup2(STDERR_FILENO, STDOUT_FILENO);
}

void load(const std::string &path, const std::string &library)
{
    void *handle = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!handle) {
        std::fprintf(stderr, "dlopen: %s\n", dlerror());
        fatal("src/module.c(417)", "Failed to load library " + library + ".hdll");
    }
    loader().handle = handle;
    loader().library = library;
    loader().last_sign = kUnsetSignature;
}

bool loaded() { return loader().handle != nullptr; }

Descriptor describe(const std::string &name)
{
    Descriptor d;
    DescriptorFunction descriptor = find_descriptor(name);
    if (!descriptor)
        return d;
    d.found = true;
    const char *sign = kUnsetSignature;
    d.function = descriptor(&sign);
    if (sign)
        d.signature = std::string(sign);
    return d;
}

void *bind(const std::string &name, const std::string &declared)
{
    Loader &l = loader();
    DescriptorFunction descriptor = find_descriptor(name);
    if (!descriptor)
        fatal("src/module.c(616)", "Failed to load function " + l.library + "@" + name);
    const char *sign = l.last_sign;
    void *function = descriptor(&sign);
    l.last_sign = sign;
    if (sign && std::strcmp(sign, declared.c_str()) != 0)
        fatal("src/module.c(623)", "Invalid signature for function " + l.library + "@" + name + " : " + declared +
                                       " required but " + sign + " found in hdll");
    return function;
}

void *symbol(const std::string &name)
{
    if (!loader().handle)
        usage_error("no hdll loaded (call host::load first)");
    return dlsym(loader().handle, name.c_str());
}

// ---------------------------------------------------------------------------
// Types.

hl_type *type_of(const std::string &signature)
{
    TypeCache &c = type_cache();
    std::lock_guard<std::mutex> guard(c.lock);
    auto it = c.by_signature.find(signature);
    if (it != c.by_signature.end())
        return it->second;
    hl_type *t = SignatureParser(signature).parse_all();
    c.by_signature[signature] = t;
    return t;
}

int field_offset(const hl_type *object_type, int index)
{
    require_object_type(object_type);
    const hl_type_obj *o = object_type->obj;
    if (index < 0 || index >= o->nfields)
        usage_error("field index out of range");
    int offset = static_cast<int>(sizeof(void *));
    for (int i = 0;; ++i) {
        int size = value_size(o->fields[i].t);
        int align = size > 0 ? size : 1;
        offset = (offset + align - 1) / align * align;
        if (i == index)
            return offset;
        offset += size;
    }
}

int object_size(const hl_type *object_type)
{
    require_object_type(object_type);
    const hl_type_obj *o = object_type->obj;
    int end = static_cast<int>(sizeof(void *));
    if (o->nfields > 0)
        end = field_offset(object_type, o->nfields - 1) + value_size(o->fields[o->nfields - 1].t);
    int align = static_cast<int>(sizeof(void *));
    return (end + align - 1) / align * align;
}

void *make_object(hl_type *object_type)
{
    void *o = hlrt::alloc_block(hlrt::BlockKind::Object, static_cast<size_t>(object_size(object_type)));
    *static_cast<hl_type **>(o) = object_type;
    return o;
}

// ---------------------------------------------------------------------------
// Closures.

ClosureRef make_closure(const std::string &signature, ClosureBehaviour behaviour)
{
    hl_type *ft = type_of(signature);
    if (ft->kind != HFUN)
        usage_error("make_closure needs a function signature, got \"" + signature + "\"");

    hl_type *closure_type = ft;
    if (behaviour.has_value) {
        // The full function takes the value first; the closure's type is its
        // closure view.
        const hl_type *value_type =
            behaviour.value && hlrt::is_live(behaviour.value) ? *static_cast<hl_type **>(behaviour.value) : nullptr;
        TypeCache &c = type_cache();
        std::lock_guard<std::mutex> guard(c.lock);
        hl_type *&full = c.with_value[{signature, value_type}];
        if (!full) {
            std::vector<hl_type *> args;
            args.push_back(value_type ? const_cast<hl_type *>(value_type) : SignatureParser("O_").parse_all());
            for (int i = 0; i < ft->fun->nargs; ++i)
                args.push_back(ft->fun->args[i]);
            full = function_type(args, ft->fun->ret);
        }
        closure_type = reinterpret_cast<hl_type *>(&full->fun->closure_type);
    }

    auto record = std::make_shared<Closure>();
    HostClosure *hc = static_cast<HostClosure *>(hlrt::alloc_block(hlrt::BlockKind::Closure, sizeof(HostClosure)));
    hc->cl.t = closure_type;
    hc->cl.fun = reinterpret_cast<void *>(&closure_entry);
    hc->cl.hasValue = behaviour.has_value ? 1 : 0;
    hc->cl.value = behaviour.has_value ? behaviour.value : nullptr;
    hc->owner = new ClosureRef(record);
    hlrt::set_finalizer(hc, &closure_finalizer, nullptr);
    record->vm = &hc->cl;
    record->behaviour = std::move(behaviour);
    return record;
}

// ---------------------------------------------------------------------------
// Values.

vbyte *bytes(const std::string &text)
{
    return hl_copy_bytes(reinterpret_cast<const vbyte *>(text.c_str()), static_cast<int>(text.size() + 1));
}

vbyte *bytes_or_null(const std::optional<std::string> &text) { return text ? bytes(*text) : nullptr; }

varray *bytes_array(const std::vector<std::optional<std::string>> &items)
{
    varray *a = hl_alloc_array(&hlt_bytes, static_cast<int>(items.size()));
    for (size_t i = 0; i < items.size(); ++i)
        hl_aptr(a, vbyte *)[i] = bytes_or_null(items[i]);
    return a;
}

varray *bytes_array(const std::vector<std::string> &items)
{
    return bytes_array(std::vector<std::optional<std::string>>(items.begin(), items.end()));
}

vdynamic *box_i32(int value)
{
    vdynamic *d = hl_alloc_dynamic(&hlt_i32);
    d->v.i = value;
    return d;
}

vdynamic *box_bytes(vbyte *value)
{
    vdynamic *d = hl_alloc_dynamic(&hlt_bytes);
    d->v.bytes = value;
    return d;
}

vdynamic *exception(const std::string &message) { return box_bytes(bytes(message)); }

std::optional<std::string> exception_message(const vdynamic *exception)
{
    if (!exception || !exception->t || exception->t->kind != HBYTES)
        return std::nullopt;
    return read_bytes(exception->v.bytes);
}

const char *const kInitConfigSignature = "OBBBBBBBBBBiib_";

void *init_config(const InitConfigValues &values)
{
    hl_type *t = type_of(kInitConfigSignature);
    char *o = static_cast<char *>(make_object(t));
    const std::optional<std::string> *texts[] = {
        &values.productName, &values.productVersion, &values.eosProductId, &values.spare,    &values.sandboxId,
        &values.deploymentId, &values.clientId,      &values.clientSecret, &values.loginId, &values.loginToken,
    };
    for (int i = 0; i < 10; ++i) {
        vbyte *b = bytes_or_null(*texts[i]);
        std::memcpy(o + field_offset(t, i), &b, sizeof b);
    }
    std::memcpy(o + field_offset(t, 10), &values.loginType, sizeof(int));
    std::memcpy(o + field_offset(t, 11), &values.externalType, sizeof(int));
    std::memcpy(o + field_offset(t, 12), &values.enableOverlay, sizeof(bool));
    return o;
}

// ---------------------------------------------------------------------------
// Readers.

std::optional<std::string> read_bytes(const vbyte *b)
{
    if (!b)
        return std::nullopt;
    const char *text = reinterpret_cast<const char *>(b);
    long size = hlrt::block_size(b);
    if (size < 0)
        return std::string(text);
    const void *nul = std::memchr(text, 0, static_cast<size_t>(size));
    if (!nul)
        usage_error("VM bytes of " + std::to_string(size) + " byte(s) without a terminating NUL");
    return std::string(text, static_cast<const char *>(nul));
}

long bytes_size(const vbyte *b) { return b && hlrt::is_block(b, hlrt::BlockKind::Bytes) ? hlrt::block_size(b) : -1; }

int array_size(const varray *a)
{
    if (!a)
        usage_error("array_size on a null array");
    return a->size;
}

std::vector<void *> array_slots(const varray *a)
{
    if (!a || !a->at || a->at->kind < HBYTES)
        usage_error("array_slots needs an array of a pointer kind");
    void *const *slots = hl_aptr(a, void *const);
    return std::vector<void *>(slots, slots + a->size);
}

std::vector<std::optional<std::string>> array_bytes(const varray *a)
{
    if (!a || !a->at || a->at->kind != HBYTES)
        usage_error("array_bytes needs an array of bytes");
    std::vector<std::optional<std::string>> out;
    for (int i = 0; i < a->size; ++i)
        out.push_back(read_bytes(hl_aptr(a, vbyte *const)[i]));
    return out;
}

bool has_field(const vdynobj *o, const std::string &name) { return find_field(o, name) != nullptr; }

std::optional<hl_type_kind> field_kind(const vdynobj *o, const std::string &name)
{
    const hl_field_lookup *l = find_field(o, name);
    if (!l)
        return std::nullopt;
    return l->t->kind;
}

std::optional<std::string> field_bytes(const vdynobj *o, const std::string &name)
{
    const hl_field_lookup *l = find_field(o, name);
    if (!l)
        return std::nullopt;
    if (l->t->kind != HBYTES)
        usage_error("field " + name + " is not bytes but " + hlrt::kind_name(l->t->kind));
    return read_bytes(static_cast<const vbyte *>(o->values[l->field_index & HL_DYNOBJ_INDEX_MASK]));
}

std::optional<bool> field_bool(const vdynobj *o, const std::string &name)
{
    const hl_field_lookup *l = find_field(o, name);
    if (!l)
        return std::nullopt;
    if (l->t->kind != HBOOL)
        usage_error("field " + name + " is not bool but " + hlrt::kind_name(l->t->kind));
    return o->raw_data[l->field_index & HL_DYNOBJ_INDEX_MASK] != 0;
}

std::optional<int> field_i32(const vdynobj *o, const std::string &name)
{
    const hl_field_lookup *l = find_field(o, name);
    if (!l)
        return std::nullopt;
    if (l->t->kind != HI32)
        usage_error("field " + name + " is not i32 but " + hlrt::kind_name(l->t->kind));
    int value;
    std::memcpy(&value, o->raw_data + (l->field_index & HL_DYNOBJ_INDEX_MASK), sizeof value);
    return value;
}

// ---------------------------------------------------------------------------
// Calls.

vdynamic *call_guarded(const std::function<void()> &fn)
{
    return hlrt::guarded_call(&guarded_entry, const_cast<std::function<void()> *>(&fn));
}

}  // namespace host
