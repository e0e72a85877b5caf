/*
 * UserInfo interface functions. Part of the EOS SDK stand-in (SDK names, tarnwick's subset).
 */
#ifndef EOS_USERINFO_H_INCLUDED
#define EOS_USERINFO_H_INCLUDED

#include "eos_userinfo_types.h"

EOS_DECLARE_FUNC(void) EOS_UserInfo_QueryUserInfo(EOS_HUserInfo Handle, const EOS_UserInfo_QueryUserInfoOptions* Options, void* ClientData, const EOS_UserInfo_OnQueryUserInfoCallback CompletionDelegate);

/* EOS_NotFound unless a QueryUserInfo has cached the user; free the copy with EOS_UserInfo_Release. */
EOS_DECLARE_FUNC(EOS_EResult) EOS_UserInfo_CopyUserInfo(EOS_HUserInfo Handle, const EOS_UserInfo_CopyUserInfoOptions* Options, EOS_UserInfo** OutUserInfo);

#endif /* EOS_USERINFO_H_INCLUDED */
