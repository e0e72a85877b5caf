/*
 * Lobby interface types: lobby handles, options/results of the lobby operations,
 * attributes and invitation notifications.
 * Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_LOBBY_TYPES_H_INCLUDED
#define EOS_LOBBY_TYPES_H_INCLUDED

#include "eos_common.h"
#include "eos_ui_types.h"

EXTERN_C typedef struct EOS_LobbyHandle* EOS_HLobby;
EXTERN_C typedef struct EOS_LobbyModificationHandle* EOS_HLobbyModification;
EXTERN_C typedef struct EOS_LobbyDetailsHandle* EOS_HLobbyDetails;
EXTERN_C typedef struct EOS_LobbySearchHandle* EOS_HLobbySearch;

typedef const char* EOS_LobbyId;

#define EOS_LOBBY_MAX_LOBBIES 16
#define EOS_LOBBY_MAX_LOBBY_MEMBERS 64
#define EOS_LOBBY_MAX_SEARCH_RESULTS 200
#define EOS_LOBBY_MIN_LOBBYIDOVERRIDE_LENGTH 4
#define EOS_LOBBY_MAX_LOBBYIDOVERRIDE_LENGTH 60
#define EOS_LOBBY_INVITEID_MAX_LENGTH 64

#define EOS_LOBBYMODIFICATION_MAX_ATTRIBUTES 64
#define EOS_LOBBYMODIFICATION_MAX_ATTRIBUTE_LENGTH 64

EOS_ENUM(EOS_ELobbyPermissionLevel,
	EOS_LPL_PUBLICADVERTISED = 0,
	EOS_LPL_JOINVIAPRESENCE = 1,
	EOS_LPL_INVITEONLY = 2
);

EOS_ENUM(EOS_ELobbyAttributeVisibility,
	EOS_LAT_PUBLIC = 0,
	EOS_LAT_PRIVATE = 1
);

EOS_ENUM(EOS_ELobbyMemberStatus,
	EOS_LMS_JOINED = 0,
	EOS_LMS_LEFT = 1,
	EOS_LMS_DISCONNECTED = 2,
	EOS_LMS_KICKED = 3,
	EOS_LMS_PROMOTED = 4,
	EOS_LMS_CLOSED = 5
);

#define EOS_LOBBYDETAILS_INFO_API_LATEST 3

/* A snapshot of a lobby's settings; copies are freed with EOS_LobbyDetails_Info_Release. */
EOS_STRUCT(EOS_LobbyDetails_Info, (
	int32_t ApiVersion;
	EOS_LobbyId LobbyId;
	EOS_ProductUserId LobbyOwnerUserId;
	EOS_ELobbyPermissionLevel PermissionLevel;
	uint32_t AvailableSlots;
	uint32_t MaxMembers;
	EOS_Bool bAllowInvites;
	const char* BucketId;
	EOS_Bool bAllowHostMigration;
	EOS_Bool bRTCRoomEnabled;
	EOS_Bool bAllowJoinById;
	EOS_Bool bRejoinAfterKickRequiresInvite;
	EOS_Bool bPresenceEnabled;
	const uint32_t* AllowedPlatformIds;
	uint32_t AllowedPlatformIdsCount;
));

EOS_DECLARE_FUNC(void) EOS_LobbyDetails_Info_Release(EOS_LobbyDetails_Info* LobbyDetailsInfo);

/* Voice-room options of a created or joined lobby (NULL: defaults). */
#define EOS_LOBBY_LOCALRTCOPTIONS_API_LATEST 1

EOS_STRUCT(EOS_Lobby_LocalRTCOptions, (
	int32_t ApiVersion;
	uint32_t Flags;
	EOS_Bool bUseManualAudioInput;
	EOS_Bool bUseManualAudioOutput;
	EOS_Bool bLocalAudioDeviceInputStartsMuted;
));

#define EOS_LOBBY_CREATELOBBY_API_LATEST 9

/* LobbyId NULL lets the service choose the id; AllowedPlatformIds NULL means any platform. */
EOS_STRUCT(EOS_Lobby_CreateLobbyOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId LocalUserId;
	uint32_t MaxLobbyMembers;
	EOS_ELobbyPermissionLevel PermissionLevel;
	EOS_Bool bPresenceEnabled;
	EOS_Bool bAllowInvites;
	const char* BucketId;
	EOS_Bool bDisableHostMigration;
	EOS_Bool bEnableRTCRoom;
	const EOS_Lobby_LocalRTCOptions* LocalRTCOptions;
	EOS_LobbyId LobbyId;
	EOS_Bool bEnableJoinById;
	EOS_Bool bRejoinAfterKickRequiresInvite;
	const uint32_t* AllowedPlatformIds;
	uint32_t AllowedPlatformIdsCount;
	EOS_Bool bCrossplayOptOut;
));

