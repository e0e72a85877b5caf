// Friends: the friend-list query and the getters over its cached result.
#include "sim_internal.h"

using namespace eos_sim::sim;
using eos_sim::Account;
using eos_sim::FriendEntry;

namespace {

const auto kFriends = EOS_ELogCategory::EOS_LC_Friends;

// Epic id text of a friend entry. An entry naming an account the world does not model still
// gets the id that account would have, so it behaves like a stranger unknown to the services.
std::string friend_epic_id(const FriendEntry& f) {
    if (Account* a = account_by_name(f.account)) return a->epic_id;
    return eos_sim::derive_id("epic:" + f.account);
}

// The cached friend list of a getter's LocalUserId, or null; *usable is false for a null or
// foreign handle (the options are invalid then, so not even a forced count is reported).
const std::vector<FriendEntry>* cached_list(Op& op, EOS_EpicAccountId local, bool* usable) {
    Account* a = nullptr;
    const EOS_EResult r = auth_user(op, local, &a, kFriends, "LocalUserId");
    *usable = r != EOS_EResult::EOS_InvalidParameters;
    if (r != EOS_EResult::EOS_Success) return nullptr;
    auto& cache = sessions().services.friends;
    auto it = cache.find(a->name);
    return it == cache.end() ? nullptr : &it->second;
}

}  // namespace

EOS_DECLARE_FUNC(void) EOS_Friends_QueryFriends(EOS_HFriends Handle, const EOS_Friends_QueryFriendsOptions* Options,
                                                void* ClientData,
                                                const EOS_Friends_OnQueryFriendsCallback CompletionDelegate) {
    Op op("EOS_Friends_QueryFriends", Handle, Iface::Friends, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    EOS_EpicAccountId local = nullptr;
    std::string local_name;
    if (Options == nullptr) {
        pre = op.invalid(kFriends, "EOS_Friends_QueryFriendsOptions: null");
    } else {
        local = Options->LocalUserId;
        op.options({{"ApiVersion", Options->ApiVersion}, {"LocalUserId", id_json(local)}});
        Account* a = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_FRIENDS_QUERYFRIENDS_API_LATEST)) {
            pre = op.invalid(kFriends, "EOS_Friends_QueryFriendsOptions.ApiVersion",
                             EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = auth_user(op, local, &a, kFriends, "LocalUserId")) == EOS_EResult::EOS_Success) {
            local_name = a->name;
        }
    }
    start_async<EOS_Friends_QueryFriendsCallbackInfo>(
        op, CompletionDelegate, pre,
        [local, local_name](EOS_Friends_QueryFriendsCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
            Account* a = account_by_name(local_name);
            if (a == nullptr || !sessions().auth.count(local_name)) return EOS_EResult::EOS_InvalidUser;
            // The list as the server has it now; later world changes need a new query.
            sessions().services.friends[local_name] = a->friends;
            json friends = json::array();
            for (const auto& f : a->friends) friends.push_back(f.invalid ? json(nullptr) : json(friend_epic_id(f)));
            k.out["Friends"] = friends;
            return EOS_EResult::EOS_Success;
        },
        [local](EOS_Friends_QueryFriendsCallbackInfo& info, Keep& k) { info.LocalUserId = k.id("LocalUserId", local); });
}

EOS_DECLARE_FUNC(int32_t) EOS_Friends_GetFriendsCount(EOS_HFriends Handle,
                                                      const EOS_Friends_GetFriendsCountOptions* Options) {
    Op op("EOS_Friends_GetFriendsCount", Handle, Iface::Friends);
    if (Options)
        op.options({{"ApiVersion", Options->ApiVersion}, {"LocalUserId", id_json(Options->LocalUserId)}});
    if (!op.ok()) return 0;
    if (Options == nullptr) {
        op.invalid(kFriends, "EOS_Friends_GetFriendsCountOptions: null");
        return 0;
    }
    if (!version_ok(Options->ApiVersion, EOS_FRIENDS_GETFRIENDSCOUNT_API_LATEST)) {
        op.invalid(kFriends, "EOS_Friends_GetFriendsCountOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        return 0;
    }
    bool usable = false;
    const auto* list = cached_list(op, Options->LocalUserId, &usable);
    if (!usable) return 0;
    int32_t count = list ? static_cast<int32_t>(list->size()) : 0;
    if (auto forced = sessions().services.forced_friends_count) count = *forced;
    op.output({{"Count", count}});
    return count;
}

EOS_DECLARE_FUNC(EOS_EpicAccountId) EOS_Friends_GetFriendAtIndex(EOS_HFriends Handle,
                                                                 const EOS_Friends_GetFriendAtIndexOptions* Options) {
    Op op("EOS_Friends_GetFriendAtIndex", Handle, Iface::Friends);
    if (Options)
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(Options->LocalUserId)},
                    {"Index", Options->Index}});
    if (!op.ok()) return nullptr;
    if (Options == nullptr) {
        op.invalid(kFriends, "EOS_Friends_GetFriendAtIndexOptions: null");
        return nullptr;
    }
    if (!version_ok(Options->ApiVersion, EOS_FRIENDS_GETFRIENDATINDEX_API_LATEST)) {
        op.invalid(kFriends, "EOS_Friends_GetFriendAtIndexOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        return nullptr;
    }
    bool usable = false;
    const auto* list = cached_list(op, Options->LocalUserId, &usable);
    const int32_t i = Options->Index;
    if (list == nullptr || i < 0 || static_cast<size_t>(i) >= list->size()) {
        op.output({{"FriendUserId", nullptr}});
        return nullptr;
    }
    if (op.injected()) {
        op.output({{"FriendUserId", nullptr}});
        return nullptr;
    }
    const FriendEntry& f = (*list)[static_cast<size_t>(i)];
    if (f.invalid) {
        op.output({{"FriendUserId", nullptr}});
        return nullptr;
    }
    const std::string text = friend_epic_id(f);
    op.output({{"FriendUserId", text}});
    return intern_epic(text);
}

// ---- controls -------------------------------------------------------------------------------

namespace eos_sim {

void force_friends_count(std::optional<int32_t> count) { sim::sessions().services.forced_friends_count = count; }

}  // namespace eos_sim
