// Connect: external account mappings (Epic account id -> product user id).
// Cached per local account in Sessions::mappings, by the target account's name.
#include "sim_internal.h"

using namespace eos_sim::sim;
using eos_sim::Account;

namespace {

const auto kConnect = EOS_ELogCategory::EOS_LC_Connect;

bool known_account_type(EOS_EExternalAccountType t) {
    const int v = static_cast<int>(t);
    return v >= static_cast<int>(EOS_EExternalAccountType::EOS_EAT_EPIC) &&
           v <= static_cast<int>(EOS_EExternalAccountType::EOS_EAT_AMAZON);
}

}  // namespace

EOS_DECLARE_FUNC(void) EOS_Connect_QueryExternalAccountMappings(
    EOS_HConnect Handle, const EOS_Connect_QueryExternalAccountMappingsOptions* Options, void* ClientData,
    const EOS_Connect_OnQueryExternalAccountMappingsCallback CompletionDelegate) {
    Op op("EOS_Connect_QueryExternalAccountMappings", Handle, Iface::Connect, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    EOS_ProductUserId local = nullptr;
    std::string local_name;
    std::vector<std::string> ids;
    bool epic = false;
    if (Options == nullptr) {
        pre = op.invalid(kConnect, "EOS_Connect_QueryExternalAccountMappingsOptions: null");
    } else {
        local = Options->LocalUserId;
        const uint32_t count = Options->ExternalAccountIdCount;
        const bool readable = Options->ExternalAccountIds != nullptr &&
                              count <= EOS_CONNECT_QUERYEXTERNALACCOUNTMAPPINGS_MAX_ACCOUNT_IDS;
        json list = nullptr;
        bool null_entry = false;
        if (readable) {
            // The SDK reads the list during the call; the caller may free it right after.
            list = json::array();
            for (uint32_t i = 0; i < count; ++i) {
                const char* s = Options->ExternalAccountIds[i];
                list.push_back(str_json(s));
                if (s == nullptr || s[0] == '\0')
                    null_entry = true;
                else
                    ids.emplace_back(s);
            }
        }
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(local)},
                    {"AccountIdType", static_cast<int32_t>(Options->AccountIdType)},
                    {"ExternalAccountIds", list},
                    {"ExternalAccountIdCount", count}});
        Account* a = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_CONNECT_QUERYEXTERNALACCOUNTMAPPINGS_API_LATEST)) {
            pre = op.invalid(kConnect, "EOS_Connect_QueryExternalAccountMappingsOptions.ApiVersion",
                             EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = connect_user(op, local, &a, kConnect, "LocalUserId")) != EOS_EResult::EOS_Success) {
        } else if (!known_account_type(Options->AccountIdType)) {
            pre = op.invalid(kConnect, "AccountIdType: unknown");
        } else if (count > EOS_CONNECT_QUERYEXTERNALACCOUNTMAPPINGS_MAX_ACCOUNT_IDS) {
            pre = op.invalid(kConnect, "ExternalAccountIdCount: more than " +
                                           std::to_string(EOS_CONNECT_QUERYEXTERNALACCOUNTMAPPINGS_MAX_ACCOUNT_IDS));
        } else if (count > 0 && Options->ExternalAccountIds == nullptr) {
            pre = op.invalid(kConnect, "ExternalAccountIds: null with a non-zero count");
        } else if (null_entry) {
            pre = op.invalid(kConnect, "ExternalAccountIds: null or empty entry");
        } else {
            // An empty list is a valid query that finds nothing.
            local_name = a->name;
            epic = Options->AccountIdType == EOS_EExternalAccountType::EOS_EAT_EPIC;
        }
    }
    start_async<EOS_Connect_QueryExternalAccountMappingsCallbackInfo>(
        op, CompletionDelegate, pre,
        [local, local_name, ids, epic](EOS_Connect_QueryExternalAccountMappingsCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
            if (!sessions().connect.count(local_name)) return EOS_EResult::EOS_InvalidUser;
            // Only Epic accounts exist in the simulated world: other types find nothing, which
            // is still a successful query. Accounts without a Connect user have no mapping.
            json found = json::object();
            auto& cached = sessions().mappings[local_name];
            for (const auto& text : ids) {
                Account* t = epic ? account_by_epic(text) : nullptr;
                if (t == nullptr || !t->has_connect_user) continue;
                cached.insert(t->name);
                found[text] = t->product_user_id;
            }
            k.out["Mappings"] = found;
            return EOS_EResult::EOS_Success;
        },
        [local](EOS_Connect_QueryExternalAccountMappingsCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
        });
}

EOS_DECLARE_FUNC(EOS_ProductUserId) EOS_Connect_GetExternalAccountMapping(
    EOS_HConnect Handle, const EOS_Connect_GetExternalAccountMappingsOptions* Options) {
    Op op("EOS_Connect_GetExternalAccountMapping", Handle, Iface::Connect);
    if (Options)
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(Options->LocalUserId)},
                    {"AccountIdType", static_cast<int32_t>(Options->AccountIdType)},
                    {"TargetExternalUserId", str_json(Options->TargetExternalUserId)}});
    auto none = [&op]() -> EOS_ProductUserId {
        op.output({{"ProductUserId", nullptr}});
        return nullptr;
    };
    if (!op.ok()) return nullptr;
    if (Options == nullptr) {
        op.invalid(kConnect, "EOS_Connect_GetExternalAccountMappingsOptions: null");
        return none();
    }
    if (!version_ok(Options->ApiVersion, EOS_CONNECT_GETEXTERNALACCOUNTMAPPING_API_LATEST)) {
        op.invalid(kConnect, "EOS_Connect_GetExternalAccountMappingsOptions.ApiVersion",
                   EOS_EResult::EOS_IncompatibleVersion);
        return none();
    }
    Account* local = nullptr;
    if (connect_user(op, Options->LocalUserId, &local, kConnect, "LocalUserId") != EOS_EResult::EOS_Success)
        return none();
    if (Options->TargetExternalUserId == nullptr) {
        op.invalid(kConnect, "TargetExternalUserId: null");
        return none();
    }
    if (Options->AccountIdType != EOS_EExternalAccountType::EOS_EAT_EPIC) return none();
    Account* target = account_by_epic(Options->TargetExternalUserId);
    const auto& cached = sessions().mappings[local->name];
    if (target == nullptr || !cached.count(target->name) || !target->has_connect_user) return none();
    if (op.injected()) return none();
    op.output({{"ProductUserId", target->product_user_id}});
    return intern_product(target->product_user_id);
}
