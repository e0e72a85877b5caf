// The tracked heap: every VM value is a malloc'd block registered here, so a
// collection can really free what is unreachable and AddressSanitizer reports
// any later use of it.
#include "internal.h"

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>
#include <mutex>
#include <unordered_map>
#include <vector>

namespace hlrt {

namespace {

struct Block {
    size_t size;
    BlockKind kind;
    bool permanent;
    bool marked;
    Finalizer finalizer;
    void *context;
};

struct Heap {
    std::mutex lock;
    std::map<uintptr_t, Block> blocks;
    std::vector<void *> roots;
    std::unordered_map<const void *, int> holds;
};

// Never destroyed: values may be released by other statics' destructors at exit.
Heap &heap()
{
    static Heap *h = new Heap;
    return *h;
}

// The block containing address p (interior pointers included), or null.
std::pair<const uintptr_t, Block> *find_block(Heap &h, const void *p)
{
    uintptr_t a = reinterpret_cast<uintptr_t>(p);
    auto it = h.blocks.upper_bound(a);
    if (it == h.blocks.begin())
        return nullptr;
    --it;
    size_t extent = it->second.size ? it->second.size : 1;
    if (a - it->first >= extent)
        return nullptr;
    return &*it;
}

Block *find_start(Heap &h, const void *p)
{
    auto it = h.blocks.find(reinterpret_cast<uintptr_t>(p));
    return it == h.blocks.end() ? nullptr : &it->second;
}

void *allocate(BlockKind kind, size_t size, bool permanent)
{
    void *p = std::calloc(1, size ? size : 1);
    if (!p)
        fail("out of memory allocating %zu bytes", size);
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    h.blocks[reinterpret_cast<uintptr_t>(p)] = Block{size, kind, permanent, false, nullptr, nullptr};
    return p;
}

class Marker {
public:
    explicit Marker(Heap &h) : h_(h) {}

    void mark(const void *p)
    {
        if (!p)
            return;
        auto *entry = find_block(h_, p);
        if (!entry || entry->second.marked || entry->second.permanent)
            return;
        entry->second.marked = true;
        pending_.push_back(entry);
    }

    // A value in a call's argument vector: a VM value itself, or a box on the
    // caller's stack whose payload is a VM value.
    void mark_argument(const vdynamic *arg)
    {
        if (!arg)
            return;
        if (find_block(h_, arg)) {
            mark(arg);
            return;
        }
        if (arg->t && is_pointer_kind(arg->t->kind))
            mark(arg->v.ptr);
    }

    void drain()
    {
        while (!pending_.empty()) {
            auto *entry = pending_.back();
            pending_.pop_back();
            trace(reinterpret_cast<void *>(entry->first), entry->second);
        }
    }

private:
    void trace(void *p, const Block &b)
    {
        switch (b.kind) {
        case BlockKind::Bytes:
        case BlockKind::Type:
            break;
        case BlockKind::Array: {
            varray *a = static_cast<varray *>(p);
            if (a->at && is_pointer_kind(a->at->kind))
                for (int i = 0; i < a->size; ++i)
                    mark(hl_aptr(a, void *)[i]);
            break;
        }
        case BlockKind::DynObj: {
            vdynobj *o = static_cast<vdynobj *>(p);
            for (int i = 0; i < o->nvalues; ++i)
                mark(o->values[i]);
            break;
        }
        case BlockKind::Box: {
            vdynamic *d = static_cast<vdynamic *>(p);
            if (d->t && is_pointer_kind(d->t->kind))
                mark(d->v.ptr);
            break;
        }
        case BlockKind::Closure: {
            vclosure *c = static_cast<vclosure *>(p);
            if (c->hasValue)
                mark(c->value);
            break;
        }
        case BlockKind::Object: {
            // Every aligned word after the type pointer may be a field pointer.
            void **words = static_cast<void **>(p);
            for (size_t i = 1; i < b.size / sizeof(void *); ++i)
                mark(words[i]);
            break;
        }
        }
    }

    Heap &h_;
    std::vector<std::pair<const uintptr_t, Block> *> pending_;
};

struct Dead {
    void *p;
    Block block;
};

}  // namespace

void fail(const char *format, ...)
{
    std::fflush(stdout);
    std::fprintf(stderr, "hl runtime: ");
    va_list args;
    va_start(args, format);
    std::vfprintf(stderr, format, args);
    va_end(args);
    std::fprintf(stderr, "\n");
    std::fflush(stderr);
    std::abort();
}

void *alloc_block(BlockKind kind, size_t size) { return allocate(kind, size, false); }

void *alloc_permanent(BlockKind kind, size_t size) { return allocate(kind, size, true); }

void set_finalizer(void *block, Finalizer finalizer, void *context)
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    Block *b = find_start(h, block);
    if (!b)
        fail("set_finalizer: %p is not a live block", block);
    b->finalizer = finalizer;
    b->context = context;
}

