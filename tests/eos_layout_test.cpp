// Checks the EOS SDK stand-in headers against the SDK 1.16.1 binary interface (x64): struct
// sizes, field offsets and types, enum and constant values, ApiVersion macros, and the exact
// function prototypes and callback signatures. Code built against these headers must build
// unchanged against the real SDK headers and run against the real library, so any drift here
// is a real fault. Nearly everything is checked at compile time; the run-time tests cover what
// static_assert cannot.

#include "eos_sdk.h"
#include "eos_logging.h"
#include "eos_version.h"
#include "eos_auth.h"
#include "eos_connect.h"
#include "eos_userinfo.h"
#include "eos_lobby.h"
#include "eos_friends.h"
#include "eos_presence.h"
#include "eos_ui.h"
#include "eos_achievements.h"
#include "eos_ecom.h"

#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <set>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace {

// ---------------------------------------------------------------------------------------------
// Struct layouts: size, alignment, the _tag<Name> struct tag, and per field its offset and
// declared type (the type matters too: code assigning to a field must compile against both).

#define LAYOUT(S, Size, Align)                                                                   \
    static_assert(sizeof(S) == (Size), "size of " #S);                                          \
    static_assert(alignof(S) == (Align), "alignment of " #S);                                   \
    static_assert(std::is_same<S, _tag##S>::value, "struct tag of " #S)

#define FIELD(S, F, T, Offset)                                                                   \
    static_assert(offsetof(S, F) == (Offset), "offset of " #S "." #F);                          \
    static_assert(std::is_same<decltype(S::F), T>::value, "type of " #S "." #F)

// The anonymous-type union of EOS_Lobby_AttributeData and its members.
#define UNION_AT(S, F, Offset, Size)                                                             \
    static_assert(offsetof(S, F) == (Offset), "offset of " #S "." #F);                          \
    static_assert(sizeof(S::F) == (Size), "size of " #S "." #F)
#define UNION_MEMBER(S, F, Offset, Size) UNION_AT(S, F, Offset, Size)

// eos_init.h
LAYOUT(EOS_InitializeOptions, 72, 8);
FIELD(EOS_InitializeOptions, ApiVersion, int32_t, 0);
FIELD(EOS_InitializeOptions, AllocateMemoryFunction, EOS_AllocateMemoryFunc, 8);
FIELD(EOS_InitializeOptions, ReallocateMemoryFunction, EOS_ReallocateMemoryFunc, 16);
FIELD(EOS_InitializeOptions, ReleaseMemoryFunction, EOS_ReleaseMemoryFunc, 24);
FIELD(EOS_InitializeOptions, ProductName, const char*, 32);
FIELD(EOS_InitializeOptions, ProductVersion, const char*, 40);
FIELD(EOS_InitializeOptions, Reserved, void*, 48);
FIELD(EOS_InitializeOptions, SystemInitializeOptions, void*, 56);
FIELD(EOS_InitializeOptions, OverrideThreadAffinity, EOS_Initialize_ThreadAffinity*, 64);
LAYOUT(EOS_Initialize_ThreadAffinity, 56, 8);
FIELD(EOS_Initialize_ThreadAffinity, ApiVersion, int32_t, 0);
FIELD(EOS_Initialize_ThreadAffinity, NetworkWork, uint64_t, 8);
FIELD(EOS_Initialize_ThreadAffinity, StorageIo, uint64_t, 16);
FIELD(EOS_Initialize_ThreadAffinity, WebSocketIo, uint64_t, 24);
FIELD(EOS_Initialize_ThreadAffinity, P2PIo, uint64_t, 32);
FIELD(EOS_Initialize_ThreadAffinity, HttpRequestIo, uint64_t, 40);
FIELD(EOS_Initialize_ThreadAffinity, RTCIo, uint64_t, 48);

// eos_types.h
LAYOUT(EOS_Platform_ClientCredentials, 16, 8);
FIELD(EOS_Platform_ClientCredentials, ClientId, const char*, 0);
FIELD(EOS_Platform_ClientCredentials, ClientSecret, const char*, 8);
LAYOUT(EOS_Platform_RTCOptions, 24, 8);
FIELD(EOS_Platform_RTCOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Platform_RTCOptions, PlatformSpecificOptions, void*, 8);
FIELD(EOS_Platform_RTCOptions, BackgroundMode, EOS_ERTCBackgroundMode, 16);
LAYOUT(EOS_Platform_Options, 136, 8);
FIELD(EOS_Platform_Options, ApiVersion, int32_t, 0);
FIELD(EOS_Platform_Options, Reserved, void*, 8);
FIELD(EOS_Platform_Options, ProductId, const char*, 16);
FIELD(EOS_Platform_Options, SandboxId, const char*, 24);
FIELD(EOS_Platform_Options, ClientCredentials, EOS_Platform_ClientCredentials, 32);
FIELD(EOS_Platform_Options, bIsServer, EOS_Bool, 48);
FIELD(EOS_Platform_Options, EncryptionKey, const char*, 56);
FIELD(EOS_Platform_Options, OverrideCountryCode, const char*, 64);
FIELD(EOS_Platform_Options, OverrideLocaleCode, const char*, 72);
FIELD(EOS_Platform_Options, DeploymentId, const char*, 80);
FIELD(EOS_Platform_Options, Flags, uint64_t, 88);
FIELD(EOS_Platform_Options, CacheDirectory, const char*, 96);
FIELD(EOS_Platform_Options, TickBudgetInMilliseconds, uint32_t, 104);
FIELD(EOS_Platform_Options, RTCOptions, const EOS_Platform_RTCOptions*, 112);
FIELD(EOS_Platform_Options, IntegratedPlatformOptionsContainerHandle, EOS_HIntegratedPlatformOptionsContainer, 120);
FIELD(EOS_Platform_Options, SystemSpecificOptions, const void*, 128);

// eos_logging.h
LAYOUT(EOS_LogMessage, 24, 8);
FIELD(EOS_LogMessage, Category, const char*, 0);
FIELD(EOS_LogMessage, Message, const char*, 8);
FIELD(EOS_LogMessage, Level, EOS_ELogLevel, 16);

// eos_auth_types.h
LAYOUT(EOS_Auth_Credentials, 48, 8);
FIELD(EOS_Auth_Credentials, ApiVersion, int32_t, 0);
FIELD(EOS_Auth_Credentials, Id, const char*, 8);
FIELD(EOS_Auth_Credentials, Token, const char*, 16);
FIELD(EOS_Auth_Credentials, Type, EOS_ELoginCredentialType, 24);
FIELD(EOS_Auth_Credentials, SystemAuthCredentialsOptions, void*, 32);
FIELD(EOS_Auth_Credentials, ExternalType, EOS_EExternalCredentialType, 40);
LAYOUT(EOS_Auth_LoginOptions, 32, 8);
FIELD(EOS_Auth_LoginOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Auth_LoginOptions, Credentials, const EOS_Auth_Credentials*, 8);
FIELD(EOS_Auth_LoginOptions, ScopeFlags, EOS_EAuthScopeFlags, 16);
FIELD(EOS_Auth_LoginOptions, LoginFlags, uint64_t, 24);
LAYOUT(EOS_Auth_LoginCallbackInfo, 56, 8);
FIELD(EOS_Auth_LoginCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Auth_LoginCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Auth_LoginCallbackInfo, LocalUserId, EOS_EpicAccountId, 16);
FIELD(EOS_Auth_LoginCallbackInfo, PinGrantInfo, const EOS_Auth_PinGrantInfo*, 24);
FIELD(EOS_Auth_LoginCallbackInfo, ContinuanceToken, EOS_ContinuanceToken, 32);
FIELD(EOS_Auth_LoginCallbackInfo, AccountFeatureRestrictedInfo_DEPRECATED, const EOS_Auth_AccountFeatureRestrictedInfo*, 40);
FIELD(EOS_Auth_LoginCallbackInfo, SelectedAccountId, EOS_EpicAccountId, 48);
LAYOUT(EOS_Auth_PinGrantInfo, 40, 8);
FIELD(EOS_Auth_PinGrantInfo, ApiVersion, int32_t, 0);
FIELD(EOS_Auth_PinGrantInfo, UserCode, const char*, 8);
FIELD(EOS_Auth_PinGrantInfo, VerificationURI, const char*, 16);
FIELD(EOS_Auth_PinGrantInfo, ExpiresIn, int32_t, 24);
FIELD(EOS_Auth_PinGrantInfo, VerificationURIComplete, const char*, 32);

// eos_auth_types_deprecated.inl
LAYOUT(EOS_Auth_AccountFeatureRestrictedInfo, 16, 8);
FIELD(EOS_Auth_AccountFeatureRestrictedInfo, ApiVersion, int32_t, 0);
FIELD(EOS_Auth_AccountFeatureRestrictedInfo, VerificationURI, const char*, 8);

// eos_auth_types.h
LAYOUT(EOS_Auth_CopyUserAuthTokenOptions, 4, 4);
FIELD(EOS_Auth_CopyUserAuthTokenOptions, ApiVersion, int32_t, 0);
LAYOUT(EOS_Auth_Token, 88, 8);
FIELD(EOS_Auth_Token, ApiVersion, int32_t, 0);
FIELD(EOS_Auth_Token, App, const char*, 8);
FIELD(EOS_Auth_Token, ClientId, const char*, 16);
FIELD(EOS_Auth_Token, AccountId, EOS_EpicAccountId, 24);
FIELD(EOS_Auth_Token, AccessToken, const char*, 32);
FIELD(EOS_Auth_Token, ExpiresIn, double, 40);
FIELD(EOS_Auth_Token, ExpiresAt, const char*, 48);
FIELD(EOS_Auth_Token, AuthType, EOS_EAuthTokenType, 56);
FIELD(EOS_Auth_Token, RefreshToken, const char*, 64);
FIELD(EOS_Auth_Token, RefreshExpiresIn, double, 72);
FIELD(EOS_Auth_Token, RefreshExpiresAt, const char*, 80);

// eos_userinfo_types.h
LAYOUT(EOS_UserInfo_QueryUserInfoOptions, 24, 8);
FIELD(EOS_UserInfo_QueryUserInfoOptions, ApiVersion, int32_t, 0);
FIELD(EOS_UserInfo_QueryUserInfoOptions, LocalUserId, EOS_EpicAccountId, 8);
FIELD(EOS_UserInfo_QueryUserInfoOptions, TargetUserId, EOS_EpicAccountId, 16);
LAYOUT(EOS_UserInfo_QueryUserInfoCallbackInfo, 32, 8);
FIELD(EOS_UserInfo_QueryUserInfoCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_UserInfo_QueryUserInfoCallbackInfo, ClientData, void*, 8);
FIELD(EOS_UserInfo_QueryUserInfoCallbackInfo, LocalUserId, EOS_EpicAccountId, 16);
FIELD(EOS_UserInfo_QueryUserInfoCallbackInfo, TargetUserId, EOS_EpicAccountId, 24);
LAYOUT(EOS_UserInfo_CopyUserInfoOptions, 24, 8);
FIELD(EOS_UserInfo_CopyUserInfoOptions, ApiVersion, int32_t, 0);
FIELD(EOS_UserInfo_CopyUserInfoOptions, LocalUserId, EOS_EpicAccountId, 8);
FIELD(EOS_UserInfo_CopyUserInfoOptions, TargetUserId, EOS_EpicAccountId, 16);
LAYOUT(EOS_UserInfo, 56, 8);
FIELD(EOS_UserInfo, ApiVersion, int32_t, 0);
FIELD(EOS_UserInfo, UserId, EOS_EpicAccountId, 8);
FIELD(EOS_UserInfo, Country, const char*, 16);
FIELD(EOS_UserInfo, DisplayName, const char*, 24);
FIELD(EOS_UserInfo, PreferredLanguage, const char*, 32);
FIELD(EOS_UserInfo, Nickname, const char*, 40);
FIELD(EOS_UserInfo, DisplayNameSanitized, const char*, 48);

// eos_connect_types.h
LAYOUT(EOS_Connect_Credentials, 24, 8);
FIELD(EOS_Connect_Credentials, ApiVersion, int32_t, 0);
FIELD(EOS_Connect_Credentials, Token, const char*, 8);
FIELD(EOS_Connect_Credentials, Type, EOS_EExternalCredentialType, 16);
LAYOUT(EOS_Connect_UserLoginInfo, 24, 8);
FIELD(EOS_Connect_UserLoginInfo, ApiVersion, int32_t, 0);
FIELD(EOS_Connect_UserLoginInfo, DisplayName, const char*, 8);
FIELD(EOS_Connect_UserLoginInfo, NsaIdToken, const char*, 16);
LAYOUT(EOS_Connect_LoginOptions, 24, 8);
FIELD(EOS_Connect_LoginOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Connect_LoginOptions, Credentials, const EOS_Connect_Credentials*, 8);
FIELD(EOS_Connect_LoginOptions, UserLoginInfo, const EOS_Connect_UserLoginInfo*, 16);
LAYOUT(EOS_Connect_LoginCallbackInfo, 32, 8);
FIELD(EOS_Connect_LoginCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Connect_LoginCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Connect_LoginCallbackInfo, LocalUserId, EOS_ProductUserId, 16);
FIELD(EOS_Connect_LoginCallbackInfo, ContinuanceToken, EOS_ContinuanceToken, 24);
LAYOUT(EOS_Connect_CreateUserOptions, 16, 8);
FIELD(EOS_Connect_CreateUserOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Connect_CreateUserOptions, ContinuanceToken, EOS_ContinuanceToken, 8);
LAYOUT(EOS_Connect_CreateUserCallbackInfo, 24, 8);
FIELD(EOS_Connect_CreateUserCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Connect_CreateUserCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Connect_CreateUserCallbackInfo, LocalUserId, EOS_ProductUserId, 16);
LAYOUT(EOS_Connect_QueryProductUserIdMappingsOptions, 40, 8);
FIELD(EOS_Connect_QueryProductUserIdMappingsOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Connect_QueryProductUserIdMappingsOptions, LocalUserId, EOS_ProductUserId, 8);
FIELD(EOS_Connect_QueryProductUserIdMappingsOptions, AccountIdType_DEPRECATED, EOS_EExternalAccountType, 16);
FIELD(EOS_Connect_QueryProductUserIdMappingsOptions, ProductUserIds, EOS_ProductUserId*, 24);
FIELD(EOS_Connect_QueryProductUserIdMappingsOptions, ProductUserIdCount, uint32_t, 32);
LAYOUT(EOS_Connect_QueryProductUserIdMappingsCallbackInfo, 24, 8);
FIELD(EOS_Connect_QueryProductUserIdMappingsCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Connect_QueryProductUserIdMappingsCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Connect_QueryProductUserIdMappingsCallbackInfo, LocalUserId, EOS_ProductUserId, 16);
LAYOUT(EOS_Connect_GetProductUserIdMappingOptions, 32, 8);
FIELD(EOS_Connect_GetProductUserIdMappingOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Connect_GetProductUserIdMappingOptions, LocalUserId, EOS_ProductUserId, 8);
FIELD(EOS_Connect_GetProductUserIdMappingOptions, AccountIdType, EOS_EExternalAccountType, 16);
FIELD(EOS_Connect_GetProductUserIdMappingOptions, TargetProductUserId, EOS_ProductUserId, 24);
LAYOUT(EOS_Connect_QueryExternalAccountMappingsOptions, 40, 8);
FIELD(EOS_Connect_QueryExternalAccountMappingsOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Connect_QueryExternalAccountMappingsOptions, LocalUserId, EOS_ProductUserId, 8);
FIELD(EOS_Connect_QueryExternalAccountMappingsOptions, AccountIdType, EOS_EExternalAccountType, 16);
FIELD(EOS_Connect_QueryExternalAccountMappingsOptions, ExternalAccountIds, const char**, 24);
FIELD(EOS_Connect_QueryExternalAccountMappingsOptions, ExternalAccountIdCount, uint32_t, 32);
LAYOUT(EOS_Connect_QueryExternalAccountMappingsCallbackInfo, 24, 8);
FIELD(EOS_Connect_QueryExternalAccountMappingsCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Connect_QueryExternalAccountMappingsCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Connect_QueryExternalAccountMappingsCallbackInfo, LocalUserId, EOS_ProductUserId, 16);
LAYOUT(EOS_Connect_GetExternalAccountMappingsOptions, 32, 8);
FIELD(EOS_Connect_GetExternalAccountMappingsOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Connect_GetExternalAccountMappingsOptions, LocalUserId, EOS_ProductUserId, 8);
FIELD(EOS_Connect_GetExternalAccountMappingsOptions, AccountIdType, EOS_EExternalAccountType, 16);
FIELD(EOS_Connect_GetExternalAccountMappingsOptions, TargetExternalUserId, const char*, 24);

// eos_lobby_types.h
LAYOUT(EOS_Lobby_LocalRTCOptions, 20, 4);
FIELD(EOS_Lobby_LocalRTCOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_LocalRTCOptions, Flags, uint32_t, 4);
FIELD(EOS_Lobby_LocalRTCOptions, bUseManualAudioInput, EOS_Bool, 8);
FIELD(EOS_Lobby_LocalRTCOptions, bUseManualAudioOutput, EOS_Bool, 12);
FIELD(EOS_Lobby_LocalRTCOptions, bLocalAudioDeviceInputStartsMuted, EOS_Bool, 16);
LAYOUT(EOS_Lobby_CreateLobbyOptions, 88, 8);
FIELD(EOS_Lobby_CreateLobbyOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_CreateLobbyOptions, LocalUserId, EOS_ProductUserId, 8);
FIELD(EOS_Lobby_CreateLobbyOptions, MaxLobbyMembers, uint32_t, 16);
FIELD(EOS_Lobby_CreateLobbyOptions, PermissionLevel, EOS_ELobbyPermissionLevel, 20);
FIELD(EOS_Lobby_CreateLobbyOptions, bPresenceEnabled, EOS_Bool, 24);
FIELD(EOS_Lobby_CreateLobbyOptions, bAllowInvites, EOS_Bool, 28);
FIELD(EOS_Lobby_CreateLobbyOptions, BucketId, const char*, 32);
FIELD(EOS_Lobby_CreateLobbyOptions, bDisableHostMigration, EOS_Bool, 40);
FIELD(EOS_Lobby_CreateLobbyOptions, bEnableRTCRoom, EOS_Bool, 44);
FIELD(EOS_Lobby_CreateLobbyOptions, LocalRTCOptions, const EOS_Lobby_LocalRTCOptions*, 48);
FIELD(EOS_Lobby_CreateLobbyOptions, LobbyId, EOS_LobbyId, 56);
FIELD(EOS_Lobby_CreateLobbyOptions, bEnableJoinById, EOS_Bool, 64);
FIELD(EOS_Lobby_CreateLobbyOptions, bRejoinAfterKickRequiresInvite, EOS_Bool, 68);
FIELD(EOS_Lobby_CreateLobbyOptions, AllowedPlatformIds, const uint32_t*, 72);
FIELD(EOS_Lobby_CreateLobbyOptions, AllowedPlatformIdsCount, uint32_t, 80);
FIELD(EOS_Lobby_CreateLobbyOptions, bCrossplayOptOut, EOS_Bool, 84);
LAYOUT(EOS_Lobby_CreateLobbyCallbackInfo, 24, 8);
FIELD(EOS_Lobby_CreateLobbyCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Lobby_CreateLobbyCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Lobby_CreateLobbyCallbackInfo, LobbyId, EOS_LobbyId, 16);
LAYOUT(EOS_Lobby_UpdateLobbyModificationOptions, 24, 8);
FIELD(EOS_Lobby_UpdateLobbyModificationOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_UpdateLobbyModificationOptions, LocalUserId, EOS_ProductUserId, 8);
FIELD(EOS_Lobby_UpdateLobbyModificationOptions, LobbyId, EOS_LobbyId, 16);
LAYOUT(EOS_LobbyModification_AddAttributeOptions, 24, 8);
FIELD(EOS_LobbyModification_AddAttributeOptions, ApiVersion, int32_t, 0);
FIELD(EOS_LobbyModification_AddAttributeOptions, Attribute, const EOS_Lobby_AttributeData*, 8);
FIELD(EOS_LobbyModification_AddAttributeOptions, Visibility, EOS_ELobbyAttributeVisibility, 16);
LAYOUT(EOS_Lobby_AttributeData, 32, 8);
FIELD(EOS_Lobby_AttributeData, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_AttributeData, Key, const char*, 8);
UNION_AT(EOS_Lobby_AttributeData, Value, 16, 8);
UNION_MEMBER(EOS_Lobby_AttributeData, Value.AsInt64, 16, 8);
UNION_MEMBER(EOS_Lobby_AttributeData, Value.AsDouble, 16, 8);
UNION_MEMBER(EOS_Lobby_AttributeData, Value.AsBool, 16, 4);
UNION_MEMBER(EOS_Lobby_AttributeData, Value.AsUtf8, 16, 8);
FIELD(EOS_Lobby_AttributeData, ValueType, EOS_ELobbyAttributeType, 24);
LAYOUT(EOS_Lobby_Attribute, 24, 8);
FIELD(EOS_Lobby_Attribute, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_Attribute, Data, EOS_Lobby_AttributeData*, 8);
FIELD(EOS_Lobby_Attribute, Visibility, EOS_ELobbyAttributeVisibility, 16);
LAYOUT(EOS_Lobby_UpdateLobbyOptions, 16, 8);
FIELD(EOS_Lobby_UpdateLobbyOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_UpdateLobbyOptions, LobbyModificationHandle, EOS_HLobbyModification, 8);
LAYOUT(EOS_Lobby_UpdateLobbyCallbackInfo, 24, 8);
FIELD(EOS_Lobby_UpdateLobbyCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Lobby_UpdateLobbyCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Lobby_UpdateLobbyCallbackInfo, LobbyId, EOS_LobbyId, 16);
LAYOUT(EOS_Lobby_LeaveLobbyOptions, 24, 8);
FIELD(EOS_Lobby_LeaveLobbyOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_LeaveLobbyOptions, LocalUserId, EOS_ProductUserId, 8);
FIELD(EOS_Lobby_LeaveLobbyOptions, LobbyId, EOS_LobbyId, 16);
LAYOUT(EOS_Lobby_LeaveLobbyCallbackInfo, 24, 8);
FIELD(EOS_Lobby_LeaveLobbyCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Lobby_LeaveLobbyCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Lobby_LeaveLobbyCallbackInfo, LobbyId, EOS_LobbyId, 16);
LAYOUT(EOS_Lobby_DestroyLobbyOptions, 24, 8);
FIELD(EOS_Lobby_DestroyLobbyOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_DestroyLobbyOptions, LocalUserId, EOS_ProductUserId, 8);
FIELD(EOS_Lobby_DestroyLobbyOptions, LobbyId, EOS_LobbyId, 16);
LAYOUT(EOS_Lobby_DestroyLobbyCallbackInfo, 24, 8);
FIELD(EOS_Lobby_DestroyLobbyCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Lobby_DestroyLobbyCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Lobby_DestroyLobbyCallbackInfo, LobbyId, EOS_LobbyId, 16);
LAYOUT(EOS_Lobby_SendInviteOptions, 32, 8);
FIELD(EOS_Lobby_SendInviteOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_SendInviteOptions, LobbyId, EOS_LobbyId, 8);
FIELD(EOS_Lobby_SendInviteOptions, LocalUserId, EOS_ProductUserId, 16);
FIELD(EOS_Lobby_SendInviteOptions, TargetUserId, EOS_ProductUserId, 24);
LAYOUT(EOS_Lobby_SendInviteCallbackInfo, 24, 8);
FIELD(EOS_Lobby_SendInviteCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Lobby_SendInviteCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Lobby_SendInviteCallbackInfo, LobbyId, EOS_LobbyId, 16);
LAYOUT(EOS_Lobby_RejectInviteOptions, 24, 8);
FIELD(EOS_Lobby_RejectInviteOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_RejectInviteOptions, InviteId, const char*, 8);
FIELD(EOS_Lobby_RejectInviteOptions, LocalUserId, EOS_ProductUserId, 16);
LAYOUT(EOS_Lobby_RejectInviteCallbackInfo, 24, 8);
FIELD(EOS_Lobby_RejectInviteCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Lobby_RejectInviteCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Lobby_RejectInviteCallbackInfo, InviteId, const char*, 16);
LAYOUT(EOS_Lobby_CopyLobbyDetailsHandleByInviteIdOptions, 16, 8);
FIELD(EOS_Lobby_CopyLobbyDetailsHandleByInviteIdOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_CopyLobbyDetailsHandleByInviteIdOptions, InviteId, const char*, 8);
LAYOUT(EOS_Lobby_CopyLobbyDetailsHandleByUiEventIdOptions, 16, 8);
FIELD(EOS_Lobby_CopyLobbyDetailsHandleByUiEventIdOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_CopyLobbyDetailsHandleByUiEventIdOptions, UiEventId, EOS_UI_EventId, 8);
LAYOUT(EOS_Lobby_JoinLobbyOptions, 48, 8);
FIELD(EOS_Lobby_JoinLobbyOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_JoinLobbyOptions, LobbyDetailsHandle, EOS_HLobbyDetails, 8);
FIELD(EOS_Lobby_JoinLobbyOptions, LocalUserId, EOS_ProductUserId, 16);
FIELD(EOS_Lobby_JoinLobbyOptions, bPresenceEnabled, EOS_Bool, 24);
FIELD(EOS_Lobby_JoinLobbyOptions, LocalRTCOptions, const EOS_Lobby_LocalRTCOptions*, 32);
FIELD(EOS_Lobby_JoinLobbyOptions, bCrossplayOptOut, EOS_Bool, 40);
LAYOUT(EOS_Lobby_JoinLobbyCallbackInfo, 24, 8);
FIELD(EOS_Lobby_JoinLobbyCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Lobby_JoinLobbyCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Lobby_JoinLobbyCallbackInfo, LobbyId, EOS_LobbyId, 16);
LAYOUT(EOS_Lobby_CopyLobbyDetailsHandleOptions, 24, 8);
FIELD(EOS_Lobby_CopyLobbyDetailsHandleOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Lobby_CopyLobbyDetailsHandleOptions, LobbyId, EOS_LobbyId, 8);
FIELD(EOS_Lobby_CopyLobbyDetailsHandleOptions, LocalUserId, EOS_ProductUserId, 16);
LAYOUT(EOS_LobbyDetails_CopyInfoOptions, 4, 4);
FIELD(EOS_LobbyDetails_CopyInfoOptions, ApiVersion, int32_t, 0);
LAYOUT(EOS_LobbyDetails_Info, 88, 8);
FIELD(EOS_LobbyDetails_Info, ApiVersion, int32_t, 0);
FIELD(EOS_LobbyDetails_Info, LobbyId, EOS_LobbyId, 8);
FIELD(EOS_LobbyDetails_Info, LobbyOwnerUserId, EOS_ProductUserId, 16);
FIELD(EOS_LobbyDetails_Info, PermissionLevel, EOS_ELobbyPermissionLevel, 24);
FIELD(EOS_LobbyDetails_Info, AvailableSlots, uint32_t, 28);
FIELD(EOS_LobbyDetails_Info, MaxMembers, uint32_t, 32);
FIELD(EOS_LobbyDetails_Info, bAllowInvites, EOS_Bool, 36);
FIELD(EOS_LobbyDetails_Info, BucketId, const char*, 40);
FIELD(EOS_LobbyDetails_Info, bAllowHostMigration, EOS_Bool, 48);
FIELD(EOS_LobbyDetails_Info, bRTCRoomEnabled, EOS_Bool, 52);
FIELD(EOS_LobbyDetails_Info, bAllowJoinById, EOS_Bool, 56);
FIELD(EOS_LobbyDetails_Info, bRejoinAfterKickRequiresInvite, EOS_Bool, 60);
FIELD(EOS_LobbyDetails_Info, bPresenceEnabled, EOS_Bool, 64);
FIELD(EOS_LobbyDetails_Info, AllowedPlatformIds, const uint32_t*, 72);
FIELD(EOS_LobbyDetails_Info, AllowedPlatformIdsCount, uint32_t, 80);
LAYOUT(EOS_LobbyDetails_CopyAttributeByKeyOptions, 16, 8);
FIELD(EOS_LobbyDetails_CopyAttributeByKeyOptions, ApiVersion, int32_t, 0);
FIELD(EOS_LobbyDetails_CopyAttributeByKeyOptions, AttrKey, const char*, 8);
LAYOUT(EOS_Lobby_AddNotifyLobbyInviteAcceptedOptions, 4, 4);
FIELD(EOS_Lobby_AddNotifyLobbyInviteAcceptedOptions, ApiVersion, int32_t, 0);
LAYOUT(EOS_Lobby_LobbyInviteAcceptedCallbackInfo, 40, 8);
FIELD(EOS_Lobby_LobbyInviteAcceptedCallbackInfo, ClientData, void*, 0);
FIELD(EOS_Lobby_LobbyInviteAcceptedCallbackInfo, InviteId, const char*, 8);
FIELD(EOS_Lobby_LobbyInviteAcceptedCallbackInfo, LocalUserId, EOS_ProductUserId, 16);
FIELD(EOS_Lobby_LobbyInviteAcceptedCallbackInfo, TargetUserId, EOS_ProductUserId, 24);
FIELD(EOS_Lobby_LobbyInviteAcceptedCallbackInfo, LobbyId, EOS_LobbyId, 32);
LAYOUT(EOS_Lobby_AddNotifyJoinLobbyAcceptedOptions, 4, 4);
FIELD(EOS_Lobby_AddNotifyJoinLobbyAcceptedOptions, ApiVersion, int32_t, 0);
LAYOUT(EOS_Lobby_JoinLobbyAcceptedCallbackInfo, 24, 8);
FIELD(EOS_Lobby_JoinLobbyAcceptedCallbackInfo, ClientData, void*, 0);
FIELD(EOS_Lobby_JoinLobbyAcceptedCallbackInfo, LocalUserId, EOS_ProductUserId, 8);
FIELD(EOS_Lobby_JoinLobbyAcceptedCallbackInfo, UiEventId, EOS_UI_EventId, 16);
LAYOUT(EOS_Lobby_AddNotifyLobbyInviteReceivedOptions, 4, 4);
FIELD(EOS_Lobby_AddNotifyLobbyInviteReceivedOptions, ApiVersion, int32_t, 0);
LAYOUT(EOS_Lobby_LobbyInviteReceivedCallbackInfo, 32, 8);
FIELD(EOS_Lobby_LobbyInviteReceivedCallbackInfo, ClientData, void*, 0);
FIELD(EOS_Lobby_LobbyInviteReceivedCallbackInfo, InviteId, const char*, 8);
FIELD(EOS_Lobby_LobbyInviteReceivedCallbackInfo, LocalUserId, EOS_ProductUserId, 16);
FIELD(EOS_Lobby_LobbyInviteReceivedCallbackInfo, TargetUserId, EOS_ProductUserId, 24);

// eos_friends_types.h
LAYOUT(EOS_Friends_QueryFriendsOptions, 16, 8);
FIELD(EOS_Friends_QueryFriendsOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Friends_QueryFriendsOptions, LocalUserId, EOS_EpicAccountId, 8);
LAYOUT(EOS_Friends_QueryFriendsCallbackInfo, 24, 8);
FIELD(EOS_Friends_QueryFriendsCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Friends_QueryFriendsCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Friends_QueryFriendsCallbackInfo, LocalUserId, EOS_EpicAccountId, 16);
LAYOUT(EOS_Friends_GetFriendsCountOptions, 16, 8);
FIELD(EOS_Friends_GetFriendsCountOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Friends_GetFriendsCountOptions, LocalUserId, EOS_EpicAccountId, 8);
LAYOUT(EOS_Friends_GetFriendAtIndexOptions, 24, 8);
FIELD(EOS_Friends_GetFriendAtIndexOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Friends_GetFriendAtIndexOptions, LocalUserId, EOS_EpicAccountId, 8);
FIELD(EOS_Friends_GetFriendAtIndexOptions, Index, int32_t, 16);

// eos_presence_types.h
LAYOUT(EOS_Presence_QueryPresenceOptions, 24, 8);
FIELD(EOS_Presence_QueryPresenceOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Presence_QueryPresenceOptions, LocalUserId, EOS_EpicAccountId, 8);
FIELD(EOS_Presence_QueryPresenceOptions, TargetUserId, EOS_EpicAccountId, 16);
LAYOUT(EOS_Presence_QueryPresenceCallbackInfo, 32, 8);
FIELD(EOS_Presence_QueryPresenceCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Presence_QueryPresenceCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Presence_QueryPresenceCallbackInfo, LocalUserId, EOS_EpicAccountId, 16);
FIELD(EOS_Presence_QueryPresenceCallbackInfo, TargetUserId, EOS_EpicAccountId, 24);
LAYOUT(EOS_Presence_CopyPresenceOptions, 24, 8);
FIELD(EOS_Presence_CopyPresenceOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Presence_CopyPresenceOptions, LocalUserId, EOS_EpicAccountId, 8);
FIELD(EOS_Presence_CopyPresenceOptions, TargetUserId, EOS_EpicAccountId, 16);
LAYOUT(EOS_Presence_DataRecord, 24, 8);
FIELD(EOS_Presence_DataRecord, ApiVersion, int32_t, 0);
FIELD(EOS_Presence_DataRecord, Key, const char*, 8);
FIELD(EOS_Presence_DataRecord, Value, const char*, 16);
LAYOUT(EOS_Presence_Info, 80, 8);
FIELD(EOS_Presence_Info, ApiVersion, int32_t, 0);
FIELD(EOS_Presence_Info, Status, EOS_Presence_EStatus, 4);
FIELD(EOS_Presence_Info, UserId, EOS_EpicAccountId, 8);
FIELD(EOS_Presence_Info, ProductId, const char*, 16);
FIELD(EOS_Presence_Info, ProductVersion, const char*, 24);
FIELD(EOS_Presence_Info, Platform, const char*, 32);
FIELD(EOS_Presence_Info, RichText, const char*, 40);
FIELD(EOS_Presence_Info, RecordsCount, int32_t, 48);
FIELD(EOS_Presence_Info, Records, const EOS_Presence_DataRecord*, 56);
FIELD(EOS_Presence_Info, ProductName, const char*, 64);
FIELD(EOS_Presence_Info, IntegratedPlatform, const char*, 72);

// eos_ui_types.h
LAYOUT(EOS_UI_ShowFriendsOptions, 16, 8);
FIELD(EOS_UI_ShowFriendsOptions, ApiVersion, int32_t, 0);
FIELD(EOS_UI_ShowFriendsOptions, LocalUserId, EOS_EpicAccountId, 8);
LAYOUT(EOS_UI_ShowFriendsCallbackInfo, 24, 8);
FIELD(EOS_UI_ShowFriendsCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_UI_ShowFriendsCallbackInfo, ClientData, void*, 8);
FIELD(EOS_UI_ShowFriendsCallbackInfo, LocalUserId, EOS_EpicAccountId, 16);

// eos_achievements_types.h
LAYOUT(EOS_Achievements_UnlockAchievementsOptions, 32, 8);
FIELD(EOS_Achievements_UnlockAchievementsOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Achievements_UnlockAchievementsOptions, UserId, EOS_ProductUserId, 8);
FIELD(EOS_Achievements_UnlockAchievementsOptions, AchievementIds, const char**, 16);
FIELD(EOS_Achievements_UnlockAchievementsOptions, AchievementsCount, uint32_t, 24);
LAYOUT(EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo, 32, 8);
FIELD(EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo, UserId, EOS_ProductUserId, 16);
FIELD(EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo, AchievementsCount, uint32_t, 24);
LAYOUT(EOS_Achievements_QueryPlayerAchievementsOptions, 24, 8);
FIELD(EOS_Achievements_QueryPlayerAchievementsOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Achievements_QueryPlayerAchievementsOptions, TargetUserId, EOS_ProductUserId, 8);
FIELD(EOS_Achievements_QueryPlayerAchievementsOptions, LocalUserId, EOS_ProductUserId, 16);
LAYOUT(EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo, 24, 8);
FIELD(EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo, UserId, EOS_ProductUserId, 16);
LAYOUT(EOS_Achievements_GetPlayerAchievementCountOptions, 16, 8);
FIELD(EOS_Achievements_GetPlayerAchievementCountOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Achievements_GetPlayerAchievementCountOptions, UserId, EOS_ProductUserId, 8);
LAYOUT(EOS_Achievements_CopyPlayerAchievementByIndexOptions, 32, 8);
FIELD(EOS_Achievements_CopyPlayerAchievementByIndexOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Achievements_CopyPlayerAchievementByIndexOptions, TargetUserId, EOS_ProductUserId, 8);
FIELD(EOS_Achievements_CopyPlayerAchievementByIndexOptions, AchievementIndex, uint32_t, 16);
FIELD(EOS_Achievements_CopyPlayerAchievementByIndexOptions, LocalUserId, EOS_ProductUserId, 24);
LAYOUT(EOS_Achievements_PlayerStatInfo, 24, 8);
FIELD(EOS_Achievements_PlayerStatInfo, ApiVersion, int32_t, 0);
FIELD(EOS_Achievements_PlayerStatInfo, Name, const char*, 8);
FIELD(EOS_Achievements_PlayerStatInfo, CurrentValue, int32_t, 16);
FIELD(EOS_Achievements_PlayerStatInfo, ThresholdValue, int32_t, 20);
LAYOUT(EOS_Achievements_PlayerAchievement, 80, 8);
FIELD(EOS_Achievements_PlayerAchievement, ApiVersion, int32_t, 0);
FIELD(EOS_Achievements_PlayerAchievement, AchievementId, const char*, 8);
FIELD(EOS_Achievements_PlayerAchievement, Progress, double, 16);
FIELD(EOS_Achievements_PlayerAchievement, UnlockTime, int64_t, 24);
FIELD(EOS_Achievements_PlayerAchievement, StatInfoCount, int32_t, 32);
FIELD(EOS_Achievements_PlayerAchievement, StatInfo, const EOS_Achievements_PlayerStatInfo*, 40);
FIELD(EOS_Achievements_PlayerAchievement, DisplayName, const char*, 48);
FIELD(EOS_Achievements_PlayerAchievement, Description, const char*, 56);
FIELD(EOS_Achievements_PlayerAchievement, IconURL, const char*, 64);
FIELD(EOS_Achievements_PlayerAchievement, FlavorText, const char*, 72);

// eos_ecom_types.h
LAYOUT(EOS_Ecom_QueryOwnershipOptions, 40, 8);
FIELD(EOS_Ecom_QueryOwnershipOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Ecom_QueryOwnershipOptions, LocalUserId, EOS_EpicAccountId, 8);
FIELD(EOS_Ecom_QueryOwnershipOptions, CatalogItemIds, EOS_Ecom_CatalogItemId*, 16);
FIELD(EOS_Ecom_QueryOwnershipOptions, CatalogItemIdCount, uint32_t, 24);
FIELD(EOS_Ecom_QueryOwnershipOptions, CatalogNamespace, const char*, 32);
LAYOUT(EOS_Ecom_QueryOwnershipCallbackInfo, 40, 8);
FIELD(EOS_Ecom_QueryOwnershipCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Ecom_QueryOwnershipCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Ecom_QueryOwnershipCallbackInfo, LocalUserId, EOS_EpicAccountId, 16);
FIELD(EOS_Ecom_QueryOwnershipCallbackInfo, ItemOwnership, const EOS_Ecom_ItemOwnership*, 24);
FIELD(EOS_Ecom_QueryOwnershipCallbackInfo, ItemOwnershipCount, uint32_t, 32);
LAYOUT(EOS_Ecom_ItemOwnership, 24, 8);
FIELD(EOS_Ecom_ItemOwnership, ApiVersion, int32_t, 0);
FIELD(EOS_Ecom_ItemOwnership, Id, EOS_Ecom_CatalogItemId, 8);
FIELD(EOS_Ecom_ItemOwnership, OwnershipStatus, EOS_EOwnershipStatus, 16);
LAYOUT(EOS_Ecom_CheckoutEntry, 16, 8);
FIELD(EOS_Ecom_CheckoutEntry, ApiVersion, int32_t, 0);
FIELD(EOS_Ecom_CheckoutEntry, OfferId, EOS_Ecom_CatalogOfferId, 8);
LAYOUT(EOS_Ecom_CheckoutOptions, 40, 8);
FIELD(EOS_Ecom_CheckoutOptions, ApiVersion, int32_t, 0);
FIELD(EOS_Ecom_CheckoutOptions, LocalUserId, EOS_EpicAccountId, 8);
FIELD(EOS_Ecom_CheckoutOptions, OverrideCatalogNamespace, const char*, 16);
FIELD(EOS_Ecom_CheckoutOptions, EntryCount, uint32_t, 24);
FIELD(EOS_Ecom_CheckoutOptions, Entries, const EOS_Ecom_CheckoutEntry*, 32);
LAYOUT(EOS_Ecom_CheckoutCallbackInfo, 32, 8);
FIELD(EOS_Ecom_CheckoutCallbackInfo, ResultCode, EOS_EResult, 0);
FIELD(EOS_Ecom_CheckoutCallbackInfo, ClientData, void*, 8);
FIELD(EOS_Ecom_CheckoutCallbackInfo, LocalUserId, EOS_EpicAccountId, 16);
FIELD(EOS_Ecom_CheckoutCallbackInfo, TransactionId, const char*, 24);

static_assert(std::is_same<decltype(EOS_Lobby_AttributeData::Value.AsInt64), int64_t>::value, "");
static_assert(std::is_same<decltype(EOS_Lobby_AttributeData::Value.AsDouble), double>::value, "");
static_assert(std::is_same<decltype(EOS_Lobby_AttributeData::Value.AsBool), EOS_Bool>::value, "");
static_assert(std::is_same<decltype(EOS_Lobby_AttributeData::Value.AsUtf8), const char*>::value, "");

// ---------------------------------------------------------------------------------------------
// Base types and handles.

static_assert(std::is_same<EOS_Bool, int32_t>::value, "");
static_assert(EOS_TRUE == 1 && EOS_FALSE == 0, "");
static_assert(std::is_same<EOS_NotificationId, uint64_t>::value, "");
static_assert(std::is_same<decltype(EOS_INVALID_NOTIFICATIONID), EOS_NotificationId>::value, "");
static_assert(EOS_INVALID_NOTIFICATIONID == 0, "");
static_assert(std::is_same<EOS_UI_EventId, uint64_t>::value && EOS_UI_EVENTID_INVALID == 0, "");
static_assert(std::is_same<EOS_LobbyId, const char*>::value, "");
static_assert(std::is_same<EOS_Ecom_CatalogItemId, const char*>::value, "");
static_assert(std::is_same<EOS_Ecom_CatalogOfferId, const char*>::value, "");
static_assert(std::is_same<EOS_OnlinePlatformType, uint32_t>::value, "");
static_assert(EOS_OPT_Unknown == 0 && EOS_OPT_Epic == 100 && EOS_OPT_Steam == 4000, "");
static_assert(std::is_same<EOS_IntegratedPlatformType, const char*>::value, "");
static_assert(std::is_same<EOS_ELobbyAttributeType, EOS_EAttributeType>::value, "");
static_assert(std::is_same<EOS_ESessionAttributeType, EOS_EAttributeType>::value, "");

// Handles are pointers to incomplete structs with fixed tags (the tags show up in C++ mangling).
static_assert(std::is_same<EOS_EpicAccountId, struct EOS_EpicAccountIdDetails*>::value, "");
static_assert(std::is_same<EOS_ProductUserId, struct EOS_ProductUserIdDetails*>::value, "");
static_assert(std::is_same<EOS_ContinuanceToken, struct EOS_ContinuanceTokenDetails*>::value, "");
static_assert(std::is_same<EOS_HPlatform, struct EOS_PlatformHandle*>::value, "");
static_assert(std::is_same<EOS_HAuth, struct EOS_AuthHandle*>::value, "");
static_assert(std::is_same<EOS_HConnect, struct EOS_ConnectHandle*>::value, "");
static_assert(std::is_same<EOS_HUserInfo, struct EOS_UserInfoHandle*>::value, "");
static_assert(std::is_same<EOS_HLobby, struct EOS_LobbyHandle*>::value, "");
static_assert(std::is_same<EOS_HLobbyModification, struct EOS_LobbyModificationHandle*>::value, "");
static_assert(std::is_same<EOS_HLobbyDetails, struct EOS_LobbyDetailsHandle*>::value, "");
static_assert(std::is_same<EOS_HLobbySearch, struct EOS_LobbySearchHandle*>::value, "");
static_assert(std::is_same<EOS_HFriends, struct EOS_FriendsHandle*>::value, "");
static_assert(std::is_same<EOS_HPresence, struct EOS_PresenceHandle*>::value, "");
static_assert(std::is_same<EOS_HPresenceModification, struct EOS_PresenceModificationHandle*>::value, "");
static_assert(std::is_same<EOS_HUI, struct EOS_UIHandle*>::value, "");
static_assert(std::is_same<EOS_HAchievements, struct EOS_AchievementsHandle*>::value, "");
static_assert(std::is_same<EOS_HEcom, struct EOS_EcomHandle*>::value, "");
static_assert(std::is_same<EOS_Ecom_HTransaction, struct EOS_Ecom_TransactionHandle*>::value, "");
static_assert(std::is_same<EOS_HIntegratedPlatformOptionsContainer,
                           struct EOS_IntegratedPlatformOptionsContainerHandle*>::value, "");
static_assert(std::is_same<EOS_HMetrics, struct EOS_MetricsHandle*>::value, "");

// ---------------------------------------------------------------------------------------------
// Enums: scoped, 32-bit, no implicit conversion in C++ (so tarnwick's code must qualify and cast
// exactly as it has to with the real headers), and the values themselves.

template <typename E>
constexpr bool is_scoped_int32_enum()
{
    return std::is_enum<E>::value && !std::is_convertible<E, int>::value &&
           std::is_same<typename std::underlying_type<E>::type, int32_t>::value;
}

static_assert(is_scoped_int32_enum<EOS_EResult>(), "");
static_assert(is_scoped_int32_enum<EOS_ELoginStatus>(), "");
static_assert(is_scoped_int32_enum<EOS_EAttributeType>(), "");
static_assert(is_scoped_int32_enum<EOS_EExternalAccountType>(), "");
static_assert(is_scoped_int32_enum<EOS_EExternalCredentialType>(), "");
static_assert(is_scoped_int32_enum<EOS_ERTCBackgroundMode>(), "");
static_assert(is_scoped_int32_enum<EOS_ELogLevel>(), "");
static_assert(is_scoped_int32_enum<EOS_ELogCategory>(), "");
static_assert(is_scoped_int32_enum<EOS_ELoginCredentialType>(), "");
static_assert(is_scoped_int32_enum<EOS_EAuthScopeFlags>(), "");
static_assert(is_scoped_int32_enum<EOS_EAuthTokenType>(), "");
static_assert(is_scoped_int32_enum<EOS_ELobbyPermissionLevel>(), "");
static_assert(is_scoped_int32_enum<EOS_ELobbyAttributeVisibility>(), "");
static_assert(is_scoped_int32_enum<EOS_ELobbyMemberStatus>(), "");
static_assert(is_scoped_int32_enum<EOS_EFriendsStatus>(), "");
static_assert(is_scoped_int32_enum<EOS_Presence_EStatus>(), "");
static_assert(is_scoped_int32_enum<EOS_EOwnershipStatus>(), "");

#define ENUM_VALUE(E, Name, Value)                                                               \
    static_assert(static_cast<int64_t>(E::Name) == (Value), #E "::" #Name)

// EOS_ELoginCredentialType
ENUM_VALUE(EOS_ELoginCredentialType, EOS_LCT_Password, 0);
ENUM_VALUE(EOS_ELoginCredentialType, EOS_LCT_ExchangeCode, 1);
ENUM_VALUE(EOS_ELoginCredentialType, EOS_LCT_PersistentAuth, 2);
ENUM_VALUE(EOS_ELoginCredentialType, EOS_LCT_DeviceCode, 3);
ENUM_VALUE(EOS_ELoginCredentialType, EOS_LCT_Developer, 4);
ENUM_VALUE(EOS_ELoginCredentialType, EOS_LCT_RefreshToken, 5);
ENUM_VALUE(EOS_ELoginCredentialType, EOS_LCT_AccountPortal, 6);
ENUM_VALUE(EOS_ELoginCredentialType, EOS_LCT_ExternalAuth, 7);
// EOS_EAuthScopeFlags
ENUM_VALUE(EOS_EAuthScopeFlags, EOS_AS_NoFlags, 0x0);
ENUM_VALUE(EOS_EAuthScopeFlags, EOS_AS_BasicProfile, 0x1);
ENUM_VALUE(EOS_EAuthScopeFlags, EOS_AS_FriendsList, 0x2);
ENUM_VALUE(EOS_EAuthScopeFlags, EOS_AS_Presence, 0x4);
ENUM_VALUE(EOS_EAuthScopeFlags, EOS_AS_FriendsManagement, 0x8);
ENUM_VALUE(EOS_EAuthScopeFlags, EOS_AS_Email, 0x10);
ENUM_VALUE(EOS_EAuthScopeFlags, EOS_AS_Country, 0x20);
// EOS_EAuthTokenType
ENUM_VALUE(EOS_EAuthTokenType, EOS_ATT_Client, 0);
ENUM_VALUE(EOS_EAuthTokenType, EOS_ATT_User, 1);
// EOS_EExternalCredentialType
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_EPIC, 0);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_STEAM_APP_TICKET, 1);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_PSN_ID_TOKEN, 2);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_XBL_XSTS_TOKEN, 3);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_DISCORD_ACCESS_TOKEN, 4);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_GOG_SESSION_TICKET, 5);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_NINTENDO_ID_TOKEN, 6);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_NINTENDO_NSA_ID_TOKEN, 7);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_UPLAY_ACCESS_TOKEN, 8);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_OPENID_ACCESS_TOKEN, 9);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_DEVICEID_ACCESS_TOKEN, 10);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_APPLE_ID_TOKEN, 11);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_GOOGLE_ID_TOKEN, 12);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_OCULUS_USERID_NONCE, 13);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_ITCHIO_JWT, 14);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_ITCHIO_KEY, 15);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_EPIC_ID_TOKEN, 16);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_AMAZON_ACCESS_TOKEN, 17);
ENUM_VALUE(EOS_EExternalCredentialType, EOS_ECT_STEAM_SESSION_TICKET, 18);
// EOS_EExternalAccountType
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_EPIC, 0);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_STEAM, 1);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_PSN, 2);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_XBL, 3);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_DISCORD, 4);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_GOG, 5);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_NINTENDO, 6);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_UPLAY, 7);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_OPENID, 8);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_APPLE, 9);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_GOOGLE, 10);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_OCULUS, 11);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_ITCHIO, 12);
ENUM_VALUE(EOS_EExternalAccountType, EOS_EAT_AMAZON, 13);
// EOS_ELoginStatus
ENUM_VALUE(EOS_ELoginStatus, EOS_LS_NotLoggedIn, 0);
ENUM_VALUE(EOS_ELoginStatus, EOS_LS_UsingLocalProfile, 1);
ENUM_VALUE(EOS_ELoginStatus, EOS_LS_LoggedIn, 2);
// EOS_EAttributeType
ENUM_VALUE(EOS_EAttributeType, EOS_AT_BOOLEAN, 0);
ENUM_VALUE(EOS_EAttributeType, EOS_AT_INT64, 1);
ENUM_VALUE(EOS_EAttributeType, EOS_AT_DOUBLE, 2);
ENUM_VALUE(EOS_EAttributeType, EOS_AT_STRING, 3);
// EOS_ELobbyPermissionLevel
ENUM_VALUE(EOS_ELobbyPermissionLevel, EOS_LPL_PUBLICADVERTISED, 0);
ENUM_VALUE(EOS_ELobbyPermissionLevel, EOS_LPL_JOINVIAPRESENCE, 1);
ENUM_VALUE(EOS_ELobbyPermissionLevel, EOS_LPL_INVITEONLY, 2);
// EOS_ELobbyAttributeVisibility
ENUM_VALUE(EOS_ELobbyAttributeVisibility, EOS_LAT_PUBLIC, 0);
ENUM_VALUE(EOS_ELobbyAttributeVisibility, EOS_LAT_PRIVATE, 1);
// EOS_ELobbyMemberStatus
ENUM_VALUE(EOS_ELobbyMemberStatus, EOS_LMS_JOINED, 0);
ENUM_VALUE(EOS_ELobbyMemberStatus, EOS_LMS_LEFT, 1);
ENUM_VALUE(EOS_ELobbyMemberStatus, EOS_LMS_DISCONNECTED, 2);
ENUM_VALUE(EOS_ELobbyMemberStatus, EOS_LMS_KICKED, 3);
ENUM_VALUE(EOS_ELobbyMemberStatus, EOS_LMS_PROMOTED, 4);
ENUM_VALUE(EOS_ELobbyMemberStatus, EOS_LMS_CLOSED, 5);
// EOS_EOwnershipStatus
ENUM_VALUE(EOS_EOwnershipStatus, EOS_OS_NotOwned, 0);
ENUM_VALUE(EOS_EOwnershipStatus, EOS_OS_Owned, 1);
// EOS_ELogLevel
ENUM_VALUE(EOS_ELogLevel, EOS_LOG_Off, 0);
ENUM_VALUE(EOS_ELogLevel, EOS_LOG_Fatal, 100);
ENUM_VALUE(EOS_ELogLevel, EOS_LOG_Error, 200);
ENUM_VALUE(EOS_ELogLevel, EOS_LOG_Warning, 300);
ENUM_VALUE(EOS_ELogLevel, EOS_LOG_Info, 400);
ENUM_VALUE(EOS_ELogLevel, EOS_LOG_Verbose, 500);
ENUM_VALUE(EOS_ELogLevel, EOS_LOG_VeryVerbose, 600);
// EOS_ELogCategory
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Core, 0);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Auth, 1);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Friends, 2);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Presence, 3);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_UserInfo, 4);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_HttpSerialization, 5);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Ecom, 6);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_P2P, 7);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Sessions, 8);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_RateLimiter, 9);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_PlayerDataStorage, 10);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Analytics, 11);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Messaging, 12);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Connect, 13);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Overlay, 14);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Achievements, 15);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Stats, 16);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_UI, 17);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Lobby, 18);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Leaderboards, 19);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Keychain, 20);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_IntegratedPlatform, 21);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_TitleStorage, 22);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Mods, 23);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_AntiCheat, 24);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Reports, 25);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_Sanctions, 26);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_ProgressionSnapshots, 27);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_KWS, 28);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_RTC, 29);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_RTCAdmin, 30);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_CustomInvites, 31);
ENUM_VALUE(EOS_ELogCategory, EOS_LC_ALL_CATEGORIES, 0x7fffffff);
// EOS_Presence_EStatus
ENUM_VALUE(EOS_Presence_EStatus, EOS_PS_Offline, 0);
ENUM_VALUE(EOS_Presence_EStatus, EOS_PS_Online, 1);
ENUM_VALUE(EOS_Presence_EStatus, EOS_PS_Away, 2);
ENUM_VALUE(EOS_Presence_EStatus, EOS_PS_ExtendedAway, 3);
ENUM_VALUE(EOS_Presence_EStatus, EOS_PS_DoNotDisturb, 4);
// EOS_EFriendsStatus
ENUM_VALUE(EOS_EFriendsStatus, EOS_FS_NotFriends, 0);
ENUM_VALUE(EOS_EFriendsStatus, EOS_FS_InviteSent, 1);
ENUM_VALUE(EOS_EFriendsStatus, EOS_FS_InviteReceived, 2);
ENUM_VALUE(EOS_EFriendsStatus, EOS_FS_Friends, 3);
// EOS_ERTCBackgroundMode
ENUM_VALUE(EOS_ERTCBackgroundMode, EOS_RTCBM_LeaveRooms, 0);
ENUM_VALUE(EOS_ERTCBackgroundMode, EOS_RTCBM_KeepRoomsAlive, 1);


