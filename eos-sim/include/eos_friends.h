/*
 * Friends interface functions. Part of the EOS SDK stand-in (SDK names, tarnwick's subset).
 */
#ifndef EOS_FRIENDS_H_INCLUDED
#define EOS_FRIENDS_H_INCLUDED

#include "eos_friends_types.h"

EOS_DECLARE_FUNC(void) EOS_Friends_QueryFriends(EOS_HFriends Handle, const EOS_Friends_QueryFriendsOptions* Options, void* ClientData, const EOS_Friends_OnQueryFriendsCallback CompletionDelegate);

/* Number of friends cached by the last QueryFriends. */
EOS_DECLARE_FUNC(int32_t) EOS_Friends_GetFriendsCount(EOS_HFriends Handle, const EOS_Friends_GetFriendsCountOptions* Options);

/* An invalid id when Index is out of range. */
EOS_DECLARE_FUNC(EOS_EpicAccountId) EOS_Friends_GetFriendAtIndex(EOS_HFriends Handle, const EOS_Friends_GetFriendAtIndexOptions* Options);

#endif /* EOS_FRIENDS_H_INCLUDED */
