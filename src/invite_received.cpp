// The invite-received chain: each invitation reaches the game with its id and
// the display name of the Epic account behind the sender's product user id.
#include "state.h"

#include <cstdlib>
#include <cstring>

// One subscription's closure. Chains started under it hold it, so it outlives
// a replacement until the last of them has ended.
struct InviteSubscription {
    closure_cell *cell;
    int chains;
    bool replaced;
};

// One received invitation on its way to the game.
struct InviteNotice {
    char invite_id[65];
    char lobby_id[65];
    EOS_ProductUserId sender_id;
    InviteSubscription *subscription;
};

static InviteSubscription *g_invite_subscription = nullptr;

static void EOS_CALL on_lobby_invite_received(const EOS_Lobby_LobbyInviteReceivedCallbackInfo *info);
static void EOS_CALL on_invite_sender_mappings(const EOS_Connect_QueryProductUserIdMappingsCallbackInfo *info);
static void EOS_CALL on_invite_sender_info(const EOS_UserInfo_QueryUserInfoCallbackInfo *info);

static void subscription_release_if_done(InviteSubscription *subscription)
{
    if (subscription && subscription->replaced && subscription->chains == 0) {
        closure_cell_free(subscription->cell);
        std::free(subscription);
    }
}

// Ends a chain: frees its record and lets go of the subscription it holds.
static void invite_notice_end(InviteNotice *notice)
{
    InviteSubscription *subscription = notice->subscription;
    std::free(notice);
    if (subscription) {
        subscription->chains -= 1;
        subscription_release_if_done(subscription);
    }
}

HL_PRIM void HL_NAME(notify_invite_received)(vclosure *onInvite)
{
    if (!platform_ready("notify_invite_received"))
        return;
    EOS_HLobby lobby = EOS_Platform_GetLobbyInterface(g_platform);
    InviteSubscription *subscription = nullptr;
    if (onInvite) {
        subscription = static_cast<InviteSubscription *>(std::calloc(1, sizeof(InviteSubscription)));
        if (!subscription) {
            egs_log("[EGS] Failed to subscribe to invitations : %d\n", result_code(EOS_EResult::EOS_UnexpectedError));
            return;
        }
        subscription->cell = closure_cell_new(onInvite);
    }
    if (g_invite_received_id != EOS_INVALID_NOTIFICATIONID)
        EOS_Lobby_RemoveNotifyLobbyInviteReceived(lobby, g_invite_received_id);
    if (g_invite_subscription) {
        g_invite_subscription->replaced = true;
        subscription_release_if_done(g_invite_subscription);
    }
    g_invite_subscription = subscription;
    EOS_Lobby_AddNotifyLobbyInviteReceivedOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    g_invite_received_id = EOS_Lobby_AddNotifyLobbyInviteReceived(lobby, &options, subscription, on_lobby_invite_received);
    if (g_invite_received_id == EOS_INVALID_NOTIFICATIONID) {
        // No subscription will ever call the closure: it is not kept alive.
        egs_log("[EGS] Failed to subscribe to invitations : %d\n", result_code(EOS_EResult::EOS_UnexpectedError));
        if (subscription) {
            subscription->replaced = true;
            subscription_release_if_done(subscription);
        }
        g_invite_subscription = nullptr;
    }
}

// Copies an id into a 65-byte field; false when it does not fit.
static bool copy_id(char out[65], const char *id)
{
    if (!id || std::strlen(id) > 64)
        return false;
    copy_text(out, 65, id);
    return true;
}

