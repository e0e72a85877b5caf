// Result codes, account id handles and the SDK version.
#include <cstring>

#include "eos_version.h"
#include "sim_internal.h"

namespace eos_sim::sim {

namespace {

constexpr uint64_t kEpicMagic = 0x4550494349444b31ull;     // "EPICIDK1"
constexpr uint64_t kProductMagic = 0x5055494449444b31ull;  // "PUIDIDK1"

struct IdObj {
    uint64_t magic;
    std::string text;
};

struct IdTable {
    uint64_t magic;
    std::unordered_map<std::string, std::unique_ptr<IdObj>> by_text;
    std::unordered_map<const void*, const IdObj*> by_ptr;

    const IdObj* intern(const std::string& text) {
        auto it = by_text.find(text);
        if (it != by_text.end()) return it->second.get();
        auto obj = std::make_unique<IdObj>(IdObj{magic, text});
        const IdObj* raw = obj.get();
        by_text.emplace(text, std::move(obj));
        by_ptr.emplace(raw, raw);
        return raw;
    }

    IdState text_of(const void* h, std::string* text) const {
        if (h == nullptr) return IdState::Null;
        auto it = by_ptr.find(h);
        if (it == by_ptr.end()) return IdState::Garbage;
        if (text) *text = it->second->text;
        return IdState::Ok;
    }
};

// Interned handles are never freed: the game may keep them for the life of the process.
IdTable& epic_table() {
    static IdTable* t = new IdTable{kEpicMagic, {}, {}};
    return *t;
}

IdTable& product_table() {
    static IdTable* t = new IdTable{kProductMagic, {}, {}};
    return *t;
}

// The shared ToString rules: required length is the text plus its terminator.
EOS_EResult id_to_string(Op& op, IdState state, const std::string& text, char* out, int32_t* len) {
    op.options({{"AccountId", state == IdState::Ok ? json(text) : state == IdState::Null ? json(nullptr)
                                                                                           : json("<invalid handle>")},
                {"InOutBufferLength", len ? json(*len) : json(nullptr)}});
    if (out == nullptr || len == nullptr) return op.ret(EOS_EResult::EOS_InvalidParameters);
    if (state == IdState::Garbage) fault(std::string(op.function()) + ": unknown id handle");
    if (state != IdState::Ok) return op.ret(EOS_EResult::EOS_InvalidUser);
    if (auto inj = op.injected()) return op.ret(inj->code);
    const int32_t need = static_cast<int32_t>(text.size()) + 1;
    if (*len < need) {
        *len = need;
        op.output({{"InOutBufferLength", need}});
        return op.ret(EOS_EResult::EOS_LimitExceeded);
    }
    std::memcpy(out, text.c_str(), static_cast<size_t>(need));
    *len = need;
    op.output({{"InOutBufferLength", need}, {"OutBuffer", text}});
    return op.ret(EOS_EResult::EOS_Success);
}

}  // namespace

EOS_EpicAccountId intern_epic(const std::string& text) {
    return reinterpret_cast<EOS_EpicAccountId>(const_cast<IdObj*>(epic_table().intern(text)));
}

EOS_ProductUserId intern_product(const std::string& text) {
    return reinterpret_cast<EOS_ProductUserId>(const_cast<IdObj*>(product_table().intern(text)));
}

IdState epic_text(EOS_EpicAccountId id, std::string* text) { return epic_table().text_of(id, text); }

IdState product_text(EOS_ProductUserId id, std::string* text) { return product_table().text_of(id, text); }

json id_json(EOS_EpicAccountId id) {
    std::string text;
    switch (epic_text(id, &text)) {
        case IdState::Null: return nullptr;
        case IdState::Ok: return text;
        default: return "<invalid handle>";
    }
}

json id_json(EOS_ProductUserId id) {
    std::string text;
    switch (product_text(id, &text)) {
        case IdState::Null: return nullptr;
        case IdState::Ok: return text;
        default: return "<invalid handle>";
    }
}

json str_json(const char* s) { return s ? json(s) : json(nullptr); }

}  // namespace eos_sim::sim