EOS_STRUCT(EOS_Lobby_CreateLobbyCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_LobbyId LobbyId;
));

EOS_DECLARE_CALLBACK(EOS_Lobby_OnCreateLobbyCallback, const EOS_Lobby_CreateLobbyCallbackInfo* Data);

#define EOS_LOBBY_ATTRIBUTEDATA_API_LATEST 1

/* A key and a typed value; ValueType says which member of Value is live. */
EOS_STRUCT(EOS_Lobby_AttributeData, (
	int32_t ApiVersion;
	const char* Key;
	union
	{
		int64_t AsInt64;
		double AsDouble;
		EOS_Bool AsBool;
		const char* AsUtf8;
	} Value;
	EOS_ELobbyAttributeType ValueType;
));

#define EOS_LOBBY_ATTRIBUTE_API_LATEST 1

/* An attribute with its visibility; copies are freed with EOS_Lobby_Attribute_Release. */
EOS_STRUCT(EOS_Lobby_Attribute, (
	int32_t ApiVersion;
	EOS_Lobby_AttributeData* Data;
	EOS_ELobbyAttributeVisibility Visibility;
));

EOS_DECLARE_FUNC(void) EOS_Lobby_Attribute_Release(EOS_Lobby_Attribute* LobbyAttribute);

#define EOS_LOBBY_UPDATELOBBYMODIFICATION_API_LATEST 1

EOS_STRUCT(EOS_Lobby_UpdateLobbyModificationOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId LocalUserId;
	EOS_LobbyId LobbyId;
));

#define EOS_LOBBY_UPDATELOBBY_API_LATEST 1

EOS_STRUCT(EOS_Lobby_UpdateLobbyOptions, (
	int32_t ApiVersion;
	EOS_HLobbyModification LobbyModificationHandle;
));

EOS_STRUCT(EOS_Lobby_UpdateLobbyCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_LobbyId LobbyId;
));

EOS_DECLARE_CALLBACK(EOS_Lobby_OnUpdateLobbyCallback, const EOS_Lobby_UpdateLobbyCallbackInfo* Data);

#define EOS_LOBBY_DESTROYLOBBY_API_LATEST 1

EOS_STRUCT(EOS_Lobby_DestroyLobbyOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId LocalUserId;
	EOS_LobbyId LobbyId;
));

EOS_STRUCT(EOS_Lobby_DestroyLobbyCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_LobbyId LobbyId;
));

EOS_DECLARE_CALLBACK(EOS_Lobby_OnDestroyLobbyCallback, const EOS_Lobby_DestroyLobbyCallbackInfo* Data);

#define EOS_LOBBY_JOINLOBBY_API_LATEST 4

EOS_STRUCT(EOS_Lobby_JoinLobbyOptions, (
	int32_t ApiVersion;
	EOS_HLobbyDetails LobbyDetailsHandle;
	EOS_ProductUserId LocalUserId;
	EOS_Bool bPresenceEnabled;
	const EOS_Lobby_LocalRTCOptions* LocalRTCOptions;
	EOS_Bool bCrossplayOptOut;
));

EOS_STRUCT(EOS_Lobby_JoinLobbyCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_LobbyId LobbyId;
));

EOS_DECLARE_CALLBACK(EOS_Lobby_OnJoinLobbyCallback, const EOS_Lobby_JoinLobbyCallbackInfo* Data);

#define EOS_LOBBY_LEAVELOBBY_API_LATEST 1

EOS_STRUCT(EOS_Lobby_LeaveLobbyOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId LocalUserId;
	EOS_LobbyId LobbyId;
));

EOS_STRUCT(EOS_Lobby_LeaveLobbyCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_LobbyId LobbyId;
));

EOS_DECLARE_CALLBACK(EOS_Lobby_OnLeaveLobbyCallback, const EOS_Lobby_LeaveLobbyCallbackInfo* Data);

#define EOS_LOBBY_SENDINVITE_API_LATEST 1

/* Note the order: LobbyId comes before LocalUserId. */
EOS_STRUCT(EOS_Lobby_SendInviteOptions, (
	int32_t ApiVersion;
	EOS_LobbyId LobbyId;
	EOS_ProductUserId LocalUserId;
	EOS_ProductUserId TargetUserId;
));

EOS_STRUCT(EOS_Lobby_SendInviteCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_LobbyId LobbyId;
));

EOS_DECLARE_CALLBACK(EOS_Lobby_OnSendInviteCallback, const EOS_Lobby_SendInviteCallbackInfo* Data);

#define EOS_LOBBY_REJECTINVITE_API_LATEST 1

EOS_STRUCT(EOS_Lobby_RejectInviteOptions, (
	int32_t ApiVersion;
	const char* InviteId;
	EOS_ProductUserId LocalUserId;
));

