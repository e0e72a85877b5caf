// The HashLink runtime stand-in and its host: layouts, the tracked heap and
// its collector, strict closure calls, exceptions, the console, and binding
// an hdll the way the VM does.
#include <hl.h>
#include <hl_runtime_control.h>
#include <host.h>

#include <gtest/gtest.h>

#include <cstddef>
#include <cstring>
#include <string>
#include <vector>

extern "C" {
HL_API void hl_sys_print(vbyte *msg);
}

using hlrt::BlockKind;

// ---------------------------------------------------------------------------
// Layouts (x86-64).

static_assert(sizeof(uchar) == 2, "uchar");
static_assert(sizeof(hl_type_kind) == 4 && HGUID == 23 && HLAST == 24 && HDYNOBJ == 16 && HABSTRACT == 17, "kinds");

static_assert(sizeof(hl_type) == 32, "hl_type");
static_assert(offsetof(hl_type, kind) == 0 && offsetof(hl_type, fun) == 8 && offsetof(hl_type, abs_name) == 8, "hl_type");
static_assert(offsetof(hl_type, vobj_proto) == 16 && offsetof(hl_type, mark_bits) == 24, "hl_type");

static_assert(sizeof(hl_type_fun) == 80, "hl_type_fun");
static_assert(offsetof(hl_type_fun, args) == 0 && offsetof(hl_type_fun, ret) == 8, "hl_type_fun");
static_assert(offsetof(hl_type_fun, nargs) == 16 && offsetof(hl_type_fun, parent) == 24, "hl_type_fun");
static_assert(offsetof(hl_type_fun, closure_type.kind) == 32 && offsetof(hl_type_fun, closure_type.p) == 40, "hl_type_fun");
static_assert(offsetof(hl_type_fun, closure.args) == 48 && offsetof(hl_type_fun, closure.ret) == 56, "hl_type_fun");
static_assert(offsetof(hl_type_fun, closure.nargs) == 64 && offsetof(hl_type_fun, closure.parent) == 72, "hl_type_fun");

static_assert(sizeof(hl_type_obj) == 80, "hl_type_obj");
static_assert(offsetof(hl_type_obj, nfields) == 0 && offsetof(hl_type_obj, nproto) == 4, "hl_type_obj");
static_assert(offsetof(hl_type_obj, nbindings) == 8 && offsetof(hl_type_obj, name) == 16, "hl_type_obj");
static_assert(offsetof(hl_type_obj, super) == 24 && offsetof(hl_type_obj, fields) == 32, "hl_type_obj");
static_assert(offsetof(hl_type_obj, proto) == 40 && offsetof(hl_type_obj, bindings) == 48, "hl_type_obj");
static_assert(offsetof(hl_type_obj, global_value) == 56 && offsetof(hl_type_obj, m) == 64, "hl_type_obj");
static_assert(offsetof(hl_type_obj, rt) == 72, "hl_type_obj");
static_assert(sizeof(hl_obj_field) == 24 && offsetof(hl_obj_field, t) == 8 && offsetof(hl_obj_field, hashed_name) == 16,
              "hl_obj_field");

static_assert(sizeof(vdynamic) == 16 && offsetof(vdynamic, v) == 8, "vdynamic");
static_assert(sizeof(varray) == 24 && offsetof(varray, at) == 8 && offsetof(varray, size) == 16, "varray");
static_assert(offsetof(varray, __pad) == 20, "varray");
static_assert(sizeof(vclosure) == 32 && offsetof(vclosure, fun) == 8 && offsetof(vclosure, hasValue) == 16, "vclosure");
static_assert(offsetof(vclosure, stackCount) == 20 && offsetof(vclosure, value) == 24, "vclosure");
static_assert(sizeof(vclosure_wrapper) == 40 && offsetof(vclosure_wrapper, wrappedFun) == 32, "vclosure_wrapper");
static_assert(sizeof(vdynobj) == 56, "vdynobj");
static_assert(offsetof(vdynobj, lookup) == 8 && offsetof(vdynobj, raw_data) == 16 && offsetof(vdynobj, values) == 24,
              "vdynobj");
