/*
 * Types shared by every interface: result codes, account ids, notification ids and the
 * common enums. Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_COMMON_H_INCLUDED
#define EOS_COMMON_H_INCLUDED

#include "eos_base.h"

#define EOS_RESULT_VALUE(Name, Value) Name = Value,
#define EOS_RESULT_VALUE_LAST(Name, Value) Name = Value

EOS_ENUM_START(EOS_EResult)
#include "eos_result.h"
EOS_ENUM_END(EOS_EResult);

#undef EOS_RESULT_VALUE
#undef EOS_RESULT_VALUE_LAST

/* The enumerator's name, e.g. "EOS_Success". Never NULL; must not be freed. */
EOS_DECLARE_FUNC(const char*) EOS_EResult_ToString(EOS_EResult Result);

/* False when the callback that delivered this result will be called again later. */
EOS_DECLARE_FUNC(EOS_Bool) EOS_EResult_IsOperationComplete(EOS_EResult Result);

/* An Epic account, as an opaque handle. */
typedef struct EOS_EpicAccountIdDetails* EOS_EpicAccountId;

EOS_DECLARE_FUNC(EOS_Bool) EOS_EpicAccountId_IsValid(EOS_EpicAccountId AccountId);
EOS_DECLARE_FUNC(EOS_EResult) EOS_EpicAccountId_ToString(EOS_EpicAccountId AccountId, char* OutBuffer, int32_t* InOutBufferLength);
EOS_DECLARE_FUNC(EOS_EpicAccountId) EOS_EpicAccountId_FromString(const char* AccountIdString);

/* Characters of an account id string, without the terminator. */
#define EOS_EPICACCOUNTID_MAX_LENGTH 32

/* A product user (Connect interface), as an opaque handle. */
typedef struct EOS_ProductUserIdDetails* EOS_ProductUserId;

EOS_DECLARE_FUNC(EOS_Bool) EOS_ProductUserId_IsValid(EOS_ProductUserId AccountId);
EOS_DECLARE_FUNC(EOS_EResult) EOS_ProductUserId_ToString(EOS_ProductUserId AccountId, char* OutBuffer, int32_t* InOutBufferLength);
EOS_DECLARE_FUNC(EOS_ProductUserId) EOS_ProductUserId_FromString(const char* ProductUserIdString);

/* Characters of a product user id string, without the terminator. */
#define EOS_PRODUCTUSERID_MAX_LENGTH 32

/* Handle of a registered notification callback. */
typedef uint64_t EOS_NotificationId;
#define EOS_INVALID_NOTIFICATIONID ((EOS_NotificationId)0)

/* Token continuing a login that needs an extra step (e.g. creating a product user). */
typedef struct EOS_ContinuanceTokenDetails* EOS_ContinuanceToken;

EOS_ENUM(EOS_ELoginStatus,
	EOS_LS_NotLoggedIn = 0,
	EOS_LS_UsingLocalProfile = 1,
	EOS_LS_LoggedIn = 2
);

EOS_ENUM(EOS_EAttributeType,
	EOS_AT_BOOLEAN = 0,
	EOS_AT_INT64 = 1,
	EOS_AT_DOUBLE = 2,
	EOS_AT_STRING = 3
);

typedef EOS_EAttributeType EOS_ELobbyAttributeType;
typedef EOS_EAttributeType EOS_ESessionAttributeType;

EOS_ENUM(EOS_EExternalAccountType,
	EOS_EAT_EPIC = 0,
	EOS_EAT_STEAM = 1,
	EOS_EAT_PSN = 2,
	EOS_EAT_XBL = 3,
	EOS_EAT_DISCORD = 4,
	EOS_EAT_GOG = 5,
	EOS_EAT_NINTENDO = 6,
	EOS_EAT_UPLAY = 7,
	EOS_EAT_OPENID = 8,
	EOS_EAT_APPLE = 9,
	EOS_EAT_GOOGLE = 10,
	EOS_EAT_OCULUS = 11,
	EOS_EAT_ITCHIO = 12,
	EOS_EAT_AMAZON = 13
);

EOS_ENUM(EOS_EExternalCredentialType,
	EOS_ECT_EPIC = 0,
	EOS_ECT_STEAM_APP_TICKET = 1,
	EOS_ECT_PSN_ID_TOKEN = 2,
	EOS_ECT_XBL_XSTS_TOKEN = 3,
	EOS_ECT_DISCORD_ACCESS_TOKEN = 4,
	EOS_ECT_GOG_SESSION_TICKET = 5,
	EOS_ECT_NINTENDO_ID_TOKEN = 6,
	EOS_ECT_NINTENDO_NSA_ID_TOKEN = 7,
	EOS_ECT_UPLAY_ACCESS_TOKEN = 8,
	EOS_ECT_OPENID_ACCESS_TOKEN = 9,
	EOS_ECT_DEVICEID_ACCESS_TOKEN = 10,
	EOS_ECT_APPLE_ID_TOKEN = 11,
	EOS_ECT_GOOGLE_ID_TOKEN = 12,
	EOS_ECT_OCULUS_USERID_NONCE = 13,
	EOS_ECT_ITCHIO_JWT = 14,
	EOS_ECT_ITCHIO_KEY = 15,
	EOS_ECT_EPIC_ID_TOKEN = 16,
	EOS_ECT_AMAZON_ACCESS_TOKEN = 17,
	EOS_ECT_STEAM_SESSION_TICKET = 18
);

/* Name of an integrated platform (see eos_integratedplatform_types.h for the values). */
typedef const char* EOS_IntegratedPlatformType;

/* Numeric online platform ids. */
typedef uint32_t EOS_OnlinePlatformType;
#define EOS_OPT_Unknown 0
#define EOS_OPT_Epic 100
#define EOS_OPT_Steam 4000

#endif /* EOS_COMMON_H_INCLUDED */
