/*
 * Friends interface types. Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_FRIENDS_TYPES_H_INCLUDED
#define EOS_FRIENDS_TYPES_H_INCLUDED

#include "eos_common.h"

EXTERN_C typedef struct EOS_FriendsHandle* EOS_HFriends;

EOS_ENUM(EOS_EFriendsStatus,
	EOS_FS_NotFriends = 0,
	EOS_FS_InviteSent = 1,
	EOS_FS_InviteReceived = 2,
	EOS_FS_Friends = 3
);

#define EOS_FRIENDS_QUERYFRIENDS_API_LATEST 1

EOS_STRUCT(EOS_Friends_QueryFriendsOptions, (
	int32_t ApiVersion;
	EOS_EpicAccountId LocalUserId;
));

EOS_STRUCT(EOS_Friends_QueryFriendsCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_EpicAccountId LocalUserId;
));

EOS_DECLARE_CALLBACK(EOS_Friends_OnQueryFriendsCallback, const EOS_Friends_QueryFriendsCallbackInfo* Data);

#define EOS_FRIENDS_GETFRIENDSCOUNT_API_LATEST 1

EOS_STRUCT(EOS_Friends_GetFriendsCountOptions, (
	int32_t ApiVersion;
	EOS_EpicAccountId LocalUserId;
));

#define EOS_FRIENDS_GETFRIENDATINDEX_API_LATEST 1

EOS_STRUCT(EOS_Friends_GetFriendAtIndexOptions, (
	int32_t ApiVersion;
	EOS_EpicAccountId LocalUserId;
	int32_t Index;
));

#endif /* EOS_FRIENDS_TYPES_H_INCLUDED */
