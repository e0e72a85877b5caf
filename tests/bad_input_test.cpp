// Whatever a game passes, the library neither crashes nor reads through a
// null: a null for every bytes, array, object and closure argument, empty and
// overlong strings, ids of the wrong length, text that is not UTF-8, a
// configuration with missing fields, and calls before init and after exit.
// Each such call ends with a clear log line or with what the game is always
// told, and leaves no root, no SDK copy and no misuse behind.
#include "reliability.h"

#include <random>

using namespace tw;

namespace {

const std::string kLong(300, 'x');             // beyond every bound of the library
const std::string kLongId(70, 'a');            // longer than any id the SDK hands out
const std::string kNotUtf8 = "\xff\xfe\xc3(\xed\xa0\x80";  // bad lead, cut sequence, surrogate

class BadInput : public TarnwickTest {
protected:
    void SetUp() override
    {
        count_failures();
        TarnwickTest::SetUp();
    }

    // Ticks until the SDK has nothing queued.
    void settle()
    {
        tick(1);
        for (int i = 0; i < 20 && !eos_sim::pending().empty(); ++i)
            tick(1);
        tick(1);
    }

    // One bad input: the call returns, nothing is thrown at the game, and once
    // its completions have run no misuse shows and no copy is left.
    void attempt(const std::string &what, const std::function<void()> &call)
    {
        SCOPED_TRACE(what);
        ++tried_;
        from_ = egs_lines().size();
        EXPECT_EQ(host::call_guarded(call), nullptr);
        settle();
        EXPECT_TRUE(eos_sim::faults().empty()) << eos_sim::faults().front();
        EXPECT_EQ(eos_sim::outstanding_total(), 0);
    }

    // The library's lines written by the last attempt.
    std::vector<std::string> lines() const
    {
        std::vector<std::string> all = egs_lines();
        return std::vector<std::string>(all.begin() + static_cast<long>(std::min(from_, all.size())), all.end());
    }

    bool line_starting(const std::string &prefix) const
    {
        for (const std::string &l : lines())
            if (l.rfind(prefix, 0) == 0)
                return true;
        return false;
    }

    static std::string published_key(const std::string &lobby)
    {
        std::optional<eos_sim::Lobby> l = eos_sim::find_lobby(lobby);
        if (l)
            for (const eos_sim::Attribute &a : l->attributes)
                if (a.key == "connection_key")
                    return a.as_utf8;
        return "<none>";
    }

    void report(const char *group) { std::printf("[ inputs   ] %s: %zu bad inputs tried\n", group, tried_); }

