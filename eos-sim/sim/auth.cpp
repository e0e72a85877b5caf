// Auth (login, user auth tokens) and UserInfo (profile queries and copies).
#include <cstring>

#include "sim_internal.h"

using namespace eos_sim::sim;
using eos_sim::Account;

namespace {

const auto kAuth = EOS_ELogCategory::EOS_LC_Auth;
const auto kUserInfo = EOS_ELogCategory::EOS_LC_UserInfo;

bool present(const char* s) { return s != nullptr && s[0] != '\0'; }

// Which of Id and Token a credential type needs; an unused one must be absent.
enum class Need { Required, Optional, Absent };

struct CredentialRule {
    Need id;
    Need token;
};

CredentialRule rule_for(EOS_ELoginCredentialType type) {
    switch (type) {
        case EOS_ELoginCredentialType::EOS_LCT_Password: return {Need::Required, Need::Required};
        case EOS_ELoginCredentialType::EOS_LCT_ExchangeCode: return {Need::Absent, Need::Required};
        case EOS_ELoginCredentialType::EOS_LCT_PersistentAuth: return {Need::Absent, Need::Optional};
        case EOS_ELoginCredentialType::EOS_LCT_DeviceCode: return {Need::Optional, Need::Optional};
        case EOS_ELoginCredentialType::EOS_LCT_Developer: return {Need::Required, Need::Required};
        case EOS_ELoginCredentialType::EOS_LCT_RefreshToken: return {Need::Absent, Need::Required};
        case EOS_ELoginCredentialType::EOS_LCT_AccountPortal: return {Need::Optional, Need::Optional};
        case EOS_ELoginCredentialType::EOS_LCT_ExternalAuth: return {Need::Optional, Need::Required};
    }
    return {Need::Optional, Need::Optional};
}

bool meets(Need need, const char* s) {
    switch (need) {
        case Need::Required: return present(s);
        case Need::Absent: return !present(s);
        default: return true;
    }
}

bool valid_login_type(EOS_ELoginCredentialType t) {
    const int v = static_cast<int>(t);
    return v >= 0 && v <= static_cast<int>(EOS_ELoginCredentialType::EOS_LCT_ExternalAuth);
}

// "host:port" of the developer authentication tool.
bool host_port(const char* s) {
    const char* colon = std::strrchr(s, ':');
    if (colon == nullptr || colon == s || colon[1] == '\0') return false;
    for (const char* p = colon + 1; *p; ++p)
        if (*p < '0' || *p > '9') return false;
    return true;
}

struct TokenCopy {
    EOS_Auth_Token token{};
    std::string app, client_id, access, expires_at, refresh, refresh_expires_at;
};

struct UserInfoCopy {
    EOS_UserInfo info{};
    std::string display_name, country, language;
};

}  // namespace

