// Tests of the EOS SDK simulator itself, driven through the EOS_* C API and the eos_sim controls.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cstring>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "eos_sim.h"

using R = EOS_EResult;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

// ---- completion and notification recorders --------------------------------------------------

bool g_in_tick = false;

// What a request's completions delivered; the request's ClientData points at one of these.
struct Got {
    std::vector<R> codes;
    std::vector<std::string> texts;            // LobbyId / InviteId, "<null>" when null
    std::vector<const void*> users;            // LocalUserId
    EOS_ContinuanceToken continuance = nullptr;
    bool outside_tick = false;

    template <class Info>
    static Got* base(const Info* i) {
        Got* g = static_cast<Got*>(i->ClientData);
        g->codes.push_back(i->ResultCode);
        g->outside_tick = g->outside_tick || !g_in_tick;
        return g;
    }
};

std::string text_or_null(const char* s) { return s ? s : "<null>"; }

void on_auth(const EOS_Auth_LoginCallbackInfo* i) { Got::base(i)->users.push_back(i->LocalUserId); }
void on_connect(const EOS_Connect_LoginCallbackInfo* i) {
    Got* g = Got::base(i);
    g->users.push_back(i->LocalUserId);
    g->continuance = i->ContinuanceToken;
}
void on_create_user(const EOS_Connect_CreateUserCallbackInfo* i) { Got::base(i)->users.push_back(i->LocalUserId); }
template <class Info>
void on_code(const Info* i) {
    Got::base(i);
}
template <class Info>
void on_lobby(const Info* i) {
    Got::base(i)->texts.push_back(text_or_null(i->LobbyId));
}
void on_reject(const EOS_Lobby_RejectInviteCallbackInfo* i) { Got::base(i)->texts.push_back(text_or_null(i->InviteId)); }

// Notifications; their ClientData is a Notes.
struct Notes {
    std::vector<std::string> invite_ids, lobby_ids;
    std::vector<const void*> locals, senders;
    std::vector<uint64_t> ui_events;
    bool outside_tick = false;
};
void on_invite_received(const EOS_Lobby_LobbyInviteReceivedCallbackInfo* i) {
    auto* n = static_cast<Notes*>(i->ClientData);
    n->invite_ids.push_back(i->InviteId);
    n->locals.push_back(i->LocalUserId);
    n->senders.push_back(i->TargetUserId);
    n->outside_tick = n->outside_tick || !g_in_tick;
}
void on_invite_accepted(const EOS_Lobby_LobbyInviteAcceptedCallbackInfo* i) {
    auto* n = static_cast<Notes*>(i->ClientData);
    n->invite_ids.push_back(i->InviteId);
    n->lobby_ids.push_back(i->LobbyId);
    n->senders.push_back(i->TargetUserId);
}
void on_join_accepted(const EOS_Lobby_JoinLobbyAcceptedCallbackInfo* i) {
    static_cast<Notes*>(i->ClientData)->ui_events.push_back(i->UiEventId);
}

struct LogLine {
    std::string category, message;
    EOS_ELogLevel level;
    std::thread::id thread;
};
std::vector<LogLine> g_log;
std::mutex g_log_mutex;
void on_log(const EOS_LogMessage* m) {
    std::lock_guard<std::mutex> lock(g_log_mutex);
    g_log.push_back({m->Category, m->Message, m->Level, std::this_thread::get_id()});
}

// ---- fixture --------------------------------------------------------------------------------

EOS_Platform_Options platform_options() {
    EOS_Platform_Options o{};
    o.ApiVersion = EOS_PLATFORM_OPTIONS_API_LATEST;
    o.ProductId = "product-1";
    o.SandboxId = "sandbox-1";
    o.DeploymentId = "deployment-1";
    o.ClientCredentials.ClientId = "client-1";
    o.ClientCredentials.ClientSecret = "secret-1";
    o.Flags = EOS_PF_DISABLE_OVERLAY;
    return o;
}

EOS_EResult initialize(const char* name = "tests") {
    EOS_InitializeOptions o{};
    o.ApiVersion = EOS_INITIALIZE_API_LATEST;
    o.ProductName = name;
    o.ProductVersion = "1.0";
    return EOS_Initialize(&o);
}

eos_sim::Account account(const std::string& name, std::optional<std::string> display, bool connect_user = true) {
    eos_sim::Account a;
    a.name = name;
    a.display_name = std::move(display);
    a.has_connect_user = connect_user;
    return a;
}

class Sim : public testing::Test {
public:
    void SetUp() override {
        eos_sim::reset();
        eos_sim::World w;
        w.accounts = {account("me", "Me"), account("alice", "Alice"), account("bob", "Bob"),
                      account("newbie", std::nullopt, false)};
        w.local_account = "me";
        eos_sim::set_world(w);
        ASSERT_EQ(initialize(), R::EOS_Success);
        auto o = platform_options();
        platform = EOS_Platform_Create(&o);
        ASSERT_NE(platform, nullptr);
        auth = EOS_Platform_GetAuthInterface(platform);
        connect = EOS_Platform_GetConnectInterface(platform);
        user_info = EOS_Platform_GetUserInfoInterface(platform);
        lobby = EOS_Platform_GetLobbyInterface(platform);
    }

    void TearDown() override {
        if (!expect_faults) {
            EXPECT_THAT(eos_sim::faults(), IsEmpty());
        }
        eos_sim::reset();
    }

    void tick(int n = 1) {
        for (int i = 0; i < n; ++i) {
            g_in_tick = true;
            EOS_Platform_Tick(platform);
            g_in_tick = false;
        }
    }

    void login(Got* got, EOS_ELoginCredentialType type = EOS_ELoginCredentialType::EOS_LCT_AccountPortal,
               const char* id = nullptr, const char* token = nullptr, int version = EOS_AUTH_LOGIN_API_LATEST,
               EOS_Auth_OnLoginCallback cb = on_auth) {
        EOS_Auth_Credentials c{};
        c.ApiVersion = EOS_AUTH_CREDENTIALS_API_LATEST;
        c.Type = type;
        c.Id = id;
        c.Token = token;
        EOS_Auth_LoginOptions o{};
        o.ApiVersion = version;
        o.Credentials = &c;
        o.ScopeFlags = EOS_EAuthScopeFlags::EOS_AS_BasicProfile | EOS_EAuthScopeFlags::EOS_AS_Presence;
        EOS_Auth_Login(auth, &o, got, cb);
    }

    std::string access_token(EOS_EpicAccountId user) {
        EOS_Auth_CopyUserAuthTokenOptions o{EOS_AUTH_COPYUSERAUTHTOKEN_API_LATEST};
        EOS_Auth_Token* t = nullptr;
        EXPECT_EQ(EOS_Auth_CopyUserAuthToken(auth, &o, user, &t), R::EOS_Success);
        std::string text = t ? t->AccessToken : "";
        EOS_Auth_Token_Release(t);
        return text;
    }

    void connect_login(const std::string& token, Got* got) {
        EOS_Connect_Credentials c{EOS_CONNECT_CREDENTIALS_API_LATEST, token.c_str(),
                                  EOS_EExternalCredentialType::EOS_ECT_EPIC};
        EOS_Connect_LoginOptions o{EOS_CONNECT_LOGIN_API_LATEST, &c, nullptr};
        EOS_Connect_Login(connect, &o, got, on_connect);
    }

