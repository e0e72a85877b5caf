#include "hlbytecode.h"

#include <algorithm>
#include <fstream>
#include <iterator>
#include <set>
#include <stdexcept>

namespace hlbc {
namespace {

struct ReadError : std::runtime_error {
    using std::runtime_error::runtime_error;
};

// Bounds-checked cursor over the input.
class Reader {
public:
    Reader(const uint8_t* data, size_t size) : data_(data), size_(size) {}

    size_t pos() const { return pos_; }
    size_t remaining() const { return size_ - pos_; }

    uint8_t byte() {
        need(1);
        return data_[pos_++];
    }

    int32_t i32() {
        need(4);
        uint32_t v = uint32_t(data_[pos_]) | uint32_t(data_[pos_ + 1]) << 8 |
                     uint32_t(data_[pos_ + 2]) << 16 | uint32_t(data_[pos_ + 3]) << 24;
        pos_ += 4;
        return int32_t(v);
    }

    const uint8_t* take(size_t n) {
        need(n);
        const uint8_t* p = data_ + pos_;
        pos_ += n;
        return p;
    }

    int index() {
        uint8_t b = byte();
        if ((b & 0x80) == 0) return b & 0x7F;
        if ((b & 0x40) == 0) {
            int v = (b & 0x1F) << 8 | byte();
            return (b & 0x20) ? -v : v;
        }
        int v = (b & 0x1F) << 24;
        v |= byte() << 16;
        v |= byte() << 8;
        v |= byte();
        return (b & 0x20) ? -v : v;
    }

    uint32_t uindex() {
        int v = index();
        if (v < 0) throw ReadError("Negative index");
        return uint32_t(v);
    }

    // A count of entries that each take at least `min_bytes` of input: larger
    // counts cannot be satisfied, and rejecting them early keeps a corrupt
    // count from reserving huge tables.
    uint32_t count(size_t min_bytes = 1) {
        uint32_t n = uindex();
        if (min_bytes && n > remaining() / min_bytes) throw ReadError("No more data");
        return n;
    }

private:
    void need(size_t n) const {
        if (n > size_ - pos_) throw ReadError("No more data");
    }

    const uint8_t* data_;
    size_t size_;
    size_t pos_ = 0;
};

// String block: i32 size, NUL-terminated data, then one length per string.
std::vector<std::string> read_strings(Reader& r, uint32_t n) {
    int32_t size = r.i32();
    if (size < 0) throw ReadError("Invalid string block size");
    const uint8_t* block = r.take(size_t(size));
    if (n > r.remaining()) throw ReadError("No more data");
    std::vector<std::string> out;
    out.reserve(n);
    size_t offset = 0;
    for (uint32_t i = 0; i < n; i++) {
        uint32_t len = r.uindex();
        if (offset >= size_t(size) || len >= size_t(size) - offset || block[offset + len] != 0)
            throw ReadError("Invalid string");
        out.emplace_back(reinterpret_cast<const char*>(block + offset), len);
        offset += len + 1;
    }
    return out;
}

class ModuleReader {
public:
    ModuleReader(Reader& r, Module& m) : r_(r), m_(m) {}

    void run() {
        const uint8_t* magic = r_.take(3);
        if (magic[0] != 'H' || magic[1] != 'L' || magic[2] != 'B') throw ReadError("Invalid HL bytecode header");
        m_.version = r_.byte();
        if (m_.version < 2 || m_.version > 5)
            throw ReadError("Found version " + std::to_string(m_.version) +
                            " while HL 1.17 supports up to 5: Unsupported bytecode version");
        m_.flags = r_.uindex();
        uint32_t nints = r_.uindex();
        uint32_t nfloats = r_.uindex();
        uint32_t nstrings = r_.uindex();
        uint32_t nbytes = m_.version >= 5 ? r_.uindex() : 0;
        uint32_t ntypes = r_.uindex();
        uint32_t nglobals = r_.uindex();
        uint32_t nnatives = r_.uindex();
        m_.nfunctions = r_.uindex();
        if (m_.version >= 4) r_.uindex();  // constants
        m_.entrypoint = r_.uindex();

        if (nints > r_.remaining() / 4) throw ReadError("No more data");
        r_.take(size_t(nints) * 4);
        if (nfloats > r_.remaining() / 8) throw ReadError("No more data");
        r_.take(size_t(nfloats) * 8);
        m_.strings = read_strings(r_, nstrings);
        if (m_.version >= 5) {
            int32_t size = r_.i32();
            if (size < 0) throw ReadError("Invalid bytes block size");
            r_.take(size_t(size));
            if (nbytes > r_.remaining()) throw ReadError("No more data");
            for (uint32_t i = 0; i < nbytes; i++) r_.uindex();
        }
        if (m_.flags & 1) {
            uint32_t nfiles = r_.count();
            read_strings(r_, nfiles);
        }

        if (ntypes > r_.remaining()) throw ReadError("No more data");
        m_.types.resize(ntypes);
        for (auto& t : m_.types) read_type(t);

        if (nglobals > r_.remaining()) throw ReadError("No more data");
        m_.globals.reserve(nglobals);
        for (uint32_t i = 0; i < nglobals; i++) m_.globals.push_back(type_ref());

        if (nnatives > r_.remaining() / 4) throw ReadError("No more data");
        m_.natives.reserve(nnatives);
        for (uint32_t i = 0; i < nnatives; i++) {
            Native n;
            n.lib = string_ref();
            if (!n.lib.empty() && n.lib[0] == '?') {
                n.optional = true;
                n.lib.erase(0, 1);
            }
            n.name = string_ref();
            n.type = type_ref();
            n.findex = r_.uindex();
            m_.natives.push_back(std::move(n));
        }
        m_.natives_end = r_.pos();
    }

private:
    int type_ref() {
        int i = r_.index();
        if (i < 0 || size_t(i) >= m_.types.size()) throw ReadError("Invalid type index");
        return i;
    }