    size_t tried_ = 0;
    size_t from_ = 0;
};

// ---- ids and keys ---------------------------------------------------------------------------

TEST_F(BadInput, LobbyIdsInviteIdsAndKeysOfEveryShape)
{
    sign_in();
    host::ClosureRef onInvite = host::make_closure("PBB_v");
    p.notify_invite_received(onInvite->vm);
    const size_t subscribed = hlrt::root_count();
    const std::string bob = eos_sim::get_world().accounts[2].product_user_id;

    // Keys: null publishes an empty key (and says so), overlong ones are cut,
    // text that is not UTF-8 is published as it is.
    struct KeyCase {
        const char *what;
        std::optional<std::string> key;
        std::string published;
    };
    for (const KeyCase &k : {KeyCase{"null key", std::nullopt, ""}, KeyCase{"empty key", std::string(), ""},
                             KeyCase{"300-byte key", kLong, kLong.substr(0, 255)},
                             KeyCase{"key not in UTF-8", kNotUtf8, kNotUtf8}}) {
        host::ClosureRef onCreated = host::make_closure("PB_v");
        attempt(k.what, [&] { p.create_lobby(host::bytes_or_null(k.key), onCreated->vm); });
        ASSERT_EQ(onCreated->count(), 1u) << k.what;
        std::optional<std::string> lobby = arg_bytes(onCreated->last(), 0);
        ASSERT_TRUE(lobby.has_value()) << k.what;
        EXPECT_EQ(published_key(*lobby), k.published) << k.what;
        EXPECT_EQ(line_starting("[EGS] No connection key given"), !k.key.has_value()) << k.what;
        p.destroy_lobby(host::bytes(*lobby), nullptr);
        settle();
    }

    // Lobby ids that name no lobby: leave and destroy answer with the SDK's
    // code and log it.
    for (const std::optional<std::string> &id : {std::optional<std::string>(), std::optional<std::string>(""),
                                                 std::optional<std::string>(kLongId), std::optional<std::string>(kNotUtf8),
                                                 std::optional<std::string>(kLong)}) {
        std::string what = id ? "lobby id of " + std::to_string(id->size()) + " bytes" : "null lobby id";
        host::ClosureRef onLeft = host::make_closure("Pi_v");
        attempt("leave, " + what, [&] { p.leave_lobby(host::bytes_or_null(id), onLeft->vm); });
        ASSERT_EQ(onLeft->count(), 1u) << what;
        int code = arg_i32(onLeft->last(), 0);
        EXPECT_NE(code, 0) << what;
        EXPECT_TRUE(line_starting("[EGS] Can't leave lobby ")) << what;
        EXPECT_EQ(lines().back().substr(lines().back().rfind(' ') + 1), std::to_string(code)) << what;

        host::ClosureRef onDestroyed = host::make_closure("Pi_v");
        attempt("destroy, " + what, [&] { p.destroy_lobby(host::bytes_or_null(id), onDestroyed->vm); });
        ASSERT_EQ(onDestroyed->count(), 1u) << what;
        EXPECT_NE(arg_i32(onDestroyed->last(), 0), 0) << what;
        EXPECT_TRUE(line_starting("[EGS] Can't destroy lobby : ")) << what;

        attempt("leave without a closure, " + what, [&] { p.leave_lobby(host::bytes_or_null(id), nullptr); });
        attempt("destroy without a closure, " + what, [&] { p.destroy_lobby(host::bytes_or_null(id), nullptr); });

        // Invite ids: no details, no join, no answer.
        host::ClosureRef onJoined = host::make_closure("PBB_v");
        host::Held keep(onJoined->vm);
        attempt("accept, invite " + what, [&] { p.accept_invite(host::bytes_or_null(id), onJoined->vm); });
        EXPECT_EQ(onJoined->count(), 0u) << what;
        EXPECT_TRUE(line_starting("[EGS] Failed to receive lobby details : ")) << what;
        attempt("accept without a closure, invite " + what, [&] { p.accept_invite(host::bytes_or_null(id), nullptr); });

        attempt("reject, invite " + what, [&] { p.reject_invite(host::bytes_or_null(id)); });
        EXPECT_TRUE(line_starting("[EGS] Failed to reject invite ")) << what;

        // Sending: a bad target, a bad lobby, or both.
        attempt("send to a target id " + what, [&] { p.send_invite(host::bytes_or_null(id), host::bytes("no-such-lobby")); });
        EXPECT_TRUE(line_starting("[EGS] Failed to send invite : ")) << what;
        attempt("send to bob, " + what, [&] { p.send_invite(host::bytes(bob), host::bytes_or_null(id)); });
        EXPECT_TRUE(line_starting("[EGS] Failed to send invite : ")) << what;
        attempt("send, both " + what, [&] { p.send_invite(host::bytes_or_null(id), host::bytes_or_null(id)); });
        EXPECT_TRUE(line_starting("[EGS] Failed to send invite : ")) << what;

        // Achievements and offers: the outcome is never reported, and nothing breaks.
        attempt("unlock, achievement " + what, [&] { p.set_achievement(host::bytes_or_null(id)); });
        attempt("checkout, offer " + what, [&] { p.store_checkout(host::bytes_or_null(id)); });
    }

    // Nothing above was answered twice or left rooted, and later requests work.
    EXPECT_EQ(hlrt::root_count(), subscribed);
    Recorder game;
    p.query_achievements(game.closure("onAchievements", "PA_v")->vm);
    settle();
    ASSERT_EQ(game.told["onAchievements"].size(), 1u);
    EXPECT_EQ(game.told["onAchievements"][0],
              "([{id='first_win' unlock=false } {id='explorer' unlock=true } {id='dawn' unlock=true } ])");
    expect_clean(subscribed);
    report("ids and keys");
}

// ---- arrays and closures --------------------------------------------------------------------

TEST_F(BadInput, ItemArraysAndMissingClosures)
{
    sign_in();
    struct ArrayCase {
        const char *what;
        std::function<varray *()> make;
        std::string owned;  // what onOwned receives
        const char *line;
    };
    const std::string none = "([])";
    const std::vector<ArrayCase> cases = {
        {"null array", [] { return static_cast<varray *>(nullptr); }, none,
         "[EGS] No catalogue item ids, ownership asked for none"},
        {"empty array", [] { return host::bytes_array(std::vector<std::string>{}); }, none, nullptr},
        {"null entries", [] { return host::bytes_array(std::vector<std::optional<std::string>>{std::nullopt, std::string("item_sword"), std::nullopt}); },
         "(['item_sword' ])", "[EGS] Null catalogue item ids skipped : 2"},
        {"only null entries", [] { return host::bytes_array(std::vector<std::optional<std::string>>{std::nullopt, std::nullopt}); },
         none, "[EGS] Null catalogue item ids skipped : 2"},
        {"an array of integers", [] { return hl_alloc_array(&hlt_i32, 3); }, none,
         "[EGS] Catalogue item ids are not bytes, ownership asked for none"},
        // The SDK refuses ids it cannot hold: the query fails as a whole.
        {"overlong, empty and non-UTF-8 ids",
         [] { return host::bytes_array(std::vector<std::string>{kLong, "", kNotUtf8, kLongId, "item_sword"}); },
         "(null)", nullptr},
        {"70-character and non-UTF-8 ids", [] { return host::bytes_array(std::vector<std::string>{kNotUtf8, kLongId, "item_sword"}); },
         "(['item_sword' ])", nullptr},
    };
    for (const ArrayCase &c : cases) {
        Recorder game;
        attempt(c.what, [&] { p.query_ownership(c.make(), game.closure("onOwned", "PA_v")->vm); });
        EXPECT_EQ(game.told["onOwned"], std::vector<std::string>{c.owned}) << c.what;
        if (c.line)
            EXPECT_TRUE(line_starting(c.line)) << c.what;
        attempt(std::string(c.what) + " without a closure", [&] { p.query_ownership(c.make(), nullptr); });
    }

    // Every request primitive with a null closure: the request runs, nothing
    // is called, nothing stays rooted.
    std::string invite =
        eos_sim::remote_invite("alice", eos_sim::remote_create_lobby("alice", {eos_sim::Attribute::string("connection_key", "k")}));
    attempt("friends without a closure", [&] { p.query_friends(nullptr); });
    attempt("achievements without a closure", [&] { p.query_achievements(nullptr); });
    attempt("lobby without a closure", [&] { p.create_lobby(host::bytes("k"), nullptr); });
    attempt("accept without a closure", [&] { p.accept_invite(host::bytes(invite), nullptr); });
    EXPECT_TRUE(line_starting("[EGS] call lobby joined callback"));
    attempt("invitations without a closure", [&] { p.notify_invite_received(nullptr); });
    attempt("accepted invitations without a closure", [&] { p.notify_invite_accepted(nullptr); });
    // Invitations still run their whole chain, and overlay acceptances reject.
    std::string second =
        eos_sim::remote_invite("bob", eos_sim::remote_create_lobby("bob", {eos_sim::Attribute::string("connection_key", "k2")}));
    attempt("an invitation to nobody", [] {});
    attempt("an overlay acceptance for nobody", [&] { eos_sim::raise_invite_accepted(second); });
    EXPECT_TRUE(line_starting("[EGS] Accept to join the lobby "));
    // The second invitation came under the closure-less subscription.
    EXPECT_EQ(eos_sim::calls("EOS_Connect_QueryProductUserIdMappings").size(), 1u);
    expect_clean(0);
    report("arrays and closures");
}

// ---- before init and after exit -------------------------------------------------------------

// Every primitive but init, update and exit, with the name its dropping line gives.
struct Request {
    const char *name;
    std::function<void(Primitives &)> call;
};

std::vector<Request> every_request(const host::ClosureRef &bytes2, const host::ClosureRef &bytes1,
                                   const host::ClosureRef &code, const host::ClosureRef &array)
{
    return {
        {"notify_invite_received", [=](Primitives &p) { p.notify_invite_received(bytes2->vm); }},
        {"notify_invite_accepted", [=](Primitives &p) { p.notify_invite_accepted(bytes2->vm); }},
        {"set_achievement", [](Primitives &p) { p.set_achievement(host::bytes("first_win")); }},
        {"query_ownership", [=](Primitives &p) { p.query_ownership(nullptr, array->vm); }},
        {"query_achievements", [=](Primitives &p) { p.query_achievements(array->vm); }},
        {"show_friends", [](Primitives &p) { p.show_friends(); }},
        {"query_friends", [=](Primitives &p) { p.query_friends(array->vm); }},
        {"send_invite", [](Primitives &p) { p.send_invite(nullptr, nullptr); }},
        {"reject_invite", [](Primitives &p) { p.reject_invite(nullptr); }},
        {"accept_invite", [=](Primitives &p) { p.accept_invite(nullptr, bytes2->vm); }},
        {"create_lobby", [=](Primitives &p) { p.create_lobby(nullptr, bytes1->vm); }},
        {"leave_lobby", [=](Primitives &p) { p.leave_lobby(nullptr, code->vm); }},
        {"destroy_lobby", [=](Primitives &p) { p.destroy_lobby(nullptr, code->vm); }},
        {"store_checkout", [](Primitives &p) { p.store_checkout(nullptr); }},
    };
}

TEST_F(BadInput, RequestsWithoutAPlatformAreDroppedBeforeInitAndAfterExit)
{
    host::ClosureRef bytes2 = host::make_closure("PBB_v");
    host::ClosureRef bytes1 = host::make_closure("PB_v");
    host::ClosureRef code = host::make_closure("Pi_v");
    host::ClosureRef array = host::make_closure("PA_v");
    // No platform ever holds these closures: the test keeps them alive itself.
    for (const host::ClosureRef *c : {&bytes2, &bytes1, &code, &array})
        hlrt::hold((*c)->vm);
    std::vector<Request> requests = every_request(bytes2, bytes1, code, array);

    auto all_dropped = [&](const char *when) {
        for (const Request &r : requests) {
            attempt(std::string(r.name) + " " + when, [&] { r.call(p); });
            EXPECT_EQ(lines(), std::vector<std::string>{"[EGS] No EOS platform, " + std::string(r.name) + " ignored"});
        }
        attempt(std::string("update ") + when, [&] { p.update(); });
        attempt(std::string("exit ") + when, [&] { p.exit(); });
        EXPECT_TRUE(lines().empty());
    };
    all_dropped("before init");
    EXPECT_TRUE(eos_sim::calls().empty());

    host::ClosureRef onLogin = sign_in();
    attempt("init again", [&] { EXPECT_FALSE(init(config(), onLogin)); });
    EXPECT_EQ(lines(), std::vector<std::string>{"[EGS] EOS failed to initialize : " +
                                                std::to_string(static_cast<int>(EOS_EResult::EOS_AlreadyConfigured))});
    EXPECT_EQ(eos_sim::live_platforms(), 1);
    p.exit();
    all_dropped("after exit");
    EXPECT_EQ(eos_sim::calls("EOS_Platform_Release").size(), 1u);
    for (const host::ClosureRef *c : {&bytes2, &bytes1, &code, &array})
        EXPECT_EQ((*c)->count(), 0u);
    EXPECT_EQ(onLogin->count(), 1u);
    expect_clean(0);
    report("without a platform");
}

// ---- the configuration ----------------------------------------------------------------------

// One configuration, in a process of its own: init either refuses it with a
// line, or starts a sign-in that reports exactly once.
struct ConfigCase {
    std::string what;
    std::function<void(host::InitConfigValues &)> change;
    bool null_object = false;
};

TEST_F(BadInput, ConfigurationsWithMissingEmptyOverlongOrOddFields)
{
    std::vector<ConfigCase> cases;
    using V = host::InitConfigValues;
    using Field = std::optional<std::string> V::*;
    const std::vector<std::pair<const char *, Field>> fields = {
        {"productName", &V::productName},   {"productVersion", &V::productVersion}, {"eosProductId", &V::eosProductId},
        {"spare", &V::spare},               {"sandboxId", &V::sandboxId},           {"deploymentId", &V::deploymentId},
        {"clientId", &V::clientId},         {"clientSecret", &V::clientSecret},     {"loginId", &V::loginId},
        {"loginToken", &V::loginToken}};
    cases.push_back({"no configuration object", nullptr, true});
    for (const auto &[name, field] : fields) {
        Field f = field;
        cases.push_back({std::string("null ") + name, [f](V &v) { v.*f = std::nullopt; }});
        cases.push_back({std::string("empty ") + name, [f](V &v) { v.*f = std::string(); }});
        cases.push_back({std::string("5000-byte ") + name, [f](V &v) { v.*f = std::string(5000, 'p'); }});
        cases.push_back({std::string("non-UTF-8 ") + name, [f](V &v) { v.*f = kNotUtf8; }});
    }
    cases.push_back({"every field null", [&](V &v) {
                         for (const auto &[name, field] : fields)
                             v.*field = std::nullopt;
                     }});
    cases.push_back({"login type -1", [](V &v) { v.loginType = -1; }});
    cases.push_back({"login type 1000", [](V &v) { v.loginType = 1000; }});
    cases.push_back({"external type -7", [](V &v) { v.externalType = -7; }});

    size_t refused = 0;
    for (const ConfigCase &c : cases) {
        ++tried_;
        ChildRun child = run_forked([&](const std::string &dir) {
            SCOPED_TRACE(c.what);
            dir_ = dir;
            host::ClosureRef onLogin = host::make_closure("PiBBB_v");
            bool started = false;
            if (c.null_object) {
                started = p.init(nullptr, onLogin->vm);
            } else {
                host::InitConfigValues values = config();
                c.change(values);
                started = init(values, onLogin);
            }
            tick_until([&] { return onLogin->count() > 0; }, 30);
            tick(2);
            std::vector<std::string> lines = egs_lines();
            if (started) {
                EXPECT_EQ(onLogin->count(), 1u);
            } else {
                EXPECT_EQ(onLogin->count(), 0u);
                bool said = false;
                for (const std::string &l : lines)
                    said = said || l.rfind("[EGS] EOS failed to initialize : ", 0) == 0 ||
                           l == "[EGS] EOS failed to create platform" || l == "[EGS] EOS init without a configuration";
                EXPECT_TRUE(said) << "init refused the configuration without saying why";
            }
            // Requests go on working, or are dropped with their line.
            host::ClosureRef onFriends = host::make_closure("PA_v");
            p.query_friends(onFriends->vm);
            tick(5);
            EXPECT_EQ(onFriends->count(), started ? 1u : 0u);
            p.exit();
            expect_clean(0);
            return std::string(started ? "started" : "refused");
        });
        EXPECT_TRUE(child.clean()) << c.what << ": " << child.describe();
        refused += child.output == "refused";
    }
    std::printf("[ inputs   ] configurations: %zu tried, %zu refused by init with a line\n", tried_, refused);
}

}  // namespace