    EOS_EResult copy_user_info(EOS_EpicAccountId target, EOS_UserInfo** out,
                               int version = EOS_USERINFO_COPYUSERINFO_API_LATEST) {
        EOS_UserInfo_CopyUserInfoOptions o{version, epic("me"), target};
        return EOS_UserInfo_CopyUserInfo(user_info, &o, out);
    }

    void query_user_info(EOS_EpicAccountId target, void* client_data,
                         EOS_UserInfo_OnQueryUserInfoCallback cb = on_code<EOS_UserInfo_QueryUserInfoCallbackInfo>) {
        EOS_UserInfo_QueryUserInfoOptions o{EOS_USERINFO_QUERYUSERINFO_API_LATEST, epic("me"), target};
        EOS_UserInfo_QueryUserInfo(user_info, &o, client_data, cb);
    }

    static EOS_EpicAccountId epic(const char* name) { return eos_sim::epic_account_id(name); }
    static EOS_ProductUserId puid(const char* name) { return eos_sim::product_user_id(name); }

    void create_lobby(Got* got, uint32_t max_members = 10, int version = EOS_LOBBY_CREATELOBBY_API_LATEST,
                      EOS_ProductUserId user = puid("me")) {
        EOS_Lobby_CreateLobbyOptions o{};
        o.ApiVersion = version;
        o.LocalUserId = user;
        o.MaxLobbyMembers = max_members;
        o.PermissionLevel = EOS_ELobbyPermissionLevel::EOS_LPL_INVITEONLY;
        o.bPresenceEnabled = EOS_TRUE;
        o.bAllowInvites = EOS_TRUE;
        EOS_Lobby_CreateLobby(lobby, &o, got, on_lobby<EOS_Lobby_CreateLobbyCallbackInfo>);
    }

    // Creates a lobby owned by the local user and returns its id.
    std::string my_lobby() {
        Got got;
        create_lobby(&got);
        tick();
        EXPECT_THAT(got.codes, ElementsAre(R::EOS_Success));
        return got.texts.empty() ? "" : got.texts[0];
    }

    void leave(const std::string& id, Got* got) {
        EOS_Lobby_LeaveLobbyOptions o{EOS_LOBBY_LEAVELOBBY_API_LATEST, puid("me"), id.c_str()};
        EOS_Lobby_LeaveLobby(lobby, &o, got, on_lobby<EOS_Lobby_LeaveLobbyCallbackInfo>);
    }

    void destroy(const std::string& id, Got* got) {
        EOS_Lobby_DestroyLobbyOptions o{EOS_LOBBY_DESTROYLOBBY_API_LATEST, puid("me"), id.c_str()};
        EOS_Lobby_DestroyLobby(lobby, &o, got, on_lobby<EOS_Lobby_DestroyLobbyCallbackInfo>);
    }

    void join(EOS_HLobbyDetails details, Got* got) {
        EOS_Lobby_JoinLobbyOptions o{};
        o.ApiVersion = EOS_LOBBY_JOINLOBBY_API_LATEST;
        o.LobbyDetailsHandle = details;
        o.LocalUserId = puid("me");
        o.bPresenceEnabled = EOS_TRUE;
        EOS_Lobby_JoinLobby(lobby, &o, got, on_lobby<EOS_Lobby_JoinLobbyCallbackInfo>);
    }

    EOS_HLobbyDetails details_by_invite(const std::string& invite) {
        EOS_Lobby_CopyLobbyDetailsHandleByInviteIdOptions o{EOS_LOBBY_COPYLOBBYDETAILSHANDLEBYINVITEID_API_LATEST,
                                                            invite.c_str()};
        EOS_HLobbyDetails h = nullptr;
        EXPECT_EQ(EOS_Lobby_CopyLobbyDetailsHandleByInviteId(lobby, &o, &h), R::EOS_Success);
        return h;
    }

    EOS_HLobbyDetails details_of(const std::string& lobby_id) {
        EOS_Lobby_CopyLobbyDetailsHandleOptions o{EOS_LOBBY_COPYLOBBYDETAILSHANDLE_API_LATEST, lobby_id.c_str(),
                                                  puid("me")};
        EOS_HLobbyDetails h = nullptr;
        EXPECT_EQ(EOS_Lobby_CopyLobbyDetailsHandle(lobby, &o, &h), R::EOS_Success);
        return h;
    }

    // The string attribute `key` read through a details handle, or the failing code's name.
    std::string read_attribute(EOS_HLobbyDetails h, const char* key) {
        EOS_LobbyDetails_CopyAttributeByKeyOptions o{EOS_LOBBYDETAILS_COPYATTRIBUTEBYKEY_API_LATEST, key};
        EOS_Lobby_Attribute* a = nullptr;
        const R r = EOS_LobbyDetails_CopyAttributeByKey(h, &o, &a);
        if (r != R::EOS_Success) return EOS_EResult_ToString(r);
        std::string value = a->Data->Value.AsUtf8;
        EOS_Lobby_Attribute_Release(a);
        return value;
    }

    EOS_HPlatform platform = nullptr;
    EOS_HAuth auth = nullptr;
    EOS_HConnect connect = nullptr;
    EOS_HUserInfo user_info = nullptr;
    EOS_HLobby lobby = nullptr;
    bool expect_faults = false;
};

// ---- SDK lifecycle and platforms ------------------------------------------------------------

TEST(SimLifecycle, InitializeValidatesItsOptionsAndSucceedsOnce) {
    eos_sim::reset();
    EXPECT_EQ(EOS_Initialize(nullptr), R::EOS_InvalidParameters);
    EOS_InitializeOptions o{};
    o.ApiVersion = 3;
    o.ProductName = "p";
    o.ProductVersion = "1";
    EXPECT_EQ(EOS_Initialize(&o), R::EOS_IncompatibleVersion);
    o.ApiVersion = EOS_INITIALIZE_API_LATEST;
    o.AllocateMemoryFunction = [](size_t, size_t) -> void* { return nullptr; };
    EXPECT_EQ(EOS_Initialize(&o), R::EOS_InvalidParameters) << "allocators are all set or all null";
    o.AllocateMemoryFunction = nullptr;
    const std::string too_long(65, 'x');
    o.ProductName = too_long.c_str();
    EXPECT_EQ(EOS_Initialize(&o), R::EOS_InvalidParameters);
    o.ProductName = "";
    EXPECT_EQ(EOS_Initialize(&o), R::EOS_InvalidParameters);
    EXPECT_FALSE(eos_sim::initialized());

    const std::string longest(64, 'n');
    EXPECT_EQ(initialize(longest.c_str()), R::EOS_Success);
    EXPECT_TRUE(eos_sim::initialized());
    EXPECT_EQ(initialize(), R::EOS_AlreadyConfigured);
    const auto rec = eos_sim::calls("EOS_Initialize");
    ASSERT_EQ(rec.size(), 7u);
    EXPECT_EQ(rec[5].options["ProductName"], longest);
    EXPECT_EQ(rec[5].result, R::EOS_Success);
}

TEST(SimLifecycle, ShutdownAndLoggingNeedAnInitializedSdk) {
    eos_sim::reset();
    EXPECT_EQ(EOS_Shutdown(), R::EOS_NotConfigured);
    EXPECT_EQ(EOS_Logging_SetCallback(on_log), R::EOS_NotConfigured);
    EXPECT_EQ(EOS_Logging_SetLogLevel(EOS_ELogCategory::EOS_LC_ALL_CATEGORIES, EOS_ELogLevel::EOS_LOG_Info),
              R::EOS_NotConfigured);
    auto o = platform_options();
    EXPECT_EQ(EOS_Platform_Create(&o), nullptr);

    ASSERT_EQ(initialize(), R::EOS_Success);
    EXPECT_EQ(EOS_Logging_SetCallback(on_log), R::EOS_Success);
    EXPECT_EQ(EOS_Shutdown(), R::EOS_Success);
    EXPECT_EQ(EOS_Shutdown(), R::EOS_UnexpectedError);
    EXPECT_EQ(EOS_Logging_SetLogLevel(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Info),
              R::EOS_NotConfigured);
    EXPECT_THAT(eos_sim::faults(), IsEmpty());
}

