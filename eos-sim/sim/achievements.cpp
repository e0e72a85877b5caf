// Achievements: unlocking, the player-achievement query and copies of its cached result.
// Achievements are per account (Account::achievements); the cache is per target account.
#include <ctime>

#include "sim_internal.h"

using namespace eos_sim::sim;
using eos_sim::Account;
using eos_sim::Achievement;

namespace {

const auto kAchievements = EOS_ELogCategory::EOS_LC_Achievements;

struct AchievementCopy {
    EOS_Achievements_PlayerAchievement info{};
    std::string id, display_name;
};

// A product user id naming the account whose achievements are meant. Unlike a local user it
// need not be signed in here; it must be an id of a known account.
EOS_EResult target_user(Op& op, EOS_ProductUserId id, Account** out, const char* field) {
    *out = nullptr;
    std::string text;
    const IdState state = product_text(id, &text);
    if (state == IdState::Null) return op.invalid(kAchievements, std::string(field) + ": null");
    if (state == IdState::Garbage) {
        fault(std::string(op.function()) + ": " + field + " is not an id handle");
        return op.invalid(kAchievements, std::string(field) + ": invalid handle");
    }
    *out = account_by_product(text);
    return *out ? EOS_EResult::EOS_Success : EOS_EResult::EOS_NotFound;
}

// An optional LocalUserId (null is what a server passes) must be a handle of ours when given.
EOS_EResult optional_local(Op& op, EOS_ProductUserId id) {
    if (id == nullptr) return EOS_EResult::EOS_Success;
    Account* a = nullptr;
    return connect_user(op, id, &a, kAchievements, "LocalUserId");
}

const std::vector<Achievement>* cached(const Account* target) {
    if (target == nullptr) return nullptr;
    auto& cache = sessions().services.achievements;
    auto it = cache.find(target->name);
    return it == cache.end() ? nullptr : &it->second;
}

}  // namespace

EOS_DECLARE_FUNC(void) EOS_Achievements_UnlockAchievements(
    EOS_HAchievements Handle, const EOS_Achievements_UnlockAchievementsOptions* Options, void* ClientData,
    const EOS_Achievements_OnUnlockAchievementsCompleteCallback CompletionDelegate) {
    Op op("EOS_Achievements_UnlockAchievements", Handle, Iface::Achievements, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    EOS_ProductUserId user = nullptr;
    uint32_t count = 0;
    std::string user_name;
    std::vector<std::string> ids;
    if (Options == nullptr) {
        pre = op.invalid(kAchievements, "EOS_Achievements_UnlockAchievementsOptions: null");
    } else {
        user = Options->UserId;
        count = Options->AchievementsCount;
        json list = nullptr;
        bool null_entry = false;
        if (Options->AchievementIds != nullptr) {
            // Read during the call: the caller's strings need not outlive it.
            list = json::array();
            for (uint32_t i = 0; i < count; ++i) {
                const char* s = Options->AchievementIds[i];
                list.push_back(str_json(s));
                if (s == nullptr || s[0] == '\0')
                    null_entry = true;
                else
                    ids.emplace_back(s);
            }
        }
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"UserId", id_json(user)},
                    {"AchievementIds", list},
                    {"AchievementsCount", count}});
        Account* a = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_ACHIEVEMENTS_UNLOCKACHIEVEMENTS_API_LATEST)) {
            pre = op.invalid(kAchievements, "EOS_Achievements_UnlockAchievementsOptions.ApiVersion",
                             EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = connect_user(op, user, &a, kAchievements, "UserId")) != EOS_EResult::EOS_Success) {
        } else if (count == 0 || Options->AchievementIds == nullptr) {
            pre = op.invalid(kAchievements, "AchievementIds: empty");
        } else if (null_entry) {
            pre = op.invalid(kAchievements, "AchievementIds: null or empty entry");
        } else {
            user_name = a->name;
        }
    }
    auto fill = [user, count](EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo& info, Keep& k) {
        info.UserId = k.id("UserId", user);
        info.AchievementsCount = count;
        k.out["AchievementsCount"] = count;
    };
    start_async<EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo>(
        op, CompletionDelegate, pre,
        [fill, user_name, ids](EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo& info, Keep& k) {
            fill(info, k);
            Account* a = account_by_name(user_name);
            if (a == nullptr || !sessions().connect.count(user_name)) return EOS_EResult::EOS_InvalidUser;
            // All or nothing: an id the product does not define fails the whole request with
            // EOS_NotFound (the request was well-formed, the achievement does not exist).
            std::vector<Achievement*> targets;
            for (const auto& id : ids) {
                Achievement* found = nullptr;
                for (auto& ach : a->achievements)
                    if (ach.id == id) found = &ach;
                if (found == nullptr) {
                    log(kAchievements, EOS_ELogLevel::EOS_LOG_Warning,
                        "EOS_Achievements_UnlockAchievements: unknown achievement " + id);
                    k.out["Unknown"] = id;
                    return EOS_EResult::EOS_NotFound;
                }
                targets.push_back(found);
            }
            // An achievement already unlocked keeps its first unlock time.
            const int64_t now = static_cast<int64_t>(std::time(nullptr));
            for (Achievement* ach : targets)
                if (ach->unlock_time == EOS_ACHIEVEMENTS_ACHIEVEMENT_UNLOCKTIME_UNDEFINED) ach->unlock_time = now;
            return EOS_EResult::EOS_Success;
        },
        fill);
}

