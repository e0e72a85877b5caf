/*
 * Auth interface functions. Part of the EOS SDK stand-in (SDK names, tarnwick's subset).
 */
#ifndef EOS_AUTH_H_INCLUDED
#define EOS_AUTH_H_INCLUDED

#include "eos_auth_types.h"

/* Completes through EOS_Platform_Tick. */
EOS_DECLARE_FUNC(void) EOS_Auth_Login(EOS_HAuth Handle, const EOS_Auth_LoginOptions* Options, void* ClientData, const EOS_Auth_OnLoginCallback CompletionDelegate);

/* EOS_NotFound if there is no valid token; free the copy with EOS_Auth_Token_Release. */
EOS_DECLARE_FUNC(EOS_EResult) EOS_Auth_CopyUserAuthToken(EOS_HAuth Handle, const EOS_Auth_CopyUserAuthTokenOptions* Options, EOS_EpicAccountId LocalUserId, EOS_Auth_Token** OutUserAuthToken);

#endif /* EOS_AUTH_H_INCLUDED */