using namespace eos_sim::sim;

EOS_DECLARE_FUNC(const char*) EOS_EResult_ToString(EOS_EResult Result) {
    Op op("EOS_EResult_ToString");
    op.options({{"Result", static_cast<int32_t>(Result)}});
    switch (Result) {
#define EOS_RESULT_VALUE(Name, Value) \
    case EOS_EResult::Name: return #Name;
#define EOS_RESULT_VALUE_LAST(Name, Value) \
    case EOS_EResult::Name: return #Name;
#include "eos_result.h"
#undef EOS_RESULT_VALUE
#undef EOS_RESULT_VALUE_LAST
    }
    return "EOS_UnknownError";
}

EOS_DECLARE_FUNC(EOS_Bool) EOS_EResult_IsOperationComplete(EOS_EResult Result) {
    Op op("EOS_EResult_IsOperationComplete");
    op.options({{"Result", static_cast<int32_t>(Result)}});
    return Result == EOS_EResult::EOS_OperationWillRetry ? EOS_FALSE : EOS_TRUE;
}

EOS_DECLARE_FUNC(EOS_Bool) EOS_EpicAccountId_IsValid(EOS_EpicAccountId AccountId) {
    Op op("EOS_EpicAccountId_IsValid");
    op.options({{"AccountId", id_json(AccountId)}});
    const IdState state = epic_text(AccountId, nullptr);
    if (state == IdState::Garbage) fault("EOS_EpicAccountId_IsValid: unknown id handle");
    return state == IdState::Ok ? EOS_TRUE : EOS_FALSE;
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_EpicAccountId_ToString(EOS_EpicAccountId AccountId, char* OutBuffer,
                                                         int32_t* InOutBufferLength) {
    Op op("EOS_EpicAccountId_ToString");
    std::string text;
    const IdState state = epic_text(AccountId, &text);
    return id_to_string(op, state, text, OutBuffer, InOutBufferLength);
}

EOS_DECLARE_FUNC(EOS_EpicAccountId) EOS_EpicAccountId_FromString(const char* AccountIdString) {
    Op op("EOS_EpicAccountId_FromString");
    op.options({{"AccountIdString", str_json(AccountIdString)}});
    if (AccountIdString == nullptr || AccountIdString[0] == '\0') return nullptr;
    if (op.injected()) return nullptr;
    EOS_EpicAccountId id = intern_epic(AccountIdString);
    op.output({{"AccountId", AccountIdString}});
    return id;
}

EOS_DECLARE_FUNC(EOS_Bool) EOS_ProductUserId_IsValid(EOS_ProductUserId AccountId) {
    Op op("EOS_ProductUserId_IsValid");
    op.options({{"AccountId", id_json(AccountId)}});
    const IdState state = product_text(AccountId, nullptr);
    if (state == IdState::Garbage) fault("EOS_ProductUserId_IsValid: unknown id handle");
    return state == IdState::Ok ? EOS_TRUE : EOS_FALSE;
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_ProductUserId_ToString(EOS_ProductUserId AccountId, char* OutBuffer,
                                                         int32_t* InOutBufferLength) {
    Op op("EOS_ProductUserId_ToString");
    std::string text;
    const IdState state = product_text(AccountId, &text);
    return id_to_string(op, state, text, OutBuffer, InOutBufferLength);
}

EOS_DECLARE_FUNC(EOS_ProductUserId) EOS_ProductUserId_FromString(const char* ProductUserIdString) {
    Op op("EOS_ProductUserId_FromString");
    op.options({{"ProductUserIdString", str_json(ProductUserIdString)}});
    if (ProductUserIdString == nullptr || ProductUserIdString[0] == '\0') return nullptr;
    if (op.injected()) return nullptr;
    EOS_ProductUserId id = intern_product(ProductUserIdString);
    op.output({{"AccountId", ProductUserIdString}});
    return id;
}

EOS_DECLARE_FUNC(const char*) EOS_GetVersion(void) {
    Op op("EOS_GetVersion");
    return EOS_VERSION_STRING;
}
