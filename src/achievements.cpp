// Achievements: unlock one by id, list the local player's with their state.
#include "state.h"

#include <climits>
#include <cstring>

static void EOS_CALL on_query_achievements(const EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo *info);

HL_PRIM void HL_NAME(set_achievement)(vbyte *achievementId)
{
    if (!platform_ready("set_achievement"))
        return;
    const char *ids[1] = {reinterpret_cast<const char *>(achievementId)};
    EOS_Achievements_UnlockAchievementsOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.UserId = g_product_user_id;
    options.AchievementIds = ids;
    options.AchievementsCount = 1;
    EOS_Achievements_UnlockAchievements(EOS_Platform_GetAchievementsInterface(g_platform), &options, nullptr,
                                        on_complete_ignore<EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo>);
}

HL_PRIM void HL_NAME(query_achievements)(vclosure *onAchievements)
{
    if (!platform_ready("query_achievements"))
        return;
    EOS_Achievements_QueryPlayerAchievementsOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 2;
    options.TargetUserId = g_product_user_id;
    options.LocalUserId = g_product_user_id;
    closure_cell *cell = closure_cell_new(onAchievements);
    EOS_Achievements_QueryPlayerAchievements(EOS_Platform_GetAchievementsInterface(g_platform), &options, cell,
                                             on_query_achievements);
}

static vdynobj *achievement_record(const EOS_Achievements_PlayerAchievement *achievement)
{
    vdynobj *record = hl_alloc_dynobj();
    set_bytes_field(record, "id", to_vm_bytes(achievement->AchievementId));
    set_bool_field(record, "unlock", achievement->UnlockTime != EOS_ACHIEVEMENTS_ACHIEVEMENT_UNLOCKTIME_UNDEFINED);
    return record;
}

static void EOS_CALL on_query_achievements(const EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    closure_cell *cell = static_cast<closure_cell *>(info->ClientData);
    if (!cell)
        return;
    EOS_HAchievements achievements = EOS_Platform_GetAchievementsInterface(g_platform);
    EOS_Achievements_GetPlayerAchievementCountOptions count_options;
    std::memset(&count_options, 0, sizeof count_options);
    count_options.ApiVersion = 1;
    count_options.UserId = g_product_user_id;
    uint32_t reported = EOS_Achievements_GetPlayerAchievementCount(achievements, &count_options);
    // A count that is not a valid array length gives an empty list.
    int count = reported > static_cast<uint32_t>(INT_MAX) ? 0 : static_cast<int>(reported);

    varray *list = hl_alloc_array(&hlt_dynobj, count);
    for (int i = 0; i < count; ++i) {
        // The copy names the local player as target as well, so that the
        // copies are the local player's own.
        EOS_Achievements_CopyPlayerAchievementByIndexOptions options;
        std::memset(&options, 0, sizeof options);
        options.ApiVersion = 2;
        options.TargetUserId = g_product_user_id;
        options.AchievementIndex = static_cast<uint32_t>(i);
        options.LocalUserId = g_product_user_id;
        EOS_Achievements_PlayerAchievement *achievement = nullptr;
        if (EOS_Achievements_CopyPlayerAchievementByIndex(achievements, &options, &achievement) != EOS_EResult::EOS_Success ||
            !achievement)
            continue;
        hl_aptr(list, vdynobj *)[i] = achievement_record(achievement);
        EOS_Achievements_PlayerAchievement_Release(achievement);
    }
    deliver_array(cell->closure, list);
    closure_cell_free(cell);
}