EOS_DECLARE_FUNC(void) EOS_Achievements_QueryPlayerAchievements(
    EOS_HAchievements Handle, const EOS_Achievements_QueryPlayerAchievementsOptions* Options, void* ClientData,
    const EOS_Achievements_OnQueryPlayerAchievementsCompleteCallback CompletionDelegate) {
    Op op("EOS_Achievements_QueryPlayerAchievements", Handle, Iface::Achievements, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    EOS_ProductUserId target = nullptr;
    std::string target_name;
    if (Options == nullptr) {
        pre = op.invalid(kAchievements, "EOS_Achievements_QueryPlayerAchievementsOptions: null");
    } else {
        target = Options->TargetUserId;
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"TargetUserId", id_json(target)},
                    {"LocalUserId", id_json(Options->LocalUserId)}});
        Account* t = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_ACHIEVEMENTS_QUERYPLAYERACHIEVEMENTS_API_LATEST)) {
            pre = op.invalid(kAchievements, "EOS_Achievements_QueryPlayerAchievementsOptions.ApiVersion",
                             EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = optional_local(op, Options->LocalUserId)) != EOS_EResult::EOS_Success) {
        } else if ((pre = target_user(op, target, &t, "TargetUserId")) == EOS_EResult::EOS_Success) {
            target_name = t->name;
        }
    }
    auto ids = [target](EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo& info, Keep& k) {
        info.UserId = k.id("UserId", target);
    };
    start_async<EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo>(
        op, CompletionDelegate, pre,
        [ids, target_name](EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo& info, Keep& k) {
            ids(info, k);
            Account* t = account_by_name(target_name);
            if (t == nullptr) return EOS_EResult::EOS_NotFound;
            sessions().services.achievements[target_name] = t->achievements;
            k.out["Count"] = t->achievements.size();
            return EOS_EResult::EOS_Success;
        },
        ids);
}