static_assert(offsetof(vdynobj, nfields) == 32 && offsetof(vdynobj, raw_size) == 36, "vdynobj");
static_assert(offsetof(vdynobj, nvalues) == 40 && offsetof(vdynobj, virtuals) == 48, "vdynobj");
static_assert(sizeof(hl_field_lookup) == 16 && offsetof(hl_field_lookup, hashed_name) == 8 &&
                  offsetof(hl_field_lookup, field_index) == 12,
              "hl_field_lookup");
static_assert(sizeof(vstring) == 24 && offsetof(vstring, bytes) == 8 && offsetof(vstring, length) == 16, "vstring");
static_assert(sizeof(vvirtual) == 24 && offsetof(vvirtual, value) == 8 && offsetof(vvirtual, next) == 16, "vvirtual");

TEST(HlTypes, SignatureMacrosAndModuleTypesSpellTheVmStrings)
{
    EXPECT_STREQ(_FUN(_BOOL, _OBJ(_BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _BYTES _I32 _I32 _BOOL)
                                 _FUN(_VOID, _I32 _BYTES _BYTES _BYTES)),
                 "POBBBBBBBBBBiib_PiBBB_v_b");
    EXPECT_STREQ(_FUN(_VOID, _NO_ARG), "P_v");
    EXPECT_STREQ(_FUN(_VOID, _ARR _FUN(_VOID, _ARR)), "PAPA_v_v");
    EXPECT_STREQ(_FUN(_VOID, _NULL(_I32) _REF(_I32) _ABSTRACT(probe_handle) _DYN), "PNiRiXprobe_handle_D_v");
    EXPECT_STREQ(_STRING, "OBi_");

    for (const char *s : {"POBBBBBBBBBBiib_PiBBB_v_b", "PAPA_v_v", "PNiRiXprobe_handle_D_v", "Pii_i", "OBi_", "P_v"})
        EXPECT_EQ(hlrt::signature(host::type_of(s)), s);

    // Module types are the module's own objects, not libhl's globals.
    hl_type *f = host::type_of("PiB_v");
    ASSERT_EQ(f->kind, HFUN);
    ASSERT_EQ(f->fun->nargs, 2);
    EXPECT_EQ(f->fun->args[0]->kind, HI32);
    EXPECT_EQ(f->fun->args[1]->kind, HBYTES);
    EXPECT_NE(f->fun->args[1], &hlt_bytes);
    EXPECT_EQ(f->fun->ret->kind, HVOID);
    EXPECT_EQ(hlt_abstract.kind, HABSTRACT);

    hl_type *config = host::type_of(host::kInitConfigSignature);
    EXPECT_EQ(host::field_offset(config, 0), 8);
    EXPECT_EQ(host::field_offset(config, 9), 80);
    EXPECT_EQ(host::field_offset(config, 10), 88);
    EXPECT_EQ(host::field_offset(config, 11), 92);
    EXPECT_EQ(host::field_offset(config, 12), 96);
    EXPECT_EQ(host::object_size(config), 104);
}

TEST(HlHash, MatchesTheVmIncludingSignAndWrapAround)
{
    EXPECT_EQ(hl_hash_utf8("value"), 297304054);
    EXPECT_EQ(hl_hash_utf8("productUserId"), -32396794);
    EXPECT_EQ(hl_hash_utf8("displayName"), 284299826);
    EXPECT_EQ(hl_hash_utf8("lobbyId"), -82642942);
    EXPECT_EQ(hl_hash_utf8(""), 0);
    EXPECT_EQ(hl_hash_utf8("\xC3\xA9"), -13690);  // bytes >= 0x80 count as negative chars
}

// ---------------------------------------------------------------------------
// Values.