// Result codes: spot checks from each group; the full list is checked at run time below.
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Success) == 0, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_InvalidUser) == 3, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_InvalidParameters) == 10, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_IncompatibleVersion) == 13, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_NotConfigured) == 14, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_AlreadyConfigured) == 15, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Canceled) == 17, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_NotFound) == 18, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_OperationWillRetry) == 19, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_NoChange) == 20, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_LimitExceeded) == 22, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_TimedOut) == 27, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Invalid_ProductUserID) == 34, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_NetworkDisconnected) == 41, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Auth_AccountLocked) == 1001, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Auth_PinGrantCode) == 1020, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Auth_UserInterfaceRequired) == 1090, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Friends_NoInvitation) == 2001, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Friends_AlreadyFriends) == 2003, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Presence_StatusInvalid) == 3008, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Ecom_PurchaseProcessing) == 4005, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Connect_UserAlreadyExists) == 7001, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_UI_SocialOverlayLoadError) == 8000, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Lobby_NotOwner) == 9000, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Lobby_InviteNotFound) == 9009, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_Lobby_PlatformNotAllowed) == 9020, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_RTC_UserIsInBlocklist) == 13007, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_UserInfo_BestDisplayNameIndeterminate) == 22000, "");
static_assert(static_cast<int32_t>(EOS_EResult::EOS_UnexpectedError) == 0x7FFFFFFF, "");