EOS_DECLARE_FUNC(uint32_t) EOS_Achievements_GetPlayerAchievementCount(
    EOS_HAchievements Handle, const EOS_Achievements_GetPlayerAchievementCountOptions* Options) {
    Op op("EOS_Achievements_GetPlayerAchievementCount", Handle, Iface::Achievements);
    if (Options) op.options({{"ApiVersion", Options->ApiVersion}, {"UserId", id_json(Options->UserId)}});
    if (!op.ok()) return 0;
    if (Options == nullptr) {
        op.invalid(kAchievements, "EOS_Achievements_GetPlayerAchievementCountOptions: null");
        return 0;
    }
    if (!version_ok(Options->ApiVersion, EOS_ACHIEVEMENTS_GETPLAYERACHIEVEMENTCOUNT_API_LATEST)) {
        op.invalid(kAchievements, "EOS_Achievements_GetPlayerAchievementCountOptions.ApiVersion",
                   EOS_EResult::EOS_IncompatibleVersion);
        return 0;
    }
    Account* t = nullptr;
    if (target_user(op, Options->UserId, &t, "UserId") == EOS_EResult::EOS_InvalidParameters) return 0;
    const auto* list = cached(t);
    uint32_t count = list ? static_cast<uint32_t>(list->size()) : 0;
    if (auto forced = sessions().services.forced_achievement_count) count = *forced;
    op.output({{"Count", count}});
    return count;
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_Achievements_CopyPlayerAchievementByIndex(
    EOS_HAchievements Handle, const EOS_Achievements_CopyPlayerAchievementByIndexOptions* Options,
    EOS_Achievements_PlayerAchievement** OutAchievement) {
    Op op("EOS_Achievements_CopyPlayerAchievementByIndex", Handle, Iface::Achievements);
    // Version 1 was {ApiVersion, UserId, AchievementIndex}: its first fields sit where version 2
    // has TargetUserId and AchievementIndex, and it has no LocalUserId, which is never read then.
    const bool old_layout = Options && Options->ApiVersion == 1;
    if (Options) {
        json o = {{"ApiVersion", Options->ApiVersion},
                  {old_layout ? "UserId" : "TargetUserId", id_json(Options->TargetUserId)},
                  {"AchievementIndex", Options->AchievementIndex}};
        if (!old_layout) o["LocalUserId"] = id_json(Options->LocalUserId);
        op.options(o);
    }
    if (OutAchievement) *OutAchievement = nullptr;
    if (!op.ok()) return EOS_EResult::EOS_InvalidParameters;
    if (OutAchievement == nullptr) return op.ret(op.invalid(kAchievements, "OutAchievement: null"));
    if (Options == nullptr)
        return op.ret(op.invalid(kAchievements, "EOS_Achievements_CopyPlayerAchievementByIndexOptions: null"));
    if (!version_ok(Options->ApiVersion, EOS_ACHIEVEMENTS_COPYPLAYERACHIEVEMENTBYINDEX_API_LATEST, {1}))
        return op.ret(op.invalid(kAchievements, "EOS_Achievements_CopyPlayerAchievementByIndexOptions.ApiVersion",
                                 EOS_EResult::EOS_IncompatibleVersion));
    EOS_EResult r = EOS_EResult::EOS_Success;
    if (!old_layout && (r = optional_local(op, Options->LocalUserId)) != EOS_EResult::EOS_Success) return op.ret(r);
    Account* t = nullptr;
    r = target_user(op, Options->TargetUserId, &t, old_layout ? "UserId" : "TargetUserId");
    if (r == EOS_EResult::EOS_InvalidParameters) return op.ret(r);
    const auto* list = cached(t);
    const uint32_t i = Options->AchievementIndex;
    if (list == nullptr || i >= list->size()) return op.ret(EOS_EResult::EOS_NotFound);
    if (auto inj = op.injected()) return op.ret(inj->code);

    const Achievement& ach = (*list)[i];
    const bool unlocked = ach.unlock_time != EOS_ACHIEVEMENTS_ACHIEVEMENT_UNLOCKTIME_UNDEFINED;
    auto* c = new AchievementCopy;
    c->id = ach.id;
    c->display_name = ach.id;
    EOS_Achievements_PlayerAchievement& info = c->info;
    info.ApiVersion = EOS_ACHIEVEMENTS_PLAYERACHIEVEMENT_API_LATEST;
    info.AchievementId = c->id.c_str();
    info.Progress = unlocked ? 1.0 : 0.0;
    info.UnlockTime = ach.unlock_time;
    info.DisplayName = c->display_name.c_str();
    track_copy("EOS_Achievements_PlayerAchievement", op.platform(), &c->info, c, [c]() { delete c; });
    *OutAchievement = &c->info;
    op.output({{"AchievementId", ach.id}, {"UnlockTime", ach.unlock_time}});
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(void) EOS_Achievements_PlayerAchievement_Release(EOS_Achievements_PlayerAchievement* Achievement) {
    Op op("EOS_Achievements_PlayerAchievement_Release");
    release_copy("EOS_Achievements_PlayerAchievement_Release", "EOS_Achievements_PlayerAchievement", Achievement);
}

// ---- controls -------------------------------------------------------------------------------

namespace eos_sim {

void force_achievement_count(std::optional<uint32_t> count) {
    sim::sessions().services.forced_achievement_count = count;
}

}  // namespace eos_sim
