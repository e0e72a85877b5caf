/*
 * UI (overlay) interface functions. Part of the EOS SDK stand-in (SDK names, tarnwick's subset).
 */
#ifndef EOS_UI_H_INCLUDED
#define EOS_UI_H_INCLUDED

#include "eos_ui_types.h"

/* Opens the overlay's friends list. */
EOS_DECLARE_FUNC(void) EOS_UI_ShowFriends(EOS_HUI Handle, const EOS_UI_ShowFriendsOptions* Options, void* ClientData, const EOS_UI_OnShowFriendsCallback CompletionDelegate);

#endif /* EOS_UI_H_INCLUDED */