// Scope flags combine at compile time like the real header's operators.
static_assert((EOS_EAuthScopeFlags::EOS_AS_BasicProfile | EOS_EAuthScopeFlags::EOS_AS_FriendsList |
               EOS_EAuthScopeFlags::EOS_AS_Presence) == static_cast<EOS_EAuthScopeFlags>(0x7), "");
static_assert((static_cast<EOS_EAuthScopeFlags>(0x7) & EOS_EAuthScopeFlags::EOS_AS_Presence) ==
                  EOS_EAuthScopeFlags::EOS_AS_Presence, "");

// ---------------------------------------------------------------------------------------------
// ApiVersion macros of the modelled release (1.16.1).

#define API_LATEST(Macro, Value) static_assert((Macro) == (Value), #Macro)

API_LATEST(EOS_INITIALIZE_API_LATEST, 4);
API_LATEST(EOS_PLATFORM_OPTIONS_API_LATEST, 13);
API_LATEST(EOS_AUTH_CREDENTIALS_API_LATEST, 4);
API_LATEST(EOS_AUTH_LOGIN_API_LATEST, 3);
API_LATEST(EOS_AUTH_COPYUSERAUTHTOKEN_API_LATEST, 1);
API_LATEST(EOS_USERINFO_COPYUSERINFO_API_LATEST, 3);
API_LATEST(EOS_USERINFO_QUERYUSERINFO_API_LATEST, 1);
API_LATEST(EOS_CONNECT_LOGIN_API_LATEST, 2);
API_LATEST(EOS_CONNECT_CREDENTIALS_API_LATEST, 1);
API_LATEST(EOS_CONNECT_CREATEUSER_API_LATEST, 1);
API_LATEST(EOS_CONNECT_QUERYPRODUCTUSERIDMAPPINGS_API_LATEST, 2);
API_LATEST(EOS_CONNECT_GETPRODUCTUSERIDMAPPING_API_LATEST, 1);
API_LATEST(EOS_CONNECT_QUERYEXTERNALACCOUNTMAPPINGS_API_LATEST, 1);
API_LATEST(EOS_CONNECT_GETEXTERNALACCOUNTMAPPING_API_LATEST, 1);
API_LATEST(EOS_LOBBY_CREATELOBBY_API_LATEST, 9);
API_LATEST(EOS_LOBBY_UPDATELOBBYMODIFICATION_API_LATEST, 1);
API_LATEST(EOS_LOBBYMODIFICATION_ADDATTRIBUTE_API_LATEST, 2);
API_LATEST(EOS_LOBBY_ATTRIBUTEDATA_API_LATEST, 1);
API_LATEST(EOS_LOBBY_UPDATELOBBY_API_LATEST, 1);
API_LATEST(EOS_LOBBY_LEAVELOBBY_API_LATEST, 1);
API_LATEST(EOS_LOBBY_DESTROYLOBBY_API_LATEST, 1);
API_LATEST(EOS_LOBBY_SENDINVITE_API_LATEST, 1);
API_LATEST(EOS_LOBBY_REJECTINVITE_API_LATEST, 1);
API_LATEST(EOS_LOBBY_COPYLOBBYDETAILSHANDLEBYINVITEID_API_LATEST, 1);
API_LATEST(EOS_LOBBY_JOINLOBBY_API_LATEST, 4);
API_LATEST(EOS_LOBBY_COPYLOBBYDETAILSHANDLE_API_LATEST, 1);
API_LATEST(EOS_LOBBYDETAILS_COPYINFO_API_LATEST, 1);
API_LATEST(EOS_LOBBYDETAILS_COPYATTRIBUTEBYKEY_API_LATEST, 1);
API_LATEST(EOS_LOBBY_ADDNOTIFYLOBBYINVITEACCEPTED_API_LATEST, 1);
API_LATEST(EOS_LOBBY_ADDNOTIFYJOINLOBBYACCEPTED_API_LATEST, 1);
API_LATEST(EOS_LOBBY_ADDNOTIFYLOBBYINVITERECEIVED_API_LATEST, 1);
API_LATEST(EOS_LOBBY_COPYLOBBYDETAILSHANDLEBYUIEVENTID_API_LATEST, 1);
API_LATEST(EOS_FRIENDS_QUERYFRIENDS_API_LATEST, 1);
API_LATEST(EOS_FRIENDS_GETFRIENDSCOUNT_API_LATEST, 1);
API_LATEST(EOS_FRIENDS_GETFRIENDATINDEX_API_LATEST, 1);
API_LATEST(EOS_PRESENCE_QUERYPRESENCE_API_LATEST, 1);
API_LATEST(EOS_PRESENCE_COPYPRESENCE_API_LATEST, 3);
API_LATEST(EOS_UI_SHOWFRIENDS_API_LATEST, 1);
API_LATEST(EOS_ACHIEVEMENTS_UNLOCKACHIEVEMENTS_API_LATEST, 1);
API_LATEST(EOS_ACHIEVEMENTS_QUERYPLAYERACHIEVEMENTS_API_LATEST, 2);
API_LATEST(EOS_ACHIEVEMENTS_GETPLAYERACHIEVEMENTCOUNT_API_LATEST, 1);
API_LATEST(EOS_ACHIEVEMENTS_COPYPLAYERACHIEVEMENTBYINDEX_API_LATEST, 2);
API_LATEST(EOS_ECOM_QUERYOWNERSHIP_API_LATEST, 2);
API_LATEST(EOS_ECOM_CHECKOUT_API_LATEST, 1);
API_LATEST(EOS_ECOM_CHECKOUTENTRY_API_LATEST, 1);

