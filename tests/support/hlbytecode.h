// A reader of HashLink bytecode (.hl) files, as far as the native table, and
// the signature strings the VM derives from native declarations. Used to check
// that compiled Haxe code declares every primitive of tarnwick.hdll with the
// signature the library's descriptor reports, before a VM ever loads it.
//
// The reader never reads past the end of its input: malformed or truncated
// files give an error message (worded like the VM's where it has one).
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace hlbc {

// Type kinds, numbered as in the bytecode.
enum Kind : uint8_t {
    HVOID = 0, HUI8, HUI16, HI32, HI64, HF32, HF64, HBOOL, HBYTES, HDYN,
    HFUN = 10, HOBJ, HARRAY, HTYPE, HREF, HVIRTUAL, HDYNOBJ, HABSTRACT,
    HENUM = 18, HNULL, HMETHOD, HSTRUCT, HPACKED, HGUID,
    HLAST
};

struct Field {
    std::string name;
    int type = -1;
};

struct Type {
    Kind kind = HVOID;
    std::string name;           // HOBJ, HSTRUCT, HABSTRACT, HENUM
    std::vector<int> args;      // HFUN, HMETHOD
    int ret = -1;               // HFUN, HMETHOD
    int super = -1;             // HOBJ, HSTRUCT: -1 = none (not range-checked while reading)
    std::vector<Field> fields;  // HOBJ, HSTRUCT (own fields only), HVIRTUAL
    int param = -1;             // HREF, HNULL, HPACKED
};

struct Native {
    std::string lib;        // without the optional marker
    bool optional = false;  // the library name started with '?'
    std::string name;
    int type = -1;
    uint32_t findex = 0;
};

struct Module {
    int version = 0;
    uint32_t flags = 0;
    std::vector<std::string> strings;
    std::vector<Type> types;
    std::vector<int> globals;
    std::vector<Native> natives;
    uint32_t nfunctions = 0;
    uint32_t entrypoint = 0;
    size_t natives_end = 0;  // offset just past the native table
};

// Reads header, constant pools, types, globals and natives. Functions and
// constants, which follow, are not read. Returns false with `error` set when
// the input is not valid bytecode up to the end of the native table.
bool read_module(const uint8_t* data, size_t size, Module& out, std::string& error);
bool read_module_file(const std::string& path, Module& out, std::string& error);

// The signature the VM builds for type `type` when binding a native. Returns
// false with `error` set when the VM could not build it safely: a type that
// contains itself (endless recursion), a signature longer than 255 bytes (the
// VM's buffer), or a super class index outside the type table.
bool signature_of(const Module& module, int type, std::string& out, std::string& error);

// What a library's descriptor `hlp_<name>` answered.
struct Descriptor {
    bool exists = false;          // the symbol was found
    bool wrote_signature = false; // it stored something through its argument
    const char* signature = nullptr;
    void* implementation = nullptr;
};
using DescriptorLookup = std::function<Descriptor(const std::string& name)>;

struct Finding {
    enum class Kind {
        Undeclared,         // a required primitive has no declaration
        BadDeclaration,     // the VM could not build the declaration's signature
        MissingDescriptor,  // no hlp_<name>: "Failed to load function"
        NoSignature,        // the descriptor left *sign unwritten or NULL
        NoImplementation,   // the descriptor returned NULL
        Mismatch,           // "Invalid signature for function"
    };
    Kind kind;
    std::string name;
    std::string declared;  // signature from the bytecode
    std::string found;     // signature from the library
    std::string message;
};

// Binds, the way the VM does, every native of library `lib` declared in
// `module` against `lookup`, and reports what would go wrong, in table order,
// followed by every name of `required` that is not declared at all.
std::vector<Finding> check_natives(const Module& module, const std::string& lib,
                                   const std::vector<std::string>& required,
                                   const DescriptorLookup& lookup);

}  // namespace hlbc
