// The demo tour end to end: what the game receives at each step in the built-in world, in a large
// generated world, and the tarnwick-demo program itself (exit status, step names, speed).
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <eos_sim.h>
#include <hl_runtime_control.h>
#include <tour.h>

#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>

namespace {

namespace fs = std::filesystem;
using json = nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;

std::string read_text(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    std::stringstream s;
    s << in.rdbuf();
    return s.str();
}

class Demo : public testing::Test {
protected:
    void SetUp() override {
        char pattern[] = "/tmp/tarnwick-demo-test-XXXXXX";
        ASSERT_NE(mkdtemp(pattern), nullptr);
        dir_ = pattern;
        ASSERT_EQ(chdir(dir_.c_str()), 0);
        eos_sim::reset();
        hlrt::reset();
        ::unsetenv("EOS_SIM_WORLD");
    }
    void TearDown() override {
        (void)chdir("/");
        std::error_code ignored;
        fs::remove_all(dir_, ignored);
    }

    tour::Report play(tour::Options o = {}) {
        o.hdll = TARNWICK_HDLL_PATH;
        std::ostringstream out;
        tour::Report r = tour::run(o, out);
        output_ = out.str();
        return r;
    }

    // The library's own lines of egs.log (the SDK's, "[EGS] [level] [category] ...", left out).
    std::vector<std::string> library_lines() const {
        std::vector<std::string> out;
        std::istringstream in(read_text(fs::path(dir_) / "egs.log"));
        static const std::regex sdk(R"(^\[EGS\] \[-?[0-9]+\] \[)");
        for (std::string line; std::getline(in, line);)
            if (!std::regex_search(line, sdk)) out.push_back(line);
        return out;
    }

    struct Run {
        int status = -1;
        std::string out, err;
        double seconds = 0;
    };
    Run run_program(const std::string& args) {
        const auto start = std::chrono::steady_clock::now();
        const std::string cmd = std::string("'") + TARNWICK_DEMO_EXE + "' " + args + " >out.txt 2>err.txt";
        const int raw = std::system(cmd.c_str());
        Run r;
        r.seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
        r.status = WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
        r.out = read_text(fs::path(dir_) / "out.txt");
        r.err = read_text(fs::path(dir_) / "err.txt");
        return r;
    }