TEST(SimLifecycle, PlatformCreateRecordsDeepCopiesOfItsOptions) {
    eos_sim::reset();
    ASSERT_EQ(initialize(), R::EOS_Success);
    char product[32] = "product-x";
    char cache[32] = "sim-cache";
    auto o = platform_options();
    o.ProductId = product;
    o.CacheDirectory = cache;
    o.Flags = 0x70;
    o.TickBudgetInMilliseconds = 5;
    EOS_HPlatform p = EOS_Platform_Create(&o);
    ASSERT_NE(p, nullptr);
    std::strcpy(product, "overwritten");
    std::strcpy(cache, "overwritten");
    const auto rec = eos_sim::calls("EOS_Platform_Create").at(0).options;
    EXPECT_EQ(rec["ProductId"], "product-x");
    EXPECT_EQ(rec["CacheDirectory"], "sim-cache");
    EXPECT_EQ(rec["Flags"], 0x70);
    EXPECT_EQ(rec["TickBudgetInMilliseconds"], 5);
    EXPECT_EQ(rec["ClientCredentials"]["ClientId"], "client-1");
    EXPECT_EQ(rec["EncryptionKey"], nullptr);

    auto newer = platform_options();
    newer.ApiVersion = 14;   // a later SDK's layout this one cannot know
    EXPECT_EQ(EOS_Platform_Create(&newer), nullptr);
    EXPECT_EQ(eos_sim::calls("EOS_Platform_Create").back().result, R::EOS_IncompatibleVersion);
    eos_sim::inject("EOS_Platform_Create", eos_sim::Failure::once(R::EOS_UnexpectedError));
    auto good = platform_options();
    EXPECT_EQ(EOS_Platform_Create(&good), nullptr);
    EXPECT_EQ(eos_sim::live_platforms(), 1);
    EOS_Platform_Release(p);
    EXPECT_EQ(eos_sim::live_platforms(), 0);
    EXPECT_THAT(eos_sim::faults(), IsEmpty());
}

TEST_F(Sim, UseOfAReleasedPlatformIsAFaultAndDeliversNothing) {
    expect_faults = true;
    Got got;
    login(&got);   // still pending when the platform goes
    EOS_Platform_Release(platform);
    EXPECT_THAT(eos_sim::faults(), IsEmpty());

    tick();
    EXPECT_EQ(EOS_Platform_GetLobbyInterface(platform), nullptr);
    login(&got);   // through the Auth interface of the released platform
    EOS_UserInfo* info = nullptr;
    EXPECT_NE(copy_user_info(epic("me"), &info), R::EOS_Success);
    EXPECT_EQ(info, nullptr);
    EOS_Platform_Release(platform);
    EXPECT_THAT(got.codes, IsEmpty());
    const auto f = eos_sim::faults();
    ASSERT_EQ(f.size(), 5u);
    EXPECT_THAT(f[0], HasSubstr("EOS_Platform_Tick"));
    EXPECT_THAT(f[2], HasSubstr("EOS_Auth_Login"));
    EXPECT_THAT(f[4], HasSubstr("EOS_Platform_Release"));

    int not_a_handle = 0;
    eos_sim::clear_faults();
    EOS_Platform_Tick(reinterpret_cast<EOS_HPlatform>(&not_a_handle));
    EOS_Lobby_RemoveNotifyJoinLobbyAccepted(reinterpret_cast<EOS_HLobby>(&not_a_handle), 1);
    EOS_Platform_Tick(nullptr);
    EXPECT_EQ(eos_sim::faults().size(), 3u);
}

TEST_F(Sim, ReleasingThePlatformOrTickingInsideACallbackIsAFault) {
    expect_faults = true;
    static EOS_HPlatform s_platform;
    s_platform = platform;
    login(nullptr, EOS_ELoginCredentialType::EOS_LCT_AccountPortal, nullptr, nullptr, EOS_AUTH_LOGIN_API_LATEST,
          [](const EOS_Auth_LoginCallbackInfo*) { EOS_Platform_Tick(s_platform); });
    login(nullptr, EOS_ELoginCredentialType::EOS_LCT_AccountPortal, nullptr, nullptr, EOS_AUTH_LOGIN_API_LATEST,
          [](const EOS_Auth_LoginCallbackInfo*) { EOS_Platform_Release(s_platform); });
    tick();
    const auto f = eos_sim::faults();
    ASSERT_EQ(f.size(), 2u);
    EXPECT_THAT(f[0], HasSubstr("inside a callback"));
    EXPECT_THAT(f[1], HasSubstr("during EOS_Platform_Tick"));
}

// ---- logging --------------------------------------------------------------------------------

TEST_F(Sim, LogLevelsFilterPerCategoryAndDefaultToWarnings) {
    g_log.clear();
    ASSERT_EQ(EOS_Logging_SetCallback(on_log), R::EOS_Success);
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Auth, EOS_ELogLevel::EOS_LOG_Info, "hidden");
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Auth, EOS_ELogLevel::EOS_LOG_Warning, "shown");
    ASSERT_EQ(g_log.size(), 1u);
    EXPECT_EQ(g_log[0].category, "LogEOSAuth");
    EXPECT_EQ(g_log[0].message, "shown");

    ASSERT_EQ(EOS_Logging_SetLogLevel(EOS_ELogCategory::EOS_LC_ALL_CATEGORIES, EOS_ELogLevel::EOS_LOG_Info),
              R::EOS_Success);
    ASSERT_EQ(EOS_Logging_SetLogLevel(EOS_ELogCategory::EOS_LC_Lobby, EOS_ELogLevel::EOS_LOG_Off), R::EOS_Success);
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Lobby, EOS_ELogLevel::EOS_LOG_Fatal, "category off");
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Verbose, "too verbose");
    EXPECT_EQ(g_log.size(), 1u);

    // The simulator's own lines, e.g. at sign-in, pass the same filter.
    Got got;
    login(&got);
    tick();
    ASSERT_EQ(g_log.size(), 2u);
    EXPECT_EQ(g_log[1].category, "LogEOSAuth");
    EXPECT_EQ(g_log[1].level, EOS_ELogLevel::EOS_LOG_Info);
}

TEST_F(Sim, LogLinesCanComeFromAnotherThread) {
    g_log.clear();
    ASSERT_EQ(EOS_Logging_SetCallback(on_log), R::EOS_Success);
    eos_sim::emit_log_from_thread(50, EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Error, "from afar");
    ASSERT_EQ(g_log.size(), 50u);
    EXPECT_NE(g_log[0].thread, std::this_thread::get_id());
    EXPECT_EQ(g_log[49].category, "LogEOS");
}

// ---- completions ----------------------------------------------------------------------------

std::vector<int> g_order;
void on_ordered(const EOS_UserInfo_QueryUserInfoCallbackInfo* i) {
    g_order.push_back(*static_cast<int*>(i->ClientData));
    EXPECT_TRUE(g_in_tick);
}

