// Conventions shared by every call into the EOS SDK.
#include "state.h"

#include <cstring>

bool result_is_final(EOS_EResult result)
{
    return EOS_EResult_IsOperationComplete(result) != EOS_FALSE;
}

bool epic_id_text(EOS_EpicAccountId id, char out[33])
{
    int32_t length = 33;
    out[0] = 0;
    if (EOS_EpicAccountId_ToString(id, out, &length) != EOS_EResult::EOS_Success) {
        out[0] = 0;
        return false;
    }
    out[32] = 0;
    return true;
}

bool product_id_text(EOS_ProductUserId id, char out[33])
{
    int32_t length = 33;
    out[0] = 0;
    if (EOS_ProductUserId_ToString(id, out, &length) != EOS_EResult::EOS_Success) {
        out[0] = 0;
        return false;
    }
    out[32] = 0;
    return true;
}

bool platform_ready(const char *primitive)
{
    if (g_platform)
        return true;
    egs_log("[EGS] No EOS platform, %s ignored\n", primitive);
    return false;
}

EOS_EResult copy_details_by_invite(const char *invite_id, EOS_HLobbyDetails *details)
{
    EOS_Lobby_CopyLobbyDetailsHandleByInviteIdOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.InviteId = invite_id;
    *details = nullptr;
    EOS_EResult result = EOS_Lobby_CopyLobbyDetailsHandleByInviteId(EOS_Platform_GetLobbyInterface(g_platform), &options, details);
    if (result == EOS_EResult::EOS_Success && !*details)
        result = EOS_EResult::EOS_NotFound;
    return result;
}

EOS_EResult copy_details_info(EOS_HLobbyDetails details, EOS_LobbyDetails_Info **info)
{
    EOS_LobbyDetails_CopyInfoOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    *info = nullptr;
    EOS_EResult result = EOS_LobbyDetails_CopyInfo(details, &options, info);
    if (result == EOS_EResult::EOS_Success && !*info)
        result = EOS_EResult::EOS_NotFound;
    return result;
}
