/*
 * UI (overlay) interface types. Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_UI_TYPES_H_INCLUDED
#define EOS_UI_TYPES_H_INCLUDED

#include "eos_common.h"

EXTERN_C typedef struct EOS_UIHandle* EOS_HUI;

/* Id of an overlay event (e.g. a join accepted in the overlay). */
typedef uint64_t EOS_UI_EventId;
#define EOS_UI_EVENTID_INVALID 0

#define EOS_UI_SHOWFRIENDS_API_LATEST 1

EOS_STRUCT(EOS_UI_ShowFriendsOptions, (
	int32_t ApiVersion;
	EOS_EpicAccountId LocalUserId;
));

EOS_STRUCT(EOS_UI_ShowFriendsCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_EpicAccountId LocalUserId;
));

EOS_DECLARE_CALLBACK(EOS_UI_OnShowFriendsCallback, const EOS_UI_ShowFriendsCallbackInfo* Data);

#endif /* EOS_UI_TYPES_H_INCLUDED */
