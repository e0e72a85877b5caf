// Completion order: the SDK may complete requests in any order, spread over
// any number of ticks, and may first answer with a result that is not final.
// For each kind of request the same round is played once in order and then
// for many seeds with the queued completions released in a random order, some
// held back for a few ticks and some answered "not final" first: the game must
// be told exactly what the in-order round told it, each answer exactly once.
#include "reliability.h"

#include <algorithm>
#include <random>

using namespace tw;
using json = nlohmann::json;

namespace {

constexpr uint32_t kSeeds = 64;

class OrderFuzz : public TarnwickTest {
protected:
    void SetUp() override
    {
        count_failures();
        TarnwickTest::SetUp();
        if (!IsSkipped())
            name_accounts();
    }

    void name_accounts()
    {
        for (const eos_sim::Account &a : eos_sim::get_world().accounts) {
            accounts_[a.epic_id] = "epic:" + a.name;
            accounts_[a.product_user_id] = "puid:" + a.name;
        }
    }

    // One round's view of what the game was told: ids by name, every closure's
    // calls sorted (answers to different requests may come in any order), and
    // the library's own log lines, sorted.
    struct Outcome {
        Told told;
        std::vector<std::string> lines;
        bool operator==(const Outcome &o) const { return told == o.told && lines == o.lines; }
    };

    // Starts a round: completions are held from now on when a seed is given,
    // and the async calls in `retried` sometimes answer "not final" first.
    void begin(std::optional<uint32_t> seed, const std::vector<std::string> &retried)
    {
        game_ = Recorder();
        names_.clear();
        rng_.seed(seed ? *seed : 0);
        seeded_ = seed.has_value();
        lines_from_ = egs_lines().size();
        roots_before_ = hlrt::root_count();
        if (!seeded_)
            return;
        eos_sim::hold(true);
        for (const std::string &function : retried)
            if (rng_() % 3 == 0)
                eos_sim::inject(function, eos_sim::Failure::retry(1 + static_cast<int>(rng_() % 2)));
    }

    // Runs every queued completion: in order without a seed; with one, the
    // held completions are released in a random order each tick and some of
    // them skip a tick or two.
    void drain()
    {
        for (int round = 0; round < 400; ++round) {
            if (seeded_) {
                eos_sim::release_shuffled(static_cast<uint32_t>(rng_()));
                for (const eos_sim::Pending &p : eos_sim::pending())
                    if (rng_() % 2 == 0)
                        eos_sim::delay(p.id, static_cast<int>(rng_() % 3));
            }
            tick(1);
            if (round > 0 && eos_sim::pending().empty())
                break;
        }
        tick(1);
        EXPECT_TRUE(eos_sim::pending().empty()) << "completions still queued";
    }

    // Ends a round: nothing held, no copy outstanding, no root but those kept
    // before the round, no fault.
    Outcome end()
    {
        eos_sim::hold(false);
        eos_sim::clear_injections();
        EXPECT_EQ(eos_sim::outstanding_total(), 0);
        EXPECT_TRUE(eos_sim::faults().empty()) << (eos_sim::faults().empty() ? "" : eos_sim::faults().front());
        EXPECT_EQ(hlrt::root_count(), roots_before_);
        Outcome o;
        for (auto &[closure, calls] : game_.told) {
            std::vector<std::string> &out = o.told[closure];
            for (const std::string &c : calls)
                out.push_back(canonical(c));
            std::sort(out.begin(), out.end());
        }
        std::vector<std::string> lines = egs_lines();
        for (size_t i = lines_from_; i < lines.size(); ++i)
            o.lines.push_back(canonical(lines[i]));
        std::sort(o.lines.begin(), o.lines.end());
        return o;
    }

    std::string canonical(std::string text) const
    {
        for (const auto *names : {&names_, &accounts_})
            for (const auto &[id, name] : *names)
                text = replace_all(text, id, "<" + name + ">");
        return text;
    }

    vclosure *closure(const std::string &name, const std::string &signature)
    {
        host::ClosureRef c = game_.closure(name, signature);
        closures_.push_back(c);
        return c->vm;
    }

