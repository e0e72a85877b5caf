// The sign-in chain: Auth login, display name and token, Connect login,
// creation of the Connect user on first use, and one report to the game.
#include "state.h"

#include <cstdlib>
#include <cstring>

static void EOS_CALL on_connect_login(const EOS_Connect_LoginCallbackInfo *info);
static void EOS_CALL on_create_user(const EOS_Connect_CreateUserCallbackInfo *info);

// Delivers (result, account id, display name, token) to the sign-in closure
// and releases its cell: the chain's single delivery.
static void report_login(void *client_data, int result)
{
    closure_cell *cell = static_cast<closure_cell *>(client_data);
    if (!cell)
        return;
    char account[33];
    vbyte *account_bytes = nullptr;
    if (g_epic_account_id && epic_id_text(g_epic_account_id, account))
        account_bytes = to_vm_bytes(account);
    vbyte *name = to_vm_bytes(g_display_name);
    vbyte *token = to_vm_bytes(g_access_token);
    deliver_login(cell->closure, result, account_bytes, name, token);
    closure_cell_free(cell);
}

// Keeps the signed-in user's display name; the account comes from the copy
// when there is one, else from the login itself.
static void read_local_user(EOS_EpicAccountId account)
{
    EOS_UserInfo_CopyUserInfoOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 3;
    options.LocalUserId = account;
    options.TargetUserId = account;
    EOS_UserInfo *user = nullptr;
    EOS_EResult result = EOS_UserInfo_CopyUserInfo(EOS_Platform_GetUserInfoInterface(g_platform), &options, &user);
    if (result != EOS_EResult::EOS_Success || !user) {
        egs_log("[EGS] Failed to retreive name : %d\n", result_code(result));
        g_epic_account_id = account;
        g_display_name[0] = 0;
        return;
    }
    g_epic_account_id = user->UserId;
    copy_text(g_display_name, sizeof g_display_name, user->DisplayName);
    EOS_UserInfo_Release(user);
}

void EOS_CALL on_auth_login(const EOS_Auth_LoginCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    if (info->ResultCode != EOS_EResult::EOS_Success) {
        egs_log("[EGS] Failed to auth to EGS : %d\n", result_code(info->ResultCode));
        report_login(info->ClientData, result_code(info->ResultCode));
        return;
    }
    egs_log("[EGS] EGS Auth Login success\n");
    read_local_user(info->LocalUserId);

    EOS_Auth_CopyUserAuthTokenOptions token_options;
    std::memset(&token_options, 0, sizeof token_options);
    token_options.ApiVersion = 1;
    EOS_Auth_Token *token = nullptr;
    EOS_EResult result =
        EOS_Auth_CopyUserAuthToken(EOS_Platform_GetAuthInterface(g_platform), &token_options, g_epic_account_id, &token);
    if (result != EOS_EResult::EOS_Success || !token) {
        if (result == EOS_EResult::EOS_Success)
            result = EOS_EResult::EOS_UnexpectedError;
        egs_log("[EGS] Failed to retreive an EGS auth token : %d\n", result_code(result));
        report_login(info->ClientData, result_code(result));
        return;
    }
    const char *access = token->AccessToken ? token->AccessToken : "";
    size_t length = std::strlen(access);
    char *copy = static_cast<char *>(std::malloc(length + 1));
    if (!copy) {
        EOS_Auth_Token_Release(token);
        egs_log("[EGS] Failed to retreive an EGS auth token : %d\n", result_code(EOS_EResult::EOS_UnexpectedError));
        report_login(info->ClientData, result_code(EOS_EResult::EOS_UnexpectedError));
        return;
    }
    std::memcpy(copy, access, length + 1);
    EOS_Auth_Token_Release(token);
    std::free(g_access_token);
    g_access_token = copy;

    EOS_Connect_Credentials credentials;
    std::memset(&credentials, 0, sizeof credentials);
    credentials.ApiVersion = 1;
    credentials.Token = g_access_token;
    credentials.Type = EOS_EExternalCredentialType::EOS_ECT_EPIC;
    EOS_Connect_LoginOptions login_options;
    std::memset(&login_options, 0, sizeof login_options);
    login_options.ApiVersion = 2;
    login_options.Credentials = &credentials;
    login_options.UserLoginInfo = nullptr;
    EOS_Connect_Login(EOS_Platform_GetConnectInterface(g_platform), &login_options, info->ClientData, on_connect_login);
}

static void EOS_CALL on_connect_login(const EOS_Connect_LoginCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    if (info->ResultCode == EOS_EResult::EOS_Success) {
        egs_log("[EGS] EGS Connect Login success\n");
        g_product_user_id = info->LocalUserId;
        report_login(info->ClientData, 0);
        return;
    }
    if (info->ResultCode == EOS_EResult::EOS_InvalidUser) {
        egs_log("[EGS] Invalid User, Create it\n");
        EOS_Connect_CreateUserOptions options;
        std::memset(&options, 0, sizeof options);
        options.ApiVersion = 1;
        options.ContinuanceToken = info->ContinuanceToken;
        EOS_Connect_CreateUser(EOS_Platform_GetConnectInterface(g_platform), &options, info->ClientData, on_create_user);
        return;
    }
    egs_log("[EGS] Failed to auth to EGS : %d\n", result_code(info->ResultCode));
    report_login(info->ClientData, result_code(info->ResultCode));
}

static void EOS_CALL on_create_user(const EOS_Connect_CreateUserCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    if (info->ResultCode == EOS_EResult::EOS_Success) {
        egs_log("[EGS] EGS Connect Create user success\n");
        g_product_user_id = info->LocalUserId;
    } else {
        egs_log("[EGS] Failed to create user : %d\n", result_code(info->ResultCode));
    }
    report_login(info->ClientData, result_code(info->ResultCode));
}