TEST(HlValues, BytesAndArraysFollowTheAllocationRules)
{
    EXPECT_EQ(hl_copy_bytes(reinterpret_cast<const vbyte *>("x"), 0), nullptr);
    vbyte *copy = host::bytes(std::string(32, 'a'));
    EXPECT_EQ(host::bytes_size(copy), 33);
    EXPECT_EQ(host::read_bytes(copy), std::string(32, 'a'));

    varray *a = hl_alloc_array(&hlt_bytes, 3);
    EXPECT_EQ(a->t, &hlt_array);
    EXPECT_EQ(a->at, &hlt_bytes);
    EXPECT_EQ(a->size, 3);
    EXPECT_EQ(reinterpret_cast<char *>(hl_aptr(a, vbyte *)) - reinterpret_cast<char *>(a), 24);
    EXPECT_EQ(hlrt::block_size(a), 24 + 3 * 8);
    for (void *slot : host::array_slots(a))
        EXPECT_EQ(slot, nullptr);
    EXPECT_EQ(hlrt::block_size(hl_alloc_array(&hlt_bool, 5)), 24 + 5);

    varray *names = host::bytes_array(std::vector<std::optional<std::string>>{"one", std::nullopt});
    EXPECT_EQ(host::array_bytes(names), (std::vector<std::optional<std::string>>{"one", std::nullopt}));

    EXPECT_DEATH(hl_copy_bytes(copy, -1), "Invalid allocation size");
    EXPECT_DEATH(hl_alloc_array(&hlt_bytes, -2), "Invalid array size");
}

TEST(HlValues, DynamicObjectsKeepTheVmLayout)
{
    vdynobj *o = hl_alloc_dynobj();
    vdynamic *d = reinterpret_cast<vdynamic *>(o);
    EXPECT_EQ(o->t, &hlt_dynobj);
    EXPECT_EQ(o->nfields, 0);
    EXPECT_EQ(hl_dyn_getp(d, hl_hash_utf8("missing"), &hlt_bytes), nullptr);
    EXPECT_EQ(hl_dyn_geti(d, hl_hash_utf8("missing"), &hlt_bool), 0);

    vbyte *id = host::bytes("abc");
    hl_dyn_setp(d, hl_hash_utf8("productUserId"), &hlt_bytes, id);
    hl_dyn_seti(d, hl_hash_utf8("online"), &hlt_bool, 5);
    hl_dyn_setp(d, hl_hash_utf8("value"), &hlt_bytes, nullptr);

    EXPECT_EQ(hl_dyn_getp(d, hl_hash_utf8("productUserId"), &hlt_bytes), id);
    EXPECT_EQ(hl_dyn_geti(d, hl_hash_utf8("online"), &hlt_bool), 1);
    EXPECT_EQ(host::field_bool(o, "online"), true);
    EXPECT_TRUE(host::has_field(o, "value"));
    EXPECT_EQ(host::field_bytes(o, "value"), std::nullopt);
    EXPECT_EQ(host::field_bytes(o, "productUserId"), "abc");

    // Lookup sorted by hash; pointer fields in values, the bool in raw_data;
    // field_index = declaration order << 17 | slot.
    ASSERT_EQ(o->nfields, 3);
    EXPECT_EQ(o->nvalues, 2);
    EXPECT_EQ(o->raw_size, 1);
    EXPECT_LT(o->lookup[0].hashed_name, o->lookup[1].hashed_name);
    EXPECT_LT(o->lookup[1].hashed_name, o->lookup[2].hashed_name);
    for (int i = 0; i < o->nfields; ++i) {
        const hl_field_lookup &l = o->lookup[i];
        if (l.hashed_name == hl_hash_utf8("online")) {
            EXPECT_EQ(l.field_index, (1 << HL_DYNOBJ_INDEX_SHIFT) | 0);
            EXPECT_EQ(o->raw_data[0], 1);
        }
        if (l.hashed_name == hl_hash_utf8("value"))
            EXPECT_EQ(l.field_index, (2 << HL_DYNOBJ_INDEX_SHIFT) | 1);
    }

    // A field written with another type of the same storage is retyped in place.
    hl_dyn_setp(d, hl_hash_utf8("value"), &hlt_dynobj, o);
    EXPECT_EQ(o->nvalues, 2);
    EXPECT_EQ(host::field_kind(o, "value"), HDYNOBJ);
    EXPECT_DEATH(hl_dyn_getp(d, hl_hash_utf8("value"), &hlt_bytes), "Can't cast dynobj to bytes");

    // One that needs other storage is recreated: the bool becomes a pointer
    // field, and the retyped field no longer holds the object.
    hl_dyn_setp(d, hl_hash_utf8("online"), &hlt_bytes, id);
    hl_dyn_seti(d, hl_hash_utf8("value"), &hlt_i32, 9);
    EXPECT_EQ(host::field_bytes(o, "online"), "abc");
    EXPECT_EQ(host::field_i32(o, "value"), 9);
    EXPECT_EQ(o->nfields, 3);
    for (int i = 0; i < o->nvalues; ++i)
        EXPECT_NE(o->values[i], static_cast<void *>(o));
    EXPECT_DEATH(hl_dyn_getp(nullptr, 1, &hlt_bytes), "Invalid field access");
}