    // The first bytes argument the named closure received, if it was called.
    std::optional<std::string> answer(const std::string &name) const
    {
        auto it = game_.told.find(name);
        if (it == game_.told.end() || it->second.empty())
            return std::nullopt;
        const std::string &call = it->second[0];
        size_t open = call.find('\'');
        if (open == std::string::npos)
            return std::nullopt;
        return call.substr(open + 1, call.find('\'', open + 1) - open - 1);
    }

    // A lobby of `owner` publishing `key`, with an invitation of the local player to it.
    std::string invitation(const std::string &owner, const std::string &name)
    {
        std::string lobby =
            eos_sim::remote_create_lobby(owner, {eos_sim::Attribute::string("connection_key", name + "-key")});
        std::string invite = eos_sim::remote_invite(owner, lobby);
        names_[lobby] = "lobby-" + name;
        names_[invite] = "invite-" + name;
        return invite;
    }

    // Plays `round` in order, then once per seed; every seed must match.
    void fuzz(const char *kind, const std::function<Outcome(std::optional<uint32_t>)> &round)
    {
        Outcome in_order = round(std::nullopt);
        EXPECT_FALSE(in_order.told.empty());
        uint32_t seeds = 0;
        for (uint32_t seed = 1; seed <= kSeeds && !HasFailure(); ++seed, ++seeds) {
            Outcome o = round(seed);
            EXPECT_EQ(o.told, in_order.told) << kind << ", seed " << seed << ":\n"
                                             << show(o.told) << "in order:\n"
                                             << show(in_order.told);
            EXPECT_EQ(o.lines, in_order.lines) << kind << ", seed " << seed;
        }
        std::printf("[ fuzz     ] %s: %u seeds in random orders matched the in-order round\n", kind, seeds);
    }