TEST_F(Sim, CompletionsRunOnlyInsideTickFirstInFirstOut) {
    eos_sim::sign_in("me");
    g_order.clear();
    int ids[3] = {0, 1, 2};
    for (int& i : ids) query_user_info(epic("alice"), &i, on_ordered);
    EXPECT_THAT(g_order, IsEmpty());
    EXPECT_EQ(eos_sim::pending().size(), 3u);
    tick();
    EXPECT_THAT(g_order, ElementsAre(0, 1, 2));
    EXPECT_THAT(eos_sim::pending(), IsEmpty());
    const auto rec = eos_sim::calls("EOS_UserInfo_QueryUserInfo");
    ASSERT_EQ(rec.size(), 3u);
    EXPECT_EQ(rec[1].client_data, &ids[1]);
    EXPECT_EQ(rec[1].result, R::EOS_Success);
}

void on_slow_client(const EOS_UserInfo_QueryUserInfoCallbackInfo*) {
    std::this_thread::sleep_for(std::chrono::milliseconds(200));
    EOS_EResult_ToString(R::EOS_Success);
}

// Benchmarks subtract the simulator's self-time from a request's whole time: the client's
// callbacks must not count, the EOS_* calls they make must.
TEST_F(Sim, SelfTimingCountsTheSimulatorsOwnStretchesOnly) {
    eos_sim::sign_in("me");
    eos_sim::set_self_timing(true);
    query_user_info(epic("alice"), nullptr, on_slow_client);
    tick();
    const eos_sim::SelfTime t = eos_sim::self_time();
    eos_sim::set_self_timing(false);
    // The query; the tick up to the callback; the call inside it; the tick after it.
    EXPECT_EQ(t.entries, 4u);
    EXPECT_GT(t.inside.count(), 0);
    EXPECT_LT(t.inside, std::chrono::milliseconds(100));
    EXPECT_EQ(eos_sim::self_time().entries, 0u);
}

TEST_F(Sim, ARequestStartedWhileTickingCompletesOnALaterTick) {
    static Got first, second;
    static Sim* self;
    first = Got{};
    second = Got{};
    self = this;
    login(&first, EOS_ELoginCredentialType::EOS_LCT_AccountPortal, nullptr, nullptr, EOS_AUTH_LOGIN_API_LATEST,
          [](const EOS_Auth_LoginCallbackInfo* i) {
              on_auth(i);
              self->login(&second);
          });
    tick();
    EXPECT_EQ(first.codes.size(), 1u);
    EXPECT_THAT(second.codes, IsEmpty());
    tick();
    EXPECT_EQ(second.codes.size(), 1u);
}

TEST_F(Sim, HeldCompletionsRunWhenReleasedInTheOrderOfRelease) {
    eos_sim::sign_in("me");
    g_order.clear();
    eos_sim::hold(true);
    int ids[4] = {0, 1, 2, 3};
    for (int& i : ids) query_user_info(epic("alice"), &i, on_ordered);
    tick();
    EXPECT_THAT(g_order, IsEmpty());
    const auto p = eos_sim::pending();
    ASSERT_EQ(p.size(), 4u);
    EXPECT_EQ(p[2].function, "EOS_UserInfo_QueryUserInfo");
    EXPECT_EQ(p[2].client_data, &ids[2]);
    EXPECT_TRUE(p[2].held);

    ASSERT_TRUE(eos_sim::release(p[2].id));
    EXPECT_FALSE(eos_sim::release(p[2].id)) << "no longer held";
    tick();
    EXPECT_THAT(g_order, ElementsAre(2));
    eos_sim::release_in_order({p[3].id, p[0].id});
    tick();
    EXPECT_THAT(g_order, ElementsAre(2, 3, 0));
    eos_sim::hold(false);   // lets the rest go
    tick();
    EXPECT_THAT(g_order, ElementsAre(2, 3, 0, 1));
}

TEST_F(Sim, ShuffledReleaseIsAPermutationFixedByTheSeed) {
    eos_sim::sign_in("me");
    int ids[6] = {0, 1, 2, 3, 4, 5};
    auto run = [&](uint32_t seed) {
        g_order.clear();
        eos_sim::hold(true);
        for (int& i : ids) query_user_info(epic("alice"), &i, on_ordered);
        eos_sim::release_shuffled(seed);
        tick();
        return g_order;
    };
    const auto a = run(42);
    const auto b = run(42);
    EXPECT_EQ(a, b);
    auto sorted = a;
    std::sort(sorted.begin(), sorted.end());
    EXPECT_THAT(sorted, ElementsAre(0, 1, 2, 3, 4, 5));
    bool any_differs = false;
    for (uint32_t seed = 1; seed < 5 && !any_differs; ++seed) any_differs = run(seed) != a;
    EXPECT_TRUE(any_differs);
}

TEST_F(Sim, ADelayedCompletionSkipsTicksWithoutHoldingOthersBack) {
    eos_sim::sign_in("me");
    g_order.clear();
    int ids[2] = {0, 1};
    for (int& i : ids) query_user_info(epic("alice"), &i, on_ordered);
    ASSERT_TRUE(eos_sim::delay(eos_sim::pending()[0].id, 2));
    tick();
    EXPECT_THAT(g_order, ElementsAre(1));
    tick();
    EXPECT_THAT(g_order, ElementsAre(1));
    tick();
    EXPECT_THAT(g_order, ElementsAre(1, 0));
    EXPECT_EQ(eos_sim::ticks(), 3u);
}

// ---- injected failures ----------------------------------------------------------------------

TEST_F(Sim, InjectedFailuresHitTheChosenCallsOfAFunction) {
    eos_sim::sign_in("me");
    EOS_UserInfo* info = nullptr;
    eos_sim::inject("EOS_UserInfo_CopyUserInfo", eos_sim::Failure::repeated(R::EOS_ServiceFailure, 2));
    EXPECT_EQ(copy_user_info(epic("me"), &info), R::EOS_ServiceFailure);
    EXPECT_EQ(info, nullptr);
    EXPECT_EQ(copy_user_info(epic("me"), &info), R::EOS_ServiceFailure);
    ASSERT_EQ(copy_user_info(epic("me"), &info), R::EOS_Success);
    EOS_UserInfo_Release(info);

    eos_sim::clear_calls();
    eos_sim::inject("EOS_Auth_CopyUserAuthToken", eos_sim::Failure::once(R::EOS_TimedOut).on_call(2));
    EOS_Auth_CopyUserAuthTokenOptions o{EOS_AUTH_COPYUSERAUTHTOKEN_API_LATEST};
    std::vector<R> results;
    for (int i = 0; i < 3; ++i) {
        EOS_Auth_Token* t = nullptr;
        results.push_back(EOS_Auth_CopyUserAuthToken(auth, &o, epic("me"), &t));
        EOS_Auth_Token_Release(t);
    }
    EXPECT_THAT(results, ElementsAre(R::EOS_Success, R::EOS_TimedOut, R::EOS_Success));

    // Functions returning a handle or an id give null / 0 instead.
    eos_sim::inject("EOS_EpicAccountId_FromString", eos_sim::Failure::once(R::EOS_UnexpectedError));
    EXPECT_EQ(EOS_EpicAccountId_FromString("0123456789abcdef0123456789abcdef"), nullptr);
    eos_sim::inject("EOS_Lobby_AddNotifyLobbyInviteReceived", eos_sim::Failure::once(R::EOS_UnexpectedError));
    EOS_Lobby_AddNotifyLobbyInviteReceivedOptions n{EOS_LOBBY_ADDNOTIFYLOBBYINVITERECEIVED_API_LATEST};
    EXPECT_EQ(EOS_Lobby_AddNotifyLobbyInviteReceived(lobby, &n, nullptr, on_invite_received), 0u);
    EXPECT_THAT(eos_sim::subscriptions(), IsEmpty());
}

