// Invitations and joining: send, reject and accept invitations, and hand
// every lobby reached (lobby id, connection key) to the game.
#include "state.h"

#include <cstring>

static void EOS_CALL on_invite_sent(const EOS_Lobby_SendInviteCallbackInfo *info);
static void EOS_CALL on_invite_rejected(const EOS_Lobby_RejectInviteCallbackInfo *info);
static void EOS_CALL on_lobby_joined(const EOS_Lobby_JoinLobbyCallbackInfo *info);
static void EOS_CALL on_lobby_invite_accepted(const EOS_Lobby_LobbyInviteAcceptedCallbackInfo *info);
static void EOS_CALL on_join_lobby_accepted(const EOS_Lobby_JoinLobbyAcceptedCallbackInfo *info);

// The cell of the live invite-accepted subscription (null without a closure).
static closure_cell *g_invite_accepted_cell = nullptr;

HL_PRIM void HL_NAME(send_invite)(vbyte *targetUserId, vbyte *lobbyId)
{
    if (!platform_ready("send_invite"))
        return;
    EOS_Lobby_SendInviteOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.LobbyId = reinterpret_cast<const char *>(lobbyId);
    options.LocalUserId = g_product_user_id;
    options.TargetUserId = EOS_ProductUserId_FromString(reinterpret_cast<const char *>(targetUserId));
    EOS_Lobby_SendInvite(EOS_Platform_GetLobbyInterface(g_platform), &options, nullptr, on_invite_sent);
}

static void EOS_CALL on_invite_sent(const EOS_Lobby_SendInviteCallbackInfo *info)
{
    if (result_is_final(info->ResultCode) && info->ResultCode != EOS_EResult::EOS_Success)
        egs_log("[EGS] Failed to send invite : %d\n", result_code(info->ResultCode));
}

static void reject_invite(const char *invite_id)
{
    EOS_Lobby_RejectInviteOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.InviteId = invite_id;
    options.LocalUserId = g_product_user_id;
    EOS_Lobby_RejectInvite(EOS_Platform_GetLobbyInterface(g_platform), &options, nullptr, on_invite_rejected);
}

HL_PRIM void HL_NAME(reject_invite)(vbyte *inviteId)
{
    if (!platform_ready("reject_invite"))
        return;
    reject_invite(reinterpret_cast<const char *>(inviteId));
}

static void EOS_CALL on_invite_rejected(const EOS_Lobby_RejectInviteCallbackInfo *info)
{
    if (result_is_final(info->ResultCode) && info->ResultCode != EOS_EResult::EOS_Success)
        egs_log("[EGS] Failed to reject invite %s : %d\n", info->InviteId ? info->InviteId : "",
                result_code(info->ResultCode));
}

HL_PRIM void HL_NAME(accept_invite)(vbyte *inviteId, vclosure *onJoined)
{
    if (!platform_ready("accept_invite"))
        return;
    EOS_HLobbyDetails details = nullptr;
    EOS_EResult result = copy_details_by_invite(reinterpret_cast<const char *>(inviteId), &details);
    if (result != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to receive lobby details : %d\n", result_code(result));
        return;
    }
    closure_cell *cell = closure_cell_new(onJoined);
    EOS_Lobby_JoinLobbyOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 4;
    options.LobbyDetailsHandle = details;
    options.LocalUserId = g_product_user_id;
    options.bPresenceEnabled = EOS_TRUE;
    EOS_Lobby_JoinLobby(EOS_Platform_GetLobbyInterface(g_platform), &options, cell, on_lobby_joined);
    // The join has taken what it needs from the handle.
    EOS_LobbyDetails_Release(details);
}

// Reads the lobby's connection_key and hands (lobby id, key) to the closure.
static void deliver_lobby_joined(vclosure *closure, const char *lobby_id, EOS_HLobbyDetails details)
{
    EOS_LobbyDetails_CopyAttributeByKeyOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.AttrKey = "connection_key";
    EOS_Lobby_Attribute *attribute = nullptr;
    EOS_EResult result = EOS_LobbyDetails_CopyAttributeByKey(details, &options, &attribute);
    if (result != EOS_EResult::EOS_Success || !attribute) {
        egs_log("[EGS] Failed to receive lobby attribute : %d\n", result_code(result));
        return;
    }
    const EOS_Lobby_AttributeData *data = attribute->Data;
    if (!data || data->ValueType != EOS_ELobbyAttributeType::EOS_AT_STRING) {
        egs_log("[EGS] Lobby attribute connection_key is not a string : %d\n",
                data ? static_cast<int>(data->ValueType) : -1);
        EOS_Lobby_Attribute_Release(attribute);
        return;
    }
    vbyte *key = to_vm_bytes(data->Value.AsUtf8);
    vbyte *id = to_vm_bytes(lobby_id);
    EOS_Lobby_Attribute_Release(attribute);
    deliver_bytes2(closure, id, key);
}