// The plural spelling is an alias of the singular one.
API_LATEST(EOS_CONNECT_GETEXTERNALACCOUNTMAPPINGS_API_LATEST, 1);

// Versions the SDK writes into the structs it fills in, and of nested input structs.
API_LATEST(EOS_AUTH_TOKEN_API_LATEST, 2);
API_LATEST(EOS_AUTH_PINGRANTINFO_API_LATEST, 2);
API_LATEST(EOS_AUTH_ACCOUNTFEATURERESTRICTEDINFO_API_LATEST, 1);
API_LATEST(EOS_PRESENCE_INFO_API_LATEST, 3);
API_LATEST(EOS_PRESENCE_DATARECORD_API_LATEST, 1);
API_LATEST(EOS_LOBBYDETAILS_INFO_API_LATEST, 3);
API_LATEST(EOS_LOBBY_ATTRIBUTE_API_LATEST, 1);
API_LATEST(EOS_ACHIEVEMENTS_PLAYERACHIEVEMENT_API_LATEST, 2);
API_LATEST(EOS_ACHIEVEMENTS_PLAYERSTATINFO_API_LATEST, 1);
API_LATEST(EOS_ECOM_ITEMOWNERSHIP_API_LATEST, 1);
API_LATEST(EOS_PLATFORM_RTCOPTIONS_API_LATEST, 2);
API_LATEST(EOS_LOBBY_LOCALRTCOPTIONS_API_LATEST, 1);
API_LATEST(EOS_INITIALIZE_THREADAFFINITY_API_LATEST, 2);
API_LATEST(EOS_CONNECT_USERLOGININFO_API_LATEST, 2);

