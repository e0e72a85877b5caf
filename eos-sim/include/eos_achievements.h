/*
 * Achievements interface functions. Part of the EOS SDK stand-in (SDK names, tarnwick's subset).
 */
#ifndef EOS_ACHIEVEMENTS_H_INCLUDED
#define EOS_ACHIEVEMENTS_H_INCLUDED

#include "eos_achievements_types.h"

EOS_DECLARE_FUNC(void) EOS_Achievements_QueryPlayerAchievements(EOS_HAchievements Handle, const EOS_Achievements_QueryPlayerAchievementsOptions* Options, void* ClientData, const EOS_Achievements_OnQueryPlayerAchievementsCompleteCallback CompletionDelegate);

/* Number of achievements cached for the user; 0 on error. */
EOS_DECLARE_FUNC(uint32_t) EOS_Achievements_GetPlayerAchievementCount(EOS_HAchievements Handle, const EOS_Achievements_GetPlayerAchievementCountOptions* Options);

/* Free the copy with EOS_Achievements_PlayerAchievement_Release. */
EOS_DECLARE_FUNC(EOS_EResult) EOS_Achievements_CopyPlayerAchievementByIndex(EOS_HAchievements Handle, const EOS_Achievements_CopyPlayerAchievementByIndexOptions* Options, EOS_Achievements_PlayerAchievement** OutAchievement);

EOS_DECLARE_FUNC(void) EOS_Achievements_UnlockAchievements(EOS_HAchievements Handle, const EOS_Achievements_UnlockAchievementsOptions* Options, void* ClientData, const EOS_Achievements_OnUnlockAchievementsCompleteCallback CompletionDelegate);

#endif /* EOS_ACHIEVEMENTS_H_INCLUDED */
