/*
 * Presence interface functions. Part of the EOS SDK stand-in (SDK names, tarnwick's subset).
 */
#ifndef EOS_PRESENCE_H_INCLUDED
#define EOS_PRESENCE_H_INCLUDED

#include "eos_presence_types.h"

EOS_DECLARE_FUNC(void) EOS_Presence_QueryPresence(EOS_HPresence Handle, const EOS_Presence_QueryPresenceOptions* Options, void* ClientData, const EOS_Presence_OnQueryPresenceCompleteCallback CompletionDelegate);

/* Succeeds only for cached presence; free the copy with EOS_Presence_Info_Release. */
EOS_DECLARE_FUNC(EOS_EResult) EOS_Presence_CopyPresence(EOS_HPresence Handle, const EOS_Presence_CopyPresenceOptions* Options, EOS_Presence_Info** OutPresence);

#endif /* EOS_PRESENCE_H_INCLUDED */
