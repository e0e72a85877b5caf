/*
 * Presence interface types. Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_PRESENCE_TYPES_H_INCLUDED
#define EOS_PRESENCE_TYPES_H_INCLUDED

#include "eos_common.h"
#include "eos_ui_types.h"

EXTERN_C typedef struct EOS_PresenceHandle* EOS_HPresence;
EXTERN_C typedef struct EOS_PresenceModificationHandle* EOS_HPresenceModification;

#define EOS_PRESENCE_DATA_MAX_KEYS 32
#define EOS_PRESENCE_DATA_MAX_KEY_LENGTH 64
#define EOS_PRESENCE_DATA_MAX_VALUE_LENGTH 255
#define EOS_PRESENCE_RICH_TEXT_MAX_VALUE_LENGTH 255

EOS_ENUM(EOS_Presence_EStatus,
	EOS_PS_Offline = 0,
	EOS_PS_Online = 1,
	EOS_PS_Away = 2,
	EOS_PS_ExtendedAway = 3,
	EOS_PS_DoNotDisturb = 4
);

#define EOS_PRESENCE_DATARECORD_API_LATEST 1

/* One key/value pair of a user's presence. */
EOS_STRUCT(EOS_Presence_DataRecord, (
	int32_t ApiVersion;
	const char* Key;
	const char* Value;
));

#define EOS_PRESENCE_INFO_API_LATEST 3

/* A user's presence; copies are freed with EOS_Presence_Info_Release. */
EOS_STRUCT(EOS_Presence_Info, (
	int32_t ApiVersion;
	EOS_Presence_EStatus Status;
	EOS_EpicAccountId UserId;
	const char* ProductId;
	const char* ProductVersion;
	const char* Platform;
	const char* RichText;
	int32_t RecordsCount;
	const EOS_Presence_DataRecord* Records;
	const char* ProductName;
	const char* IntegratedPlatform;
));

EOS_DECLARE_FUNC(void) EOS_Presence_Info_Release(EOS_Presence_Info* PresenceInfo);

#define EOS_PRESENCE_QUERYPRESENCE_API_LATEST 1

EOS_STRUCT(EOS_Presence_QueryPresenceOptions, (
	int32_t ApiVersion;
	EOS_EpicAccountId LocalUserId;
	EOS_EpicAccountId TargetUserId;
));

EOS_STRUCT(EOS_Presence_QueryPresenceCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_EpicAccountId LocalUserId;
	EOS_EpicAccountId TargetUserId;
));

EOS_DECLARE_CALLBACK(EOS_Presence_OnQueryPresenceCompleteCallback, const EOS_Presence_QueryPresenceCallbackInfo* Data);

#define EOS_PRESENCE_COPYPRESENCE_API_LATEST 3

EOS_STRUCT(EOS_Presence_CopyPresenceOptions, (
	int32_t ApiVersion;
	EOS_EpicAccountId LocalUserId;
	EOS_EpicAccountId TargetUserId;
));

#endif /* EOS_PRESENCE_TYPES_H_INCLUDED */