// An object filled with many fields grows its storage in steps: every field
// keeps its value across the moves, also after retyping recreates some.
TEST(HlValues, DynamicObjectsKeepEveryFieldAsTheyGrow)
{
    vdynobj *o = hl_alloc_dynobj();
    vdynamic *d = reinterpret_cast<vdynamic *>(o);
    host::Held keep(o);
    auto name = [](int i) { return hl_hash_utf8(("field" + std::to_string(i)).c_str()); };
    std::vector<vbyte *> texts;
    for (int i = 0; i < 60; ++i) {
        texts.push_back(host::bytes("text " + std::to_string(i)));
        if (i % 2)
            hl_dyn_seti(d, name(i), &hlt_i32, i * 1000);
        else
            hl_dyn_setp(d, name(i), &hlt_bytes, texts.back());
    }
    // Every fifth field changes storage: ints become pointers and back.
    for (int i = 0; i < 60; i += 5) {
        if (i % 2)
            hl_dyn_setp(d, name(i), &hlt_bytes, texts[static_cast<size_t>(i)]);
        else
            hl_dyn_seti(d, name(i), &hlt_i32, -i);
    }
    hlrt::collect();
    ASSERT_EQ(o->nfields, 60);
    for (int i = 0; i < 60; ++i) {
        bool is_int = (i % 2 == 1) != (i % 5 == 0);
        if (is_int)
            EXPECT_EQ(hl_dyn_geti(d, name(i), &hlt_i32), i % 5 == 0 ? -i : i * 1000) << i;
        else
            EXPECT_EQ(hl_dyn_getp(d, name(i), &hlt_bytes), texts[static_cast<size_t>(i)]) << i;
    }
}

// ---------------------------------------------------------------------------
// Heap and collector.

// The heap tells its values from any other address however many there are:
// tens of thousands of values over many pages, half of them collected.
TEST(HlHeap, EveryLiveValueIsKnownAndNothingElse)
{
    std::vector<vbyte *> values;
    for (int i = 0; i < 30000; ++i)
        values.push_back(hl_alloc_bytes(1 + (i * 37) % 300));
    for (size_t i = 0; i < values.size(); i += 2)
        hlrt::hold(values[i]);
    hlrt::collect();
    for (size_t i = 0; i < values.size(); ++i) {
        ASSERT_EQ(hlrt::is_live(values[i]), i % 2 == 0) << i;
        if (i % 2 == 0) {
            EXPECT_EQ(hlrt::block_size(values[i]), 1 + (static_cast<long>(i) * 37) % 300);
            EXPECT_FALSE(hlrt::is_live(values[i] + 1));
            EXPECT_FALSE(hlrt::is_live(values[i] - 16));
        }
    }
    EXPECT_EQ(hlrt::live_count(hlrt::BlockKind::Bytes), values.size() / 2);
    hlrt::release_all();
    hlrt::collect();
    for (vbyte *v : values)
        ASSERT_FALSE(hlrt::is_live(v));
    EXPECT_EQ(hlrt::live_value_count(), 0u);
}

