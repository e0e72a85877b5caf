// Connect: product-user login with an Epic access token, user creation, and the product user
// id -> Epic account id mappings.
#include <cstring>

#include "sim_internal.h"

using namespace eos_sim::sim;
using eos_sim::Account;

namespace {

const auto kConnect = EOS_ELogCategory::EOS_LC_Connect;

bool epic_token_type(EOS_EExternalCredentialType t) {
    return t == EOS_EExternalCredentialType::EOS_ECT_EPIC || t == EOS_EExternalCredentialType::EOS_ECT_EPIC_ID_TOKEN;
}

// Marks the continuance token of `account`'s pending creation; tokens stay allocated until reset.
EOS_ContinuanceToken new_continuance(const std::string& account) {
    auto& s = sessions();
    s.continuance_objs.push_back(std::make_unique<int>(0));
    const void* p = s.continuance_objs.back().get();
    s.continuance[p] = account;
    return reinterpret_cast<EOS_ContinuanceToken>(const_cast<void*>(p));
}

bool known_continuance(const void* p) {
    for (auto& obj : sessions().continuance_objs)
        if (obj.get() == p) return true;
    return false;
}

}  // namespace

EOS_DECLARE_FUNC(void) EOS_Connect_Login(EOS_HConnect Handle, const EOS_Connect_LoginOptions* Options, void* ClientData,
                                         const EOS_Connect_OnLoginCallback CompletionDelegate) {
    Op op("EOS_Connect_Login", Handle, Iface::Connect, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    std::string token;
    if (Options == nullptr) {
        pre = op.invalid(kConnect, "EOS_Connect_LoginOptions: null");
    } else {
        const EOS_Connect_Credentials* c = Options->Credentials;
        json o = {{"ApiVersion", Options->ApiVersion}};
        o["Credentials"] = c ? json({{"ApiVersion", c->ApiVersion},
                                     {"Token", str_json(c->Token)},
                                     {"Type", static_cast<int32_t>(c->Type)}})
                             : json(nullptr);
        o["UserLoginInfo"] = Options->UserLoginInfo
                                 ? json({{"ApiVersion", Options->UserLoginInfo->ApiVersion},
                                         {"DisplayName", str_json(Options->UserLoginInfo->DisplayName)}})
                                 : json(nullptr);
        op.options(o);
        if (!version_ok(Options->ApiVersion, EOS_CONNECT_LOGIN_API_LATEST)) {
            pre = op.invalid(kConnect, "EOS_Connect_LoginOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if (c == nullptr) {
            pre = op.invalid(kConnect, "EOS_Connect_LoginOptions.Credentials: null");
        } else if (!version_ok(c->ApiVersion, EOS_CONNECT_CREDENTIALS_API_LATEST)) {
            pre = op.invalid(kConnect, "EOS_Connect_Credentials.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if (c->Token == nullptr || c->Token[0] == '\0') {
            pre = op.invalid(kConnect, "EOS_Connect_Credentials.Token: empty");
        } else if (!epic_token_type(c->Type)) {
            log(kConnect, EOS_ELogLevel::EOS_LOG_Error, "EOS_Connect_Login: only Epic tokens are simulated");
            pre = EOS_EResult::EOS_Connect_UnsupportedTokenType;
        } else if (Options->UserLoginInfo != nullptr) {
            pre = op.invalid(kConnect, "EOS_Connect_LoginOptions.UserLoginInfo reason: cannot be set");
        } else {
            token = c->Token;
        }
    }
    start_async<EOS_Connect_LoginCallbackInfo>(
        op, CompletionDelegate, pre,
        [token](EOS_Connect_LoginCallbackInfo& info, Keep& k) -> EOS_EResult {
            info.LocalUserId = k.id("LocalUserId", EOS_ProductUserId{});
            auto& s = sessions();
            auto owner = s.token_owner.find(token);
            Account* a = owner == s.token_owner.end() ? nullptr : account_by_name(owner->second);
            if (a == nullptr) {
                log(kConnect, EOS_ELogLevel::EOS_LOG_Warning, "Login failed: access token not recognised");
                return EOS_EResult::EOS_InvalidAuth;
            }
            if (!a->has_connect_user) {
                info.ContinuanceToken = new_continuance(a->name);
                k.out["ContinuanceToken"] = true;
                log(kConnect, EOS_ELogLevel::EOS_LOG_Info, "No product user for this account yet");
                return EOS_EResult::EOS_InvalidUser;
            }
            s.connect.insert(a->name);
            info.LocalUserId = k.id("LocalUserId", intern_product(a->product_user_id));
            log(kConnect, EOS_ELogLevel::EOS_LOG_Info, "Login succeeded: product user " + a->product_user_id);
            return EOS_EResult::EOS_Success;
        },
        [](EOS_Connect_LoginCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", EOS_ProductUserId{});
        });
}

EOS_DECLARE_FUNC(void) EOS_Connect_CreateUser(EOS_HConnect Handle, const EOS_Connect_CreateUserOptions* Options,
                                              void* ClientData,
                                              const EOS_Connect_OnCreateUserCallback CompletionDelegate) {
    Op op("EOS_Connect_CreateUser", Handle, Iface::Connect, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    const void* token = nullptr;
    if (Options == nullptr) {
        pre = op.invalid(kConnect, "EOS_Connect_CreateUserOptions: null");
    } else {
        op.options({{"ApiVersion", Options->ApiVersion}, {"ContinuanceToken", Options->ContinuanceToken != nullptr}});
        if (!version_ok(Options->ApiVersion, EOS_CONNECT_CREATEUSER_API_LATEST)) {
            pre = op.invalid(kConnect, "EOS_Connect_CreateUserOptions.ApiVersion",
                             EOS_EResult::EOS_IncompatibleVersion);
        } else if (Options->ContinuanceToken == nullptr) {
            pre = op.invalid(kConnect, "EOS_Connect_CreateUserOptions.ContinuanceToken: null");
        } else if (!known_continuance(Options->ContinuanceToken)) {
            fault("EOS_Connect_CreateUser: ContinuanceToken was not issued by EOS_Connect_Login");
            pre = op.invalid(kConnect, "EOS_Connect_CreateUserOptions.ContinuanceToken: invalid");
        } else {
            token = Options->ContinuanceToken;
        }
    }
    start_async<EOS_Connect_CreateUserCallbackInfo>(
        op, CompletionDelegate, pre,
        [token](EOS_Connect_CreateUserCallbackInfo& info, Keep& k) -> EOS_EResult {
            info.LocalUserId = k.id("LocalUserId", EOS_ProductUserId{});
            auto& s = sessions();
            auto it = s.continuance.find(token);
            if (it == s.continuance.end()) return EOS_EResult::EOS_InvalidAuth;   // already used
            Account* a = account_by_name(it->second);
            s.continuance.erase(it);
            if (a == nullptr) return EOS_EResult::EOS_InvalidAuth;
            if (a->has_connect_user) return EOS_EResult::EOS_Connect_UserAlreadyExists;
            a->has_connect_user = true;
            s.connect.insert(a->name);
            info.LocalUserId = k.id("LocalUserId", intern_product(a->product_user_id));
            log(kConnect, EOS_ELogLevel::EOS_LOG_Info, "Product user created: " + a->product_user_id);
            return EOS_EResult::EOS_Success;
        },
        [](EOS_Connect_CreateUserCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", EOS_ProductUserId{});
        });
}

EOS_DECLARE_FUNC(void) EOS_Connect_QueryProductUserIdMappings(
    EOS_HConnect Handle, const EOS_Connect_QueryProductUserIdMappingsOptions* Options, void* ClientData,
    const EOS_Connect_OnQueryProductUserIdMappingsCallback CompletionDelegate) {
    Op op("EOS_Connect_QueryProductUserIdMappings", Handle, Iface::Connect, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    EOS_ProductUserId local = nullptr;
    std::string local_name;
    std::vector<std::string> targets;
    if (Options == nullptr) {
        pre = op.invalid(kConnect, "EOS_Connect_QueryProductUserIdMappingsOptions: null");
    } else {
        local = Options->LocalUserId;
        json ids = nullptr;
        bool bad_id = false;
        if (Options->ProductUserIds) {
            ids = json::array();
            for (uint32_t i = 0; i < Options->ProductUserIdCount && i <= 1024; ++i) {
                std::string text;
                const IdState st = product_text(Options->ProductUserIds[i], &text);
                ids.push_back(id_json(Options->ProductUserIds[i]));
                if (st == IdState::Garbage) fault("EOS_Connect_QueryProductUserIdMappings: ProductUserIds holds a non-id");
                if (st != IdState::Ok) bad_id = true;
                targets.push_back(text);
            }
        }
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(local)},
                    {"AccountIdType_DEPRECATED", static_cast<int32_t>(Options->AccountIdType_DEPRECATED)},
                    {"ProductUserIds", ids},
                    {"ProductUserIdCount", Options->ProductUserIdCount}});
        Account* a = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_CONNECT_QUERYPRODUCTUSERIDMAPPINGS_API_LATEST)) {
            pre = op.invalid(kConnect, "EOS_Connect_QueryProductUserIdMappingsOptions.ApiVersion",
                             EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = connect_user(op, local, &a, kConnect, "LocalUserId")) != EOS_EResult::EOS_Success) {
        } else if (Options->ProductUserIds == nullptr || Options->ProductUserIdCount == 0 ||
                   Options->ProductUserIdCount > EOS_CONNECT_QUERYEXTERNALACCOUNTMAPPINGS_MAX_ACCOUNT_IDS) {
            pre = op.invalid(kConnect, "ProductUserIds / ProductUserIdCount");
        } else if (bad_id) {
            pre = op.invalid(kConnect, "ProductUserIds: null or invalid entry");
        } else {
            local_name = a->name;
        }
    }
    start_async<EOS_Connect_QueryProductUserIdMappingsCallbackInfo>(
        op, CompletionDelegate, pre,
        [local, local_name, targets](EOS_Connect_QueryProductUserIdMappingsCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
            // Unknown ids are not an error: they simply get no mapping.
            for (const auto& t : targets)
                if (Account* a = account_by_product(t)) sessions().mappings[local_name].insert(a->name);
            return EOS_EResult::EOS_Success;
        },
        [local](EOS_Connect_QueryProductUserIdMappingsCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
        });
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_Connect_GetProductUserIdMapping(EOS_HConnect Handle,
                                                                  const EOS_Connect_GetProductUserIdMappingOptions* Options,
                                                                  char* OutBuffer, int32_t* InOutBufferLength) {
    Op op("EOS_Connect_GetProductUserIdMapping", Handle, Iface::Connect);
    if (Options)
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(Options->LocalUserId)},
                    {"AccountIdType", static_cast<int32_t>(Options->AccountIdType)},
                    {"TargetProductUserId", id_json(Options->TargetProductUserId)},
                    {"InOutBufferLength", InOutBufferLength ? json(*InOutBufferLength) : json(nullptr)}});
    if (!op.ok()) return EOS_EResult::EOS_InvalidParameters;
    if (Options == nullptr) return op.ret(op.invalid(kConnect, "EOS_Connect_GetProductUserIdMappingOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_CONNECT_GETPRODUCTUSERIDMAPPING_API_LATEST))
        return op.ret(op.invalid(kConnect, "EOS_Connect_GetProductUserIdMappingOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    if (OutBuffer == nullptr || InOutBufferLength == nullptr)
        return op.ret(op.invalid(kConnect, "OutBuffer / InOutBufferLength: null"));
    Account* local = nullptr;
    EOS_EResult r = connect_user(op, Options->LocalUserId, &local, kConnect, "LocalUserId");
    if (r != EOS_EResult::EOS_Success) return op.ret(r);
    std::string target_text;
    const IdState ts = product_text(Options->TargetProductUserId, &target_text);
    if (ts == IdState::Null) return op.ret(op.invalid(kConnect, "TargetProductUserId: null"));
    if (ts == IdState::Garbage) {
        fault("EOS_Connect_GetProductUserIdMapping: TargetProductUserId is not an id handle");
        return op.ret(op.invalid(kConnect, "TargetProductUserId: invalid handle"));
    }
    Account* target = account_by_product(target_text);
    // Only Epic accounts exist in the simulated world.
    if (Options->AccountIdType != EOS_EExternalAccountType::EOS_EAT_EPIC || target == nullptr ||
        !sessions().mappings[local->name].count(target->name))
        return op.ret(EOS_EResult::EOS_NotFound);
    if (auto inj = op.injected()) return op.ret(inj->code);
    const std::string& text = target->epic_id;
    const int32_t need = static_cast<int32_t>(text.size()) + 1;
    if (*InOutBufferLength < need) {
        *InOutBufferLength = need;
        op.output({{"InOutBufferLength", need}});
        return op.ret(EOS_EResult::EOS_LimitExceeded);
    }
    std::memcpy(OutBuffer, text.c_str(), static_cast<size_t>(need));
    *InOutBufferLength = need;
    op.output({{"InOutBufferLength", need}, {"OutBuffer", text}});
    return op.ret(EOS_EResult::EOS_Success);
}
