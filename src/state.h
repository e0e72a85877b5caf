// Shared declarations of the tarnwick library: the platform state, the game's
// closures while requests are in flight, the log, and the helpers every
// subsystem uses to talk to the VM and the EOS SDK.
#pragma once

#define HL_NAME(n) hleos_##n
#include <hl.h>

#include <eos_sdk.h>
#include <eos_logging.h>
#include <eos_auth.h>
#include <eos_connect.h>
#include <eos_userinfo.h>
#include <eos_lobby.h>
#include <eos_friends.h>
#include <eos_presence.h>
#include <eos_ui.h>
#include <eos_achievements.h>
#include <eos_ecom.h>

#include <cstddef>
#include <cstdint>

// libhl exports its console printer without declaring it in hl.h.
extern "C" {
HL_API void hl_sys_print(vbyte *msg);
}

// ---------------------------------------------------------------------------
// Platform state. All zero until hleos_init; written only on the game's thread.

extern EOS_HPlatform g_platform;
extern EOS_EpicAccountId g_epic_account_id;
extern EOS_ProductUserId g_product_user_id;
extern char g_display_name[64];
extern char *g_access_token;
extern char g_product_id[1024];
extern EOS_NotificationId g_invite_received_id;
extern EOS_NotificationId g_invite_accepted_id;
extern EOS_NotificationId g_join_accepted_id;

// The game's configuration object: an HOBJ whose fields follow its type pointer
// at their natural alignment ("OBBBBBBBBBBiib_").
struct InitConfig {
    hl_type *t;
    vbyte *productName;
    vbyte *productVersion;
    vbyte *eosProductId;
    vbyte *spare;
    vbyte *sandboxId;
    vbyte *deploymentId;
    vbyte *clientId;
    vbyte *clientSecret;
    vbyte *loginId;
    vbyte *loginToken;
    int loginType;
    int externalType;
    bool enableOverlay;
};

// True while EOS_Platform_Tick runs inside hleos_update.
extern bool g_in_tick;

// The Auth login completion, which starts the sign-in chain.
void EOS_CALL on_auth_login(const EOS_Auth_LoginCallbackInfo *info);

// Hands the first Haxe exception trapped during a tick back to the game.
void rethrow_pending_exception();

// ---------------------------------------------------------------------------
// Closures in flight.

// Holds a game closure while only the library and the SDK know of it; the
// block's address is a collector root.
struct closure_cell {
    vclosure *closure;
};

closure_cell *closure_cell_new(vclosure *closure);
void closure_cell_free(closure_cell *cell);

// Calls a closure with an argument vector, trapping any Haxe exception: the
// first one is rethrown by hleos_update once the SDK's tick has returned.
void call_closure(vclosure *closure, vdynamic **args, int count);

// Delivery helpers: call the closure (when there is one) with boxed values.
void deliver_i32(vclosure *closure, int value);
void deliver_bytes(vclosure *closure, vbyte *value);
void deliver_bytes2(vclosure *closure, vbyte *first, vbyte *second);
void deliver_array(vclosure *closure, varray *value);
void deliver_login(vclosure *closure, int result, vbyte *account, vbyte *name, vbyte *token);

inline vclosure *cell_closure(const closure_cell *cell) { return cell ? cell->closure : nullptr; }

// A zero-terminated string crosses to the game as a VM copy that keeps its
// terminator; a null string crosses as null.
vbyte *to_vm_bytes(const char *text);

// Field access on the records handed to the game.
void set_bytes_field(vdynobj *record, const char *name, vbyte *value);
void set_bool_field(vdynobj *record, const char *name, bool value);
vbyte *get_bytes_field(vdynobj *record, const char *name);

// ---------------------------------------------------------------------------
// Log.

void egs_log(const char *format, ...)
#if defined(__GNUC__)
    __attribute__((format(printf, 1, 2)))
#endif
    ;
void EOS_CALL on_sdk_log(const EOS_LogMessage *message);

// ---------------------------------------------------------------------------
// SDK conventions.

// The completion that does nothing, for requests whose outcome is not wanted.
template <typename Info> void EOS_CALL on_complete_ignore(const Info *) {}

// False while the SDK says this result will be followed by another call of
// the same completion: such a call delivers nothing and releases nothing.
bool result_is_final(EOS_EResult result);

inline int result_code(EOS_EResult result) { return static_cast<int>(result); }

// Writes an id's text into a 33-byte buffer; false (and an empty buffer) when
// the SDK cannot convert it.
bool epic_id_text(EOS_EpicAccountId id, char out[33]);
bool product_id_text(EOS_ProductUserId id, char out[33]);

// Requests made with no platform (before a successful hleos_init or after
// hleos_exit) are dropped with a log line; returns true when one exists.
bool platform_ready(const char *primitive);

// Lobby details of an invitation, and the details' info: the copies must be
// released by the caller when the result is EOS_Success (never otherwise).
EOS_EResult copy_details_by_invite(const char *invite_id, EOS_HLobbyDetails *details);
EOS_EResult copy_details_info(EOS_HLobbyDetails details, EOS_LobbyDetails_Info **info);

// Copies at most size - 1 bytes of a possibly null string and terminates it.
void copy_text(char *out, size_t size, const char *text);

// ---------------------------------------------------------------------------
// The primitives, exported under these names with their hlp_ descriptors.

HL_PRIM bool HL_NAME(init)(InitConfig *config, vclosure *onLogin);
HL_PRIM void HL_NAME(update)();
HL_PRIM void HL_NAME(exit)();
HL_PRIM void HL_NAME(notify_invite_received)(vclosure *onInvite);
HL_PRIM void HL_NAME(notify_invite_accepted)(vclosure *onAccepted);
HL_PRIM void HL_NAME(set_achievement)(vbyte *achievementId);
HL_PRIM void HL_NAME(query_achievements)(vclosure *onAchievements);
HL_PRIM void HL_NAME(query_ownership)(varray *itemIds, vclosure *onOwned);
HL_PRIM void HL_NAME(store_checkout)(vbyte *offerId);
HL_PRIM void HL_NAME(show_friends)();
HL_PRIM void HL_NAME(query_friends)(vclosure *onFriends);
HL_PRIM void HL_NAME(send_invite)(vbyte *targetUserId, vbyte *lobbyId);
HL_PRIM void HL_NAME(reject_invite)(vbyte *inviteId);
HL_PRIM void HL_NAME(accept_invite)(vbyte *inviteId, vclosure *onJoined);
HL_PRIM void HL_NAME(create_lobby)(vbyte *connectionKey, vclosure *onCreated);
HL_PRIM void HL_NAME(leave_lobby)(vbyte *lobbyId, vclosure *onLeft);
HL_PRIM void HL_NAME(destroy_lobby)(vbyte *lobbyId, vclosure *onDestroyed);
