// The tracked heap: every VM value is a calloc'd block registered here, so a
// collection can really free what is unreachable and AddressSanitizer reports
// any later use of it.
#include "internal.h"

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <algorithm>
#include <array>
#include <mutex>
#include <unordered_map>
#include <vector>

namespace hlrt {

namespace {

// Every block is one calloc: this header, then the value. The header keeps the
// value 16-byte aligned.
struct Block {
    size_t size;
    BlockKind kind;
    bool permanent;
    bool marked;
    Finalizer finalizer;
    void *context;
};

constexpr size_t kHeader = (sizeof(Block) + 15) & ~size_t(15);

Block *header_of(const void *value)
{
    return reinterpret_cast<Block *>(const_cast<char *>(static_cast<const char *>(value)) - kHeader);
}

void *value_of(Block *b) { return reinterpret_cast<char *>(b) + kHeader; }

uintptr_t address_of(const Block *b) { return reinterpret_cast<uintptr_t>(b) + kHeader; }

// The set of live values' addresses: one bit per 16 bytes of address space,
// in 64 KiB pages found by page number. Values are 16-byte aligned and
// allocated close together, so adding, finding and removing one touch a word
// the previous allocation most likely touched. Arbitrary pointers are checked
// here before their header is read.
class AddressSet {
public:
    bool contains(uintptr_t a) const
    {
        if (a % 16 != 0)
            return false;
        auto it = pages_.find(a >> kPageBits);
        return it != pages_.end() && (it->second[word(a)] & bit(a)) != 0;
    }

    void insert(uintptr_t a) { page(a)[word(a)] |= bit(a); }

    void erase(uintptr_t a) { page(a)[word(a)] &= ~bit(a); }

private:
    static constexpr int kPageBits = 16;
    using Page = std::array<uint64_t, (size_t(1) << kPageBits) / 16 / 64>;

    static size_t word(uintptr_t a) { return (a & ((uintptr_t(1) << kPageBits) - 1)) / 16 / 64; }
    static uint64_t bit(uintptr_t a) { return uint64_t(1) << (a / 16 % 64); }

    Page &page(uintptr_t a)
    {
        uintptr_t number = a >> kPageBits;
        if (last_ && last_number_ == number)
            return *last_;
        Page &p = pages_[number];
        last_ = &p;
        last_number_ = number;
        return p;
    }

    std::unordered_map<uintptr_t, Page> pages_;  // never shrinks: one page per 64 KiB the heap used
    Page *last_ = nullptr;
    uintptr_t last_number_ = 0;
};

struct Heap {
    std::mutex lock;
    std::vector<Block *> blocks;  // every live block, in no particular order
    AddressSet values;            // their values' addresses
    std::vector<void *> roots;
    std::unordered_map<const void *, int> holds;
};

// Never destroyed: values may be released by other statics' destructors at exit.
Heap &heap()
{
    static Heap *h = new Heap;
    return *h;
}

Block *find_start(Heap &h, const void *p)
{
    return p && h.values.contains(reinterpret_cast<uintptr_t>(p)) ? header_of(p) : nullptr;
}

void *allocate(BlockKind kind, size_t size, bool permanent)
{
    Block *b = static_cast<Block *>(std::calloc(1, kHeader + (size ? size : 1)));
    if (!b)
        fail("out of memory allocating %zu bytes", size);
    *b = Block{size, kind, permanent, false, nullptr, nullptr};
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    h.blocks.push_back(b);
    h.values.insert(address_of(b));
    return value_of(b);
}

class Marker {
public:
    // Sorts the blocks by address once, to resolve interior pointers.
    explicit Marker(Heap &h) : by_address_(h.blocks)
    {
        std::sort(by_address_.begin(), by_address_.end());
    }

    void mark(const void *p)
    {
        if (!p)
            return;
        Block *b = find_block(p);
        if (!b || b->marked || b->permanent)
            return;
        b->marked = true;
        pending_.push_back(b);
    }

    // A value in a call's argument vector: a VM value itself, or a box on the
    // caller's stack whose payload is a VM value.
    void mark_argument(const vdynamic *arg)
    {
        if (!arg)
            return;
        if (find_block(arg)) {
            mark(arg);
            return;
        }
        if (arg->t && is_pointer_kind(arg->t->kind))
            mark(arg->v.ptr);
    }

    void drain()
    {
        while (!pending_.empty()) {
            Block *b = pending_.back();
            pending_.pop_back();
            trace(value_of(b), *b);
        }
    }

private:
    // The block whose value contains address p (interior pointers included), or null.
    Block *find_block(const void *p) const
    {
        uintptr_t a = reinterpret_cast<uintptr_t>(p);
        auto it = std::upper_bound(by_address_.begin(), by_address_.end(), a,
                                   [](uintptr_t x, const Block *b) { return x < address_of(b); });
        if (it == by_address_.begin())
            return nullptr;
        Block *b = *--it;
        size_t extent = b->size ? b->size : 1;
        return a >= address_of(b) && a - address_of(b) < extent ? b : nullptr;
    }

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

    std::vector<Block *> by_address_;
    std::vector<Block *> pending_;
};

struct Dead {
    void *p;
    Block *block;
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

        size_t kept = 0;
        for (Block *b : h.blocks) {
            if (b->permanent || b->marked) {
                b->marked = false;
                h.blocks[kept++] = b;
                continue;
            }
            h.values.erase(address_of(b));
            dead.push_back(Dead{value_of(b), b});
        }
        h.blocks.resize(kept);
    }
    for (Dead &d : dead)
        if (d.block->finalizer)
            d.block->finalizer(d.p, d.block->context);
    for (Dead &d : dead) {
        if (d.block->kind == BlockKind::DynObj)
            dynobj_release(static_cast<vdynobj *>(d.p));
        std::memset(d.block, 0xDD, kHeader + d.block->size);
        std::free(d.block);
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
    for (const Block *b : h.blocks)
        n += b->permanent ? 0 : 1;
    return n;
}

size_t live_count(BlockKind kind)
{
    Heap &h = heap();
    std::lock_guard<std::mutex> guard(h.lock);
    size_t n = 0;
    for (const Block *b : h.blocks)
        n += (!b->permanent && b->kind == kind) ? 1 : 0;
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