static_assert(EOS_MAJOR_VERSION == 1 && EOS_MINOR_VERSION == 16 && EOS_PATCH_VERSION == 1, "");

// ---------------------------------------------------------------------------------------------
// Other constants.

static_assert(EOS_PF_LOADING_IN_EDITOR == 0x1 && EOS_PF_DISABLE_OVERLAY == 0x2 &&
                  EOS_PF_DISABLE_SOCIAL_OVERLAY == 0x4 && EOS_PF_RESERVED1 == 0x8 &&
                  EOS_PF_WINDOWS_ENABLE_OVERLAY_D3D9 == 0x10 && EOS_PF_WINDOWS_ENABLE_OVERLAY_D3D10 == 0x20 &&
                  EOS_PF_WINDOWS_ENABLE_OVERLAY_OPENGL == 0x40 &&
                  EOS_PF_CONSOLE_ENABLE_OVERLAY_AUTOMATIC_UNLOADING == 0x80,
              "platform flags");
static_assert(EOS_LF_NO_USER_INTERFACE == 0x1, "");
static_assert(EOS_ACHIEVEMENTS_ACHIEVEMENT_UNLOCKTIME_UNDEFINED == -1, "");
static_assert(EOS_EPICACCOUNTID_MAX_LENGTH == 32 && EOS_PRODUCTUSERID_MAX_LENGTH == 32, "");
static_assert(EOS_PLATFORM_OPTIONS_PRODUCTID_MAX_LENGTH == 64 && EOS_PLATFORM_OPTIONS_SANDBOXID_MAX_LENGTH == 64 &&
                  EOS_PLATFORM_OPTIONS_DEPLOYMENTID_MAX_LENGTH == 64 && EOS_PLATFORM_OPTIONS_ENCRYPTIONKEY_LENGTH == 64,
              "");
