/*
 * Connect interface types: product-user login, user creation and id mappings.
 * Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_CONNECT_TYPES_H_INCLUDED
#define EOS_CONNECT_TYPES_H_INCLUDED

#include "eos_common.h"

EXTERN_C typedef struct EOS_ConnectHandle* EOS_HConnect;

#define EOS_CONNECT_EXTERNAL_ACCOUNT_ID_MAX_LENGTH 256

#define EOS_CONNECT_CREDENTIALS_API_LATEST 1

EOS_STRUCT(EOS_Connect_Credentials, (
	int32_t ApiVersion;
	const char* Token;
	EOS_EExternalCredentialType Type;
));

#define EOS_CONNECT_USERLOGININFO_API_LATEST 2

/* Only for platforms without their own display name; NULL for Epic credentials. */
EOS_STRUCT(EOS_Connect_UserLoginInfo, (
	int32_t ApiVersion;
	const char* DisplayName;
	const char* NsaIdToken;
));

#define EOS_CONNECT_LOGIN_API_LATEST 2

EOS_STRUCT(EOS_Connect_LoginOptions, (
	int32_t ApiVersion;
	const EOS_Connect_Credentials* Credentials;
	const EOS_Connect_UserLoginInfo* UserLoginInfo;
));

/* EOS_InvalidUser with a ContinuanceToken: no product user yet, create one with it. */
EOS_STRUCT(EOS_Connect_LoginCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_ProductUserId LocalUserId;
	EOS_ContinuanceToken ContinuanceToken;
));

EOS_DECLARE_CALLBACK(EOS_Connect_OnLoginCallback, const EOS_Connect_LoginCallbackInfo* Data);

#define EOS_CONNECT_CREATEUSER_API_LATEST 1

EOS_STRUCT(EOS_Connect_CreateUserOptions, (
	int32_t ApiVersion;
	EOS_ContinuanceToken ContinuanceToken;
));

EOS_STRUCT(EOS_Connect_CreateUserCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_ProductUserId LocalUserId;
));

EOS_DECLARE_CALLBACK(EOS_Connect_OnCreateUserCallback, const EOS_Connect_CreateUserCallbackInfo* Data);

#define EOS_CONNECT_QUERYPRODUCTUSERIDMAPPINGS_API_LATEST 2

/* AccountIdType_DEPRECATED is ignored: every external account of the users comes back. */
EOS_STRUCT(EOS_Connect_QueryProductUserIdMappingsOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId LocalUserId;
	EOS_EExternalAccountType AccountIdType_DEPRECATED;
	EOS_ProductUserId* ProductUserIds;
	uint32_t ProductUserIdCount;
));

EOS_STRUCT(EOS_Connect_QueryProductUserIdMappingsCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_ProductUserId LocalUserId;
));

EOS_DECLARE_CALLBACK(EOS_Connect_OnQueryProductUserIdMappingsCallback, const EOS_Connect_QueryProductUserIdMappingsCallbackInfo* Data);

#define EOS_CONNECT_GETPRODUCTUSERIDMAPPING_API_LATEST 1

EOS_STRUCT(EOS_Connect_GetProductUserIdMappingOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId LocalUserId;
	EOS_EExternalAccountType AccountIdType;
	EOS_ProductUserId TargetProductUserId;
));

#define EOS_CONNECT_QUERYEXTERNALACCOUNTMAPPINGS_API_LATEST 1
#define EOS_CONNECT_QUERYEXTERNALACCOUNTMAPPINGS_MAX_ACCOUNT_IDS 128

EOS_STRUCT(EOS_Connect_QueryExternalAccountMappingsOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId LocalUserId;
	EOS_EExternalAccountType AccountIdType;
	const char** ExternalAccountIds;
	uint32_t ExternalAccountIdCount;
));

EOS_STRUCT(EOS_Connect_QueryExternalAccountMappingsCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_ProductUserId LocalUserId;
));

EOS_DECLARE_CALLBACK(EOS_Connect_OnQueryExternalAccountMappingsCallback, const EOS_Connect_QueryExternalAccountMappingsCallbackInfo* Data);

#define EOS_CONNECT_GETEXTERNALACCOUNTMAPPING_API_LATEST 1
#define EOS_CONNECT_GETEXTERNALACCOUNTMAPPINGS_API_LATEST EOS_CONNECT_GETEXTERNALACCOUNTMAPPING_API_LATEST

/* Options of EOS_Connect_GetExternalAccountMapping (plural struct name, singular function). */
EOS_STRUCT(EOS_Connect_GetExternalAccountMappingsOptions, (
	int32_t ApiVersion;
	EOS_ProductUserId LocalUserId;
	EOS_EExternalAccountType AccountIdType;
	const char* TargetExternalUserId;
));

#endif /* EOS_CONNECT_TYPES_H_INCLUDED */
