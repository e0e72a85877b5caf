// Presence: queries of another user's presence and copies of the cached result.
#include "sim_internal.h"

using namespace eos_sim::sim;
using eos_sim::Account;
using eos_sim::Presence;

namespace {

const auto kPresence = EOS_ELogCategory::EOS_LC_Presence;

struct PresenceCopy {
    EOS_Presence_Info info{};
    std::string product_id, product_version, platform, product_name;
};

// Checks a TargetUserId handle: null -> EOS_InvalidParameters, not one of ours -> fault too.
EOS_EResult target_id(Op& op, EOS_EpicAccountId id, std::string* text) {
    const IdState state = epic_text(id, text);
    if (state == IdState::Null) return op.invalid(kPresence, "TargetUserId: null");
    if (state == IdState::Garbage) {
        fault(std::string(op.function()) + ": TargetUserId is not an id handle");
        return op.invalid(kPresence, "TargetUserId: invalid handle");
    }
    return EOS_EResult::EOS_Success;
}

// The product id a presence names, as the copy reports it (kThisProduct = the platform's own).
std::optional<std::string> product_of(const Presence& p, const Platform* platform) {
    if (!p.product_id) return std::nullopt;
    if (*p.product_id == eos_sim::kThisProduct) return platform ? platform->product_id : std::string();
    return *p.product_id;
}

}  // namespace

EOS_DECLARE_FUNC(void) EOS_Presence_QueryPresence(EOS_HPresence Handle, const EOS_Presence_QueryPresenceOptions* Options,
                                                  void* ClientData,
                                                  const EOS_Presence_OnQueryPresenceCompleteCallback CompletionDelegate) {
    Op op("EOS_Presence_QueryPresence", Handle, Iface::Presence, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    EOS_EpicAccountId local = nullptr, target = nullptr;
    std::string local_name, target_text;
    if (Options == nullptr) {
        pre = op.invalid(kPresence, "EOS_Presence_QueryPresenceOptions: null");
    } else {
        local = Options->LocalUserId;
        target = Options->TargetUserId;
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(local)},
                    {"TargetUserId", id_json(target)}});
        Account* a = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_PRESENCE_QUERYPRESENCE_API_LATEST)) {
            pre = op.invalid(kPresence, "EOS_Presence_QueryPresenceOptions.ApiVersion",
                             EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = auth_user(op, local, &a, kPresence, "LocalUserId")) != EOS_EResult::EOS_Success) {
        } else if ((pre = target_id(op, target, &target_text)) == EOS_EResult::EOS_Success) {
            local_name = a->name;
        }
    }
    auto ids = [local, target](EOS_Presence_QueryPresenceCallbackInfo& info, Keep& k) {
        info.LocalUserId = k.id("LocalUserId", local);
        info.TargetUserId = k.id("TargetUserId", target);
    };
    start_async<EOS_Presence_QueryPresenceCallbackInfo>(
        op, CompletionDelegate, pre,
        [ids, local_name, target_text](EOS_Presence_QueryPresenceCallbackInfo& info, Keep& k) {
            ids(info, k);
            if (!sessions().auth.count(local_name)) return EOS_EResult::EOS_InvalidUser;
            Account* t = account_by_epic(target_text);
            if (t == nullptr) return EOS_EResult::EOS_NotFound;
            // A snapshot: the copy reports the presence as it was when this query completed.
            sessions().services.presence[local_name][t->name] = t->presence;
            return EOS_EResult::EOS_Success;
        },
        ids);
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_Presence_CopyPresence(EOS_HPresence Handle,
                                                        const EOS_Presence_CopyPresenceOptions* Options,
                                                        EOS_Presence_Info** OutPresence) {
    Op op("EOS_Presence_CopyPresence", Handle, Iface::Presence);
    if (Options)
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(Options->LocalUserId)},
                    {"TargetUserId", id_json(Options->TargetUserId)}});
    if (OutPresence) *OutPresence = nullptr;
    if (!op.ok()) return EOS_EResult::EOS_InvalidParameters;
    if (OutPresence == nullptr) return op.ret(op.invalid(kPresence, "OutPresence: null"));
    if (Options == nullptr) return op.ret(op.invalid(kPresence, "EOS_Presence_CopyPresenceOptions: null"));
    // Version 2 has the same options; its callers get a version 3 record, which only appends.
    if (!version_ok(Options->ApiVersion, EOS_PRESENCE_COPYPRESENCE_API_LATEST, {2}))
        return op.ret(op.invalid(kPresence, "EOS_Presence_CopyPresenceOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    Account* local = nullptr;
    EOS_EResult r = auth_user(op, Options->LocalUserId, &local, kPresence, "LocalUserId");
    if (r != EOS_EResult::EOS_Success) return op.ret(r);
    std::string target_text;
    if ((r = target_id(op, Options->TargetUserId, &target_text)) != EOS_EResult::EOS_Success) return op.ret(r);
    Account* target = account_by_epic(target_text);
    const auto& cache = sessions().services.presence[local->name];
    auto it = target ? cache.find(target->name) : cache.end();
    // Only queried presence can be copied; a user without any presence has nothing to copy either.
    if (it == cache.end() || !it->second) return op.ret(EOS_EResult::EOS_NotFound);
    if (auto inj = op.injected()) return op.ret(inj->code);

    const Presence& p = *it->second;
    auto* c = new PresenceCopy;
    EOS_Presence_Info& info = c->info;
    info.ApiVersion = EOS_PRESENCE_INFO_API_LATEST;
    info.Status = p.status;
    info.UserId = intern_epic(target->epic_id);
    const auto product = product_of(p, op.platform());
    if (product) {
        // Playing something: the fields a real presence of a running game carries.
        c->product_id = *product;
        c->product_version = "1.0.0";
        c->platform = "OTHER";
        c->product_name = *product == op.platform()->product_id ? "This game" : "Another game";
        info.ProductId = c->product_id.c_str();
        info.ProductVersion = c->product_version.c_str();
        info.Platform = c->platform.c_str();
        info.ProductName = c->product_name.c_str();
    }
    track_copy("EOS_Presence_Info", op.platform(), &c->info, c, [c]() { delete c; });
    *OutPresence = &c->info;
    op.output({{"UserId", target->epic_id},
               {"Status", static_cast<int32_t>(p.status)},
               {"ProductId", product ? json(*product) : json(nullptr)}});
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(void) EOS_Presence_Info_Release(EOS_Presence_Info* PresenceInfo) {
    Op op("EOS_Presence_Info_Release");
    release_copy("EOS_Presence_Info_Release", "EOS_Presence_Info", PresenceInfo);
}
