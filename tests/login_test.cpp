// The sign-in chain: Auth login, display name and token, Connect login, user
// creation, and its single report to the game.
#include "tarnwick_test.h"

using namespace tw;

class Login : public TarnwickTest {
protected:
    struct Outcome {
        int code;
        std::optional<std::string> account, name, token;
    };

    void SetUp() override
    {
        TarnwickTest::SetUp();
        onLogin = host::make_closure("PiBBB_v");
    }

    // Starts the chain and ticks (collecting before every tick) until it has
    // reported; the report must come exactly once.
    Outcome run()
    {
        EXPECT_TRUE(init(config(), onLogin));
        for (int i = 0; i < 40 && onLogin->count() == 0; ++i) {
            hlrt::collect();
            EXPECT_EQ(tick(), nullptr);
        }
        tick_collecting(5);
        EXPECT_EQ(onLogin->count(), 1u);
        if (onLogin->count() == 0)
            return {-1, {}, {}, {}};
        const host::Call &c = onLogin->last();
        EXPECT_EQ(c.args.size(), 4u);
        return {arg_i32(c, 0), arg_bytes(c, 1), arg_bytes(c, 2), arg_bytes(c, 3)};
    }

    std::string me_id() const { return eos_sim::get_world().accounts[0].epic_id; }
    std::string token_of_me() const
    {
        auto logins = eos_sim::calls("EOS_Connect_Login");
        return logins.empty() ? std::string() : logins[0].options["Credentials"]["Token"].get<std::string>();
    }

    host::ClosureRef onLogin;
};

TEST_F(Login, AReturningPlayerSignsInToBothServices)
{
    Outcome o = run();
    EXPECT_EQ(o.code, 0);
    EXPECT_EQ(o.account, std::optional<std::string>(me_id()));
    EXPECT_EQ(o.name, std::optional<std::string>("Local Player"));
    ASSERT_TRUE(o.token.has_value());
    EXPECT_EQ(*o.token, token_of_me());
    EXPECT_EQ(egs_lines(), (std::vector<std::string>{"[EGS] DEBUG BUILD", "[EGS] EGS Auth Login success",
                                                    "[EGS] EGS Connect Login success"}));
    EXPECT_TRUE(eos_sim::calls("EOS_Connect_CreateUser").empty());

    auto copy = eos_sim::calls("EOS_UserInfo_CopyUserInfo");
    ASSERT_EQ(copy.size(), 1u);
    EXPECT_EQ(copy[0].options["ApiVersion"], 3);
    EXPECT_EQ(copy[0].options["LocalUserId"], me_id());
    EXPECT_EQ(copy[0].options["TargetUserId"], me_id());
    EXPECT_EQ(eos_sim::calls("EOS_Auth_CopyUserAuthToken")[0].options["ApiVersion"], 1);
    nlohmann::json connect = eos_sim::calls("EOS_Connect_Login")[0].options;
    EXPECT_EQ(connect["ApiVersion"], 2);
    EXPECT_EQ(connect["Credentials"]["ApiVersion"], 1);
    EXPECT_EQ(connect["Credentials"]["Type"], 0);
    EXPECT_TRUE(connect["UserLoginInfo"].is_null() || connect["UserLoginInfo"] == false);

    // Later requests act for the product user the Connect login gave.
    p.create_lobby(host::bytes("key"), nullptr);
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_CreateLobby")[0].options["LocalUserId"],
              eos_sim::get_world().accounts[0].product_user_id);
    expect_clean();
}