    Recorder game_;
    std::vector<host::ClosureRef> closures_;
    std::map<std::string, std::string> names_;
    std::map<std::string, std::string> accounts_;
    std::mt19937 rng_;
    bool seeded_ = false;
    size_t lines_from_ = 0;
    size_t roots_before_ = 0;
};

// ---- sign-in: one chain per process, so each seed runs in a process of its own -------------

TEST_F(OrderFuzz, SignIn)
{
    // Odd seeds sign in a player whose Connect user is yet to be created.
    auto round = [this](std::optional<uint32_t> seed, bool new_player) {
        ChildRun child = run_forked([&](const std::string &dir) {
            dir_ = dir;
            if (new_player)
                eos_sim::update_world([](eos_sim::World &w) { w.accounts[0].has_connect_user = false; });
            begin(seed, {"EOS_Auth_Login", "EOS_Connect_Login", "EOS_Connect_CreateUser"});
            {
                void *object = host::init_config(config());
                host::Held keep(object);
                EXPECT_TRUE(p.init(object, closure("onLogin", "PiBBB_v")));
            }
            drain();
            auto logins = eos_sim::calls("EOS_Connect_Login");
            if (!logins.empty())
                names_[logins[0].options["Credentials"].value("Token", std::string("?"))] = "token";
            Outcome o = end();
            return json{{"told", o.told}, {"lines", o.lines}}.dump();
        });
        EXPECT_TRUE(child.clean()) << "seed " << (seed ? *seed : 0) << ": " << child.describe();
        json in = json::parse(child.output, nullptr, false);
        Outcome o;
        if (!in.is_discarded()) {
            o.told = in["told"].get<Told>();
            o.lines = in["lines"].get<std::vector<std::string>>();
        }
        return o;
    };
    for (bool new_player : {false, true}) {
        Outcome in_order = round(std::nullopt, new_player);
        ASSERT_EQ(in_order.told["onLogin"].size(), 1u);
        EXPECT_EQ(in_order.told["onLogin"][0], "(0, '<epic:me>', 'Local Player', '<token>')");
        uint32_t seeds = 0;
        for (uint32_t seed = 1; seed <= kSeeds / 2 && !HasFailure(); ++seed, ++seeds) {
            Outcome o = round(seed, new_player);
            EXPECT_EQ(o.told, in_order.told) << "seed " << seed << ":\n" << show(o.told);
            EXPECT_EQ(o.lines, in_order.lines) << "seed " << seed;
        }
        std::printf("[ fuzz     ] sign-in (%s player): %u seeds in random orders matched the in-order round\n",
                    new_player ? "new" : "returning", seeds);
    }
}

// ---- lobbies of the player's own ------------------------------------------------------------

TEST_F(OrderFuzz, CreateLeaveAndDestroyLobbies)
{
    sign_in();
    fuzz("create, leave and destroy", [this](std::optional<uint32_t> seed) {
        begin(seed, {"EOS_Lobby_CreateLobby", "EOS_Lobby_UpdateLobby", "EOS_Lobby_LeaveLobby", "EOS_Lobby_DestroyLobby"});
        for (const char *name : {"a", "b", "c"})
            p.create_lobby(host::bytes(std::string(name) + "-key"), closure(std::string("onCreated-") + name, "PB_v"));
        drain();
        std::map<std::string, std::string> lobby;
        for (const char *name : {"a", "b", "c"}) {
            std::optional<std::string> id = answer(std::string("onCreated-") + name);
            if (!id)
                continue;
            lobby[name] = *id;
            names_[*id] = std::string("lobby-") + name;
            // Each lobby publishes its own key, whatever order the requests took.
            std::optional<eos_sim::Lobby> l = eos_sim::find_lobby(*id);
            std::string published = "none";
            if (l)
                for (const eos_sim::Attribute &a : l->attributes)
                    if (a.key == "connection_key")
                        published = a.as_utf8;
            game_.told[std::string("published-") + name].push_back(published);
        }
        if (lobby.size() == 3) {
            p.destroy_lobby(host::bytes(lobby["a"]), closure("onDestroyed-a", "Pi_v"));
            p.leave_lobby(host::bytes(lobby["b"]), closure("onLeft-b", "Pi_v"));
            p.destroy_lobby(host::bytes(lobby["c"]), closure("onDestroyed-c", "Pi_v"));
            p.leave_lobby(host::bytes("no-such-lobby"), closure("onLeft-none", "Pi_v"));
            drain();
        }
        return end();
    });
}

// ---- invitations accepted in the game and in the overlay ------------------------------------

TEST_F(OrderFuzz, AcceptInvitations)
{
    sign_in();
    p.notify_invite_accepted(closure("onAccepted", "PBB_v"));
    fuzz("accept", [this](std::optional<uint32_t> seed) {
        begin(seed, {"EOS_Lobby_JoinLobby", "EOS_Lobby_RejectInvite", "EOS_Lobby_LeaveLobby"});
        std::map<std::string, std::string> invite;
        for (const char *owner : {"alice", "bob", "carol"})
            invite[owner] = invitation(owner, owner);
        std::string overlay = invitation("alice", "overlay");
        for (const char *owner : {"alice", "bob", "carol"})
            p.accept_invite(host::bytes(invite[owner]), closure(std::string("onJoined-") + owner, "PBB_v"));
        p.accept_invite(host::bytes("no-such-invite"), closure("onJoined-none", "PBB_v"));
        eos_sim::raise_invite_accepted(overlay);
        drain();
        // Leaving every lobby reached keeps the rounds alike.
        for (const char *owner : {"alice", "bob", "carol"})
            if (std::optional<std::string> lobby = answer(std::string("onJoined-") + owner))
                p.leave_lobby(host::bytes(*lobby), closure(std::string("onLeft-") + owner, "Pi_v"));
        drain();
        return end();
    });
}

// ---- invitations received: one chain per invitation, interleaved ---------------------------

TEST_F(OrderFuzz, InvitationsReceived)
{
    sign_in();
    p.notify_invite_received(closure("onInvite", "PBB_v"));
    fuzz("invite received", [this](std::optional<uint32_t> seed) {
        begin(seed, {"EOS_Connect_QueryProductUserIdMappings", "EOS_UserInfo_QueryUserInfo"});
        invitation("alice", "alice-1");
        invitation("bob", "bob");
        invitation("alice", "alice-2");
        invitation("carol", "carol");
        drain();
        return end();
    });
}

// ---- friends: two lists gathered at once, 2n + 1 completions each -------------------------

TEST_F(OrderFuzz, Friends)
{
    eos_sim::update_world([](eos_sim::World &w) {
        auto add = [&](const std::string &name, std::optional<std::string> display, std::optional<std::string> product,
                       bool connect) {
            eos_sim::Account a;
            a.name = name;
            a.display_name = display;
            a.has_connect_user = connect;
            a.friends = {{"me"}};
            if (product)
                a.presence = eos_sim::Presence{EOS_Presence_EStatus::EOS_PS_Online, product};
            w.accounts.push_back(a);
            w.accounts[0].friends.push_back({name});
        };
        add("dan", "Dan", std::string(eos_sim::kThisProduct), true);
        add("erin", std::nullopt, std::string("another-product"), true);
        add("frank", "Frank", std::nullopt, false);
        add("gina", "Gina", std::string(eos_sim::kThisProduct), true);
        w.accounts[0].friends.push_back({"ghost", true});
    });
    name_accounts();
    sign_in();
    fuzz("friends", [this](std::optional<uint32_t> seed) {
        begin(seed, {"EOS_Friends_QueryFriends", "EOS_UserInfo_QueryUserInfo", "EOS_Presence_QueryPresence",
                     "EOS_Connect_QueryExternalAccountMappings"});
        p.query_friends(closure("onFriends-1", "PA_v"));
        p.query_friends(closure("onFriends-2", "PA_v"));
        drain();
        return end();
    });
}

// ---- achievements and ownership -------------------------------------------------------------

TEST_F(OrderFuzz, AchievementsAndOwnership)
{
    sign_in();
    p.set_achievement(host::bytes("first_win"));
    tick(3);
    fuzz("achievements and ownership", [this](std::optional<uint32_t> seed) {
        begin(seed, {"EOS_Achievements_QueryPlayerAchievements", "EOS_Ecom_QueryOwnership"});
        p.query_achievements(closure("onAchievements-1", "PA_v"));
        p.query_ownership(host::bytes_array(std::vector<std::string>{"item_sword", "item_shield"}),
                          closure("onOwned-1", "PA_v"));
        p.query_achievements(closure("onAchievements-2", "PA_v"));
        p.query_ownership(host::bytes_array(std::vector<std::string>{}), closure("onOwned-2", "PA_v"));
        p.query_ownership(host::bytes_array(std::vector<std::string>{"nothing", "item_sword"}), closure("onOwned-3", "PA_v"));
        drain();
        return end();
    });
}

// ---- everything in flight at once -----------------------------------------------------------

TEST_F(OrderFuzz, EverythingAtOnce)
{
    sign_in();
    p.notify_invite_received(closure("onInvite", "PBB_v"));
    p.notify_invite_accepted(closure("onAccepted", "PBB_v"));
    fuzz("everything at once", [this](std::optional<uint32_t> seed) {
        begin(seed, {"EOS_Lobby_CreateLobby", "EOS_Lobby_JoinLobby", "EOS_Friends_QueryFriends",
                     "EOS_Presence_QueryPresence", "EOS_UserInfo_QueryUserInfo", "EOS_Ecom_QueryOwnership"});
        std::string joined = invitation("bob", "joined");
        std::string overlay = invitation("carol", "overlay");
        drain();  // the game hears of both invitations
        p.create_lobby(host::bytes("mine-key"), closure("onCreated", "PB_v"));
        p.accept_invite(host::bytes(joined), closure("onJoined", "PBB_v"));
        eos_sim::raise_invite_accepted(overlay);
        invitation("alice", "received");
        p.query_friends(closure("onFriends", "PA_v"));
        p.query_achievements(closure("onAchievements", "PA_v"));
        p.query_ownership(host::bytes_array(std::vector<std::string>{"item_sword"}), closure("onOwned", "PA_v"));
        p.show_friends();
        drain();
        if (std::optional<std::string> mine = answer("onCreated")) {
            names_[*mine] = "lobby-mine";
            p.destroy_lobby(host::bytes(*mine), closure("onDestroyed", "Pi_v"));
        }
        if (std::optional<std::string> lobby = answer("onJoined"))
            p.leave_lobby(host::bytes(*lobby), closure("onLeft", "Pi_v"));
        drain();
        return end();
    });
}

}  // namespace