    std::string dir_, output_;
};

eos_sim::Account account_of(const std::string& name) {
    for (const auto& a : eos_sim::get_world().accounts)
        if (a.name == name) return a;
    ADD_FAILURE() << "no account " << name;
    return {};
}

TEST_F(Demo, TourInTheBuiltInWorldReceivesEverythingAGameShould) {
    const tour::Report r = play();
    ASSERT_EQ(r.failed_step, "") << output_;

    const auto player = account_of("player"), alice = account_of("alice"), bob = account_of("bob");
    EXPECT_EQ(r.login_result, 0);
    EXPECT_EQ(r.account, player.epic_id);
    EXPECT_EQ(r.display_name, std::optional<std::string>("Player"));
    EXPECT_TRUE(r.token.has_value());

    ASSERT_EQ(r.friends.size(), 3u);
    EXPECT_EQ(r.friends[0].epic_id, alice.epic_id);
    EXPECT_EQ(r.friends[0].name, std::optional<std::string>("Alice"));
    EXPECT_EQ(r.friends[0].online, std::optional<bool>(true));
    EXPECT_EQ(r.friends[0].product_id, alice.product_user_id);
    EXPECT_EQ(r.friends[1].online, std::optional<bool>(false)) << "bob plays another game";
    EXPECT_EQ(r.friends[1].product_id, bob.product_user_id);
    EXPECT_EQ(r.friends[2].name, std::nullopt) << "carol has no display name";
    EXPECT_EQ(r.friends[2].online, std::optional<bool>(false));
    EXPECT_EQ(r.friends[2].product_id, std::nullopt) << "carol never played: no product user";

    EXPECT_EQ(r.unlocked, "explorer");
    ASSERT_EQ(r.achievements.size(), 2u);
    EXPECT_FALSE(r.achievements[1].unlocked);
    ASSERT_EQ(r.achievements_after_unlock.size(), 2u);
    EXPECT_TRUE(r.achievements_after_unlock[0].unlocked);
    EXPECT_TRUE(r.achievements_after_unlock[1].unlocked);
    EXPECT_EQ(r.owned, (std::vector<std::string>{"base_game", "soundtrack"}));

    ASSERT_TRUE(r.lobby_id.has_value());
    EXPECT_EQ(r.invited, "alice");
    EXPECT_EQ(eos_sim::find_lobby(*r.lobby_id), std::nullopt) << "destroyed at the end";

    // alice's scripted invitation, then the lounge one, each with her name.
    ASSERT_EQ(r.invitations.size(), 2u);
    EXPECT_EQ(r.invitations[0].second, "Alice");
    EXPECT_EQ(r.invitations[1].second, "Alice");
    EXPECT_GE(r.invitation_ticks[0], *eos_sim::script_fired("alice-invites"));
    EXPECT_EQ(r.joined.connection_key, std::optional<std::string>("alice-host:7777"));
    EXPECT_EQ(r.overlay.lobby_id, std::optional<std::string>("alice-lounge"));
    EXPECT_EQ(r.overlay.connection_key, std::optional<std::string>("alice-lounge:7777"));
    EXPECT_EQ(r.overlay.tick, *eos_sim::script_fired("overlay-accept")) << "an overlay acceptance arrives on its tick";
    EXPECT_EQ(r.left, 0);
    EXPECT_EQ(r.destroyed, 0);
    EXPECT_LT(r.ticks, 40u);

    EXPECT_THAT(library_lines(),
                ElementsAre("[EGS] DEBUG BUILD", "[EGS] EGS Auth Login success", "[EGS] EGS Connect Login success",
                            "[EGS] Can't copy presence info : 18", "[EGS] on lobby joined : " + *r.joined.lobby_id,
                            "[EGS] call lobby joined callback", "[EGS] Accept to join the lobby alice-lounge"));
    const std::string log = read_text(fs::path(dir_) / "egs.log");
    EXPECT_THAT(log, HasSubstr("Script: \"alice-invites\": alice invites player"));
    EXPECT_THAT(log, HasSubstr("Script: alice accepts invitation"));
    EXPECT_THAT(output_, HasSubstr("[tick " + std::to_string(r.login_tick) +
                                   "] signed in: result 0 (EOS_Success), account " + player.epic_id.substr(0, 8)));
    EXPECT_EQ(eos_sim::outstanding_total(), 0);
    EXPECT_TRUE(eos_sim::faults().empty());
}

// 200 friends, 50 script events: every friend is listed and every invitation reaches the game.
TEST_F(Demo, TourInAGeneratedCrowdedWorld) {
    json doc = {{"local_account", "me"}};
    json friends = json::array();
    json accounts = json::array();
    for (int i = 0; i < 200; ++i) {
        const std::string name = "friend" + std::to_string(i);
        friends.push_back(name);
        json a = {{"name", name}, {"display_name", "Friend " + std::to_string(i)}, {"friends", {"me"}}};
        if (i % 3 == 0) a["presence"] = {{"status", "online"}, {"product", "@product"}};
        if (i == 7) a["accepts_invites_after"] = 1;
        accounts.push_back(a);
    }
    accounts[0]["presence"] = {{"status", "offline"}};   // the tour invites friend 3, the first in this game
    accounts[3]["accepts_invites_after"] = 1;
    accounts.push_back({{"name", "me"}, {"display_name", "Me"}, {"friends", friends}});
    doc["accounts"] = accounts;
    doc["lobbies"] = {{{"id", "big-room"}, {"owner", "friend1"}, {"attributes", {{{"key", "connection_key"}, {"value", "big"}}}}}};
    json script = json::array();
    script.push_back({{"name", "e0"}, {"after_sign_in", 2}, {"do", "invite"}, {"from", "friend10"}, {"connection_key", "k10"}});
    for (int i = 1; i < 47; ++i)   // a chain of invitations, one every tick
        script.push_back({{"name", "e" + std::to_string(i)}, {"after", "e" + std::to_string(i - 1)}, {"ticks", 1},
                          {"do", "invite"}, {"from", "friend" + std::to_string(10 + i)},
                          {"connection_key", "k" + std::to_string(10 + i)}});
    script.push_back({{"name", "room"}, {"after", "e46"}, {"ticks", 1}, {"do", "invite"}, {"from", "friend1"}, {"lobby", "big-room"}});
    script.push_back({{"after", "room"}, {"ticks", 3}, {"do", "overlay_accept_invite"}, {"invite", "room"}});
    script.push_back({{"at", 5}, {"do", "overlay_accept_join"}, {"lobby", "big-room"}});
    doc["script"] = script;
    ASSERT_EQ(doc["script"].size(), 50u);
    std::ofstream(fs::path(dir_) / "crowd.json") << doc.dump();

    tour::Options o;
    o.world_file = (fs::path(dir_) / "crowd.json").string();
    const tour::Report r = play(o);
    ASSERT_EQ(r.failed_step, "") << output_;
    ASSERT_EQ(r.friends.size(), 200u);
    for (int i = 0; i < 200; ++i) {
        EXPECT_EQ(r.friends[i].name, "Friend " + std::to_string(i));
        EXPECT_EQ(r.friends[i].online, std::optional<bool>(i % 3 == 0 && i != 0));
    }
    EXPECT_EQ(r.invited, "friend3");
    ASSERT_EQ(r.invitations.size(), 48u);
    for (int i = 0; i < 47; ++i) EXPECT_EQ(r.invitations[i].second, "Friend " + std::to_string(10 + i));
    EXPECT_EQ(r.joined.connection_key, std::optional<std::string>("k10"));
    EXPECT_EQ(r.overlay.connection_key, std::optional<std::string>("big"));
    EXPECT_THAT(library_lines(), testing::Contains("[EGS] On join lobby accepted"));
    EXPECT_EQ(eos_sim::outstanding_total(), 0);
    EXPECT_TRUE(eos_sim::faults().empty());
}

TEST_F(Demo, ProgramRunsQuicklyAndNamesTheStepThatDoesNotHappen) {
    const Run ok = run_program("");
    EXPECT_EQ(ok.status, 0) << ok.out << ok.err;
    EXPECT_THAT(ok.out, HasSubstr("] signed in: result 0 (EOS_Success)"));
    EXPECT_THAT(ok.out, HasSubstr("invitation accepted in the overlay: lobby alice-lounge"));
    EXPECT_THAT(ok.out, HasSubstr("tour complete"));
    EXPECT_LT(ok.seconds, 1.0);
    EXPECT_TRUE(fs::exists(fs::path(dir_) / "egs.log"));

    // Nobody accepts invitations in this world: the tour stops at that step.
    json world = eos_sim::world_to_json(eos_sim::default_world());
    world["accounts"][1].erase("accepts_invites_after");
    std::ofstream(fs::path(dir_) / "lonely.json") << world.dump();
    const Run lonely = run_program("--world lonely.json --max-ticks 15");
    EXPECT_EQ(lonely.status, 1);
    EXPECT_THAT(lonely.err, HasSubstr("step \"friend joins the lobby\" did not happen"));

    std::ofstream(fs::path(dir_) / "bad.json") << R"({"local_account": "me", "accounts": [{"name": "me", "friends": ["zed"]}]})";
    const Run bad = run_program("--world bad.json");
    EXPECT_EQ(bad.status, 1);
    EXPECT_THAT(bad.err, HasSubstr("bad.json: /accounts/0/friends/0: \"zed\" is not an account"));
    EXPECT_THAT(bad.err, HasSubstr("step \"start\""));

    EXPECT_EQ(run_program("--max-ticks zero").status, 2);
}

}  // namespace