TEST(HlHeap, CollectorFreesUnreachableAndKeepsRootedHeldAndTraced)
{
    hlrt::collect();
    size_t base = hlrt::live_value_count();

    vbyte *loose = host::bytes("loose");
    vbyte *held = host::bytes("held");
    hlrt::hold(held);

    // A rooted array keeps its bytes; a dynobj in it keeps its pointer fields.
    varray *list = hl_alloc_array(&hlt_dynobj, 1);
    vdynobj *record = hl_alloc_dynobj();
    vbyte *name = host::bytes("name");
    hl_dyn_setp(reinterpret_cast<vdynamic *>(record), hl_hash_utf8("displayName"), &hlt_bytes, name);
    hl_aptr(list, vdynobj *)[0] = record;
    varray *slot = list;
    hl_add_root(&slot);

    // A box's payload, a closure's bound value and a config object's strings.
    vdynamic *box = host::box_bytes(host::bytes("boxed"));
    vbyte *boxed = box->v.bytes;
    vdynobj *bound = hl_alloc_dynobj();
    host::ClosureBehaviour with_value;
    with_value.has_value = true;
    with_value.value = bound;
    host::ClosureRef closure = host::make_closure("PB_v", with_value);
    host::InitConfigValues values;
    values.productName = "game";
    void *config = host::init_config(values);
    vbyte *product = *reinterpret_cast<vbyte **>(static_cast<char *>(config) + 8);
    hlrt::hold(box);
    hlrt::hold(closure->vm);
    hlrt::hold(config);

    // Numbers in a non-pointer array are never taken for pointers.
    varray *numbers = hl_alloc_array(&hlt_i64, 1);
    vbyte *by_number = host::bytes("number");
    hl_aptr(numbers, int64)[0] = reinterpret_cast<int64>(by_number);
    hlrt::hold(numbers);

    EXPECT_EQ(hlrt::collect(), 2u);  // loose and by_number
    EXPECT_FALSE(hlrt::is_live(loose));
    EXPECT_FALSE(hlrt::is_live(by_number));
    for (const void *p : {(const void *)held, (const void *)list, (const void *)record, (const void *)name,
                          (const void *)box, (const void *)boxed, (const void *)bound, (const void *)closure->vm,
                          (const void *)config, (const void *)product})
        EXPECT_TRUE(hlrt::is_live(p));

    hl_remove_root(&slot);
    hlrt::release(held);
    hlrt::release(box);
    hlrt::release(closure->vm);
    hlrt::release(config);
    hlrt::release(numbers);
    EXPECT_FALSE(closure->collected);
    hlrt::collect();
    EXPECT_EQ(hlrt::live_value_count(), base);
    EXPECT_TRUE(closure->collected);
    EXPECT_FALSE(hlrt::is_live(name));
}

TEST(HlHeap, RootsAreCountedPerRegistrationAndRemovedLastFirst)
{
    size_t base = hlrt::root_count();
    vbyte *a = host::bytes("a");
    vbyte *b = host::bytes("b");
    hl_add_root(&a);
    hl_add_root(&b);
    hl_add_root(&a);
    EXPECT_EQ(hlrt::root_count(), base + 3);

    hl_remove_root(&a);
    std::vector<void *> roots = hlrt::roots();
    ASSERT_EQ(roots.size(), base + 2);
    EXPECT_EQ(roots[base], &a);
    EXPECT_EQ(roots[base + 1], &b);
    hlrt::collect();
    EXPECT_TRUE(hlrt::is_live(a));

    hl_remove_root(&a);
    hl_remove_root(&a);  // absent: no effect
    EXPECT_EQ(hlrt::root_count(), base + 1);
    hlrt::collect();
    EXPECT_FALSE(hlrt::is_live(a));
    EXPECT_TRUE(hlrt::is_live(b));
    hl_remove_root(&b);
}

#if defined(__SANITIZE_ADDRESS__)
TEST(HlHeap, CollectedValuesAreReallyFreed)
{
    EXPECT_DEATH(
        {
            vbyte *b = host::bytes("gone");
            hlrt::collect();
            std::printf("%c", static_cast<char>(b[0]));
        },
        "heap-use-after-free");
}
#endif

TEST(HlHeap, CollectionInsideAClosureKeepsTheCallsArguments)
{
    host::ClosureBehaviour behaviour;
    bool alive = false;
    behaviour.on_call = [&](const host::Call &call) {
        hlrt::collect();
        alive = hlrt::is_live(call.args[0].ptr) && hlrt::is_live(call.args[1].ptr) && hlrt::is_live(hlrt::current_closure());
    };
    host::ClosureRef closure = host::make_closure("PBA_v", behaviour);
    // Only the call itself refers to these: a stack box, the array, the closure.
    vdynamic text = {&hlt_bytes, {}};
    text.v.bytes = host::bytes("on the stack");
    vdynamic *args[2] = {&text, reinterpret_cast<vdynamic *>(host::bytes_array(std::vector<std::string>{"x"}))};
    hl_dyn_call(closure->vm, args, 2);
    EXPECT_TRUE(alive);
}

