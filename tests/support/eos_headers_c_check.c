/*
 * The EOS SDK headers are C headers too: this translation unit includes every stand-in
 * header as C11 and checks that the C view (plain enums padded to 32 bits, unscoped
 * enumerators) has the same layout as the C++ one.
 */
#include "eos_sdk.h"
#include "eos_logging.h"
#include "eos_version.h"
#include "eos_auth.h"
#include "eos_connect.h"
#include "eos_userinfo.h"
#include "eos_lobby.h"
#include "eos_friends.h"
#include "eos_presence.h"
#include "eos_ui.h"
#include "eos_achievements.h"
#include "eos_ecom.h"

#include <stddef.h>

_Static_assert(sizeof(EOS_EResult) == 4, "C enums are 32-bit");
_Static_assert(sizeof(EOS_ELogCategory) == 4, "C enums are 32-bit");
_Static_assert(EOS_UnexpectedError == 0x7FFFFFFF, "unscoped enumerators in C");
_Static_assert(EOS_LC_ALL_CATEGORIES == 0x7fffffff, "unscoped enumerators in C");
_Static_assert((EOS_AS_BasicProfile | EOS_AS_Presence) == 0x5, "flag enums combine as ints in C");

_Static_assert(sizeof(EOS_InitializeOptions) == 72, "layout");
_Static_assert(sizeof(EOS_Platform_Options) == 136, "layout");
_Static_assert(offsetof(EOS_Platform_Options, SystemSpecificOptions) == 128, "layout");
_Static_assert(sizeof(EOS_Auth_LoginCallbackInfo) == 56, "layout");
_Static_assert(sizeof(EOS_Lobby_CreateLobbyOptions) == 88, "layout");
_Static_assert(offsetof(EOS_Lobby_AttributeData, Value.AsBool) == 16, "layout");
_Static_assert(offsetof(EOS_Lobby_AttributeData, ValueType) == 24, "layout");
_Static_assert(sizeof(EOS_LobbyDetails_Info) == 88, "layout");
_Static_assert(offsetof(EOS_Presence_Info, Status) == 4, "layout");
_Static_assert(sizeof(EOS_Achievements_PlayerAchievement) == 80, "layout");
_Static_assert(sizeof(EOS_Ecom_QueryOwnershipCallbackInfo) == 40, "layout");
