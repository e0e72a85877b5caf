// Checks the Haxe side against the built library: every primitive declared by
// the compiled Haxe code (the sample game, and the raw declarations alone) must
// bind to tarnwick.hdll the way the HashLink VM binds it, and a wrong
// declaration must be caught. Also checks the bytecode reader that this relies
// on, with hand-made modules and with damaged copies of real compiler output.
#include "hlbytecode.h"

#include <dlfcn.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <fstream>
#include <iterator>
#include <map>
#include <random>
#include <sstream>

namespace {

using hlbc::Finding;

const std::vector<std::string> kPrimitives = {
    "init", "notify_invite_received", "notify_invite_accepted", "update", "set_achievement",
    "query_ownership", "query_achievements", "show_friends", "query_friends", "send_invite",
    "reject_invite", "accept_invite", "create_lobby", "leave_lobby", "destroy_lobby", "exit",
    "store_checkout",
};

std::string describe(const std::vector<Finding>& findings) {
    std::ostringstream out;
    for (const Finding& f : findings) out << "  " << f.message << "\n";
    return out.str();
}

std::vector<uint8_t> read_file(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

// ---------------------------------------------------------------------------
// Hand-made bytecode.

void put_index(std::vector<uint8_t>& o, int v) {
    int mag = v < 0 ? -v : v;
    uint8_t sign = v < 0 ? 0x20 : 0;
    if (v >= 0 && v < 0x80) {
        o.push_back(uint8_t(v));
    } else if (mag < 0x2000) {
        o.push_back(uint8_t(0x80 | sign | (mag >> 8)));
        o.push_back(uint8_t(mag & 0xFF));
    } else {
        o.push_back(uint8_t(0xC0 | sign | (mag >> 24)));
        o.push_back(uint8_t(mag >> 16));
        o.push_back(uint8_t(mag >> 8));
        o.push_back(uint8_t(mag));
    }
}

void put_i32(std::vector<uint8_t>& o, int32_t v) {
    for (int i = 0; i < 4; i++) o.push_back(uint8_t(uint32_t(v) >> (8 * i)));
}

void put_string_block(std::vector<uint8_t>& o, const std::vector<std::string>& strings) {
    std::vector<uint8_t> data;
    for (const auto& s : strings) {
        data.insert(data.end(), s.begin(), s.end());
        data.push_back(0);
    }
    put_i32(o, int32_t(data.size()));
    o.insert(o.end(), data.begin(), data.end());
    for (const auto& s : strings) put_index(o, int(s.size()));
}

// Builds a module with types, globals and natives (no functions).
struct ModuleBuilder {
    int version = 4;
    bool debug = false;
    std::vector<std::string> strings;
    std::map<std::string, int> string_index;
    std::vector<std::vector<uint8_t>> types;
    std::vector<std::array<int, 3>> natives;  // lib, name, type

    int str(const std::string& s) {
        auto [it, added] = string_index.emplace(s, int(strings.size()));
        if (added) strings.push_back(s);
        return it->second;
    }
    int add(std::vector<uint8_t> entry) {
        types.push_back(std::move(entry));
        return int(types.size() - 1);
    }
    int prim(hlbc::Kind k) { return add({uint8_t(k)}); }
    int fun(const std::vector<int>& args, int ret, hlbc::Kind kind = hlbc::HFUN) {
        std::vector<uint8_t> e{uint8_t(kind), uint8_t(args.size())};
        for (int a : args) put_index(e, a);
        put_index(e, ret);
        return add(e);
    }
    int obj(const std::string& name, int super, const std::vector<int>& fields, hlbc::Kind kind = hlbc::HOBJ) {
        std::vector<uint8_t> e{uint8_t(kind)};
        put_index(e, str(name));
        put_index(e, super);
        put_index(e, 0);  // global
        put_index(e, int(fields.size()));
        put_index(e, 1);  // one method, not part of any signature
        put_index(e, 1);  // one binding
        for (size_t i = 0; i < fields.size(); i++) {
            put_index(e, str("f" + std::to_string(i)));
            put_index(e, fields[i]);
        }
        put_index(e, str("method"));
        put_index(e, 0);
        put_index(e, -1);
        put_index(e, 0);
        put_index(e, 0);
        return add(e);
    }
    int wrap(hlbc::Kind k, int param) {
        std::vector<uint8_t> e{uint8_t(k)};
        put_index(e, param);
        return add(e);
    }
    int abstract(const std::string& name) {
        std::vector<uint8_t> e{uint8_t(hlbc::HABSTRACT)};
        put_index(e, str(name));
        return add(e);
    }
    int virt(const std::vector<int>& fields) {
        std::vector<uint8_t> e{uint8_t(hlbc::HVIRTUAL)};
        put_index(e, int(fields.size()));
        for (int f : fields) {
            put_index(e, str("v"));
            put_index(e, f);
        }
        return add(e);
    }
    int enumt(int param) {
        std::vector<uint8_t> e{uint8_t(hlbc::HENUM)};
        put_index(e, str("E"));
        put_index(e, 0);
        put_index(e, 2);
        put_index(e, str("A"));
        put_index(e, 0);
        put_index(e, str("B"));
        put_index(e, 1);
        put_index(e, param);
        return add(e);
    }
    void native(const std::string& lib, const std::string& name, int type) {
        natives.push_back({str(lib), str(name), type});
    }

    std::vector<uint8_t> build() const {
        std::vector<uint8_t> o{'H', 'L', 'B', uint8_t(version)};
        put_index(o, debug ? 1 : 0);
        put_index(o, 1);  // ints
        put_index(o, 1);  // floats
        put_index(o, int(strings.size()));
        if (version >= 5) put_index(o, 2);
        put_index(o, int(types.size()));
        put_index(o, 1);  // globals
        put_index(o, int(natives.size()));
        put_index(o, 0);  // functions
        if (version >= 4) put_index(o, 0);
        put_index(o, 0);  // entrypoint
        put_i32(o, 7);
        for (int i = 0; i < 8; i++) o.push_back(0);
        put_string_block(o, strings);
        if (version >= 5) {
            put_i32(o, 3);
            o.insert(o.end(), {1, 2, 3});
            put_index(o, 0);
            put_index(o, 2);
        }
        if (debug) {
            put_index(o, 1);
            put_string_block(o, {"Main.hx"});
        }
        for (const auto& t : types) o.insert(o.end(), t.begin(), t.end());
        put_index(o, 0);  // the global's type
        int findex = 0;
        for (const auto& n : natives) {
            for (int v : n) put_index(o, v);
            put_index(o, findex++);
        }
        return o;
    }
};

hlbc::Module read_ok(const std::vector<uint8_t>& bytes) {
    hlbc::Module m;
    std::string error;
    EXPECT_TRUE(hlbc::read_module(bytes.data(), bytes.size(), m, error)) << error;
    return m;
}

std::string read_error(const std::vector<uint8_t>& bytes) {
    hlbc::Module m;
    std::string error;
    EXPECT_FALSE(hlbc::read_module(bytes.data(), bytes.size(), m, error));
    return error;
}

std::string sig(const hlbc::Module& m, int type) {
    std::string s, error;
    EXPECT_TRUE(hlbc::signature_of(m, type, s, error)) << error;
    return s;
}

std::string sig_error(const hlbc::Module& m, int type) {
    std::string s, error;
    EXPECT_FALSE(hlbc::signature_of(m, type, s, error)) << "built " << s;
    return error;
}

// ---------------------------------------------------------------------------
// The built library, opened as the VM opens it, answering descriptors.

class Hdll {
public:
    explicit Hdll(const char* path) : handle_(dlopen(path, RTLD_NOW | RTLD_LOCAL)) {
        if (!handle_) error_ = dlerror();
    }
    ~Hdll() {
        if (handle_) dlclose(handle_);
    }
    Hdll(const Hdll&) = delete;
    Hdll& operator=(const Hdll&) = delete;

    bool ok() const { return handle_ != nullptr; }
    const std::string& error() const { return error_; }

    hlbc::Descriptor operator()(const std::string& name) const {
        hlbc::Descriptor d;
        auto fn = reinterpret_cast<void* (*)(const char**)>(dlsym(handle_, ("hlp_" + name).c_str()));
        if (!fn) return d;
        static const char unwritten[] = "";
        const char* sign = unwritten;
        d.exists = true;
        d.implementation = fn(&sign);
        d.wrote_signature = sign != unwritten;
        d.signature = sign;
        return d;
    }

private:
    void* handle_;
    std::string error_;
};

#if defined(TW_HAXE_SAMPLE_HL) && defined(TW_HAXE_RAW_NATIVES_HL) && defined(TW_HAXE_WRONG_NATIVES_HL)
#define TW_HAVE_HAXE_OUTPUT 1
const char* const kSampleHl = TW_HAXE_SAMPLE_HL;
const char* const kRawNativesHl = TW_HAXE_RAW_NATIVES_HL;
const char* const kWrongNativesHl = TW_HAXE_WRONG_NATIVES_HL;
#else
#define TW_HAVE_HAXE_OUTPUT 0
const char* const kSampleHl = "";
const char* const kRawNativesHl = "";
const char* const kWrongNativesHl = "";
#endif

#define REQUIRE_HAXE_OUTPUT()                                                                  \
    if (!TW_HAVE_HAXE_OUTPUT) FAIL() << "built without the compiled Haxe bytecode: "          \
                                        "haxe/CMakeLists.txt passes its paths to this test"

std::vector<Finding> check_against_library(const char* hl_path, const std::vector<std::string>& required) {
    hlbc::Module m;
    std::string error;
    EXPECT_TRUE(hlbc::read_module_file(hl_path, m, error)) << hl_path << ": " << error;
    Hdll hdll(TARNWICK_HDLL_PATH);
    EXPECT_TRUE(hdll.ok()) << hdll.error();
    if (!hdll.ok()) return {};
    return hlbc::check_natives(m, "tarnwick", required, std::cref(hdll));
}

// ---------------------------------------------------------------------------
// The Haxe declarations against the library.

TEST(HaxeConformance, CompiledDeclarationsBindToEveryPrimitiveOfTheLibrary) {
    REQUIRE_HAXE_OUTPUT();
    // The sample game goes through the typed API; the raw declarations are
    // compiled alone. Both use full dead-code elimination, which would drop
    // InitConfig fields (and change init's signature) without @:keep.
    for (const char* path : {kSampleHl, kRawNativesHl}) {
        SCOPED_TRACE(path);
        auto findings = check_against_library(path, kPrimitives);
        EXPECT_TRUE(findings.empty()) << describe(findings);

        hlbc::Module m;
        std::string error;
        ASSERT_TRUE(hlbc::read_module_file(path, m, error)) << error;
        std::vector<std::string> declared;
        for (const auto& n : m.natives)
            if (n.lib == "tarnwick") {
                EXPECT_FALSE(n.optional) << n.name;
                declared.push_back(n.name);
            }
        std::sort(declared.begin(), declared.end());
        auto expected = kPrimitives;
        std::sort(expected.begin(), expected.end());
        EXPECT_EQ(declared, expected) << "each primitive declared exactly once";
    }
}

TEST(HaxeConformance, WrongDeclarationsAreCaughtAsTheVmWouldReportThem) {
    REQUIRE_HAXE_OUTPUT();
    auto findings = check_against_library(kWrongNativesHl, {});
    ASSERT_EQ(findings.size(), 2u) << describe(findings);

    EXPECT_EQ(findings[0].kind, Finding::Kind::Mismatch);
    EXPECT_EQ(findings[0].name, "leave_lobby");
    EXPECT_EQ(findings[0].declared, "PBPb_v_v");
    EXPECT_EQ(findings[0].found, "PBPi_v_v");
    EXPECT_EQ(findings[0].message,
              "Invalid signature for function tarnwick@leave_lobby : PBPb_v_v required but PBPi_v_v found in hdll");

    EXPECT_EQ(findings[1].kind, Finding::Kind::MissingDescriptor);
    EXPECT_EQ(findings[1].name, "missing_primitive");
    EXPECT_EQ(findings[1].message, "Failed to load function tarnwick@missing_primitive");

    // Asked for the whole table, the fixture also lacks every other primitive.
    auto all = check_against_library(kWrongNativesHl, kPrimitives);
    size_t undeclared = size_t(std::count_if(all.begin(), all.end(), [](const Finding& f) {
        return f.kind == Finding::Kind::Undeclared;
    }));
    EXPECT_EQ(undeclared, kPrimitives.size() - 2);
}

// ---------------------------------------------------------------------------
// The checker's verdicts, against descriptors that misbehave.

TEST(NativeChecker, ReportsDescriptorsThatWouldNotBindCleanly) {
    ModuleBuilder b;
    int v = b.prim(hlbc::HVOID);
    int p_v = b.fun({}, v);
    b.native("tarnwick", "good", p_v);
    b.native("tarnwick", "silent", p_v);
    b.native("tarnwick", "null_sign", p_v);
    b.native("tarnwick", "no_impl", p_v);
    b.native("?tarnwick", "absent", p_v);
    b.native("std", "unrelated", p_v);  // another library: not checked
    auto m = read_ok(b.build());

    static int impl;
    auto lookup = [](const std::string& name) {
        hlbc::Descriptor d;
        d.exists = name != "absent" && name != "unrelated";
        d.implementation = name == "no_impl" ? nullptr : &impl;
        d.wrote_signature = name != "silent";
        d.signature = name == "null_sign" ? nullptr : "P_v";
        return d;
    };
    auto findings = hlbc::check_natives(m, "tarnwick", {"good", "never_declared"}, lookup);
    ASSERT_EQ(findings.size(), 5u) << describe(findings);
    EXPECT_EQ(findings[0].kind, Finding::Kind::NoSignature);
    EXPECT_EQ(findings[0].name, "silent");
    EXPECT_EQ(findings[1].kind, Finding::Kind::NoSignature);
    EXPECT_EQ(findings[1].name, "null_sign");
    EXPECT_EQ(findings[2].kind, Finding::Kind::NoImplementation);
    EXPECT_EQ(findings[2].name, "no_impl");
    EXPECT_EQ(findings[3].kind, Finding::Kind::MissingDescriptor);
    EXPECT_EQ(findings[3].message, "Primitive or library is missing: tarnwick@absent");
    EXPECT_EQ(findings[4].kind, Finding::Kind::Undeclared);
    EXPECT_EQ(findings[4].name, "never_declared");
}

// ---------------------------------------------------------------------------
// The bytecode reader and the signature rules.

TEST(HlBytecode, SignaturesFollowTheVmRulesForEveryKind) {
    using namespace hlbc;
    ModuleBuilder b;
    int v = b.prim(HVOID), i = b.prim(HI32), bo = b.prim(HBOOL), by = b.prim(HBYTES), d = b.prim(HDYN);
    int arr = b.prim(HARRAY);
    std::vector<int> scalars{b.prim(HUI8), b.prim(HUI16), i, b.prim(HI64), b.prim(HF32), b.prim(HF64), bo, by, d,
                             arr, b.prim(HTYPE), b.prim(HDYNOBJ), b.prim(HGUID)};
    int base = b.obj("Base", -1, {i});
    int derived = b.obj("Derived", base, {by});
    int string = b.obj("String", -1, {by, i});
    int config = b.obj("InitConfig", -1, {by, by, by, by, by, by, by, by, by, by, i, i, bo});
    int on_login = b.fun({i, by, by, by}, v);
    int later = int(b.types.size()) + 1;  // a forward reference, resolved below
    int forward = b.fun({later}, v);
    b.prim(HBOOL);
    int opaque = b.fun({b.virt({i}), b.enumt(i), b.obj("St", -1, {i}, HSTRUCT), b.wrap(HPACKED, i), b.fun({i}, i, HMETHOD)}, v);

    const std::vector<std::pair<int, std::string>> cases = {
        {b.fun({}, v), "P_v"},
        {b.fun(scalars, v), "PcsilfdbBDAT?g_v"},
        {b.fun({i, i}, i), "Pii_i"},
        {b.fun({derived}, i), "POiB__i"},
        {b.fun({string}, v), "POBi__v"},
        {b.fun({b.wrap(HNULL, i), b.wrap(HREF, i), b.abstract("probe_handle"), d}, v), "PNiRiXprobe_handle_D_v"},
        {b.fun({config, on_login}, bo), "POBBBBBBBBBBiib_PiBBB_v_b"},
        {b.fun({by, b.fun({by, by}, v)}, v), "PBPBB_v_v"},
        {b.fun({arr, b.fun({arr}, v)}, v), "PAPA_v_v"},
        {forward, "Pb_v"},
        {opaque, "P??S??_v"},
    };
    auto m = read_ok(b.build());
    for (const auto& [type, expected] : cases) EXPECT_EQ(sig(m, type), expected) << "type " << type;
}

TEST(HlBytecode, AbstractNamesAreCutAt99BytesOnACharacterBoundary) {
    ModuleBuilder b;
    const std::string e_acute = "\xC3\xA9";
    int fits = b.abstract(std::string(97, 'a') + e_acute);        // 99 bytes: kept whole
    int over = b.abstract(std::string(98, 'a') + e_acute + "z");  // the 2-byte character would end at 100
    int longer = b.abstract(std::string(150, 'b'));
    auto m = read_ok(b.build());
    EXPECT_EQ(sig(m, fits), "X" + std::string(97, 'a') + e_acute + "_");
    EXPECT_EQ(sig(m, over), "X" + std::string(98, 'a') + "_");
    EXPECT_EQ(sig(m, longer), "X" + std::string(99, 'b') + "_");
}

TEST(HlBytecode, DeclarationsTheVmCannotBindAreReportedNotFollowed) {
    using namespace hlbc;
    ModuleBuilder b;
    int v = b.prim(HVOID), i = b.prim(HI32);
    // Node { next:Node }: the VM would recurse forever.
    int node = int(b.types.size());
    b.obj("Node", -1, {node});
    int takes_node = b.fun({node}, v);
    // A super class index outside the table and a circular class hierarchy.
    int orphan = b.fun({b.obj("Orphan", 99, {i})}, v);
    int first = int(b.types.size());
    b.obj("A", first + 1, {i});
    b.obj("B", first, {i});
    int circular = b.fun({first}, v);
    // 255 arguments: the signature needs 258 bytes of the VM's 256.
    int wide = b.fun(std::vector<int>(255, i), v);
    // Each level doubles the signature: must stop early instead of growing to 2^40.
    int level = i;
    for (int k = 0; k < 40; k++) level = b.fun({level, level}, v);
    int widest = b.fun(std::vector<int>(252, i), v);
    auto m = read_ok(b.build());

    EXPECT_NE(sig_error(m, takes_node).find("contains itself"), std::string::npos);
    EXPECT_NE(sig_error(m, orphan).find("invalid type index 99"), std::string::npos);
    EXPECT_NE(sig_error(m, circular).find("circular"), std::string::npos);
    EXPECT_NE(sig_error(m, wide).find("255"), std::string::npos);
    EXPECT_NE(sig_error(m, level).find("255"), std::string::npos);
    EXPECT_EQ(sig(m, widest).size(), 255u);

    b.native("tarnwick", "takes_node", takes_node);
    auto with_native = read_ok(b.build());
    auto findings = check_natives(with_native, "tarnwick", {}, [](const std::string&) { return Descriptor{}; });
    ASSERT_EQ(findings.size(), 1u);
    EXPECT_EQ(findings[0].kind, Finding::Kind::BadDeclaration);
}

TEST(HlBytecode, ReadsEveryIndexWidthVersionAndOptionalSection) {
    for (int version : {2, 3, 4, 5}) {
        SCOPED_TRACE(version);
        ModuleBuilder b;
        b.version = version;
        b.debug = version % 2 == 1;
        // Enough strings and types that references need the 2- and 4-byte forms.
        for (int k = 0; k < 9000; k++) b.str("s" + std::to_string(k));
        for (int k = 0; k < 200; k++) b.prim(hlbc::HI32);
        int v = b.prim(hlbc::HVOID);
        int f = b.fun({3, 150}, v);
        b.native("?tarnwick", "s8500", f);  // library name past string 9000, 4-byte indexes
        b.native("tarnwick", "s5", f);
        auto m = read_ok(b.build());
        EXPECT_EQ(m.version, version);
        ASSERT_EQ(m.natives.size(), 2u);
        EXPECT_EQ(m.natives[0].lib, "tarnwick");
        EXPECT_TRUE(m.natives[0].optional);
        EXPECT_EQ(m.natives[0].name, "s8500");
        EXPECT_EQ(m.natives[1].name, "s5");
        EXPECT_FALSE(m.natives[1].optional);
        EXPECT_EQ(m.natives[1].findex, 1u);
        EXPECT_EQ(sig(m, m.natives[0].type), "Pii_v");
    }
}

TEST(HlBytecode, MalformedInputIsRejectedWithTheVmMessage) {
    ModuleBuilder b;
    int v = b.prim(hlbc::HVOID);
    b.native("tarnwick", "update", b.fun({}, v));
    const auto good = b.build();
    read_ok(good);

    auto with = [&](size_t at, std::vector<uint8_t> bytes) {
        auto copy = good;
        std::copy(bytes.begin(), bytes.end(), copy.begin() + long(at));
        return copy;
    };
    // Header: magic, version, flags, ints, floats, strings, types, ...
    EXPECT_EQ(read_error(with(0, {'H', 'L', 'C'})), "Invalid HL bytecode header");
    EXPECT_NE(read_error(with(3, {6})).find("Unsupported bytecode version"), std::string::npos);
    EXPECT_NE(read_error(with(3, {1})).find("Unsupported bytecode version"), std::string::npos);
    EXPECT_EQ(read_error(with(4, {0xA0, 0x01})), "Negative index");  // flags = -1
    EXPECT_EQ(read_error({'H', 'L'}), "No more data");
    EXPECT_EQ(read_error({}), "No more data");

    // A string count far beyond the file must fail without allocating for it.
    auto huge = std::vector<uint8_t>{'H', 'L', 'B', 4, 0, 0, 0, 0xDF, 0xFF, 0xFF, 0xFF};
    huge.resize(64, 0);
    EXPECT_EQ(read_error(huge), "No more data");

    // Strings must each end inside their block.
    {
        auto bad = good;
        size_t at = size_t(std::search(bad.begin(), bad.end(), std::begin("update"), std::end("update")) - bad.begin());
        ASSERT_LT(at, bad.size());
        bad[at + 6] = 'x';  // the NUL after "update"
        EXPECT_EQ(read_error(bad), "Invalid string");
    }

    // Type, string and kind references checked against their tables.
    ModuleBuilder refs;
    int rv = refs.prim(hlbc::HVOID);
    refs.native("tarnwick", "update", refs.fun({}, rv));
    refs.natives[0][2] = 7;  // type index past the table
    EXPECT_EQ(read_error(refs.build()), "Invalid type index");
    refs.natives[0][2] = 1;
    refs.natives[0][1] = 40;  // string index past the table
    EXPECT_EQ(read_error(refs.build()), "Invalid string index");
    refs.natives[0][1] = 1;
    refs.types[0][0] = 24;  // no such kind
    EXPECT_EQ(read_error(refs.build()), "Invalid type");
}

TEST(HlBytecode, DamagedCompilerOutputFailsCleanly) {
    REQUIRE_HAXE_OUTPUT();
    const auto original = read_file(kRawNativesHl);
    hlbc::Module m;
    std::string error;
    ASSERT_TRUE(hlbc::read_module(original.data(), original.size(), m, error)) << error;
    const size_t end = m.natives_end;
    ASSERT_GT(end, 0u);

    // A cut before the end of the native table is an error (the input is
    // copied so that reading past the cut would be caught by the sanitizers):
    // every cut through the header and pools, then every few bytes.
    for (size_t cut = 0; cut < end; cut += cut < 2048 ? 1 : 11) {
        std::vector<uint8_t> prefix(original.begin(), original.begin() + long(cut));
        ASSERT_FALSE(hlbc::read_module(prefix.data(), prefix.size(), m, error)) << "cut at " << cut;
        ASSERT_FALSE(error.empty());
    }

    // Random damage either reads or fails, and whatever reads gives signatures
    // or errors, never a crash or a hang.
    std::mt19937 rng(20240611);
    std::uniform_int_distribution<size_t> pos(0, end - 1);
    std::uniform_int_distribution<int> value(0, 255);
    int read = 0;
    for (int round = 0; round < 500; round++) {
        auto damaged = original;
        for (int k = 0; k < 1 + round % 3; k++) damaged[pos(rng)] = uint8_t(value(rng));
        if (!hlbc::read_module(damaged.data(), damaged.size(), m, error)) continue;
        read++;
        for (const auto& n : m.natives) {
            std::string s;
            hlbc::signature_of(m, n.type, s, error);
        }
    }
    EXPECT_GT(read, 0);  // some damage lands in names and keeps the module readable
}

}  // namespace