EOS_STRUCT(EOS_Lobby_RejectInviteCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	const char* InviteId;
));

EOS_DECLARE_CALLBACK(EOS_Lobby_OnRejectInviteCallback, const EOS_Lobby_RejectInviteCallbackInfo* Data);

#define EOS_LOBBY_ADDNOTIFYLOBBYINVITERECEIVED_API_LATEST 1

EOS_STRUCT(EOS_Lobby_AddNotifyLobbyInviteReceivedOptions, (
	int32_t ApiVersion;
));

/* LocalUserId received the invite, TargetUserId sent it. */
EOS_STRUCT(EOS_Lobby_LobbyInviteReceivedCallbackInfo, (
	void* ClientData;
	const char* InviteId;
	EOS_ProductUserId LocalUserId;
	EOS_ProductUserId TargetUserId;
));

EOS_DECLARE_CALLBACK(EOS_Lobby_OnLobbyInviteReceivedCallback, const EOS_Lobby_LobbyInviteReceivedCallbackInfo* Data);

#define EOS_LOBBY_ADDNOTIFYLOBBYINVITEACCEPTED_API_LATEST 1

EOS_STRUCT(EOS_Lobby_AddNotifyLobbyInviteAcceptedOptions, (
	int32_t ApiVersion;
));

/* An invite accepted in the overlay. LocalUserId received it, TargetUserId sent it. */
EOS_STRUCT(EOS_Lobby_LobbyInviteAcceptedCallbackInfo, (
	void* ClientData;
	const char* InviteId;
	EOS_ProductUserId LocalUserId;
	EOS_ProductUserId TargetUserId;
	EOS_LobbyId LobbyId;
));

EOS_DECLARE_CALLBACK(EOS_Lobby_OnLobbyInviteAcceptedCallback, const EOS_Lobby_LobbyInviteAcceptedCallbackInfo* Data);

#define EOS_LOBBY_ADDNOTIFYJOINLOBBYACCEPTED_API_LATEST 1

EOS_STRUCT(EOS_Lobby_AddNotifyJoinLobbyAcceptedOptions, (
	int32_t ApiVersion;
));

/* A join accepted in the overlay; UiEventId finds the lobby via CopyLobbyDetailsHandleByUiEventId. */
EOS_STRUCT(EOS_Lobby_JoinLobbyAcceptedCallbackInfo, (
	void* ClientData;
	EOS_ProductUserId LocalUserId;
	EOS_UI_EventId UiEventId;
));

EOS_DECLARE_CALLBACK(EOS_Lobby_OnJoinLobbyAcceptedCallback, const EOS_Lobby_JoinLobbyAcceptedCallbackInfo* Data);

#define EOS_LOBBY_COPYLOBBYDETAILSHANDLEBYINVITEID_API_LATEST 1

EOS_STRUCT(EOS_Lobby_CopyLobbyDetailsHandleByInviteIdOptions, (
	int32_t ApiVersion;
	const char* InviteId;
));

#define EOS_LOBBY_COPYLOBBYDETAILSHANDLEBYUIEVENTID_API_LATEST 1

EOS_STRUCT(EOS_Lobby_CopyLobbyDetailsHandleByUiEventIdOptions, (
	int32_t ApiVersion;
	EOS_UI_EventId UiEventId;
));

#define EOS_LOBBY_COPYLOBBYDETAILSHANDLE_API_LATEST 1

EOS_STRUCT(EOS_Lobby_CopyLobbyDetailsHandleOptions, (
	int32_t ApiVersion;
	EOS_LobbyId LobbyId;
	EOS_ProductUserId LocalUserId;
));

#define EOS_LOBBYMODIFICATION_ADDATTRIBUTE_API_LATEST 2

EOS_STRUCT(EOS_LobbyModification_AddAttributeOptions, (
	int32_t ApiVersion;
	const EOS_Lobby_AttributeData* Attribute;
	EOS_ELobbyAttributeVisibility Visibility;
));

EOS_DECLARE_FUNC(void) EOS_LobbyModification_Release(EOS_HLobbyModification LobbyModificationHandle);

#define EOS_LOBBYDETAILS_COPYINFO_API_LATEST 1

EOS_STRUCT(EOS_LobbyDetails_CopyInfoOptions, (
	int32_t ApiVersion;
));

#define EOS_LOBBYDETAILS_COPYATTRIBUTEBYKEY_API_LATEST 1

EOS_STRUCT(EOS_LobbyDetails_CopyAttributeByKeyOptions, (
	int32_t ApiVersion;
	const char* AttrKey;
));

EOS_DECLARE_FUNC(void) EOS_LobbyDetails_Release(EOS_HLobbyDetails LobbyHandle);

#endif /* EOS_LOBBY_TYPES_H_INCLUDED */