TEST_F(Sim, AnInjectedAsyncFailureChangesNothingInTheWorld) {
    eos_sim::inject("EOS_Auth_Login", eos_sim::Failure::always(R::EOS_InvalidCredentials));
    Got a, b;
    login(&a);
    login(&b);
    tick();
    EXPECT_THAT(a.codes, ElementsAre(R::EOS_InvalidCredentials));
    EXPECT_THAT(b.codes, ElementsAre(R::EOS_InvalidCredentials));
    EXPECT_EQ(a.users[0], nullptr);
    EOS_Auth_CopyUserAuthTokenOptions o{EOS_AUTH_COPYUSERAUTHTOKEN_API_LATEST};
    EOS_Auth_Token* t = nullptr;
    EXPECT_EQ(EOS_Auth_CopyUserAuthToken(auth, &o, epic("me"), &t), R::EOS_NotFound) << "nobody signed in";
}

TEST_F(Sim, NotFinalFirstDeliversWillRetryThenTheRealResult) {
    eos_sim::inject("EOS_Auth_Login", eos_sim::Failure::retry());
    Got got;
    login(&got);
    tick();
    ASSERT_THAT(got.codes, ElementsAre(R::EOS_OperationWillRetry));
    EXPECT_EQ(EOS_EResult_IsOperationComplete(got.codes[0]), EOS_FALSE);
    tick();
    EXPECT_THAT(got.codes, ElementsAre(R::EOS_OperationWillRetry, R::EOS_Success));
    EXPECT_EQ(got.users[1], epic("me"));
    const auto rec = eos_sim::calls("EOS_Auth_Login").at(0);
    EXPECT_THAT(rec.deliveries, ElementsAre(R::EOS_OperationWillRetry, R::EOS_Success));
    EXPECT_EQ(rec.result, R::EOS_Success);
}

// ---- ids and results ------------------------------------------------------------------------

TEST_F(Sim, IdHandlesAreInternedAndShareTheSdksOwnHandle) {
    Got got;
    login(&got);
    tick();
    const std::string text = eos_sim::get_world().accounts[0].epic_id;
    ASSERT_EQ(text.size(), 32u);
    EXPECT_EQ(text.find_first_not_of("0123456789abcdef"), std::string::npos);
    EOS_EpicAccountId a = EOS_EpicAccountId_FromString(text.c_str());
    EXPECT_EQ(a, EOS_EpicAccountId_FromString(std::string(text).c_str()));
    EXPECT_EQ(a, got.users[0]) << "the login's LocalUserId is the same handle";
    EXPECT_EQ(EOS_EpicAccountId_IsValid(a), EOS_TRUE);
    EXPECT_EQ(EOS_EpicAccountId_FromString(nullptr), nullptr);
    EXPECT_EQ(EOS_EpicAccountId_FromString(""), nullptr);
    EXPECT_EQ(EOS_EpicAccountId_IsValid(nullptr), EOS_FALSE);
    EXPECT_NE(EOS_ProductUserId_FromString("abc"), EOS_ProductUserId_FromString("abd"));
    EXPECT_EQ(eos_sim::derive_id("x"), eos_sim::derive_id("x"));
    EXPECT_NE(eos_sim::derive_id("x"), eos_sim::derive_id("y"));
}

TEST_F(Sim, ToStringFollowsTheBufferRules) {
    EOS_ProductUserId id = puid("alice");
    char buf[64];
    int32_t len = 33;
    EXPECT_EQ(EOS_ProductUserId_ToString(id, nullptr, &len), R::EOS_InvalidParameters);
    EXPECT_EQ(EOS_ProductUserId_ToString(id, buf, nullptr), R::EOS_InvalidParameters);
    EXPECT_EQ(EOS_ProductUserId_ToString(nullptr, buf, &len), R::EOS_InvalidUser);
    len = 32;
    EXPECT_EQ(EOS_ProductUserId_ToString(id, buf, &len), R::EOS_LimitExceeded);
    EXPECT_EQ(len, 33);
    len = 64;
    ASSERT_EQ(EOS_ProductUserId_ToString(id, buf, &len), R::EOS_Success);
    EXPECT_EQ(len, 33);
    EXPECT_EQ(std::string(buf), eos_sim::get_world().accounts[1].product_user_id);
    eos_sim::inject("EOS_EpicAccountId_ToString", eos_sim::Failure::once(R::EOS_UnexpectedError));
    len = 33;
    EXPECT_EQ(EOS_EpicAccountId_ToString(epic("alice"), buf, &len), R::EOS_UnexpectedError);
}

