// Start-up from the game's configuration object, the tick and shutdown.
#include "tarnwick_test.h"

#include <string>

using namespace tw;

class Platform : public TarnwickTest {
protected:
    nlohmann::json only(const char *function)
    {
        auto calls = eos_sim::calls(function);
        EXPECT_EQ(calls.size(), 1u) << function;
        return calls.empty() ? nlohmann::json() : calls[0].options;
    }
};

TEST_F(Platform, StartsTheSdkThePlatformAndTheLoginWithTheGamesValues)
{
    host::InitConfigValues values = config();
    values.enableOverlay = true;
    ASSERT_TRUE(init(values, nullptr));

    nlohmann::json init = only("EOS_Initialize");
    EXPECT_EQ(init["ApiVersion"], 4);
    EXPECT_EQ(init["ProductName"], "tarnwick tests");
    EXPECT_EQ(init["ProductVersion"], "1.0");
    EXPECT_EQ(init["Reserved"], false);
    EXPECT_EQ(init["SystemInitializeOptions"], false);
    EXPECT_EQ(init["OverrideThreadAffinity"], false);

    nlohmann::json platform = only("EOS_Platform_Create");
    EXPECT_EQ(platform["ApiVersion"], 13);
    EXPECT_EQ(platform["ProductId"], "tarnwick-product");
    EXPECT_EQ(platform["SandboxId"], "sandbox");
    EXPECT_EQ(platform["DeploymentId"], "deployment");
    EXPECT_EQ(platform["ClientCredentials"]["ClientId"], "client");
    EXPECT_EQ(platform["ClientCredentials"]["ClientSecret"], "secret");
    EXPECT_EQ(platform["bIsServer"], 0);
    EXPECT_EQ(platform["Flags"], 112);
    EXPECT_EQ(platform["CacheDirectory"], "/tmp");
    EXPECT_EQ(platform["TickBudgetInMilliseconds"], 0);
    EXPECT_TRUE(platform["EncryptionKey"].is_null());
    EXPECT_TRUE(platform["RTCOptions"].is_null());

    nlohmann::json login = only("EOS_Auth_Login");
    EXPECT_EQ(login["ApiVersion"], 3);
    EXPECT_EQ(login["ScopeFlags"], 7);
    EXPECT_EQ(login["LoginFlags"], 0);
    EXPECT_EQ(login["Credentials"]["ApiVersion"], 4);
    EXPECT_EQ(login["Credentials"]["Id"], "localhost:6547");
    EXPECT_EQ(login["Credentials"]["Token"], "me");
    EXPECT_EQ(login["Credentials"]["Type"], 4);
    EXPECT_EQ(login["Credentials"]["ExternalType"], 0);

    auto levels = eos_sim::calls("EOS_Logging_SetLogLevel");
    ASSERT_EQ(levels.size(), 1u);
    EXPECT_EQ(levels[0].options["LogCategory"], 0x7fffffff);
    EXPECT_EQ(levels[0].options["LogLevel"], 400);
    EXPECT_EQ(eos_sim::calls("EOS_Logging_SetCallback").size(), 1u);
    EXPECT_EQ(egs_lines(), std::vector<std::string>{"[EGS] DEBUG BUILD"});
}

TEST_F(Platform, TheOverlayFlagChoosesThePlatformFlagsAndSpareIsIgnored)
{
    host::InitConfigValues values = config();
    values.enableOverlay = false;
    values.spare = std::string(5000, 'x');
    ASSERT_TRUE(init(values, nullptr));
    EXPECT_EQ(only("EOS_Platform_Create")["Flags"], 2);
    for (const eos_sim::Call &call : eos_sim::calls())
        EXPECT_EQ(call.options.dump().find("xxxx"), std::string::npos) << call.function;
}

TEST_F(Platform, AnSdkThatRefusesToInitializeEndsInitWithItsCode)
{
    eos_sim::inject("EOS_Initialize", eos_sim::Failure::once(EOS_EResult::EOS_InvalidParameters));
    host::InitConfigValues values = config();
    values.eosProductId = std::string(1500, 'p');
    host::ClosureRef onLogin = host::make_closure("PiBBB_v");
    EXPECT_FALSE(init(values, onLogin));
    EXPECT_EQ(egs_lines(), std::vector<std::string>{"[EGS] EOS failed to initialize : 10"});
    auto console = hlrt::console_utf8();
    ASSERT_FALSE(console.empty());
    EXPECT_EQ(console.back(), "[EGS] EOS failed to initialize : 10\n");
    EXPECT_EQ(eos_sim::calls("EOS_Platform_Create").size(), 0u);
    EXPECT_EQ(hlrt::root_count(), 0u);
    tick(3);
    EXPECT_EQ(onLogin->count(), 0u);
}

