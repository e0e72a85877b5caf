// Conventions shared by every call into the EOS SDK.
#include "state.h"

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
