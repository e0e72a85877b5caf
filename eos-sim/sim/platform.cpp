// SDK start-up and shut-down, the log callback, and platform instances with their tick.
#include <array>
#include <cstring>
#include <thread>

#include "sim_internal.h"

namespace eos_sim::sim {

namespace {

constexpr int kCategories = 32;   // EOS_LC_Core .. EOS_LC_CustomInvites

struct LogState {
    std::mutex mutex;
    EOS_LogMessageFunc callback = nullptr;
    std::array<EOS_ELogLevel, kCategories> levels;
    LogState() { levels.fill(EOS_ELogLevel::EOS_LOG_Warning); }
};

LogState& log_state() {
    static LogState* s = new LogState;   // log threads may outlive static destruction
    return *s;
}

int category_index(EOS_ELogCategory c) {
    const int i = static_cast<int>(c);
    return (i >= 0 && i < kCategories) ? i : -1;
}

bool valid_level(EOS_ELogLevel l) {
    switch (l) {
        case EOS_ELogLevel::EOS_LOG_Off:
        case EOS_ELogLevel::EOS_LOG_Fatal:
        case EOS_ELogLevel::EOS_LOG_Error:
        case EOS_ELogLevel::EOS_LOG_Warning:
        case EOS_ELogLevel::EOS_LOG_Info:
        case EOS_ELogLevel::EOS_LOG_Verbose:
        case EOS_ELogLevel::EOS_LOG_VeryVerbose: return true;
    }
    return false;
}

// Calls the log callback if the level passes the category's threshold; the callback runs
// without the lock so that it may itself call back into logging.
void deliver_log(EOS_ELogCategory category, EOS_ELogLevel level, const std::string& message) {
    EOS_LogMessageFunc cb;
    {
        auto& s = log_state();
        std::lock_guard<std::mutex> lock(s.mutex);
        const int i = category_index(category);
        if (i < 0 || s.callback == nullptr) return;
        const EOS_ELogLevel threshold = s.levels[i];
        if (threshold == EOS_ELogLevel::EOS_LOG_Off || level == EOS_ELogLevel::EOS_LOG_Off) return;
        if (static_cast<int>(level) > static_cast<int>(threshold)) return;
        cb = s.callback;
    }
    EOS_LogMessage msg{};
    msg.Category = eos_sim::log_category_name(category);
    msg.Message = message.c_str();
    msg.Level = level;
    ClientCall client;
    cb(&msg);
}

bool text_ok(const char* s, size_t max) { return s != nullptr && s[0] != '\0' && std::strlen(s) <= max; }

bool optional_text_ok(const char* s, size_t max) { return s == nullptr || std::strlen(s) <= max; }

bool logging_available() { return lifecycle().initialized && !lifecycle().shut_down; }

}  // namespace

void log(EOS_ELogCategory category, EOS_ELogLevel level, const std::string& message) {
    deliver_log(category, level, message);
}

void reset_platforms() {
    auto& s = log_state();
    std::lock_guard<std::mutex> lock(s.mutex);
    s.callback = nullptr;
    s.levels.fill(EOS_ELogLevel::EOS_LOG_Warning);
}

// A world-file loader replaces this with its own definition.
__attribute__((weak)) bool load_world_at_initialize() { return true; }

}  // namespace eos_sim::sim

using namespace eos_sim::sim;