EOS_DECLARE_FUNC(void) EOS_Auth_Login(EOS_HAuth Handle, const EOS_Auth_LoginOptions* Options, void* ClientData,
                                      const EOS_Auth_OnLoginCallback CompletionDelegate) {
    Op op("EOS_Auth_Login", Handle, Iface::Auth, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    std::string token;
    auto type = EOS_ELoginCredentialType::EOS_LCT_Password;
    if (Options == nullptr) {
        pre = op.invalid(kAuth, "EOS_Auth_LoginOptions: null");
    } else {
        json o = {{"ApiVersion", Options->ApiVersion}, {"ScopeFlags", static_cast<int32_t>(Options->ScopeFlags)}};
        o["LoginFlags"] = Options->ApiVersion >= 3 ? json(Options->LoginFlags) : json(nullptr);
        const EOS_Auth_Credentials* c = Options->Credentials;
        if (c) {
            o["Credentials"] = {{"ApiVersion", c->ApiVersion},
                                {"Id", str_json(c->Id)},
                                {"Token", str_json(c->Token)},
                                {"Type", static_cast<int32_t>(c->Type)},
                                {"SystemAuthCredentialsOptions", c->SystemAuthCredentialsOptions != nullptr},
                                {"ExternalType", static_cast<int32_t>(c->ExternalType)}};
        } else {
            o["Credentials"] = nullptr;
        }
        op.options(o);
        if (!version_ok(Options->ApiVersion, EOS_AUTH_LOGIN_API_LATEST, {2})) {
            pre = op.invalid(kAuth, "EOS_Auth_LoginOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if (c == nullptr) {
            pre = op.invalid(kAuth, "EOS_Auth_LoginOptions.Credentials: null");
        } else if (!version_ok(c->ApiVersion, EOS_AUTH_CREDENTIALS_API_LATEST, {3})) {
            pre = op.invalid(kAuth, "EOS_Auth_Credentials.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if (!valid_login_type(c->Type)) {
            pre = op.invalid(kAuth, "EOS_Auth_Credentials.Type");
        } else if (!meets(rule_for(c->Type).id, c->Id)) {
            pre = op.invalid(kAuth, "EOS_Auth_Credentials.Id");
        } else if (!meets(rule_for(c->Type).token, c->Token)) {
            pre = op.invalid(kAuth, "EOS_Auth_Credentials.Token");
        } else if (c->Type == EOS_ELoginCredentialType::EOS_LCT_Developer && !host_port(c->Id)) {
            pre = op.invalid(kAuth, "EOS_Auth_Credentials.Id: expected host:port of the developer tool");
        } else {
            type = c->Type;
            token = c->Token ? c->Token : "";
        }
    }
    // The account a non-Developer login signs in is the one chosen when the login starts.
    const std::string chosen = sessions().login_account.empty() ? world().local_account : sessions().login_account;
    start_async<EOS_Auth_LoginCallbackInfo>(
        op, CompletionDelegate, pre,
        [type, token, chosen](EOS_Auth_LoginCallbackInfo& info, Keep& k) -> EOS_EResult {
            Account* a = nullptr;
            if (type == EOS_ELoginCredentialType::EOS_LCT_Developer) {
                for (auto& acc : world().accounts)
                    if (acc.credential == token) a = &acc;
            } else {
                a = account_by_name(chosen);
            }
            if (a == nullptr) {
                log(kAuth, EOS_ELogLevel::EOS_LOG_Warning, "Login failed: no account for these credentials");
                info.LocalUserId = k.id("LocalUserId", EOS_EpicAccountId{});
                return EOS_EResult::EOS_InvalidCredentials;
            }
            auto& s = sessions();
            s.auth.insert(a->name);
            s.user_info[a->name].insert(a->name);
            issue_token(*a);
            EOS_EpicAccountId uid = intern_epic(a->epic_id);
            info.LocalUserId = k.id("LocalUserId", uid);
            info.SelectedAccountId = k.id("SelectedAccountId", uid);
            log(kAuth, EOS_ELogLevel::EOS_LOG_Info, "Login succeeded: account " + a->epic_id);
            return EOS_EResult::EOS_Success;
        },
        [](EOS_Auth_LoginCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", EOS_EpicAccountId{});
            log(kAuth, EOS_ELogLevel::EOS_LOG_Warning, "Login failed");
        });
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_Auth_CopyUserAuthToken(EOS_HAuth Handle,
                                                         const EOS_Auth_CopyUserAuthTokenOptions* Options,
                                                         EOS_EpicAccountId LocalUserId,
                                                         EOS_Auth_Token** OutUserAuthToken) {
    Op op("EOS_Auth_CopyUserAuthToken", Handle, Iface::Auth);
    op.options({{"ApiVersion", Options ? json(Options->ApiVersion) : json(nullptr)},
                {"LocalUserId", id_json(LocalUserId)}});
    if (OutUserAuthToken) *OutUserAuthToken = nullptr;
    if (!op.ok()) return EOS_EResult::EOS_InvalidParameters;
    if (OutUserAuthToken == nullptr) return op.ret(op.invalid(kAuth, "OutUserAuthToken: null"));
    if (Options == nullptr) return op.ret(op.invalid(kAuth, "EOS_Auth_CopyUserAuthTokenOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_AUTH_COPYUSERAUTHTOKEN_API_LATEST))
        return op.ret(op.invalid(kAuth, "EOS_Auth_CopyUserAuthTokenOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    Account* a = nullptr;
    EOS_EResult r = auth_user(op, LocalUserId, &a, kAuth, "LocalUserId");
    // A user without a live session simply has no token.
    if (r == EOS_EResult::EOS_InvalidUser) return op.ret(EOS_EResult::EOS_NotFound);
    if (r != EOS_EResult::EOS_Success) return op.ret(r);
    if (auto inj = op.injected()) return op.ret(inj->code);
    auto it = sessions().auth_token.find(a->name);
    if (it == sessions().auth_token.end()) return op.ret(EOS_EResult::EOS_NotFound);

    auto* c = new TokenCopy;
    c->app = "tarnwick-sim";
    c->client_id = op.platform()->client_id;
    c->access = it->second;
    c->expires_at = "2099-01-01T00:00:00.000Z";
    c->refresh = "refresh-" + it->second;
    c->refresh_expires_at = "2099-01-01T00:00:00.000Z";
    EOS_Auth_Token& t = c->token;
    t.ApiVersion = EOS_AUTH_TOKEN_API_LATEST;
    t.App = c->app.c_str();
    t.ClientId = c->client_id.c_str();
    t.AccountId = intern_epic(a->epic_id);
    t.AccessToken = c->access.c_str();
    t.ExpiresIn = 7200.0;
    t.ExpiresAt = c->expires_at.c_str();
    t.AuthType = EOS_EAuthTokenType::EOS_ATT_User;
    t.RefreshToken = c->refresh.c_str();
    t.RefreshExpiresIn = 28800.0;
    t.RefreshExpiresAt = c->refresh_expires_at.c_str();
    track_copy("EOS_Auth_Token", op.platform(), &c->token, c, [c]() { delete c; });
    *OutUserAuthToken = &c->token;
    op.output({{"AccessToken", c->access}, {"AccountId", a->epic_id}});
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(void) EOS_Auth_Token_Release(EOS_Auth_Token* AuthToken) {
    Op op("EOS_Auth_Token_Release");
    release_copy("EOS_Auth_Token_Release", "EOS_Auth_Token", AuthToken);
}

// ---- UserInfo -------------------------------------------------------------------------------

EOS_DECLARE_FUNC(void) EOS_UserInfo_QueryUserInfo(EOS_HUserInfo Handle, const EOS_UserInfo_QueryUserInfoOptions* Options,
                                                  void* ClientData,
                                                  const EOS_UserInfo_OnQueryUserInfoCallback CompletionDelegate) {
    Op op("EOS_UserInfo_QueryUserInfo", Handle, Iface::UserInfo, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    EOS_EpicAccountId local = nullptr, target = nullptr;
    std::string local_name, target_text;
    if (Options == nullptr) {
        pre = op.invalid(kUserInfo, "EOS_UserInfo_QueryUserInfoOptions: null");
    } else {
        local = Options->LocalUserId;
        target = Options->TargetUserId;
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(local)},
                    {"TargetUserId", id_json(target)}});
        Account* a = nullptr;
        const IdState ts = epic_text(target, &target_text);
        if (!version_ok(Options->ApiVersion, EOS_USERINFO_QUERYUSERINFO_API_LATEST)) {
            pre = op.invalid(kUserInfo, "EOS_UserInfo_QueryUserInfoOptions.ApiVersion",
                             EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = auth_user(op, local, &a, kUserInfo, "LocalUserId")) != EOS_EResult::EOS_Success) {
        } else if (ts == IdState::Null) {
            pre = op.invalid(kUserInfo, "TargetUserId: null");
        } else if (ts == IdState::Garbage) {
            fault("EOS_UserInfo_QueryUserInfo: TargetUserId is not an id handle");
            pre = op.invalid(kUserInfo, "TargetUserId: invalid handle");
        } else {
            local_name = a->name;
        }
    }
    start_async<EOS_UserInfo_QueryUserInfoCallbackInfo>(
        op, CompletionDelegate, pre,
        [local, target, local_name, target_text](EOS_UserInfo_QueryUserInfoCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
            info.TargetUserId = k.id("TargetUserId", target);
            if (!sessions().auth.count(local_name)) return EOS_EResult::EOS_InvalidUser;
            Account* t = account_by_epic(target_text);
            if (t == nullptr) return EOS_EResult::EOS_NotFound;
            sessions().user_info[local_name].insert(t->name);
            return EOS_EResult::EOS_Success;
        },
        [local, target](EOS_UserInfo_QueryUserInfoCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
            info.TargetUserId = k.id("TargetUserId", target);
        });
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_UserInfo_CopyUserInfo(EOS_HUserInfo Handle,
                                                        const EOS_UserInfo_CopyUserInfoOptions* Options,
                                                        EOS_UserInfo** OutUserInfo) {
    Op op("EOS_UserInfo_CopyUserInfo", Handle, Iface::UserInfo);
    if (Options)
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(Options->LocalUserId)},
                    {"TargetUserId", id_json(Options->TargetUserId)}});
    if (OutUserInfo) *OutUserInfo = nullptr;
    if (!op.ok()) return EOS_EResult::EOS_InvalidParameters;
    if (OutUserInfo == nullptr) return op.ret(op.invalid(kUserInfo, "OutUserInfo: null"));
    if (Options == nullptr) return op.ret(op.invalid(kUserInfo, "EOS_UserInfo_CopyUserInfoOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_USERINFO_COPYUSERINFO_API_LATEST, {2}))
        return op.ret(op.invalid(kUserInfo, "EOS_UserInfo_CopyUserInfoOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    Account* local = nullptr;
    EOS_EResult r = auth_user(op, Options->LocalUserId, &local, kUserInfo, "LocalUserId");
    if (r != EOS_EResult::EOS_Success) return op.ret(r);
    std::string target_text;
    const IdState ts = epic_text(Options->TargetUserId, &target_text);
    if (ts == IdState::Null) return op.ret(op.invalid(kUserInfo, "TargetUserId: null"));
    if (ts == IdState::Garbage) {
        fault("EOS_UserInfo_CopyUserInfo: TargetUserId is not an id handle");
        return op.ret(op.invalid(kUserInfo, "TargetUserId: invalid handle"));
    }
    Account* target = account_by_epic(target_text);
    if (target == nullptr || !sessions().user_info[local->name].count(target->name))
        return op.ret(EOS_EResult::EOS_NotFound);
    if (auto inj = op.injected()) return op.ret(inj->code);

    auto* c = new UserInfoCopy;
    EOS_UserInfo& u = c->info;
    u.ApiVersion = EOS_USERINFO_COPYUSERINFO_API_LATEST;
    u.UserId = intern_epic(target->epic_id);
    if (target->display_name) {
        c->display_name = *target->display_name;
        u.DisplayName = c->display_name.c_str();
        u.DisplayNameSanitized = c->display_name.c_str();
    }
    track_copy("EOS_UserInfo", op.platform(), &c->info, c, [c]() { delete c; });
    *OutUserInfo = &c->info;
    op.output({{"UserId", target->epic_id},
               {"DisplayName", target->display_name ? json(*target->display_name) : json(nullptr)}});
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(void) EOS_UserInfo_Release(EOS_UserInfo* UserInfo) {
    Op op("EOS_UserInfo_Release");
    release_copy("EOS_UserInfo_Release", "EOS_UserInfo", UserInfo);
}
