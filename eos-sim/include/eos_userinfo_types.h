/*
 * UserInfo interface types. Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_USERINFO_TYPES_H_INCLUDED
#define EOS_USERINFO_TYPES_H_INCLUDED

#include "eos_common.h"

EXTERN_C typedef struct EOS_UserInfoHandle* EOS_HUserInfo;

#define EOS_USERINFO_MAX_DISPLAYNAME_CHARACTERS 16
#define EOS_USERINFO_MAX_DISPLAYNAME_UTF8_LENGTH 64

#define EOS_USERINFO_QUERYUSERINFO_API_LATEST 1

EOS_STRUCT(EOS_UserInfo_QueryUserInfoOptions, (
	int32_t ApiVersion;
	EOS_EpicAccountId LocalUserId;
	EOS_EpicAccountId TargetUserId;
));

EOS_STRUCT(EOS_UserInfo_QueryUserInfoCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_EpicAccountId LocalUserId;
	EOS_EpicAccountId TargetUserId;
));

EOS_DECLARE_CALLBACK(EOS_UserInfo_OnQueryUserInfoCallback, const EOS_UserInfo_QueryUserInfoCallbackInfo* Data);

#define EOS_USERINFO_COPYUSERINFO_API_LATEST 3

EOS_STRUCT(EOS_UserInfo_CopyUserInfoOptions, (
	int32_t ApiVersion;
	EOS_EpicAccountId LocalUserId;
	EOS_EpicAccountId TargetUserId;
));

/* A user's profile; every string may be NULL. Copies are freed with EOS_UserInfo_Release. */
EOS_STRUCT(EOS_UserInfo, (
	int32_t ApiVersion;
	EOS_EpicAccountId UserId;
	const char* Country;
	const char* DisplayName;
	const char* PreferredLanguage;
	const char* Nickname;
	const char* DisplayNameSanitized;
));

EOS_DECLARE_FUNC(void) EOS_UserInfo_Release(EOS_UserInfo* UserInfo);

#endif /* EOS_USERINFO_TYPES_H_INCLUDED */
