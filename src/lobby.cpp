// Lobby lifecycle: create an invite-only lobby that publishes the game's
// connection key, leave it, destroy it.
#include "state.h"

#include <cstdlib>
#include <cstring>

// Carries a creation request from hleos_create_lobby to its completion.
struct CreateLobbyRequest {
    char connection_key[256];
    closure_cell *cell;
};

static void EOS_CALL on_lobby_created(const EOS_Lobby_CreateLobbyCallbackInfo *info);
static void EOS_CALL on_lobby_left(const EOS_Lobby_LeaveLobbyCallbackInfo *info);
static void EOS_CALL on_lobby_destroyed(const EOS_Lobby_DestroyLobbyCallbackInfo *info);

HL_PRIM void HL_NAME(create_lobby)(vbyte *connectionKey, vclosure *onCreated)
{
    if (!platform_ready("create_lobby"))
        return;
    EOS_HLobby lobby = EOS_Platform_GetLobbyInterface(g_platform);
    EOS_Lobby_CreateLobbyOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 9;
    options.LocalUserId = g_product_user_id;
    options.MaxLobbyMembers = 10;
    options.PermissionLevel = EOS_ELobbyPermissionLevel::EOS_LPL_INVITEONLY;
    options.bPresenceEnabled = EOS_TRUE;
    // An invite-only lobby that refused invitations could never be joined.
    options.bAllowInvites = EOS_TRUE;

    CreateLobbyRequest *request = static_cast<CreateLobbyRequest *>(std::calloc(1, sizeof(CreateLobbyRequest)));
    if (!request) {
        egs_log("[EGS] Failed to create lobby : %d\n", result_code(EOS_EResult::EOS_UnexpectedError));
        return;
    }
    if (!connectionKey)
        egs_log("[EGS] No connection key given, the lobby publishes an empty one\n");
    else
        std::strncpy(request->connection_key, reinterpret_cast<const char *>(connectionKey), 255);
    request->connection_key[255] = 0;
    request->cell = closure_cell_new(onCreated);
    EOS_Lobby_CreateLobby(lobby, &options, request, on_lobby_created);
}

// Writes the connection_key attribute through a lobby modification; the
// update's outcome is not awaited.
static void publish_connection_key(const char *lobby_id, const char *connection_key)
{
    EOS_HLobby lobby = EOS_Platform_GetLobbyInterface(g_platform);
    EOS_Lobby_UpdateLobbyModificationOptions modification_options;
    std::memset(&modification_options, 0, sizeof modification_options);
    modification_options.ApiVersion = 1;
    modification_options.LocalUserId = g_product_user_id;
    modification_options.LobbyId = lobby_id;
    EOS_HLobbyModification modification = nullptr;
    EOS_EResult result = EOS_Lobby_UpdateLobbyModification(lobby, &modification_options, &modification);
    if (result != EOS_EResult::EOS_Success || !modification) {
        egs_log("[EGS] Failed to update lobby modification: %d\n", result_code(result));
        return;
    }

    EOS_Lobby_AttributeData attribute;
    std::memset(&attribute, 0, sizeof attribute);
    attribute.ApiVersion = 1;
    attribute.Key = "connection_key";
    attribute.Value.AsUtf8 = connection_key;
    attribute.ValueType = EOS_ELobbyAttributeType::EOS_AT_STRING;
    EOS_LobbyModification_AddAttributeOptions attribute_options;
    std::memset(&attribute_options, 0, sizeof attribute_options);
    attribute_options.ApiVersion = 2;
    attribute_options.Attribute = &attribute;
    attribute_options.Visibility = EOS_ELobbyAttributeVisibility::EOS_LAT_PUBLIC;
    result = EOS_LobbyModification_AddAttribute(modification, &attribute_options);
    if (result != EOS_EResult::EOS_Success)
        egs_log("[EGS] Failed to add attribute to the lobby: %d\n", result_code(result));

    EOS_Lobby_UpdateLobbyOptions update_options;
    std::memset(&update_options, 0, sizeof update_options);
    update_options.ApiVersion = 1;
    update_options.LobbyModificationHandle = modification;
    EOS_Lobby_UpdateLobby(lobby, &update_options, nullptr, on_complete_ignore<EOS_Lobby_UpdateLobbyCallbackInfo>);
    EOS_LobbyModification_Release(modification);
}

static void EOS_CALL on_lobby_created(const EOS_Lobby_CreateLobbyCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    CreateLobbyRequest *request = static_cast<CreateLobbyRequest *>(info->ClientData);
    if (info->ResultCode != EOS_EResult::EOS_Success)
        egs_log("[EGS] Failed to create lobby : %d\n", result_code(info->ResultCode));
    else
        publish_connection_key(info->LobbyId, request ? request->connection_key : "");
    if (!request)
        return;
    deliver_bytes(cell_closure(request->cell), to_vm_bytes(info->LobbyId));
    closure_cell_free(request->cell);
    std::free(request);
}

HL_PRIM void HL_NAME(leave_lobby)(vbyte *lobbyId, vclosure *onLeft)
{
    if (!platform_ready("leave_lobby"))
        return;
    EOS_Lobby_LeaveLobbyOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.LocalUserId = g_product_user_id;
    options.LobbyId = reinterpret_cast<const char *>(lobbyId);
    closure_cell *cell = closure_cell_new(onLeft);
    EOS_Lobby_LeaveLobby(EOS_Platform_GetLobbyInterface(g_platform), &options, cell, on_lobby_left);
}

HL_PRIM void HL_NAME(destroy_lobby)(vbyte *lobbyId, vclosure *onDestroyed)
{
    if (!platform_ready("destroy_lobby"))
        return;
    EOS_Lobby_DestroyLobbyOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.LocalUserId = g_product_user_id;
    options.LobbyId = reinterpret_cast<const char *>(lobbyId);
    closure_cell *cell = closure_cell_new(onDestroyed);
    EOS_Lobby_DestroyLobby(EOS_Platform_GetLobbyInterface(g_platform), &options, cell, on_lobby_destroyed);
}

// Delivers a leave or destroy result to the closure and releases its cell.
static void deliver_result(void *client_data, EOS_EResult result)
{
    closure_cell *cell = static_cast<closure_cell *>(client_data);
    deliver_i32(cell_closure(cell), result_code(result));
    closure_cell_free(cell);
}

static void EOS_CALL on_lobby_left(const EOS_Lobby_LeaveLobbyCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    if (info->ResultCode != EOS_EResult::EOS_Success)
        egs_log("[EGS] Can't leave lobby %s : %d\n", info->LobbyId ? info->LobbyId : "", result_code(info->ResultCode));
    deliver_result(info->ClientData, info->ResultCode);
}

static void EOS_CALL on_lobby_destroyed(const EOS_Lobby_DestroyLobbyCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    if (info->ResultCode != EOS_EResult::EOS_Success)
        egs_log("[EGS] Can't destroy lobby : %d\n", result_code(info->ResultCode));
    deliver_result(info->ClientData, info->ResultCode);
}