EOS_DECLARE_FUNC(EOS_EResult) EOS_Initialize(const EOS_InitializeOptions* Options) {
    Op op("EOS_Initialize");
    if (Options) {
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"AllocateMemoryFunction", Options->AllocateMemoryFunction != nullptr},
                    {"ReallocateMemoryFunction", Options->ReallocateMemoryFunction != nullptr},
                    {"ReleaseMemoryFunction", Options->ReleaseMemoryFunction != nullptr},
                    {"ProductName", str_json(Options->ProductName)},
                    {"ProductVersion", str_json(Options->ProductVersion)},
                    {"Reserved", Options->Reserved != nullptr},
                    {"SystemInitializeOptions", Options->SystemInitializeOptions != nullptr},
                    {"OverrideThreadAffinity", Options->OverrideThreadAffinity != nullptr}});
    }
    auto& life = lifecycle();
    if (life.initialized) return op.ret(EOS_EResult::EOS_AlreadyConfigured);
    if (Options == nullptr) return op.ret(EOS_EResult::EOS_InvalidParameters);
    if (Options->ApiVersion != EOS_INITIALIZE_API_LATEST) return op.ret(EOS_EResult::EOS_IncompatibleVersion);
    const int allocators = (Options->AllocateMemoryFunction != nullptr) +
                           (Options->ReallocateMemoryFunction != nullptr) +
                           (Options->ReleaseMemoryFunction != nullptr);
    if (allocators != 0 && allocators != 3) return op.ret(EOS_EResult::EOS_InvalidParameters);
    if (!text_ok(Options->ProductName, EOS_INITIALIZEOPTIONS_PRODUCTNAME_MAX_LENGTH) ||
        !text_ok(Options->ProductVersion, EOS_INITIALIZEOPTIONS_PRODUCTVERSION_MAX_LENGTH))
        return op.ret(EOS_EResult::EOS_InvalidParameters);
    if (auto inj = op.injected()) return op.ret(inj->code);
    if (!load_world_at_initialize()) return op.ret(EOS_EResult::EOS_InvalidParameters);
    life.initialized = true;
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_Shutdown(void) {
    Op op("EOS_Shutdown");
    auto& life = lifecycle();
    if (!life.initialized) return op.ret(EOS_EResult::EOS_NotConfigured);
    if (life.shut_down) return op.ret(EOS_EResult::EOS_UnexpectedError);
    if (!live_platform_list().empty()) fault("EOS_Shutdown: a platform was not released first");
    log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Info, "SDK shut down");
    life.shut_down = true;
    {
        auto& s = log_state();
        std::lock_guard<std::mutex> lock(s.mutex);
        s.callback = nullptr;
    }
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_Logging_SetCallback(EOS_LogMessageFunc Callback) {
    Op op("EOS_Logging_SetCallback");
    op.options({{"Callback", Callback != nullptr}});
    if (!logging_available()) return op.ret(EOS_EResult::EOS_NotConfigured);
    {
        auto& s = log_state();
        std::lock_guard<std::mutex> lock(s.mutex);
        s.callback = Callback;
    }
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(EOS_EResult) EOS_Logging_SetLogLevel(EOS_ELogCategory LogCategory, EOS_ELogLevel LogLevel) {
    Op op("EOS_Logging_SetLogLevel");
    op.options({{"LogCategory", static_cast<int32_t>(LogCategory)}, {"LogLevel", static_cast<int32_t>(LogLevel)}});
    if (!logging_available()) return op.ret(EOS_EResult::EOS_NotConfigured);
    const bool all = LogCategory == EOS_ELogCategory::EOS_LC_ALL_CATEGORIES;
    const int i = category_index(LogCategory);
    if ((!all && i < 0) || !valid_level(LogLevel)) return op.ret(EOS_EResult::EOS_InvalidParameters);
    auto& s = log_state();
    std::lock_guard<std::mutex> lock(s.mutex);
    if (all)
        s.levels.fill(LogLevel);
    else
        s.levels[i] = LogLevel;
    return op.ret(EOS_EResult::EOS_Success);
}

EOS_DECLARE_FUNC(EOS_HPlatform) EOS_Platform_Create(const EOS_Platform_Options* Options) {
    Op op("EOS_Platform_Create");
    const auto core_cat = EOS_ELogCategory::EOS_LC_Core;
    json o = nullptr;
    if (Options) {
        const int v = Options->ApiVersion;
        o = {{"ApiVersion", v},
             {"Reserved", Options->Reserved != nullptr},
             {"ProductId", str_json(Options->ProductId)},
             {"SandboxId", str_json(Options->SandboxId)},
             {"ClientCredentials",
              {{"ClientId", str_json(Options->ClientCredentials.ClientId)},
               {"ClientSecret", str_json(Options->ClientCredentials.ClientSecret)}}},
             {"bIsServer", Options->bIsServer},
             {"EncryptionKey", str_json(Options->EncryptionKey)},
             {"OverrideCountryCode", str_json(Options->OverrideCountryCode)},
             {"OverrideLocaleCode", str_json(Options->OverrideLocaleCode)},
             {"DeploymentId", str_json(Options->DeploymentId)},
             {"Flags", Options->Flags},
             {"CacheDirectory", str_json(Options->CacheDirectory)},
             {"TickBudgetInMilliseconds", Options->TickBudgetInMilliseconds}};
        if (Options->RTCOptions)
            o["RTCOptions"] = {{"ApiVersion", Options->RTCOptions->ApiVersion},
                               {"BackgroundMode", static_cast<int32_t>(Options->RTCOptions->BackgroundMode)}};
        else
            o["RTCOptions"] = nullptr;
        o["IntegratedPlatformOptionsContainerHandle"] = Options->IntegratedPlatformOptionsContainerHandle != nullptr;
        // SystemSpecificOptions exists from version 13 on.
        o["SystemSpecificOptions"] = v >= 13 ? json(Options->SystemSpecificOptions != nullptr) : json(nullptr);
    }
    op.options(o);
    auto fail = [&op](const std::string& why) -> EOS_HPlatform {
        op.invalid(EOS_ELogCategory::EOS_LC_Core, why);
        op.ret(EOS_EResult::EOS_InvalidParameters);
        return nullptr;
    };
    if (!lifecycle().initialized || lifecycle().shut_down) {
        op.ret(EOS_EResult::EOS_NotConfigured);
        return nullptr;
    }
    if (Options == nullptr) return fail("EOS_Platform_Options: null");
    if (!version_ok(Options->ApiVersion, EOS_PLATFORM_OPTIONS_API_LATEST, {12})) {
        op.invalid(core_cat, "EOS_Platform_Options.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        op.ret(EOS_EResult::EOS_IncompatibleVersion);
        return nullptr;
    }
    if (Options->Reserved != nullptr) return fail("EOS_Platform_Options.Reserved: must be null");
    if (!text_ok(Options->ProductId, EOS_PLATFORM_OPTIONS_PRODUCTID_MAX_LENGTH))
        return fail("EOS_Platform_Options.ProductId");
    if (!text_ok(Options->SandboxId, EOS_PLATFORM_OPTIONS_SANDBOXID_MAX_LENGTH))
        return fail("EOS_Platform_Options.SandboxId");
    if (!optional_text_ok(Options->DeploymentId, EOS_PLATFORM_OPTIONS_DEPLOYMENTID_MAX_LENGTH))
        return fail("EOS_Platform_Options.DeploymentId");
    if (!optional_text_ok(Options->ClientCredentials.ClientId, EOS_PLATFORM_CLIENTCREDENTIALS_CLIENTID_MAX_LENGTH) ||
        !optional_text_ok(Options->ClientCredentials.ClientSecret,
                          EOS_PLATFORM_CLIENTCREDENTIALS_CLIENTSECRET_MAX_LENGTH))
        return fail("EOS_Platform_Options.ClientCredentials");
    if (Options->EncryptionKey && std::strlen(Options->EncryptionKey) != EOS_PLATFORM_OPTIONS_ENCRYPTIONKEY_LENGTH)
        return fail("EOS_Platform_Options.EncryptionKey: must be 64 hex digits");
    if (auto inj = op.injected()) {
        op.ret(inj->code);
        return nullptr;
    }
    Platform* p = new_platform();
    p->options = o;
    p->product_id = Options->ProductId;
    p->client_id = Options->ClientCredentials.ClientId ? Options->ClientCredentials.ClientId : "";
    op.ret(EOS_EResult::EOS_Success);
    op.output({{"Platform", p->serial}});
    log(core_cat, EOS_ELogLevel::EOS_LOG_Info,
        "Platform created: ProductId=" + p->product_id + " SandboxId=" + std::string(Options->SandboxId));
    return handle_of(p);
}

EOS_DECLARE_FUNC(void) EOS_Platform_Release(EOS_HPlatform Handle) {
    Op op("EOS_Platform_Release");
    Platform* p = platform_of(Handle, "EOS_Platform_Release");
    if (p == nullptr) return;
    if (ticking()) fault("EOS_Platform_Release: called during EOS_Platform_Tick");
    p->released = true;
    drop_platform_work(p);
    op.output({{"Platform", p->serial}});
    log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Info, "Platform released");
}

EOS_DECLARE_FUNC(void) EOS_Platform_Tick(EOS_HPlatform Handle) {
    Op op("EOS_Platform_Tick");
    Platform* p = platform_of(Handle, "EOS_Platform_Tick");
    if (p == nullptr) return;
    if (ticking()) {
        fault("EOS_Platform_Tick: called from inside a callback");
        return;
    }
    run_tick(p);
}

#define SIM_INTERFACE_GETTER(Kind, Type)                                            \
    EOS_DECLARE_FUNC(Type) EOS_Platform_Get##Kind##Interface(EOS_HPlatform Handle) { \
        Op op("EOS_Platform_Get" #Kind "Interface");                                \
        Platform* p = platform_of(Handle, "EOS_Platform_Get" #Kind "Interface");    \
        if (p == nullptr) return nullptr;                                           \
        return reinterpret_cast<Type>(iface_handle(p, Iface::Kind));                \
    }

SIM_INTERFACE_GETTER(Auth, EOS_HAuth)
SIM_INTERFACE_GETTER(Connect, EOS_HConnect)
SIM_INTERFACE_GETTER(UserInfo, EOS_HUserInfo)
SIM_INTERFACE_GETTER(Lobby, EOS_HLobby)
SIM_INTERFACE_GETTER(Friends, EOS_HFriends)
SIM_INTERFACE_GETTER(Presence, EOS_HPresence)
SIM_INTERFACE_GETTER(UI, EOS_HUI)
SIM_INTERFACE_GETTER(Achievements, EOS_HAchievements)
SIM_INTERFACE_GETTER(Ecom, EOS_HEcom)

#undef SIM_INTERFACE_GETTER

// ---- controls -------------------------------------------------------------------------------

namespace eos_sim {

void emit_log(EOS_ELogCategory category, EOS_ELogLevel level, const std::string& message) {
    deliver_log(category, level, message);
}

void emit_log_from_thread(int count, EOS_ELogCategory category, EOS_ELogLevel level, const std::string& message) {
    std::thread worker([=]() {
        for (int i = 0; i < count; ++i) deliver_log(category, level, message);
    });
    worker.join();
}

EOS_ELogLevel log_level(EOS_ELogCategory category) {
    auto& s = log_state();
    std::lock_guard<std::mutex> lock(s.mutex);
    const int i = category_index(category);
    return i < 0 ? EOS_ELogLevel::EOS_LOG_Off : s.levels[i];
}

const char* log_category_name(EOS_ELogCategory category) {
    static const char* const names[kCategories] = {
        "LogEOS",           "LogEOSAuth",         "LogEOSFriends",
        "LogEOSPresence",   "LogEOSUserInfo",     "LogHttpSerialization",
        "LogEOSEcom",       "LogEOSP2P",          "LogEOSSessions",
        "LogEOSRateLimiter", "LogEOSPlayerDataStorage", "LogEOSAnalytics",
        "LogEOSMessaging",  "LogEOSConnect",      "LogEOSOverlay",
        "LogEOSAchievements", "LogEOSStats",      "LogEOSUI",
        "LogEOSLobby",      "LogEOSLeaderboards", "LogEOSKeychain",
        "LogEOSIntegratedPlatform", "LogEOSTitleStorage", "LogEOSMods",
        "LogEOSAntiCheat",  "LogEOSReports",      "LogEOSSanctions",
        "LogEOSProgressionSnapshots", "LogEOSKWS", "LogEOSRTC",
        "LogEOSRTCAdmin",   "LogEOSCustomInvites"};
    const int i = category_index(category);
    return i < 0 ? "LogEOS" : names[i];
}

}  // namespace eos_sim