static_assert(EOS_PLATFORM_CLIENTCREDENTIALS_CLIENTID_MAX_LENGTH == 64 &&
                  EOS_PLATFORM_CLIENTCREDENTIALS_CLIENTSECRET_MAX_LENGTH == 64, "");
static_assert(EOS_INITIALIZEOPTIONS_PRODUCTNAME_MAX_LENGTH == 64 &&
                  EOS_INITIALIZEOPTIONS_PRODUCTVERSION_MAX_LENGTH == 64, "");
static_assert(EOS_COUNTRYCODE_MAX_LENGTH == 4 && EOS_LOCALECODE_MAX_LENGTH == 9, "");
static_assert(EOS_CONNECT_EXTERNAL_ACCOUNT_ID_MAX_LENGTH == 256, "");
static_assert(EOS_CONNECT_QUERYEXTERNALACCOUNTMAPPINGS_MAX_ACCOUNT_IDS == 128, "");
static_assert(EOS_LOBBY_MAX_LOBBIES == 16 && EOS_LOBBY_MAX_LOBBY_MEMBERS == 64 && EOS_LOBBY_MAX_SEARCH_RESULTS == 200, "");
static_assert(EOS_LOBBY_MIN_LOBBYIDOVERRIDE_LENGTH == 4 && EOS_LOBBY_MAX_LOBBYIDOVERRIDE_LENGTH == 60, "");
static_assert(EOS_LOBBY_INVITEID_MAX_LENGTH == 64, "");
static_assert(EOS_LOBBYMODIFICATION_MAX_ATTRIBUTES == 64 && EOS_LOBBYMODIFICATION_MAX_ATTRIBUTE_LENGTH == 64, "");
static_assert(EOS_ECOM_QUERYOWNERSHIP_MAX_CATALOG_IDS == 400 && EOS_ECOM_CHECKOUT_MAX_ENTRIES == 10 &&
                  EOS_ECOM_TRANSACTIONID_MAXIMUM_LENGTH == 64, "");