// ---------------------------------------------------------------------------
// Closure calls.

TEST(HlCall, ClosuresReceiveTheDecodedVector)
{
    host::ClosureBehaviour behaviour;
    behaviour.result = 7;
    host::ClosureRef closure = host::make_closure("PiBBAb_i", behaviour);
    vdynamic code = {&hlt_i32, {}};
    code.v.i = -3;
    vdynamic text = {&hlt_bytes, {}};
    text.v.bytes = host::bytes(std::string(32, 'z'));
    vdynamic flag = {&hlt_bool, {}};
    flag.v.b = true;
    varray *list = host::bytes_array(std::vector<std::string>{"a", "b"});
    vdynamic *args[5] = {&code, &text, nullptr, reinterpret_cast<vdynamic *>(list), &flag};

    vdynamic *result = hl_dyn_call(closure->vm, args, 5);
    ASSERT_EQ(closure->count(), 1u);
    const host::Call &call = closure->last();
    EXPECT_EQ(call.args[0].i, -3);
    EXPECT_EQ(call.args[1].bytes, std::string(32, 'z'));
    EXPECT_EQ(call.args[1].bytes_size, 33);
    EXPECT_EQ(call.args[2].bytes, std::nullopt);
    EXPECT_EQ(call.args[3].array(), list);
    EXPECT_TRUE(call.args[4].b);
    ASSERT_NE(result, nullptr);
    EXPECT_EQ(result->t->kind, HI32);
    EXPECT_EQ(result->v.i, 7);

    host::ClosureRef returns_bool = host::make_closure("P_b", host::ClosureBehaviour{nullptr, nullptr, 1, false, nullptr});
    vdynamic *yes = hl_dyn_call(returns_bool->vm, nullptr, 0);
    EXPECT_EQ(yes->t, &hlt_bool);
    EXPECT_TRUE(yes->v.b);
    EXPECT_EQ(hl_dyn_call(host::make_closure("P_v")->vm, nullptr, 0), nullptr);
}

TEST(HlCall, ClosureWithAValueGetsItFirstAndShowsOnlyTheRest)
{
    vdynobj *env = hl_alloc_dynobj();
    host::ClosureBehaviour behaviour;
    behaviour.has_value = true;
    behaviour.value = env;
    host::ClosureRef closure = host::make_closure("PB_v", behaviour);
    vclosure *c = closure->vm;
    EXPECT_EQ(c->hasValue, 1);
    EXPECT_EQ(c->t->kind, HFUN);
    EXPECT_EQ(c->t->fun->nargs, 1);
    ASSERT_NE(c->t->fun->parent, nullptr);
    EXPECT_EQ(c->t->fun->parent->fun->nargs, 2);
    EXPECT_EQ(c->t->fun->parent->fun->args[0]->kind, HDYNOBJ);

    vdynamic text = {&hlt_bytes, {}};
    text.v.bytes = host::bytes("hi");
    vdynamic *args[1] = {&text};
    hl_dyn_call(c, args, 1);
    ASSERT_EQ(closure->count(), 1u);
    EXPECT_EQ(closure->last().value, env);
    EXPECT_EQ(closure->last().args[0].bytes, "hi");
}