static void EOS_CALL on_lobby_invite_received(const EOS_Lobby_LobbyInviteReceivedCallbackInfo *info)
{
    EOS_HConnect connect = EOS_Platform_GetConnectInterface(g_platform);
    EOS_HLobbyDetails details = nullptr;
    EOS_EResult result = copy_details_by_invite(info->InviteId, &details);
    if (result != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to receive lobby details : %d\n", result_code(result));
        return;
    }
    EOS_LobbyDetails_Info *lobby_info = nullptr;
    result = copy_details_info(details, &lobby_info);
    if (result != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to copy lobby details : %d\n", result_code(result));
        EOS_LobbyDetails_Release(details);
        return;
    }

    InviteNotice *notice = static_cast<InviteNotice *>(std::calloc(1, sizeof(InviteNotice)));
    if (!notice || !copy_id(notice->invite_id, info->InviteId) || !copy_id(notice->lobby_id, lobby_info->LobbyId)) {
        // An id the record cannot hold whole would reach the game cut, and a
        // cut invitation id can be neither accepted nor rejected.
        egs_log("[EGS] Invitation ignored, its ids do not fit : %s\n", info->InviteId ? info->InviteId : "");
        std::free(notice);
        EOS_LobbyDetails_Info_Release(lobby_info);
        EOS_LobbyDetails_Release(details);
        return;
    }
    notice->sender_id = info->TargetUserId;
    notice->subscription = static_cast<InviteSubscription *>(info->ClientData);
    if (notice->subscription)
        notice->subscription->chains += 1;
    EOS_LobbyDetails_Info_Release(lobby_info);

    EOS_ProductUserId senders[1] = {notice->sender_id};
    EOS_Connect_QueryProductUserIdMappingsOptions mappings_options;
    std::memset(&mappings_options, 0, sizeof mappings_options);
    mappings_options.ApiVersion = 2;
    mappings_options.LocalUserId = g_product_user_id;
    mappings_options.AccountIdType_DEPRECATED = EOS_EExternalAccountType::EOS_EAT_EPIC;
    mappings_options.ProductUserIds = senders;
    mappings_options.ProductUserIdCount = 1;
    EOS_Connect_QueryProductUserIdMappings(connect, &mappings_options, notice, on_invite_sender_mappings);
    EOS_LobbyDetails_Release(details);
}

static void EOS_CALL on_invite_sender_mappings(const EOS_Connect_QueryProductUserIdMappingsCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    InviteNotice *notice = static_cast<InviteNotice *>(info->ClientData);
    if (info->ResultCode != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to receive id mappings : %d\n", result_code(info->ResultCode));
        invite_notice_end(notice);
        return;
    }
    EOS_Connect_GetProductUserIdMappingOptions mapping_options;
    std::memset(&mapping_options, 0, sizeof mapping_options);
    mapping_options.ApiVersion = 1;
    mapping_options.LocalUserId = g_product_user_id;
    mapping_options.AccountIdType = EOS_EExternalAccountType::EOS_EAT_EPIC;
    mapping_options.TargetProductUserId = notice->sender_id;
    char epic_id[33] = {0};
    int32_t length = 33;
    EOS_EResult result =
        EOS_Connect_GetProductUserIdMapping(EOS_Platform_GetConnectInterface(g_platform), &mapping_options, epic_id, &length);
    if (result != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to get product id mapping : %d\n", result_code(result));
        invite_notice_end(notice);
        return;
    }
    epic_id[32] = 0;

    EOS_UserInfo_QueryUserInfoOptions query_options;
    std::memset(&query_options, 0, sizeof query_options);
    query_options.ApiVersion = 1;
    query_options.LocalUserId = g_epic_account_id;
    query_options.TargetUserId = EOS_EpicAccountId_FromString(epic_id);
    EOS_UserInfo_QueryUserInfo(EOS_Platform_GetUserInfoInterface(g_platform), &query_options, notice, on_invite_sender_info);
}

static void EOS_CALL on_invite_sender_info(const EOS_UserInfo_QueryUserInfoCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    InviteNotice *notice = static_cast<InviteNotice *>(info->ClientData);
    if (info->ResultCode != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to query the hoster's user info : %d\n", result_code(info->ResultCode));
        invite_notice_end(notice);
        return;
    }
    EOS_UserInfo_CopyUserInfoOptions copy_options;
    std::memset(&copy_options, 0, sizeof copy_options);
    copy_options.ApiVersion = 3;
    copy_options.LocalUserId = g_epic_account_id;
    copy_options.TargetUserId = info->TargetUserId;
    EOS_UserInfo *user = nullptr;
    EOS_EResult result = EOS_UserInfo_CopyUserInfo(EOS_Platform_GetUserInfoInterface(g_platform), &copy_options, &user);
    if (result != EOS_EResult::EOS_Success || !user) {
        egs_log("[EGS] Failed to retreive name : %d\n", result_code(result));
        invite_notice_end(notice);
        return;
    }
    vbyte *invite_id = to_vm_bytes(notice->invite_id);
    // A sender without a display name is still an invitation: the game gets
    // an empty name rather than nothing.
    vbyte *name = to_vm_bytes(user->DisplayName ? user->DisplayName : "");
    EOS_UserInfo_Release(user);
    InviteSubscription *subscription = notice->subscription;
    deliver_bytes2(subscription ? cell_closure(subscription->cell) : nullptr, invite_id, name);
    invite_notice_end(notice);
}
