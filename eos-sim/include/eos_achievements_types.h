/*
 * Achievements interface types. Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_ACHIEVEMENTS_TYPES_H_INCLUDED
#define EOS_ACHIEVEMENTS_TYPES_H_INCLUDED

#include "eos_common.h"

EXTERN_C typedef struct EOS_AchievementsHandle* EOS_HAchievements;

/* UnlockTime of an achievement that is still locked. */
#define EOS_ACHIEVEMENTS_ACHIEVEMENT_UNLOCKTIME_UNDEFINED -1

#define EOS_ACHIEVEMENTS_QUERYPLAYERACHIEVEMENTS_API_LATEST 2

EOS_STRUCT(EOS_Achievements_QueryPlayerAchievementsOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId TargetUserId;
	EOS_ProductUserId LocalUserId;
));

EOS_STRUCT(EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_ProductUserId UserId;
));

EOS_DECLARE_CALLBACK(EOS_Achievements_OnQueryPlayerAchievementsCompleteCallback, const EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo* Data);

#define EOS_ACHIEVEMENTS_GETPLAYERACHIEVEMENTCOUNT_API_LATEST 1

EOS_STRUCT(EOS_Achievements_GetPlayerAchievementCountOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId UserId;
));

#define EOS_ACHIEVEMENTS_COPYPLAYERACHIEVEMENTBYINDEX_API_LATEST 2

EOS_STRUCT(EOS_Achievements_CopyPlayerAchievementByIndexOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId TargetUserId;
	uint32_t AchievementIndex;
	EOS_ProductUserId LocalUserId;
));

#define EOS_ACHIEVEMENTS_PLAYERSTATINFO_API_LATEST 1

/* Progress of one stat towards an achievement. */
EOS_STRUCT(EOS_Achievements_PlayerStatInfo, (
	int32_t ApiVersion;
	const char* Name;
	int32_t CurrentValue;
	int32_t ThresholdValue;
));

#define EOS_ACHIEVEMENTS_PLAYERACHIEVEMENT_API_LATEST 2

/* A player's state of one achievement; copies are freed with EOS_Achievements_PlayerAchievement_Release. */
EOS_STRUCT(EOS_Achievements_PlayerAchievement, (
	int32_t ApiVersion;
	const char* AchievementId;
	double Progress;
	int64_t UnlockTime;
	int32_t StatInfoCount;
	const EOS_Achievements_PlayerStatInfo* StatInfo;
	const char* DisplayName;
	const char* Description;
	const char* IconURL;
	const char* FlavorText;
));

EOS_DECLARE_FUNC(void) EOS_Achievements_PlayerAchievement_Release(EOS_Achievements_PlayerAchievement* Achievement);

#define EOS_ACHIEVEMENTS_UNLOCKACHIEVEMENTS_API_LATEST 1

EOS_STRUCT(EOS_Achievements_UnlockAchievementsOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId UserId;
	const char** AchievementIds;
	uint32_t AchievementsCount;
));

EOS_STRUCT(EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_ProductUserId UserId;
	uint32_t AchievementsCount;
));

EOS_DECLARE_CALLBACK(EOS_Achievements_OnUnlockAchievementsCompleteCallback, const EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo* Data);

#endif /* EOS_ACHIEVEMENTS_TYPES_H_INCLUDED */