TEST_F(Platform, APlatformThatCannotBeCreatedEndsInitAfterTheDebugLine)
{
    eos_sim::inject("EOS_Platform_Create", eos_sim::Failure::once(EOS_EResult::EOS_UnexpectedError));
    host::ClosureRef onLogin = host::make_closure("PiBBB_v");
    EXPECT_FALSE(init(config(), onLogin));
    EXPECT_EQ(egs_lines(), (std::vector<std::string>{"[EGS] DEBUG BUILD", "[EGS] EOS failed to create platform"}));
    EXPECT_EQ(eos_sim::calls("EOS_Auth_Login").size(), 0u);
    EXPECT_EQ(hlrt::root_count(), 0u);
    tick(3);
    EXPECT_EQ(onLogin->count(), 0u);
    EXPECT_TRUE(eos_sim::faults().empty());
}

TEST_F(Platform, AnOverlongProductIdGoesToTheSdkWhole)
{
    // The library keeps at most 1023 bytes of it; the SDK, which allows 64,
    // receives the whole id and refuses the platform.
    host::InitConfigValues values = config();
    values.eosProductId = std::string(1500, 'p');
    host::ClosureRef onLogin = host::make_closure("PiBBB_v");
    EXPECT_FALSE(init(values, onLogin));
    EXPECT_EQ(eos_sim::calls("EOS_Platform_Create")[0].options["ProductId"], std::string(1500, 'p'));
    EXPECT_EQ(egs_lines(), (std::vector<std::string>{"[EGS] DEBUG BUILD", "[EGS] EOS failed to create platform"}));
    EXPECT_EQ(hlrt::root_count(), 0u);
}

TEST_F(Platform, FriendsPlayThisProductWhenTheirPresenceNamesTheGivenId)
{
    eos_sim::update_world([&](eos_sim::World &w) {
        w.accounts[1].presence = eos_sim::Presence{EOS_Presence_EStatus::EOS_PS_Away, std::string(64, 'q')};
    });
    host::InitConfigValues values = config();
    values.eosProductId = std::string(64, 'q');
    ASSERT_TRUE(init(values, nullptr));
    tick(5);
    host::ClosureRef onFriends = host::make_closure("PA_v");
    p.query_friends(onFriends->vm);
    ASSERT_TRUE(tick_until([&] { return onFriends->count() > 0; }));
    varray *list = arg_array(onFriends->last(), 0);
    ASSERT_NE(list, nullptr);
    auto alice = static_cast<vdynobj *>(host::array_slots(list)[0]);
    EXPECT_EQ(host::field_bool(alice, "online"), std::optional<bool>(true));
}

TEST_F(Platform, ANullConfigurationOrASecondInitFailsWithoutTouchingTheSdk)
{
    bool result = true;
    host::call_guarded([&] { result = p.init(nullptr, nullptr); });
    EXPECT_FALSE(result);
    EXPECT_TRUE(logged("[EGS] EOS init without a configuration"));
    EXPECT_TRUE(eos_sim::calls("EOS_Initialize").empty());

    sign_in();
    host::InitConfigValues other = config();
    other.eosProductId = "another-product";
    EXPECT_FALSE(init(other, host::make_closure("PiBBB_v")));
    EXPECT_TRUE(logged("[EGS] EOS failed to initialize : 15"));
    EXPECT_EQ(eos_sim::calls("EOS_Initialize").size(), 1u);
    EXPECT_EQ(eos_sim::live_platforms(), 1);
    EXPECT_EQ(hlrt::root_count(), 0u);
}

TEST_F(Platform, UpdateTicksOncePerCallAndExitReleasesOnce)
{
    ASSERT_TRUE(init(config(), nullptr));
    uint64_t before = eos_sim::ticks();
    tick(4);
    EXPECT_EQ(eos_sim::ticks(), before + 4);
    p.exit();
    p.exit();
    tick(2);
    EXPECT_EQ(eos_sim::ticks(), before + 4);
    EXPECT_EQ(eos_sim::calls("EOS_Platform_Release").size(), 1u);
    EXPECT_TRUE(eos_sim::calls("EOS_Shutdown").empty());
    EXPECT_TRUE(eos_sim::faults().empty());
}

TEST_F(Platform, WithoutASignInClosureTheChainStillRunsToItsEnd)
{
    ASSERT_TRUE(init(config(), nullptr));
    EXPECT_EQ(hlrt::root_count(), 0u);
    ASSERT_TRUE(tick_until([&] { return logged("[EGS] EGS Connect Login success"); }));
    expect_clean();
}