TEST_F(Login, AFirstTimePlayerHasTheirConnectUserCreated)
{
    eos_sim::update_world([](eos_sim::World &w) { w.accounts[0].has_connect_user = false; });
    Outcome o = run();
    EXPECT_EQ(o.code, 0);
    EXPECT_EQ(o.account, std::optional<std::string>(me_id()));
    EXPECT_EQ(o.name, std::optional<std::string>("Local Player"));
    EXPECT_TRUE(o.token.has_value());
    EXPECT_EQ(egs_lines(), (std::vector<std::string>{"[EGS] DEBUG BUILD", "[EGS] EGS Auth Login success",
                                                    "[EGS] Invalid User, Create it",
                                                    "[EGS] EGS Connect Create user success"}));
    auto create = eos_sim::calls("EOS_Connect_CreateUser");
    ASSERT_EQ(create.size(), 1u);
    EXPECT_EQ(create[0].options["ApiVersion"], 1);
    EXPECT_FALSE(create[0].options["ContinuanceToken"].is_null());
    p.create_lobby(host::bytes("key"), nullptr);
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_CreateLobby")[0].options["LocalUserId"],
              eos_sim::get_world().accounts[0].product_user_id);
    expect_clean();
}

TEST_F(Login, AnAuthFailureReportsItsCodeAndNothingElse)
{
    host::InitConfigValues values = config();
    values.loginToken = "nobody-has-this-credential";
    EXPECT_TRUE(init(values, onLogin));
    ASSERT_TRUE(tick_until([&] { return onLogin->count() > 0; }));
    const host::Call &c = onLogin->last();
    EXPECT_EQ(arg_i32(c, 0), 2);
    EXPECT_EQ(arg_bytes(c, 1), std::nullopt);
    EXPECT_EQ(arg_bytes(c, 2), std::optional<std::string>(""));
    EXPECT_EQ(arg_bytes(c, 3), std::nullopt);
    EXPECT_EQ(egs_lines(), (std::vector<std::string>{"[EGS] DEBUG BUILD", "[EGS] Failed to auth to EGS : 2"}));
    EXPECT_TRUE(eos_sim::calls("EOS_Connect_Login").empty());
    // No product user: a later request goes out with a null user.
    p.create_lobby(host::bytes("key"), nullptr);
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_CreateLobby")[0].options["LocalUserId"].is_null());
    tick(3);
    expect_clean();
}

TEST_F(Login, ATokenThatCannotBeCopiedEndsTheChainWithItsCode)
{
    eos_sim::inject("EOS_Auth_CopyUserAuthToken", eos_sim::Failure::once(EOS_EResult::EOS_NotFound));
    Outcome o = run();
    EXPECT_EQ(o.code, 18);
    EXPECT_EQ(o.account, std::optional<std::string>(me_id()));
    EXPECT_EQ(o.name, std::optional<std::string>("Local Player"));
    EXPECT_EQ(o.token, std::nullopt);
    EXPECT_EQ(egs_lines().back(), "[EGS] Failed to retreive an EGS auth token : 18");
    EXPECT_TRUE(eos_sim::calls("EOS_Connect_Login").empty());
    expect_clean();
}

TEST_F(Login, AConnectFailureOtherThanAMissingUserReportsEverythingKnown)
{
    eos_sim::inject("EOS_Connect_Login", eos_sim::Failure::once(EOS_EResult::EOS_AccessDenied));
    Outcome o = run();
    EXPECT_EQ(o.code, 5);
    EXPECT_EQ(o.account, std::optional<std::string>(me_id()));
    EXPECT_EQ(o.name, std::optional<std::string>("Local Player"));
    EXPECT_TRUE(o.token.has_value());
    EXPECT_EQ(egs_lines().back(), "[EGS] Failed to auth to EGS : 5");
    EXPECT_TRUE(eos_sim::calls("EOS_Connect_CreateUser").empty());
    p.create_lobby(host::bytes("key"), nullptr);
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_CreateLobby")[0].options["LocalUserId"].is_null());
    tick(3);
    expect_clean();
}

TEST_F(Login, AFailedUserCreationReportsItsCode)
{
    eos_sim::update_world([](eos_sim::World &w) { w.accounts[0].has_connect_user = false; });
    eos_sim::inject("EOS_Connect_CreateUser", eos_sim::Failure::once(EOS_EResult::EOS_TooManyRequests));
    Outcome o = run();
    EXPECT_EQ(o.code, 8);
    EXPECT_EQ(o.account, std::optional<std::string>(me_id()));
    EXPECT_TRUE(o.token.has_value());
    EXPECT_EQ(egs_lines().back(), "[EGS] Failed to create user : 8");
    expect_clean();
}

