/*
 * Auth types kept only for binary compatibility.
 * Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_AUTH_TYPES_DEPRECATED_INL_INCLUDED
#define EOS_AUTH_TYPES_DEPRECATED_INL_INCLUDED

#include "eos_common.h"

#define EOS_AUTH_ACCOUNTFEATURERESTRICTEDINFO_API_LATEST 1

/* Formerly reached through EOS_Auth_LoginCallbackInfo; no longer filled in. */
EOS_STRUCT(EOS_Auth_AccountFeatureRestrictedInfo, (
	int32_t ApiVersion;
	const char* VerificationURI;
));

#endif /* EOS_AUTH_TYPES_DEPRECATED_INL_INCLUDED */