    const std::string& string_ref() {
        int i = r_.index();
        if (i < 0 || size_t(i) >= m_.strings.size()) throw ReadError("Invalid string index");
        return m_.strings[size_t(i)];
    }

    void read_fields(std::vector<Field>& fields, uint32_t n) {
        fields.reserve(n);
        for (uint32_t i = 0; i < n; i++) {
            Field f;
            f.name = string_ref();
            f.type = type_ref();
            fields.push_back(std::move(f));
        }
    }

    void read_type(Type& t) {
        uint8_t kind = r_.byte();
        if (kind >= HLAST) throw ReadError("Invalid type");
        t.kind = Kind(kind);
        switch (t.kind) {
        case HFUN:
        case HMETHOD: {
            uint8_t nargs = r_.byte();
            for (uint8_t i = 0; i < nargs; i++) t.args.push_back(type_ref());
            t.ret = type_ref();
            break;
        }
        case HOBJ:
        case HSTRUCT: {
            t.name = string_ref();
            t.super = r_.index();
            r_.uindex();  // global
            uint32_t nfields = r_.count(2);
            uint32_t nproto = r_.count(3);
            uint32_t nbindings = r_.count(2);
            read_fields(t.fields, nfields);
            for (uint32_t i = 0; i < nproto; i++) {
                string_ref();
                r_.uindex();  // findex
                r_.index();   // virtual slot
            }
            for (uint32_t i = 0; i < nbindings; i++) {
                r_.uindex();
                r_.uindex();
            }
            break;
        }
        case HVIRTUAL:
            read_fields(t.fields, r_.count(2));
            break;
        case HABSTRACT:
            t.name = string_ref();
            break;
        case HENUM: {
            t.name = string_ref();
            r_.uindex();  // global
            uint32_t nconstructs = r_.count(2);
            for (uint32_t i = 0; i < nconstructs; i++) {
                string_ref();
                uint32_t nparams = r_.count();
                for (uint32_t p = 0; p < nparams; p++) type_ref();
            }
            break;
        }
        case HREF:
        case HNULL:
        case HPACKED:
            t.param = type_ref();
            break;
        default:
            break;
        }
    }

    Reader& r_;
    Module& m_;
};

// The VM builds signatures into a 256-byte buffer.
constexpr size_t kMaxSignature = 255;
constexpr size_t kMaxAbstractName = 99;
const char kTypeStr[] = "vcsilfdbBDPOATR??X?N?S?g";

struct SignatureError : std::runtime_error {
    using std::runtime_error::runtime_error;
};

class SignatureBuilder {
public:
    explicit SignatureBuilder(const Module& m) : m_(m) {}

    std::string build(int type) {
        append(type);
        return std::move(out_);
    }

private:
    void put(char c) {
        out_.push_back(c);
        if (out_.size() > kMaxSignature) throw SignatureError("signature longer than 255 bytes");
    }

    const Type& type_at(int i) const {
        if (i < 0 || size_t(i) >= m_.types.size()) throw SignatureError("invalid type index " + std::to_string(i));
        return m_.types[size_t(i)];
    }