TEST(HlCall, VectorsTheVmWouldMisreadAbort)
{
    host::ClosureRef two = host::make_closure("PiB_v");
    vdynamic code = {&hlt_i32, {}};
    vdynamic *one_arg[1] = {&code};
    EXPECT_DEATH(hl_dyn_call(two->vm, one_arg, 1), "takes 2 argument\\(s\\), called with 1");
    vdynamic *three_args[3] = {&code, nullptr, nullptr};
    EXPECT_DEATH(hl_dyn_call(two->vm, three_args, 3), "takes 2 argument\\(s\\), called with 3");

    vdynamic *swapped[2] = {&code, &code};
    EXPECT_DEATH(hl_dyn_call(two->vm, swapped, 2),
                 "argument 2 of 2 .*PiB_v.*expects a bytes box or null \\(HBYTES\\), got a value of kind i32 \\(HI32\\)");
    vdynamic *raw[2] = {&code, reinterpret_cast<vdynamic *>(host::bytes("raw"))};
    EXPECT_DEATH(hl_dyn_call(two->vm, raw, 2), "got raw bytes");
    vdynamic *null_int[2] = {nullptr, nullptr};
    EXPECT_DEATH(hl_dyn_call(two->vm, null_int, 2), "argument 1 of 2 .*\\(HI32\\), got null");

    host::ClosureRef takes_array = host::make_closure("PA_v");
    vdynamic boxed = {&hlt_array, {}};
    boxed.v.ptr = hl_alloc_array(&hlt_bytes, 0);
    vdynamic *boxed_args[1] = {&boxed};
    EXPECT_DEATH(hl_dyn_call(takes_array->vm, boxed_args, 1), "box holding an array");

    // VM bytes must carry their terminator to be read as a string.
    host::ClosureRef takes_bytes = host::make_closure("PB_v");
    vdynamic unterminated = {&hlt_bytes, {}};
    unterminated.v.bytes = hl_copy_bytes(reinterpret_cast<const vbyte *>("abc"), 3);
    vdynamic *unterminated_args[1] = {&unterminated};
    EXPECT_DEATH(hl_dyn_call(takes_bytes->vm, unterminated_args, 1), "without a terminating NUL");

    host::ClosureRef wrapper = host::make_closure("P_v");
    wrapper->vm->hasValue = 2;
    EXPECT_DEATH(hl_dyn_call(wrapper->vm, nullptr, 0), "Can't call closure with value");
}

// ---------------------------------------------------------------------------
// Exceptions.

TEST(HlException, SafeCallTrapsAndRestoresTheCallState)
{
    vdynamic *boom = host::exception("boom");
    host::ClosureBehaviour behaviour;
    behaviour.throws = boom;
    host::ClosureRef thrower = host::make_closure("P_v", behaviour);

    bool is_exception = false;
    vdynamic *result = hl_dyn_call_safe(thrower->vm, nullptr, 0, &is_exception);
    EXPECT_TRUE(is_exception);
    EXPECT_EQ(result, boom);
    EXPECT_EQ(host::exception_message(result), "boom");
    EXPECT_EQ(hlrt::call_depth(), 0);
    EXPECT_EQ(hlrt::current_closure(), nullptr);

    // Nested: the inner trap catches, the outer call completes normally.
    host::ClosureBehaviour outer_behaviour;
    bool inner_trapped = false;
    outer_behaviour.on_call = [&](const host::Call &) {
        bool inner = false;
        hl_dyn_call_safe(thrower->vm, nullptr, 0, &inner);
        inner_trapped = inner && hlrt::call_depth() == 1;
    };
    host::ClosureRef outer = host::make_closure("P_v", outer_behaviour);
    hl_dyn_call_safe(outer->vm, nullptr, 0, &is_exception);
    EXPECT_TRUE(inner_trapped);
    EXPECT_FALSE(is_exception);

    EXPECT_DEATH(hl_dyn_call(thrower->vm, nullptr, 0), "uncaught Haxe exception through native frames");
    EXPECT_DEATH(hl_rethrow(boom), "hl_rethrow: no trap");
}

TEST(HlException, RethrowReachesTheHostTrap)
{
    host::load(HLHOST_PROBE_HDLL, "hlprobe");
    auto echo = host::bind_as<void (*)(vbyte *, vclosure *)>("echo", "PBPB_v_v");
    vdynamic *boom = host::exception("from the callback");
    host::ClosureBehaviour behaviour;
    behaviour.throws = boom;
    host::ClosureRef callback = host::make_closure("PB_v", behaviour);
    vbyte *text = host::bytes("ping");

    hlrt::clear_rethrown();
    vdynamic *caught = host::call_guarded([&] { echo(text, callback->vm); });
    EXPECT_EQ(caught, boom);
    EXPECT_EQ(hlrt::rethrown(), std::vector<vdynamic *>{boom});
    ASSERT_EQ(callback->count(), 1u);
    EXPECT_EQ(callback->last().args[0].bytes, "ping");
    EXPECT_NE(callback->last().args[0].ptr, text);  // the library's own copy

    callback->behaviour.throws = nullptr;
    EXPECT_EQ(host::call_guarded([&] { echo(text, callback->vm); }), nullptr);
    EXPECT_EQ(hlrt::rethrown().size(), 1u);
}