TEST_F(Login, WithoutTheUsersInfoTheChainGoesOnWithAnEmptyName)
{
    eos_sim::inject("EOS_UserInfo_CopyUserInfo", eos_sim::Failure::once(EOS_EResult::EOS_NotFound));
    Outcome o = run();
    EXPECT_EQ(o.code, 0);
    EXPECT_EQ(o.account, std::optional<std::string>(me_id()));
    EXPECT_EQ(o.name, std::optional<std::string>(""));
    EXPECT_TRUE(o.token.has_value());
    EXPECT_EQ(egs_lines(), (std::vector<std::string>{"[EGS] DEBUG BUILD", "[EGS] EGS Auth Login success",
                                                    "[EGS] Failed to retreive name : 18",
                                                    "[EGS] EGS Connect Login success"}));
    expect_clean();
}

TEST_F(Login, AnAccountIdThatCannotBeWrittenReachesTheGameAsNull)
{
    eos_sim::inject("EOS_EpicAccountId_ToString", eos_sim::Failure::always(EOS_EResult::EOS_InvalidUser));
    Outcome o = run();
    EXPECT_EQ(o.code, 0);
    EXPECT_EQ(o.account, std::nullopt);
    EXPECT_EQ(o.name, std::optional<std::string>("Local Player"));
}

TEST_F(Login, DisplayNamesKeepAtMost63Bytes)
{
    std::string name63(63, 'n');
    eos_sim::update_world([&](eos_sim::World &w) { w.accounts[0].display_name = name63; });
    EXPECT_EQ(run().name, std::optional<std::string>(name63));
}

TEST_F(Login, ALongerDisplayNameIsCutToItsFirst63Bytes)
{
    std::string name(64, 'm');
    name += "\xC3\xA9tail";
    eos_sim::update_world([&](eos_sim::World &w) { w.accounts[0].display_name = name; });
    Outcome o = run();
    EXPECT_EQ(o.name, std::optional<std::string>(name.substr(0, 63)));
    EXPECT_EQ(onLogin->last().args[2].bytes_size, 64);
}

TEST_F(Login, WithoutAClosureTheChainRunsAndLeavesNoRoot)
{
    EXPECT_TRUE(init(config(), nullptr));
    EXPECT_EQ(hlrt::root_count(), 0u);
    ASSERT_TRUE(tick_until([&] { return logged("[EGS] EGS Connect Login success"); }));
    expect_clean();
}

TEST_F(Login, ResultsThatAreNotFinalAreNeitherLoggedNorDelivered)
{
    eos_sim::update_world([](eos_sim::World &w) { w.accounts[0].has_connect_user = false; });
    eos_sim::inject("EOS_Auth_Login", eos_sim::Failure::retry());
    eos_sim::inject("EOS_Connect_Login", eos_sim::Failure::retry());
    eos_sim::inject("EOS_Connect_CreateUser", eos_sim::Failure::retry());
    Outcome o = run();
    EXPECT_EQ(o.code, 0);
    EXPECT_EQ(egs_lines(), (std::vector<std::string>{"[EGS] DEBUG BUILD", "[EGS] EGS Auth Login success",
                                                    "[EGS] Invalid User, Create it",
                                                    "[EGS] EGS Connect Create user success"}));
    EXPECT_EQ(eos_sim::calls("EOS_Auth_Login")[0].deliveries.size(), 2u);
    EXPECT_EQ(eos_sim::calls("EOS_Connect_CreateUser").size(), 1u);
    expect_clean();
}

TEST_F(Login, TheAccessTokenNeverReachesTheLogOrTheConsole)
{
    Outcome o = run();
    ASSERT_TRUE(o.token.has_value());
    ASSERT_FALSE(o.token->empty());
    for (const std::string &line : log_lines())
        EXPECT_EQ(line.find(*o.token), std::string::npos) << line;
    for (const std::string &line : hlrt::console_utf8())
        EXPECT_EQ(line.find(*o.token), std::string::npos) << line;
}