static void EOS_CALL on_lobby_joined(const EOS_Lobby_JoinLobbyCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    closure_cell *cell = static_cast<closure_cell *>(info->ClientData);
    egs_log("[EGS] on lobby joined : %s\n", info->LobbyId ? info->LobbyId : "");
    if (info->ResultCode != EOS_EResult::EOS_Success)
        egs_log("[EGS] Failed to join lobby : %d\n", result_code(info->ResultCode));

    EOS_Lobby_CopyLobbyDetailsHandleOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.LobbyId = info->LobbyId;
    options.LocalUserId = g_product_user_id;
    EOS_HLobbyDetails details = nullptr;
    EOS_EResult result = EOS_Lobby_CopyLobbyDetailsHandle(EOS_Platform_GetLobbyInterface(g_platform), &options, &details);
    if (result != EOS_EResult::EOS_Success || !details) {
        egs_log("[EGS] Can't receive lobby details : %d\n", result_code(result));
        closure_cell_free(cell);
        return;
    }
    egs_log("[EGS] call lobby joined callback\n");
    deliver_lobby_joined(cell_closure(cell), info->LobbyId, details);
    EOS_LobbyDetails_Release(details);
    closure_cell_free(cell);
}

HL_PRIM void HL_NAME(notify_invite_accepted)(vclosure *onAccepted)
{
    if (!platform_ready("notify_invite_accepted"))
        return;
    EOS_HLobby lobby = EOS_Platform_GetLobbyInterface(g_platform);
    closure_cell *cell = closure_cell_new(onAccepted);
    // Both old subscriptions go before either new one is added, so that no
    // overlay event reaches an old handler and a new one alike.
    if (g_invite_accepted_id != EOS_INVALID_NOTIFICATIONID)
        EOS_Lobby_RemoveNotifyLobbyInviteAccepted(lobby, g_invite_accepted_id);
    if (g_join_accepted_id != EOS_INVALID_NOTIFICATIONID)
        EOS_Lobby_RemoveNotifyJoinLobbyAccepted(lobby, g_join_accepted_id);
    // The old subscription is gone: nothing will call its closure again. A
    // handler running it right now holds the closure itself, not the cell.
    closure_cell_free(g_invite_accepted_cell);
    g_invite_accepted_cell = cell;
    EOS_Lobby_AddNotifyLobbyInviteAcceptedOptions accepted_options;
    std::memset(&accepted_options, 0, sizeof accepted_options);
    accepted_options.ApiVersion = 1;
    g_invite_accepted_id = EOS_Lobby_AddNotifyLobbyInviteAccepted(lobby, &accepted_options, cell, on_lobby_invite_accepted);
    if (g_invite_accepted_id == EOS_INVALID_NOTIFICATIONID) {
        // No subscription will ever call the closure: it is not kept alive.
        egs_log("[EGS] Failed to subscribe to accepted invitations : %d\n", result_code(EOS_EResult::EOS_UnexpectedError));
        closure_cell_free(g_invite_accepted_cell);
        g_invite_accepted_cell = nullptr;
    }

    EOS_Lobby_AddNotifyJoinLobbyAcceptedOptions join_options;
    std::memset(&join_options, 0, sizeof join_options);
    join_options.ApiVersion = 1;
    g_join_accepted_id = EOS_Lobby_AddNotifyJoinLobbyAccepted(lobby, &join_options, nullptr, on_join_lobby_accepted);
    if (g_join_accepted_id == EOS_INVALID_NOTIFICATIONID)
        egs_log("[EGS] Failed to subscribe to join requests : %d\n", result_code(EOS_EResult::EOS_UnexpectedError));
}

static void EOS_CALL on_lobby_invite_accepted(const EOS_Lobby_LobbyInviteAcceptedCallbackInfo *info)
{
    closure_cell *cell = static_cast<closure_cell *>(info->ClientData);
    EOS_HLobbyDetails details = nullptr;
    EOS_EResult result = copy_details_by_invite(info->InviteId, &details);
    if (result != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to receive lobby details (invite accepted): %d\n", result_code(result));
        return;
    }
    EOS_LobbyDetails_Info *lobby_info = nullptr;
    result = copy_details_info(details, &lobby_info);
    if (result != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to copy lobby details (invite accepted): %d\n", result_code(result));
        EOS_LobbyDetails_Release(details);
        return;
    }
    egs_log("[EGS] Accept to join the lobby %s\n", lobby_info->LobbyId ? lobby_info->LobbyId : "");
    reject_invite(info->InviteId);
    deliver_lobby_joined(cell_closure(cell), lobby_info->LobbyId, details);
    EOS_LobbyDetails_Info_Release(lobby_info);
    EOS_LobbyDetails_Release(details);
}

static void EOS_CALL on_join_lobby_accepted(const EOS_Lobby_JoinLobbyAcceptedCallbackInfo *)
{
    egs_log("[EGS] On join lobby accepted\n");
}