// ---------------------------------------------------------------------------
// Console.

TEST(HlConsole, CapturesUtf16LinesWithSurrogatePairs)
{
    hlrt::clear_console();
    const char16_t text[] = u"h\u00e9 \U0001F600!";
    hl_sys_print(reinterpret_cast<vbyte *>(const_cast<char16_t *>(text)));
    const char16_t lone[] = {u'a', 0xD800, u'b', 0};
    hl_sys_print(reinterpret_cast<vbyte *>(const_cast<char16_t *>(lone)));

    std::vector<hlrt::ConsoleLine> lines = hlrt::console();
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_EQ(lines[0].utf16, std::u16string(text));
    EXPECT_EQ(lines[0].utf16.size(), 6u);
    EXPECT_EQ(lines[0].utf8, "h\xC3\xA9 \xF0\x9F\x98\x80!");
    EXPECT_EQ(lines[1].utf8, "a\xEF\xBF\xBD" "b");
    hlrt::clear_console();
    EXPECT_TRUE(hlrt::console_utf8().empty());
}

// ---------------------------------------------------------------------------
// Binding an hdll.

TEST(HlHost, BindsDescriptorsAndPassesTheConfigObject)
{
    host::load(HLHOST_PROBE_HDLL, "hlprobe");
    auto init = host::bind_as<bool (*)(void *, vclosure *)>("init", "POBBBBBBBBBBiib_PiBBB_v_b");
    host::InitConfigValues values;
    values.productName = "first";
    values.loginToken = "last";
    values.loginType = 4;
    values.enableOverlay = true;
    host::ClosureRef log = host::make_closure("PiBBB_v");

    EXPECT_TRUE(init(host::init_config(values), log->vm));
    ASSERT_EQ(log->count(), 1u);
    EXPECT_EQ(log->last().args[0].i, 4);
    EXPECT_EQ(log->last().args[1].bytes, "first");
    EXPECT_EQ(log->last().args[2].bytes, "last");
    EXPECT_EQ(log->last().args[3].bytes, std::nullopt);

    EXPECT_EQ(host::describe("unchecked").signature, std::nullopt);
    EXPECT_NE(host::bind("unchecked", "anything"), nullptr);
    EXPECT_FALSE(host::describe("absent").found);
    EXPECT_EQ(host::describe("tick").signature, "P_v");
    EXPECT_NE(host::symbol("probe_tick"), nullptr);
    EXPECT_EQ(host::symbol("hlp_absent"), nullptr);
}

TEST(HlHost, BindingFailuresExitWithTheVmMessages)
{
    host::load(HLHOST_PROBE_HDLL, "hlprobe");
    EXPECT_EXIT(
        {
            host::route_stdout_to_stderr();
            host::bind("tick", "P_i");
        },
        testing::ExitedWithCode(1),
        "^src/module\\.c\\(623\\) : FATAL ERROR : Invalid signature for function hlprobe@tick : P_i required but P_v "
        "found in hdll\n$");
    EXPECT_EXIT(
        {
            host::route_stdout_to_stderr();
            host::bind("absent", "P_v");
        },
        testing::ExitedWithCode(1), "FATAL ERROR : Failed to load function hlprobe@absent\n$");
    EXPECT_EXIT(
        {
            host::route_stdout_to_stderr();
            host::load("no-such-dir/hlprobe.hdll", "hlprobe");
        },
        testing::ExitedWithCode(1), "FATAL ERROR : Failed to load library hlprobe\\.hdll\n$");

    // A descriptor that does not write the signature is checked against the
    // previous one's, as in the VM.
    host::bind("tick", "P_v");
    EXPECT_NE(host::bind("quiet", "P_v"), nullptr);
    EXPECT_EXIT(
        {
            host::route_stdout_to_stderr();
            host::bind("quiet", "PB_v");
        },
        testing::ExitedWithCode(1), "hlprobe@quiet : PB_v required but P_v found in hdll");
}
