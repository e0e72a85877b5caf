// Platform state, start-up, the per-frame tick and shutdown.
#include "state.h"

#include <cstring>

EOS_HPlatform g_platform = nullptr;
EOS_EpicAccountId g_epic_account_id = nullptr;
EOS_ProductUserId g_product_user_id = nullptr;
char g_display_name[64] = {0};
char *g_access_token = nullptr;
char g_product_id[1024] = {0};
EOS_NotificationId g_invite_received_id = 0;
EOS_NotificationId g_invite_accepted_id = 0;
EOS_NotificationId g_join_accepted_id = 0;

bool g_in_tick = false;
// hleos_exit called from a game closure during a tick: the platform is
// released once the tick has returned, never under the SDK's feet.
static bool g_exit_requested = false;


#ifdef _WIN32
static const char *const CACHE_DIRECTORY = "C:\\Temp";
#else
static const char *const CACHE_DIRECTORY = "/tmp";
#endif

static const char *text_of(vbyte *bytes) { return reinterpret_cast<const char *>(bytes); }

HL_PRIM bool HL_NAME(init)(InitConfig *config, vclosure *onLogin)
{
    if (!config) {
        egs_log("[EGS] EOS init without a configuration\n");
        return false;
    }
    if (g_platform) {
        // The SDK allows one initialization per process; a running platform
        // and the product id it compares presences with stay untouched.
        egs_log("[EGS] EOS failed to initialize : %d\n", result_code(EOS_EResult::EOS_AlreadyConfigured));
        return false;
    }
    copy_text(g_product_id, sizeof g_product_id, text_of(config->eosProductId));

    EOS_InitializeOptions init_options;
    std::memset(&init_options, 0, sizeof init_options);
    init_options.ApiVersion = 4;
    init_options.AllocateMemoryFunction = nullptr;
    init_options.ReallocateMemoryFunction = nullptr;
    init_options.ReleaseMemoryFunction = nullptr;
    init_options.ProductName = text_of(config->productName);
    init_options.ProductVersion = text_of(config->productVersion);
    init_options.Reserved = nullptr;
    init_options.SystemInitializeOptions = nullptr;
    init_options.OverrideThreadAffinity = nullptr;
    EOS_EResult result = EOS_Initialize(&init_options);
    if (result != EOS_EResult::EOS_Success) {
        egs_log("[EGS] EOS failed to initialize : %d\n", result_code(result));
        return false;
    }
    egs_log("[EGS] DEBUG BUILD\n");

    EOS_Logging_SetCallback(on_sdk_log);
    EOS_Logging_SetLogLevel(EOS_ELogCategory::EOS_LC_ALL_CATEGORIES, EOS_ELogLevel::EOS_LOG_Info);

    EOS_Platform_Options platform_options;
    std::memset(&platform_options, 0, sizeof platform_options);
    platform_options.ApiVersion = 13;
    platform_options.Reserved = nullptr;
    platform_options.ProductId = text_of(config->eosProductId);
    platform_options.SandboxId = text_of(config->sandboxId);
    platform_options.ClientCredentials.ClientId = text_of(config->clientId);
    platform_options.ClientCredentials.ClientSecret = text_of(config->clientSecret);
    platform_options.bIsServer = EOS_FALSE;
    platform_options.EncryptionKey = nullptr;
    platform_options.OverrideCountryCode = nullptr;
    platform_options.OverrideLocaleCode = nullptr;
    platform_options.DeploymentId = text_of(config->deploymentId);
    platform_options.Flags = config->enableOverlay
        ? (EOS_PF_WINDOWS_ENABLE_OVERLAY_D3D9 | EOS_PF_WINDOWS_ENABLE_OVERLAY_D3D10 | EOS_PF_WINDOWS_ENABLE_OVERLAY_OPENGL)
        : EOS_PF_DISABLE_OVERLAY;
    platform_options.CacheDirectory = CACHE_DIRECTORY;
    platform_options.TickBudgetInMilliseconds = 0;
    platform_options.RTCOptions = nullptr;
    platform_options.IntegratedPlatformOptionsContainerHandle = nullptr;
    platform_options.SystemSpecificOptions = nullptr;
    g_platform = EOS_Platform_Create(&platform_options);
    if (!g_platform) {
        egs_log("[EGS] EOS failed to create platform\n");
        return false;
    }

    EOS_Auth_Credentials credentials;
    std::memset(&credentials, 0, sizeof credentials);
    credentials.ApiVersion = 4;
    credentials.Id = text_of(config->loginId);
    credentials.Token = text_of(config->loginToken);
    credentials.Type = static_cast<EOS_ELoginCredentialType>(config->loginType);
    credentials.SystemAuthCredentialsOptions = nullptr;
    credentials.ExternalType = static_cast<EOS_EExternalCredentialType>(config->externalType);

    EOS_Auth_LoginOptions login_options;
    std::memset(&login_options, 0, sizeof login_options);
    login_options.ApiVersion = 3;
    login_options.Credentials = &credentials;
    login_options.ScopeFlags = EOS_EAuthScopeFlags::EOS_AS_BasicProfile | EOS_EAuthScopeFlags::EOS_AS_FriendsList |
                               EOS_EAuthScopeFlags::EOS_AS_Presence;
    login_options.LoginFlags = 0;

    closure_cell *cell = closure_cell_new(onLogin);
    EOS_Auth_Login(EOS_Platform_GetAuthInterface(g_platform), &login_options, cell, on_auth_login);
    return true;
}

static void release_platform()
{
    EOS_Platform_Release(g_platform);
    g_platform = nullptr;
}

HL_PRIM void HL_NAME(update)()
{
    if (!g_platform || g_in_tick)
        return;
    g_in_tick = true;
    EOS_Platform_Tick(g_platform);
    g_in_tick = false;
    if (g_exit_requested) {
        g_exit_requested = false;
        release_platform();
    }
    rethrow_pending_exception();
}

HL_PRIM void HL_NAME(exit)()
{
    if (!g_platform)
        return;
    if (g_in_tick) {
        g_exit_requested = true;
        return;
    }
    release_platform();
}