    void append(int index) {
        const Type& t = type_at(index);
        if (std::find(open_.begin(), open_.end(), index) != open_.end())
            throw SignatureError("type " + std::to_string(index) + " contains itself");
        open_.push_back(index);
        put(kTypeStr[t.kind]);
        switch (t.kind) {
        case HFUN:
            for (int a : t.args) append(a);
            put('_');
            append(t.ret);
            break;
        case HOBJ: {
            // Super chain, root first, then the type itself.
            std::vector<const Type*> chain{&t};
            for (int s = t.super; s >= 0;) {
                const Type& st = type_at(s);
                if (st.kind != HOBJ && st.kind != HSTRUCT)
                    throw SignatureError("super type " + std::to_string(s) + " is not a class");
                if (std::find(chain.begin(), chain.end(), &st) != chain.end())
                    throw SignatureError("class hierarchy of type " + std::to_string(index) + " is circular");
                chain.push_back(&st);
                s = st.super;
            }
            for (auto it = chain.rbegin(); it != chain.rend(); ++it)
                for (const Field& f : (*it)->fields) append(f.type);
            put('_');
            break;
        }
        case HREF:
        case HNULL:
            append(t.param);
            break;
        case HABSTRACT: {
            // The name is cut to 99 bytes, never inside a UTF-8 sequence.
            size_t end = 0;
            while (end < t.name.size()) {
                unsigned char c = static_cast<unsigned char>(t.name[end]);
                size_t len = c < 0x80 ? 1 : c >= 0xF0 ? 4 : c >= 0xE0 ? 3 : c >= 0xC0 ? 2 : 1;
                if (end + len > kMaxAbstractName || end + len > t.name.size()) break;
                end += len;
            }
            for (size_t i = 0; i < end; i++) put(t.name[i]);
            put('_');
            break;
        }
        default:
            break;
        }
        open_.pop_back();
    }

    const Module& m_;
    std::string out_;
    std::vector<int> open_;
};

std::string vm_message(const std::string& lib, const std::string& name, const std::string& declared,
                       const std::string& found) {
    return "Invalid signature for function " + lib + "@" + name + " : " + declared + " required but " + found +
           " found in hdll";
}

}  // namespace

bool read_module(const uint8_t* data, size_t size, Module& out, std::string& error) {
    out = Module{};
    Reader r(data, size);
    try {
        ModuleReader(r, out).run();
        return true;
    } catch (const ReadError& e) {
        error = e.what();
        return false;
    }
}

bool read_module_file(const std::string& path, Module& out, std::string& error) {
    std::ifstream in(path, std::ios::binary);
    if (!in) {
        error = "cannot open " + path;
        return false;
    }
    std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    return read_module(bytes.data(), bytes.size(), out, error);
}

bool signature_of(const Module& module, int type, std::string& out, std::string& error) {
    try {
        out = SignatureBuilder(module).build(type);
        return true;
    } catch (const SignatureError& e) {
        error = e.what();
        return false;
    }
}

std::vector<Finding> check_natives(const Module& module, const std::string& lib,
                                   const std::vector<std::string>& required, const DescriptorLookup& lookup) {
    std::vector<Finding> findings;
    std::set<std::string> declared_names;
    for (const Native& n : module.natives) {
        if (n.lib != lib) continue;
        declared_names.insert(n.name);
        const std::string where = lib + "@" + n.name;
        Finding f{Finding::Kind::BadDeclaration, n.name, {}, {}, {}};
        std::string error;
        if (!signature_of(module, n.type, f.declared, error)) {
            f.message = "declaration of " + where + " cannot be bound: " + error;
            findings.push_back(f);
            continue;
        }
        if (("hlp_" + n.name).size() > kMaxSignature) {
            f.message = "descriptor name of " + where + " is longer than 255 bytes";
            findings.push_back(f);
            continue;
        }
        Descriptor d = lookup(n.name);
        if (!d.exists) {
            f.kind = Finding::Kind::MissingDescriptor;
            f.message = n.optional ? "Primitive or library is missing: " + where : "Failed to load function " + where;
            findings.push_back(f);
            continue;
        }
        if (!d.implementation) {
            f.kind = Finding::Kind::NoImplementation;
            f.message = "hlp_" + n.name + " returned no implementation";
            findings.push_back(f);
        }
        if (!d.wrote_signature || !d.signature) {
            f.kind = Finding::Kind::NoSignature;
            f.message = "hlp_" + n.name + (d.wrote_signature ? " set its signature to NULL" : " did not set its signature");
            findings.push_back(f);
            continue;
        }
        f.found = d.signature;
        if (f.found != f.declared) {
            f.kind = Finding::Kind::Mismatch;
            f.message = vm_message(lib, n.name, f.declared, f.found);
            findings.push_back(f);
        }
    }
    for (const std::string& name : required)
        if (!declared_names.count(name))
            findings.push_back({Finding::Kind::Undeclared, name, {}, {}, "no declaration of " + lib + "@" + name});
    return findings;
}

}  // namespace hlbc