size_t collect()
{
    Heap &h = heap();
    std::vector<Dead> dead;
    {
        std::lock_guard<std::mutex> guard(h.lock);
        Marker marker(h);
        for (void *slot : h.roots)
            marker.mark(*static_cast<void **>(slot));
        for (auto &held : h.holds)
            marker.mark(held.first);
        for_each_active_call(
            [](vclosure *c, vdynamic **args, int nargs, void *ctx) {
                Marker *m = static_cast<Marker *>(ctx);
                m->mark(c);
                if (c->hasValue)
                    m->mark(c->value);
                for (int i = 0; i < nargs; ++i)
                    m->mark_argument(args[i]);
            },
            &marker);
        marker.drain();

        for (auto it = h.blocks.begin(); it != h.blocks.end();) {
            Block &b = it->second;
            if (b.permanent || b.marked) {
                b.marked = false;
                ++it;
                continue;
            }
            dead.push_back(Dead{reinterpret_cast<void *>(it->first), b});
            it = h.blocks.erase(it);
        }
    }
    for (Dead &d : dead)
        if (d.block.finalizer)
            d.block.finalizer(d.p, d.block.context);
    for (Dead &d : dead) {
        if (d.block.kind == BlockKind::DynObj)
            dynobj_release(static_cast<vdynobj *>(d.p));
        std::memset(d.p, 0xDD, d.block.size);
        std::free(d.p);
    }
    return dead.size();
}

void hold(const void *value)
{
    if (!value)
        return;
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    ++h.holds[value];
}

void release(const void *value)
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    auto it = h.holds.find(value);
    if (it == h.holds.end())
        return;
    if (--it->second == 0)
        h.holds.erase(it);
}

void release_all()
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    h.holds.clear();
}

size_t held_count()
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    size_t n = 0;
    for (auto &held : h.holds)
        n += static_cast<size_t>(held.second);
    return n;
}

size_t live_value_count()
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    size_t n = 0;
    for (auto &b : h.blocks)
        n += b.second.permanent ? 0 : 1;
    return n;
}

size_t live_count(BlockKind kind)
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    size_t n = 0;
    for (auto &b : h.blocks)
        n += (!b.second.permanent && b.second.kind == kind) ? 1 : 0;
    return n;
}

bool is_live(const void *block)
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    return find_start(h, block) != nullptr;
}

bool is_block(const void *block, BlockKind kind)
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    Block *b = find_start(h, block);
    return b && b->kind == kind;
}

long block_size(const void *block)
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    Block *b = find_start(h, block);
    return b ? static_cast<long>(b->size) : -1;
}

size_t root_count()
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    return h.roots.size();
}

std::vector<void *> roots()
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    return h.roots;
}

}  // namespace hlrt

using namespace hlrt;

extern "C" {

HL_EXPORT void hl_add_root(void *ptr)
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    h.roots.push_back(ptr);
}

HL_EXPORT void hl_remove_root(void *ptr)
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    for (auto it = h.roots.rbegin(); it != h.roots.rend(); ++it) {
        if (*it == ptr) {
            h.roots.erase(std::next(it).base());
            return;
        }
    }
}

HL_EXPORT vbyte *hl_alloc_bytes(int size)
{
    if (size < 0)
        fail("hl_alloc_bytes: Invalid allocation size (%d)", size);
    if (size == 0)
        return nullptr;
    vbyte *b = static_cast<vbyte *>(alloc_block(BlockKind::Bytes, static_cast<size_t>(size)));
    // GC bytes are not zeroed: a pattern makes a missing terminator visible.
    std::memset(b, 0xAB, static_cast<size_t>(size));
    return b;
}

HL_EXPORT vbyte *hl_copy_bytes(const vbyte *byte, int size)
{
    if (size < 0)
        fail("hl_copy_bytes: Invalid allocation size (%d)", size);
    vbyte *b = hl_alloc_bytes(size);
    if (b)
        std::memcpy(b, byte, static_cast<size_t>(size));
    return b;
}

HL_EXPORT varray *hl_alloc_array(hl_type *t, int size)
{
    if (size < 0)
        fail("hl_alloc_array: Invalid array size (%d)", size);
    if (!t)
        fail("hl_alloc_array: null element type");
    size_t bytes = sizeof(varray) + static_cast<size_t>(size) * static_cast<size_t>(type_size(t));
    varray *a = static_cast<varray *>(alloc_block(BlockKind::Array, bytes));
    a->t = &hlt_array;
    a->at = t;
    a->size = size;
    return a;
}

HL_EXPORT vdynamic *hl_alloc_dynamic(hl_type *t)
{
    vdynamic *d = static_cast<vdynamic *>(alloc_block(BlockKind::Box, sizeof(vdynamic)));
    d->t = t;
    return d;
}

}  // extern "C"