static_assert(EOS_PRESENCE_DATA_MAX_KEYS == 32 && EOS_PRESENCE_DATA_MAX_KEY_LENGTH == 64 &&
                  EOS_PRESENCE_DATA_MAX_VALUE_LENGTH == 255 && EOS_PRESENCE_RICH_TEXT_MAX_VALUE_LENGTH == 255, "");
static_assert(EOS_USERINFO_MAX_DISPLAYNAME_CHARACTERS == 16 && EOS_USERINFO_MAX_DISPLAYNAME_UTF8_LENGTH == 64, "");

// ---------------------------------------------------------------------------------------------
// Prototypes (return type and parameter types, in order) and callback signatures. Top-level
// const on a parameter is not part of a function type, as with the real declarations.

#define PROTO(F, Ret, ...)                                                                       \
    static_assert(std::is_same<decltype(&F), Ret(EOS_CALL*)(__VA_ARGS__)>::value, "prototype of " #F)
#define CALLBACK(Name, ...)                                                                      \
    static_assert(std::is_same<Name, void(EOS_CALL*)(__VA_ARGS__)>::value, "signature of " #Name)
#define MEMORY_CALLBACK(Name, Ret, ...)                                                          \
    static_assert(std::is_same<Name, Ret(EOS_MEMORY_CALL*)(__VA_ARGS__)>::value, "signature of " #Name)

PROTO(EOS_Initialize, EOS_EResult, const EOS_InitializeOptions*);
PROTO(EOS_Shutdown, EOS_EResult, void);
PROTO(EOS_Logging_SetCallback, EOS_EResult, EOS_LogMessageFunc);
PROTO(EOS_Logging_SetLogLevel, EOS_EResult, EOS_ELogCategory, EOS_ELogLevel);
PROTO(EOS_Platform_Create, EOS_HPlatform, const EOS_Platform_Options*);
PROTO(EOS_Platform_Tick, void, EOS_HPlatform);
PROTO(EOS_Platform_Release, void, EOS_HPlatform);
PROTO(EOS_Platform_GetAchievementsInterface, EOS_HAchievements, EOS_HPlatform);
PROTO(EOS_Platform_GetAuthInterface, EOS_HAuth, EOS_HPlatform);
PROTO(EOS_Platform_GetConnectInterface, EOS_HConnect, EOS_HPlatform);
PROTO(EOS_Platform_GetEcomInterface, EOS_HEcom, EOS_HPlatform);
PROTO(EOS_Platform_GetFriendsInterface, EOS_HFriends, EOS_HPlatform);
PROTO(EOS_Platform_GetLobbyInterface, EOS_HLobby, EOS_HPlatform);
PROTO(EOS_Platform_GetPresenceInterface, EOS_HPresence, EOS_HPlatform);
PROTO(EOS_Platform_GetUIInterface, EOS_HUI, EOS_HPlatform);
PROTO(EOS_Platform_GetUserInfoInterface, EOS_HUserInfo, EOS_HPlatform);
PROTO(EOS_Auth_Login, void, EOS_HAuth, const EOS_Auth_LoginOptions*, void*, const EOS_Auth_OnLoginCallback);
PROTO(EOS_Auth_CopyUserAuthToken, EOS_EResult, EOS_HAuth, const EOS_Auth_CopyUserAuthTokenOptions*, EOS_EpicAccountId, EOS_Auth_Token**);
PROTO(EOS_Auth_Token_Release, void, EOS_Auth_Token*);
PROTO(EOS_UserInfo_CopyUserInfo, EOS_EResult, EOS_HUserInfo, const EOS_UserInfo_CopyUserInfoOptions*, EOS_UserInfo**);
PROTO(EOS_UserInfo_QueryUserInfo, void, EOS_HUserInfo, const EOS_UserInfo_QueryUserInfoOptions*, void*, const EOS_UserInfo_OnQueryUserInfoCallback);
PROTO(EOS_UserInfo_Release, void, EOS_UserInfo*);
PROTO(EOS_Connect_Login, void, EOS_HConnect, const EOS_Connect_LoginOptions*, void*, const EOS_Connect_OnLoginCallback);
PROTO(EOS_Connect_CreateUser, void, EOS_HConnect, const EOS_Connect_CreateUserOptions*, void*, const EOS_Connect_OnCreateUserCallback);
PROTO(EOS_Connect_QueryProductUserIdMappings, void, EOS_HConnect, const EOS_Connect_QueryProductUserIdMappingsOptions*, void*, const EOS_Connect_OnQueryProductUserIdMappingsCallback);
PROTO(EOS_Connect_GetProductUserIdMapping, EOS_EResult, EOS_HConnect, const EOS_Connect_GetProductUserIdMappingOptions*, char*, int32_t*);
PROTO(EOS_Connect_QueryExternalAccountMappings, void, EOS_HConnect, const EOS_Connect_QueryExternalAccountMappingsOptions*, void*, const EOS_Connect_OnQueryExternalAccountMappingsCallback);
PROTO(EOS_Connect_GetExternalAccountMapping, EOS_ProductUserId, EOS_HConnect, const EOS_Connect_GetExternalAccountMappingsOptions*);
PROTO(EOS_EpicAccountId_ToString, EOS_EResult, EOS_EpicAccountId, char*, int32_t*);
PROTO(EOS_EpicAccountId_FromString, EOS_EpicAccountId, const char*);
PROTO(EOS_EpicAccountId_IsValid, EOS_Bool, EOS_EpicAccountId);
PROTO(EOS_ProductUserId_ToString, EOS_EResult, EOS_ProductUserId, char*, int32_t*);
PROTO(EOS_ProductUserId_FromString, EOS_ProductUserId, const char*);
PROTO(EOS_ProductUserId_IsValid, EOS_Bool, EOS_ProductUserId);
PROTO(EOS_EResult_ToString, const char*, EOS_EResult);
PROTO(EOS_EResult_IsOperationComplete, EOS_Bool, EOS_EResult);
PROTO(EOS_Lobby_CreateLobby, void, EOS_HLobby, const EOS_Lobby_CreateLobbyOptions*, void*, const EOS_Lobby_OnCreateLobbyCallback);
PROTO(EOS_Lobby_UpdateLobbyModification, EOS_EResult, EOS_HLobby, const EOS_Lobby_UpdateLobbyModificationOptions*, EOS_HLobbyModification*);
PROTO(EOS_LobbyModification_AddAttribute, EOS_EResult, EOS_HLobbyModification, const EOS_LobbyModification_AddAttributeOptions*);
PROTO(EOS_LobbyModification_Release, void, EOS_HLobbyModification);
PROTO(EOS_Lobby_UpdateLobby, void, EOS_HLobby, const EOS_Lobby_UpdateLobbyOptions*, void*, const EOS_Lobby_OnUpdateLobbyCallback);
PROTO(EOS_Lobby_LeaveLobby, void, EOS_HLobby, const EOS_Lobby_LeaveLobbyOptions*, void*, const EOS_Lobby_OnLeaveLobbyCallback);
PROTO(EOS_Lobby_DestroyLobby, void, EOS_HLobby, const EOS_Lobby_DestroyLobbyOptions*, void*, const EOS_Lobby_OnDestroyLobbyCallback);
PROTO(EOS_Lobby_SendInvite, void, EOS_HLobby, const EOS_Lobby_SendInviteOptions*, void*, const EOS_Lobby_OnSendInviteCallback);
PROTO(EOS_Lobby_RejectInvite, void, EOS_HLobby, const EOS_Lobby_RejectInviteOptions*, void*, const EOS_Lobby_OnRejectInviteCallback);
PROTO(EOS_Lobby_CopyLobbyDetailsHandleByInviteId, EOS_EResult, EOS_HLobby, const EOS_Lobby_CopyLobbyDetailsHandleByInviteIdOptions*, EOS_HLobbyDetails*);
PROTO(EOS_Lobby_CopyLobbyDetailsHandleByUiEventId, EOS_EResult, EOS_HLobby, const EOS_Lobby_CopyLobbyDetailsHandleByUiEventIdOptions*, EOS_HLobbyDetails*);
PROTO(EOS_Lobby_JoinLobby, void, EOS_HLobby, const EOS_Lobby_JoinLobbyOptions*, void*, const EOS_Lobby_OnJoinLobbyCallback);
PROTO(EOS_Lobby_CopyLobbyDetailsHandle, EOS_EResult, EOS_HLobby, const EOS_Lobby_CopyLobbyDetailsHandleOptions*, EOS_HLobbyDetails*);
PROTO(EOS_LobbyDetails_CopyInfo, EOS_EResult, EOS_HLobbyDetails, const EOS_LobbyDetails_CopyInfoOptions*, EOS_LobbyDetails_Info**);
PROTO(EOS_LobbyDetails_Info_Release, void, EOS_LobbyDetails_Info*);
PROTO(EOS_LobbyDetails_CopyAttributeByKey, EOS_EResult, EOS_HLobbyDetails, const EOS_LobbyDetails_CopyAttributeByKeyOptions*, EOS_Lobby_Attribute**);
PROTO(EOS_Lobby_Attribute_Release, void, EOS_Lobby_Attribute*);
PROTO(EOS_LobbyDetails_Release, void, EOS_HLobbyDetails);
PROTO(EOS_Lobby_AddNotifyLobbyInviteAccepted, EOS_NotificationId, EOS_HLobby, const EOS_Lobby_AddNotifyLobbyInviteAcceptedOptions*, void*, const EOS_Lobby_OnLobbyInviteAcceptedCallback);
PROTO(EOS_Lobby_AddNotifyJoinLobbyAccepted, EOS_NotificationId, EOS_HLobby, const EOS_Lobby_AddNotifyJoinLobbyAcceptedOptions*, void*, const EOS_Lobby_OnJoinLobbyAcceptedCallback);
PROTO(EOS_Lobby_AddNotifyLobbyInviteReceived, EOS_NotificationId, EOS_HLobby, const EOS_Lobby_AddNotifyLobbyInviteReceivedOptions*, void*, const EOS_Lobby_OnLobbyInviteReceivedCallback);
PROTO(EOS_Lobby_RemoveNotifyLobbyInviteAccepted, void, EOS_HLobby, EOS_NotificationId);
PROTO(EOS_Lobby_RemoveNotifyJoinLobbyAccepted, void, EOS_HLobby, EOS_NotificationId);
PROTO(EOS_Lobby_RemoveNotifyLobbyInviteReceived, void, EOS_HLobby, EOS_NotificationId);
PROTO(EOS_Friends_QueryFriends, void, EOS_HFriends, const EOS_Friends_QueryFriendsOptions*, void*, const EOS_Friends_OnQueryFriendsCallback);
PROTO(EOS_Friends_GetFriendsCount, int32_t, EOS_HFriends, const EOS_Friends_GetFriendsCountOptions*);
PROTO(EOS_Friends_GetFriendAtIndex, EOS_EpicAccountId, EOS_HFriends, const EOS_Friends_GetFriendAtIndexOptions*);
PROTO(EOS_Presence_QueryPresence, void, EOS_HPresence, const EOS_Presence_QueryPresenceOptions*, void*, const EOS_Presence_OnQueryPresenceCompleteCallback);
PROTO(EOS_Presence_CopyPresence, EOS_EResult, EOS_HPresence, const EOS_Presence_CopyPresenceOptions*, EOS_Presence_Info**);
PROTO(EOS_Presence_Info_Release, void, EOS_Presence_Info*);
PROTO(EOS_UI_ShowFriends, void, EOS_HUI, const EOS_UI_ShowFriendsOptions*, void*, const EOS_UI_OnShowFriendsCallback);
PROTO(EOS_Achievements_UnlockAchievements, void, EOS_HAchievements, const EOS_Achievements_UnlockAchievementsOptions*, void*, const EOS_Achievements_OnUnlockAchievementsCompleteCallback);
PROTO(EOS_Achievements_QueryPlayerAchievements, void, EOS_HAchievements, const EOS_Achievements_QueryPlayerAchievementsOptions*, void*, const EOS_Achievements_OnQueryPlayerAchievementsCompleteCallback);
PROTO(EOS_Achievements_GetPlayerAchievementCount, uint32_t, EOS_HAchievements, const EOS_Achievements_GetPlayerAchievementCountOptions*);
PROTO(EOS_Achievements_CopyPlayerAchievementByIndex, EOS_EResult, EOS_HAchievements, const EOS_Achievements_CopyPlayerAchievementByIndexOptions*, EOS_Achievements_PlayerAchievement**);
PROTO(EOS_Achievements_PlayerAchievement_Release, void, EOS_Achievements_PlayerAchievement*);
PROTO(EOS_Ecom_QueryOwnership, void, EOS_HEcom, const EOS_Ecom_QueryOwnershipOptions*, void*, const EOS_Ecom_OnQueryOwnershipCallback);
PROTO(EOS_Ecom_Checkout, void, EOS_HEcom, const EOS_Ecom_CheckoutOptions*, void*, const EOS_Ecom_OnCheckoutCallback);
PROTO(EOS_GetVersion, const char*, void);

CALLBACK(EOS_Auth_OnLoginCallback, const EOS_Auth_LoginCallbackInfo*);
CALLBACK(EOS_UserInfo_OnQueryUserInfoCallback, const EOS_UserInfo_QueryUserInfoCallbackInfo*);
CALLBACK(EOS_Connect_OnLoginCallback, const EOS_Connect_LoginCallbackInfo*);
CALLBACK(EOS_Connect_OnCreateUserCallback, const EOS_Connect_CreateUserCallbackInfo*);
CALLBACK(EOS_Connect_OnQueryProductUserIdMappingsCallback, const EOS_Connect_QueryProductUserIdMappingsCallbackInfo*);
CALLBACK(EOS_Connect_OnQueryExternalAccountMappingsCallback, const EOS_Connect_QueryExternalAccountMappingsCallbackInfo*);
CALLBACK(EOS_Lobby_OnCreateLobbyCallback, const EOS_Lobby_CreateLobbyCallbackInfo*);
CALLBACK(EOS_Lobby_OnUpdateLobbyCallback, const EOS_Lobby_UpdateLobbyCallbackInfo*);
CALLBACK(EOS_Lobby_OnLeaveLobbyCallback, const EOS_Lobby_LeaveLobbyCallbackInfo*);
CALLBACK(EOS_Lobby_OnDestroyLobbyCallback, const EOS_Lobby_DestroyLobbyCallbackInfo*);
CALLBACK(EOS_Lobby_OnSendInviteCallback, const EOS_Lobby_SendInviteCallbackInfo*);
CALLBACK(EOS_Lobby_OnRejectInviteCallback, const EOS_Lobby_RejectInviteCallbackInfo*);
CALLBACK(EOS_Lobby_OnJoinLobbyCallback, const EOS_Lobby_JoinLobbyCallbackInfo*);
CALLBACK(EOS_Lobby_OnLobbyInviteAcceptedCallback, const EOS_Lobby_LobbyInviteAcceptedCallbackInfo*);
CALLBACK(EOS_Lobby_OnJoinLobbyAcceptedCallback, const EOS_Lobby_JoinLobbyAcceptedCallbackInfo*);
CALLBACK(EOS_Lobby_OnLobbyInviteReceivedCallback, const EOS_Lobby_LobbyInviteReceivedCallbackInfo*);
CALLBACK(EOS_Friends_OnQueryFriendsCallback, const EOS_Friends_QueryFriendsCallbackInfo*);
CALLBACK(EOS_Presence_OnQueryPresenceCompleteCallback, const EOS_Presence_QueryPresenceCallbackInfo*);
CALLBACK(EOS_UI_OnShowFriendsCallback, const EOS_UI_ShowFriendsCallbackInfo*);
CALLBACK(EOS_Achievements_OnQueryPlayerAchievementsCompleteCallback, const EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo*);
CALLBACK(EOS_Achievements_OnUnlockAchievementsCompleteCallback, const EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo*);
CALLBACK(EOS_Ecom_OnQueryOwnershipCallback, const EOS_Ecom_QueryOwnershipCallbackInfo*);
CALLBACK(EOS_Ecom_OnCheckoutCallback, const EOS_Ecom_CheckoutCallbackInfo*);
MEMORY_CALLBACK(EOS_AllocateMemoryFunc, void*, size_t, size_t);
MEMORY_CALLBACK(EOS_ReallocateMemoryFunc, void*, void*, size_t, size_t);
MEMORY_CALLBACK(EOS_ReleaseMemoryFunc, void, void*);
CALLBACK(EOS_LogMessageFunc, const EOS_LogMessage*);


// ---------------------------------------------------------------------------------------------
// Run-time checks.

struct ResultCode
{
    const char* name;
    int64_t value;
    int32_t enumValue;
};

// Every code of the X-macro list, in list order, with the enum's value for the same name.
std::vector<ResultCode> AllResultCodes()
{
    std::vector<ResultCode> codes;
#define EOS_RESULT_VALUE(Name, Value) codes.push_back({#Name, (Value), static_cast<int32_t>(EOS_EResult::Name)});
#define EOS_RESULT_VALUE_LAST(Name, Value) EOS_RESULT_VALUE(Name, Value)
#include "eos_result.h"
#undef EOS_RESULT_VALUE
#undef EOS_RESULT_VALUE_LAST
    return codes;
}

// The result list feeds both the enum and the simulator's name table: it must hold all 226
// codes of the release, each once, ascending, ending with the catch-all.
TEST(EosHeaders, ResultCodeListIsCompleteOrderedAndUnique)
{
    const std::vector<ResultCode> codes = AllResultCodes();
    ASSERT_EQ(codes.size(), 226u);
    EXPECT_STREQ(codes.front().name, "EOS_Success");
    EXPECT_EQ(codes.front().value, 0);
    EXPECT_STREQ(codes.back().name, "EOS_UnexpectedError");
    EXPECT_EQ(codes.back().value, 0x7FFFFFFF);

    std::set<std::string> names;
    for (size_t i = 0; i < codes.size(); ++i) {
        EXPECT_TRUE(names.insert(codes[i].name).second) << "duplicate " << codes[i].name;
        EXPECT_EQ(codes[i].enumValue, codes[i].value) << codes[i].name;
        EXPECT_EQ(std::strncmp(codes[i].name, "EOS_", 4), 0) << codes[i].name;
        if (i > 0) {
            EXPECT_LT(codes[i - 1].value, codes[i].value) << codes[i].name << " out of order";
        }
    }
}

// The compound assignment operators are not constexpr, so they are exercised here.
TEST(EosHeaders, ScopeFlagOperatorsBehaveAsBitmasks)
{
    EOS_EAuthScopeFlags flags = EOS_EAuthScopeFlags::EOS_AS_NoFlags;
    flags |= EOS_EAuthScopeFlags::EOS_AS_BasicProfile;
    flags |= EOS_EAuthScopeFlags::EOS_AS_Country;
    EXPECT_EQ(static_cast<int32_t>(flags), 0x21);
    flags &= ~EOS_EAuthScopeFlags::EOS_AS_BasicProfile;
    EXPECT_EQ(flags, EOS_EAuthScopeFlags::EOS_AS_Country);
    flags ^= EOS_EAuthScopeFlags::EOS_AS_Country;
    EXPECT_EQ(flags, EOS_EAuthScopeFlags::EOS_AS_NoFlags);
}

TEST(EosHeaders, StringConstants)
{
    EXPECT_STREQ(EOS_VERSION_STRING, "1.16.1");
    EXPECT_STREQ(EOS_IPT_Steam, "STEAM");
    EXPECT_EQ(EOS_IPT_Unknown, nullptr);
}

// An attribute value written through one union member is read back through the raw slot at
// offset 16, as the SDK reads it; a boolean only occupies the low four bytes.
TEST(EosHeaders, AttributeValueSharesOneSlot)
{
    static const char kText[] = "mode";
    EOS_Lobby_AttributeData data{};
    data.Value.AsUtf8 = kText;
    const char* stored = nullptr;
    std::memcpy(&stored, reinterpret_cast<const unsigned char*>(&data) + 16, sizeof stored);
    EXPECT_EQ(stored, kText);

    data.Value.AsInt64 = 0;
    data.Value.AsBool = EOS_TRUE;
    int64_t raw = -1;
    std::memcpy(&raw, reinterpret_cast<const unsigned char*>(&data) + 16, sizeof raw);
    EXPECT_EQ(raw, 1);  // little-endian targets only, like the SDK's own x64 binaries
}

}  // namespace