TEST(SimResults, EveryCodeHasItsNameAndOnlyWillRetryIsNotFinal) {
#define EOS_RESULT_VALUE(Name, Value) \
    EXPECT_STREQ(EOS_EResult_ToString(R::Name), #Name); \
    EXPECT_EQ(EOS_EResult_IsOperationComplete(R::Name), R::Name == R::EOS_OperationWillRetry ? EOS_FALSE : EOS_TRUE);
#define EOS_RESULT_VALUE_LAST(Name, Value) EOS_RESULT_VALUE(Name, Value)
#include "eos_result.h"
#undef EOS_RESULT_VALUE
#undef EOS_RESULT_VALUE_LAST
    const char* unknown = EOS_EResult_ToString(static_cast<R>(123456));
    ASSERT_NE(unknown, nullptr);
    EXPECT_STRNE(unknown, "");
}

// ---- ApiVersion and required fields ---------------------------------------------------------

TEST_F(Sim, WrongApiVersionsAreRefusedOlderAcceptedOnesAreNot) {
    eos_sim::sign_in("me");
    EOS_UserInfo* info = nullptr;
    EXPECT_EQ(copy_user_info(epic("me"), &info, 4), R::EOS_IncompatibleVersion);
    ASSERT_EQ(copy_user_info(epic("me"), &info, 2), R::EOS_Success) << "1.15's version is still accepted";
    EOS_UserInfo_Release(info);

    Got create, login_v1;
    create_lobby(&create, 10, 10);
    login(&login_v1, EOS_ELoginCredentialType::EOS_LCT_AccountPortal, nullptr, nullptr, 1);
    EXPECT_THAT(create.codes, IsEmpty()) << "refusals also arrive through the tick";
    tick();
    EXPECT_THAT(create.codes, ElementsAre(R::EOS_IncompatibleVersion));
    EXPECT_THAT(create.texts, ElementsAre("<null>"));
    EXPECT_THAT(login_v1.codes, ElementsAre(R::EOS_IncompatibleVersion));
}

TEST_F(Sim, RequestsBeforeSignInFailCleanly) {
    Got create, query;
    create_lobby(&create, 10, EOS_LOBBY_CREATELOBBY_API_LATEST, nullptr);   // no product user id yet
    query_user_info(epic("alice"), &query);
    EOS_Lobby_CreateLobby(lobby, nullptr, &create, on_lobby<EOS_Lobby_CreateLobbyCallbackInfo>);
    EOS_UserInfo* info = nullptr;
    EXPECT_EQ(copy_user_info(epic("me"), &info), R::EOS_InvalidUser);
    EXPECT_EQ(EOS_UserInfo_CopyUserInfo(user_info, nullptr, &info), R::EOS_InvalidParameters);
    tick();
    EXPECT_THAT(create.codes, ElementsAre(R::EOS_InvalidParameters, R::EOS_InvalidParameters));
    EXPECT_THAT(query.codes, ElementsAre(R::EOS_InvalidUser));
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_CreateLobby")[1].options, nullptr);
}

// ---- copies ---------------------------------------------------------------------------------

TEST_F(Sim, CopiesAreCountedAndABadReleaseIsAFault) {
    expect_faults = true;
    eos_sim::sign_in("me");
    EOS_UserInfo* info = nullptr;
    ASSERT_EQ(copy_user_info(epic("me"), &info), R::EOS_Success);
    EOS_Auth_CopyUserAuthTokenOptions o{EOS_AUTH_COPYUSERAUTHTOKEN_API_LATEST};
    EOS_Auth_Token* token = nullptr;
    ASSERT_EQ(EOS_Auth_CopyUserAuthToken(auth, &o, epic("me"), &token), R::EOS_Success);
    EXPECT_EQ(eos_sim::outstanding_copies("EOS_UserInfo"), 1);
    EXPECT_EQ(eos_sim::outstanding_total(), 2);

    EOS_Auth_Token_Release(reinterpret_cast<EOS_Auth_Token*>(info));   // wrong pair
    EXPECT_EQ(eos_sim::outstanding_total(), 2);
    EOS_UserInfo_Release(info);
    EOS_Auth_Token_Release(token);
    EXPECT_EQ(eos_sim::outstanding_total(), 0);
    EXPECT_THAT(eos_sim::outstanding_copies(), IsEmpty());
    EOS_UserInfo_Release(info);   // twice
    EOS_UserInfo local{};
    EOS_UserInfo_Release(&local);   // never copied
    EOS_UserInfo_Release(nullptr);  // harmless
    const auto f = eos_sim::faults();
    ASSERT_EQ(f.size(), 3u);
    EXPECT_THAT(f[0], HasSubstr("instead of"));
    EXPECT_THAT(f[1], HasSubstr("released twice"));
    EXPECT_THAT(f[2], HasSubstr("unknown pointer"));
}

// ---- sign-in --------------------------------------------------------------------------------

TEST_F(Sim, DeveloperLoginSignsInTheAccountNamedByTheToken) {
    Got ok, unknown, bad_host;
    login(&ok, EOS_ELoginCredentialType::EOS_LCT_Developer, "localhost:6547", "alice");
    login(&unknown, EOS_ELoginCredentialType::EOS_LCT_Developer, "localhost:6547", "mallory");
    login(&bad_host, EOS_ELoginCredentialType::EOS_LCT_Developer, "localhost", "alice");
    tick();
    EXPECT_THAT(ok.codes, ElementsAre(R::EOS_Success));
    EXPECT_EQ(ok.users[0], epic("alice"));
    EXPECT_THAT(unknown.codes, ElementsAre(R::EOS_InvalidCredentials));
    EXPECT_THAT(bad_host.codes, ElementsAre(R::EOS_InvalidParameters));

    Got portal, chosen, stray_token;
    login(&portal);
    eos_sim::set_login_account("bob");
    login(&chosen, EOS_ELoginCredentialType::EOS_LCT_ExchangeCode, nullptr, "code");
    login(&stray_token, EOS_ELoginCredentialType::EOS_LCT_ExchangeCode, "id-not-allowed", "code");
    tick();
    EXPECT_EQ(portal.users[0], epic("me"));
    EXPECT_EQ(chosen.users[0], epic("bob"));
    EXPECT_THAT(stray_token.codes, ElementsAre(R::EOS_InvalidParameters));
}

TEST_F(Sim, FirstConnectLoginNeedsACreatedUserThenSucceedsDirectly) {
    eos_sim::set_login_account("newbie");
    Got auth_login;
    login(&auth_login);
    tick();
    EOS_EpicAccountId user = epic("newbie");
    ASSERT_EQ(auth_login.users[0], user);
    EOS_UserInfo* info = nullptr;
    ASSERT_EQ(EOS_UserInfo_CopyUserInfo(user_info, nullptr, &info), R::EOS_InvalidParameters);
    EOS_UserInfo_CopyUserInfoOptions o{EOS_USERINFO_COPYUSERINFO_API_LATEST, user, user};
    ASSERT_EQ(EOS_UserInfo_CopyUserInfo(user_info, &o, &info), R::EOS_Success) << "own info is known after login";
    EXPECT_EQ(info->DisplayName, nullptr);
    EXPECT_EQ(info->UserId, user);
    EOS_UserInfo_Release(info);

    const std::string token = access_token(user);
    Got first;
    connect_login(token, &first);
    tick();
    ASSERT_THAT(first.codes, ElementsAre(R::EOS_InvalidUser));
    ASSERT_NE(first.continuance, nullptr);
    EXPECT_EQ(first.users[0], nullptr);

    Got created;
    EOS_Connect_CreateUserOptions c{EOS_CONNECT_CREATEUSER_API_LATEST, first.continuance};
    EOS_Connect_CreateUser(connect, &c, &created, on_create_user);
    tick();
    EXPECT_THAT(created.codes, ElementsAre(R::EOS_Success));
    EXPECT_EQ(created.users[0], puid("newbie"));

    Got again, bogus;
    connect_login(token, &again);
    connect_login("not-a-token", &bogus);
    tick();
    EXPECT_THAT(again.codes, ElementsAre(R::EOS_Success));
    EXPECT_EQ(again.users[0], puid("newbie"));
    EXPECT_THAT(bogus.codes, ElementsAre(R::EOS_InvalidAuth));
}

TEST_F(Sim, OtherUsersInfoIsKnownOnlyAfterAQuery) {
    eos_sim::sign_in("me");
    EOS_UserInfo* info = nullptr;
    EXPECT_EQ(copy_user_info(epic("bob"), &info), R::EOS_NotFound);
    Got q, stranger;
    query_user_info(epic("bob"), &q);
    query_user_info(EOS_EpicAccountId_FromString("ffffffffffffffffffffffffffffffff"), &stranger);
    tick();
    EXPECT_THAT(q.codes, ElementsAre(R::EOS_Success));
    EXPECT_THAT(stranger.codes, ElementsAre(R::EOS_NotFound));
    ASSERT_EQ(copy_user_info(epic("bob"), &info), R::EOS_Success);
    EXPECT_STREQ(info->DisplayName, "Bob");
    EXPECT_EQ(info->ApiVersion, EOS_USERINFO_COPYUSERINFO_API_LATEST);
    EOS_UserInfo_Release(info);
}

TEST_F(Sim, ProductUserIdMappingsFollowTheQueryAndBufferRules) {
    eos_sim::sign_in("me");
    EOS_Connect_GetProductUserIdMappingOptions get{EOS_CONNECT_GETPRODUCTUSERIDMAPPING_API_LATEST, puid("me"),
                                                   EOS_EExternalAccountType::EOS_EAT_EPIC, puid("alice")};
    char buf[33];
    int32_t len = 33;
    EXPECT_EQ(EOS_Connect_GetProductUserIdMapping(connect, &get, buf, &len), R::EOS_NotFound);

    EOS_ProductUserId ids[1] = {puid("alice")};
    EOS_Connect_QueryProductUserIdMappingsOptions q{};
    q.ApiVersion = EOS_CONNECT_QUERYPRODUCTUSERIDMAPPINGS_API_LATEST;
    q.LocalUserId = puid("me");
    q.ProductUserIds = ids;
    q.ProductUserIdCount = 1;
    Got got;
    EOS_Connect_QueryProductUserIdMappings(connect, &q, &got,
                                           on_code<EOS_Connect_QueryProductUserIdMappingsCallbackInfo>);
    tick();
    ASSERT_THAT(got.codes, ElementsAre(R::EOS_Success));

    len = 10;
    EXPECT_EQ(EOS_Connect_GetProductUserIdMapping(connect, &get, buf, &len), R::EOS_LimitExceeded);
    EXPECT_EQ(len, 33);
    EXPECT_EQ(EOS_Connect_GetProductUserIdMapping(connect, &get, nullptr, &len), R::EOS_InvalidParameters);
    ASSERT_EQ(EOS_Connect_GetProductUserIdMapping(connect, &get, buf, &len), R::EOS_Success);
    EXPECT_EQ(EOS_EpicAccountId_FromString(buf), epic("alice"));
    get.TargetProductUserId = puid("bob");
    EXPECT_EQ(EOS_Connect_GetProductUserIdMapping(connect, &get, buf, &len), R::EOS_NotFound) << "not queried";
}

// ---- lobbies --------------------------------------------------------------------------------

TEST_F(Sim, CreateLobbyChecksMemberCountAndTheSixteenLobbyLimit) {
    eos_sim::sign_in("me");
    Got bad;
    create_lobby(&bad, 0);
    create_lobby(&bad, 65);
    std::vector<Got> made(17);
    for (auto& g : made) create_lobby(&g, 64);
    tick();
    EXPECT_THAT(bad.codes, ElementsAre(R::EOS_InvalidParameters, R::EOS_InvalidParameters));
    for (int i = 0; i < 16; ++i) ASSERT_THAT(made[i].codes, ElementsAre(R::EOS_Success));
    EXPECT_THAT(made[16].codes, ElementsAre(R::EOS_LimitExceeded));
    EXPECT_THAT(made[16].texts, ElementsAre("<null>"));
    EXPECT_NE(made[0].texts[0], made[1].texts[0]);
    const auto l = eos_sim::find_lobby(made[0].texts[0]);
    ASSERT_TRUE(l);
    EXPECT_EQ(l->owner, "me");
    EXPECT_THAT(l->members, ElementsAre("me"));
    EXPECT_EQ(l->max_members, 64u);
}

TEST_F(Sim, AttributeValuesAreCopiedAndAppliedWhenTheUpdateCompletes) {
    eos_sim::sign_in("me");
    const std::string id = my_lobby();
    EOS_Lobby_UpdateLobbyModificationOptions mo{EOS_LOBBY_UPDATELOBBYMODIFICATION_API_LATEST, puid("me"), id.c_str()};
    EOS_HLobbyModification mod = nullptr;
    ASSERT_EQ(EOS_Lobby_UpdateLobbyModification(lobby, &mo, &mod), R::EOS_Success);
    EXPECT_EQ(eos_sim::outstanding_copies("EOS_HLobbyModification"), 1);

    std::string value(300, 'k');
    EOS_Lobby_AttributeData data{EOS_LOBBY_ATTRIBUTEDATA_API_LATEST, "connection_key", {},
                                 EOS_EAttributeType::EOS_AT_STRING};
    data.Value.AsUtf8 = value.c_str();
    EOS_LobbyModification_AddAttributeOptions ao{EOS_LOBBYMODIFICATION_ADDATTRIBUTE_API_LATEST, &data,
                                                 EOS_ELobbyAttributeVisibility::EOS_LAT_PUBLIC};
    ASSERT_EQ(EOS_LobbyModification_AddAttribute(mod, &ao), R::EOS_Success);
    value.assign(300, 'X');   // the caller's buffer changes right after the call

    const std::string long_key(65, 'a');
    EOS_Lobby_AttributeData bad = data;
    bad.Key = long_key.c_str();
    EOS_LobbyModification_AddAttributeOptions bo = ao;
    bo.Attribute = &bad;
    EXPECT_EQ(EOS_LobbyModification_AddAttribute(mod, &bo), R::EOS_InvalidParameters);

    Got update;
    EOS_Lobby_UpdateLobbyOptions uo{EOS_LOBBY_UPDATELOBBY_API_LATEST, mod};
    EOS_Lobby_UpdateLobby(lobby, &uo, &update, on_lobby<EOS_Lobby_UpdateLobbyCallbackInfo>);
    EOS_LobbyModification_Release(mod);   // released before the update completes
    EXPECT_TRUE(eos_sim::find_lobby(id)->attributes.empty());
    tick();
    EXPECT_THAT(update.codes, ElementsAre(R::EOS_Success));
    EXPECT_THAT(update.texts, ElementsAre(id));
    const auto l = eos_sim::find_lobby(id);
    ASSERT_EQ(l->attributes.size(), 1u);
    EXPECT_EQ(l->attributes[0].as_utf8, std::string(300, 'k'));
    EXPECT_EQ(eos_sim::outstanding_total(), 0);
}

TEST_F(Sim, OnlyTheOwnerDestroysAndOnlyMembersLeave) {
    eos_sim::sign_in("me");
    const std::string alices = eos_sim::remote_create_lobby("alice", {});
    ASSERT_TRUE(eos_sim::remote_join("me", alices));
    const std::string mine = my_lobby();
    Got not_owner, unknown, not_member, left, destroyed;
    destroy(alices, &not_owner);
    destroy("no-such-lobby", &unknown);
    leave(eos_sim::remote_create_lobby("bob", {}), &not_member);
    leave(alices, &left);
    destroy(mine, &destroyed);
    tick();
    EXPECT_THAT(not_owner.codes, ElementsAre(R::EOS_Lobby_NotOwner));
    EXPECT_THAT(unknown.codes, ElementsAre(R::EOS_NotFound));
    EXPECT_THAT(unknown.texts, ElementsAre("no-such-lobby"));
    EXPECT_THAT(not_member.codes, ElementsAre(R::EOS_NotFound));
    EXPECT_THAT(left.codes, ElementsAre(R::EOS_Success));
    EXPECT_THAT(eos_sim::find_lobby(alices)->members, ElementsAre("alice"));
    EXPECT_THAT(destroyed.codes, ElementsAre(R::EOS_Success));
    EXPECT_FALSE(eos_sim::find_lobby(mine));
}

TEST_F(Sim, JoinWorksWithADetailsHandleReleasedRightAfterTheCall) {
    eos_sim::sign_in("me");
    const std::string id = eos_sim::remote_create_lobby(
        "alice", {eos_sim::Attribute::string("connection_key", "10.0.0.1:7777"),
                  eos_sim::Attribute::int64("mode", 3)});
    const std::string invite = eos_sim::remote_invite("alice", id);
    ASSERT_FALSE(invite.empty());
    EOS_HLobbyDetails h = details_by_invite(invite);
    EXPECT_EQ(read_attribute(h, "connection_key"), "10.0.0.1:7777");
    EXPECT_EQ(read_attribute(h, "missing"), "EOS_NotFound");

    Got joined;
    join(h, &joined);
    EOS_LobbyDetails_Release(h);
    tick();
    EXPECT_THAT(joined.codes, ElementsAre(R::EOS_Success));
    EXPECT_THAT(joined.texts, ElementsAre(id));
    EXPECT_THAT(eos_sim::find_lobby(id)->members, ElementsAre("alice", "me"));
    EXPECT_THAT(eos_sim::get_world().invitations, IsEmpty()) << "joining uses up the invitation";

    EOS_HLobbyDetails mine = details_of(id);
    EOS_LobbyDetails_CopyInfoOptions io{EOS_LOBBYDETAILS_COPYINFO_API_LATEST};
    EOS_LobbyDetails_Info* info = nullptr;
    ASSERT_EQ(EOS_LobbyDetails_CopyInfo(mine, &io, &info), R::EOS_Success);
    EXPECT_STREQ(info->LobbyId, id.c_str());
    EXPECT_EQ(info->LobbyOwnerUserId, puid("alice"));
    EXPECT_EQ(info->AvailableSlots, 8u);
    EOS_LobbyDetails_Info_Release(info);
    EOS_LobbyDetails_Release(mine);
    EXPECT_EQ(eos_sim::outstanding_total(), 0);
}

TEST_F(Sim, ADetailsHandleUsedAfterItsReleaseIsAFault) {
    expect_faults = true;
    eos_sim::sign_in("me");
    const std::string id = my_lobby();
    EOS_HLobbyDetails h = details_of(id);
    EOS_LobbyDetails_Release(h);
    Got joined;
    join(h, &joined);
    EXPECT_EQ(read_attribute(h, "connection_key"), "EOS_InvalidParameters");
    tick();
    EXPECT_THAT(joined.codes, ElementsAre(R::EOS_InvalidParameters));
    EXPECT_EQ(eos_sim::faults().size(), 2u);
}

TEST_F(Sim, InvitationsSentRejectedAndAcceptedByOthers) {
    eos_sim::sign_in("me");
    const std::string id = my_lobby();
    Got sent;
    EOS_Lobby_SendInviteOptions so{EOS_LOBBY_SENDINVITE_API_LATEST, id.c_str(), puid("me"), puid("bob")};
    EOS_Lobby_SendInvite(lobby, &so, &sent, on_lobby<EOS_Lobby_SendInviteCallbackInfo>);
    tick();
    ASSERT_THAT(sent.codes, ElementsAre(R::EOS_Success));
    const auto invites = eos_sim::get_world().invitations;
    ASSERT_EQ(invites.size(), 1u);
    EXPECT_EQ(invites[0].to, "bob");
    ASSERT_TRUE(eos_sim::remote_accept_invite("bob", invites[0].id));
    EXPECT_THAT(eos_sim::find_lobby(id)->members, ElementsAre("me", "bob"));

    const std::string to_me = eos_sim::remote_invite("alice", eos_sim::remote_create_lobby("alice", {}));
    Got rejected, unknown;
    EOS_Lobby_RejectInviteOptions ro{EOS_LOBBY_REJECTINVITE_API_LATEST, to_me.c_str(), puid("me")};
    EOS_Lobby_RejectInvite(lobby, &ro, &rejected, on_reject);
    ro.InviteId = "no-such-invite";
    EOS_Lobby_RejectInvite(lobby, &ro, &unknown, on_reject);
    tick();
    EXPECT_THAT(rejected.codes, ElementsAre(R::EOS_Success));
    EXPECT_THAT(rejected.texts, ElementsAre(to_me));
    EXPECT_THAT(unknown.codes, ElementsAre(R::EOS_NotFound));
    EXPECT_THAT(unknown.texts, ElementsAre("no-such-invite"));
    EXPECT_THAT(eos_sim::get_world().invitations, IsEmpty());
}

// ---- notifications --------------------------------------------------------------------------

TEST_F(Sim, NotificationsArriveOnlyInsideTickToLiveSubscriptions) {
    eos_sim::sign_in("me");
    Notes first, second;
    EOS_Lobby_AddNotifyLobbyInviteReceivedOptions o{EOS_LOBBY_ADDNOTIFYLOBBYINVITERECEIVED_API_LATEST};
    const EOS_NotificationId a = EOS_Lobby_AddNotifyLobbyInviteReceived(lobby, &o, &first, on_invite_received);
    const EOS_NotificationId b = EOS_Lobby_AddNotifyLobbyInviteReceived(lobby, &o, &second, on_invite_received);
    ASSERT_NE(a, 0u);
    ASSERT_NE(b, a);
    const auto subs = eos_sim::subscriptions("LobbyInviteReceived");
    ASSERT_EQ(subs.size(), 2u);
    EXPECT_EQ(subs[1].client_data, &second);

    const std::string id = eos_sim::remote_create_lobby("alice", {});
    const std::string invite = eos_sim::remote_invite("alice", id);
    EXPECT_THAT(first.invite_ids, IsEmpty());
    tick();
    EXPECT_THAT(first.invite_ids, ElementsAre(invite));
    EXPECT_THAT(second.invite_ids, ElementsAre(invite));
    EXPECT_EQ(first.locals[0], puid("me"));
    EXPECT_EQ(first.senders[0], puid("alice"));
    EXPECT_FALSE(first.outside_tick);

    EOS_Lobby_RemoveNotifyLobbyInviteReceived(lobby, a);
    EOS_Lobby_RemoveNotifyLobbyInviteReceived(lobby, 9999);   // unknown id: harmless
    eos_sim::raise_invite_received(invite);
    tick();
    EXPECT_EQ(first.invite_ids.size(), 1u);
    EXPECT_EQ(second.invite_ids.size(), 2u);
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_RemoveNotifyLobbyInviteReceived")[1].result, R::EOS_NotFound);
}

TEST_F(Sim, OverlayAcceptancesCarryTheirLobbyAndUiEvent) {
    eos_sim::sign_in("me");
    Notes accepted, join_accepted;
    EOS_Lobby_AddNotifyLobbyInviteAcceptedOptions ao{EOS_LOBBY_ADDNOTIFYLOBBYINVITEACCEPTED_API_LATEST};
    EOS_Lobby_AddNotifyJoinLobbyAcceptedOptions jo{EOS_LOBBY_ADDNOTIFYJOINLOBBYACCEPTED_API_LATEST};
    ASSERT_NE(EOS_Lobby_AddNotifyLobbyInviteAccepted(lobby, &ao, &accepted, on_invite_accepted), 0u);
    ASSERT_NE(EOS_Lobby_AddNotifyJoinLobbyAccepted(lobby, &jo, &join_accepted, on_join_accepted), 0u);

    const std::string id = eos_sim::remote_create_lobby("bob", {eos_sim::Attribute::string("connection_key", "k")});
    const std::string invite = eos_sim::remote_invite("bob", id);
    eos_sim::raise_invite_accepted(invite);
    const uint64_t event = eos_sim::raise_join_lobby_accepted(id);
    EXPECT_THAT(accepted.invite_ids, IsEmpty());
    tick();
    EXPECT_THAT(accepted.invite_ids, ElementsAre(invite));
    EXPECT_THAT(accepted.lobby_ids, ElementsAre(id));
    EXPECT_EQ(accepted.senders[0], puid("bob"));
    ASSERT_THAT(join_accepted.ui_events, ElementsAre(event));

    EOS_Lobby_CopyLobbyDetailsHandleByUiEventIdOptions uo{EOS_LOBBY_COPYLOBBYDETAILSHANDLEBYUIEVENTID_API_LATEST,
                                                          event};
    EOS_HLobbyDetails h = nullptr;
    ASSERT_EQ(EOS_Lobby_CopyLobbyDetailsHandleByUiEventId(lobby, &uo, &h), R::EOS_Success);
    EXPECT_EQ(read_attribute(h, "connection_key"), "k");
    EOS_LobbyDetails_Release(h);
    uo.UiEventId = event + 100;
    EXPECT_EQ(EOS_Lobby_CopyLobbyDetailsHandleByUiEventId(lobby, &uo, &h), R::EOS_NotFound);
}

}  // namespace
