// World files: reading (and refusing) them, loading one at EOS_Initialize, and the script's
// events firing on the ticks the file gives them. Drives the simulator directly.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <eos_sim.h>

#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <functional>
#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>

namespace {

namespace fs = std::filesystem;
using eos_sim::ScriptEvent;
using json = nlohmann::json;
using R = EOS_EResult;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::StartsWith;

const fs::path kRepo = fs::path(__FILE__).parent_path().parent_path();

std::string read_text(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    std::stringstream s;
    s << in.rdbuf();
    return s.str();
}

class WorldFile : public testing::Test {
protected:
    void SetUp() override {
        eos_sim::reset();
        dir_ = fs::temp_directory_path() / ("tarnwick-world-" + std::to_string(::getpid()));
        fs::create_directories(dir_);
    }
    void TearDown() override {
        if (platform_) EOS_Platform_Release(platform_);
        if (eos_sim::initialized()) EOS_Shutdown();
        std::error_code ignored;
        fs::remove_all(dir_, ignored);
    }

    std::string write(const std::string& name, const std::string& text) {
        const fs::path p = dir_ / name;
        std::ofstream(p, std::ios::binary) << text;
        return p.string();
    }
    std::string write(const std::string& name, const json& doc) { return write(name, doc.dump(2)); }

    // The message load_world_file throws for this document, or "" when it loads.
    std::string refusal(const json& doc) {
        try {
            eos_sim::load_world_file(write("bad.json", doc));
        } catch (const std::runtime_error& e) {
            return e.what();
        }
        return "";
    }

    EOS_EResult initialize() {
        EOS_InitializeOptions o{};
        o.ApiVersion = EOS_INITIALIZE_API_LATEST;
        o.ProductName = "world tests";
        o.ProductVersion = "1.0";
        return EOS_Initialize(&o);
    }
    void start_platform() {
        EOS_Platform_Options o{};
        o.ApiVersion = EOS_PLATFORM_OPTIONS_API_LATEST;
        o.ProductId = "world-product";
        o.SandboxId = "sandbox";
        platform_ = EOS_Platform_Create(&o);
        ASSERT_NE(platform_, nullptr);
    }
    void tick() { EOS_Platform_Tick(platform_); }
    void tick_to(uint64_t n) {
        while (eos_sim::ticks() < n) tick();
    }

    fs::path dir_;
    EOS_HPlatform platform_ = nullptr;
};

// A small valid world that the refusal cases below break one thing at a time.
json base_world() {
    return json::parse(R"({
      "local_account": "me",
      "accounts": [
        {"name": "me", "display_name": "Me", "friends": ["alice"]},
        {"name": "alice", "display_name": "Alice", "friends": ["me"]}
      ],
      "lobbies": [{"id": "alice-room", "owner": "alice", "attributes": [{"key": "connection_key", "value": "k"}]}],
      "script": [{"name": "first", "at": 3, "do": "invite", "from": "alice", "lobby": "alice-room"}]
    })");
}

// ---- reading --------------------------------------------------------------------------------

TEST_F(WorldFile, ShippedDefaultWorldFileIsTheBuiltInWorld) {
    const eos_sim::World loaded = eos_sim::load_world_file((kRepo / "examples" / "default-world.json").string());
    EXPECT_EQ(eos_sim::world_to_json(loaded), eos_sim::world_to_json(eos_sim::default_world()));
    // The written form reads back unchanged.
    const json written = eos_sim::world_to_json(eos_sim::default_world());
    EXPECT_EQ(eos_sim::world_to_json(eos_sim::parse_world(written, "written")), written);
}

TEST_F(WorldFile, DocumentedCompleteExampleLoads) {
    const std::string doc = read_text(kRepo / "docs" / "worlds.md");
    std::smatch m;
    ASSERT_TRUE(std::regex_search(doc, m, std::regex("```json\\n([\\s\\S]*?)```")));
    const eos_sim::World w = eos_sim::parse_world(json::parse(m[1].str()), "docs/worlds.md");
    ASSERT_EQ(w.accounts.size(), 5u);
    EXPECT_EQ(w.script.size(), 8u);
}

TEST_F(WorldFile, EveryKindOfFieldIsRead) {
    json doc = base_world();
    doc["accounts"][0] = json::parse(R"({
      "name": "me", "display_name": null, "epic_id": "0123456789abcdef0123456789abcdef",
      "product_user_id": null, "credential": "me-token",
      "friends": ["alice", {"account": "alice", "invalid": true}],
      "presence": {"status": "extended_away", "product": "@product"},
      "achievements": [{"id": "a"}, {"id": "b", "unlock_time": 0}, {"id": "c", "unlock_time": null}],
      "ownership": {"x": true, "y": false},
      "accepts_invites_after": 4
    })");
    doc["lobbies"][0]["attributes"] = json::parse(R"([
      {"key": "s", "value": "text"}, {"key": "i", "value": -7}, {"key": "d", "value": 2.5},
      {"key": "d2", "value": 3, "type": "double"}, {"key": "b", "value": true, "visibility": "private"}
    ])");
    doc["script"] = json::parse(R"([
      {"name": "inv", "after_sign_in": 2, "do": "invite", "from": "alice", "connection_key": "new-room"},
      {"after": "inv", "do": "overlay_accept_invite", "invite": "inv"},
      {"at": 9, "do": "overlay_accept_join", "lobby": "alice-room"},
      {"at": 0, "do": "fail", "function": "EOS_Auth_Login", "code": "EOS_NoConnection", "times": "always"},
      {"after": "inv", "ticks": 6, "do": "fail", "function": "EOS_Lobby_JoinLobby", "code": 18, "times": 2},
      {"at": 4, "do": "accept_invitation", "account": "alice"}
    ])");
    const eos_sim::World w = eos_sim::parse_world(doc, "all.json");
    const eos_sim::Account& me = w.accounts[0];
    EXPECT_FALSE(me.display_name.has_value());
    EXPECT_FALSE(me.has_connect_user) << "a null product user id means no Connect user yet";
    EXPECT_EQ(me.credential, "me-token");
    ASSERT_EQ(me.friends.size(), 2u);
    EXPECT_TRUE(me.friends[1].invalid);
    EXPECT_EQ(me.presence->status, EOS_Presence_EStatus::EOS_PS_ExtendedAway);
    EXPECT_EQ(me.presence->product_id, std::optional<std::string>(eos_sim::kThisProduct));
    EXPECT_EQ(me.achievements[0].unlock_time, -1);
    EXPECT_EQ(me.achievements[1].unlock_time, 0);
    EXPECT_EQ(me.achievements[2].unlock_time, -1);
    EXPECT_EQ(me.ownership.at("y"), EOS_EOwnershipStatus::EOS_OS_NotOwned);
    EXPECT_EQ(me.accepts_invites_after, std::optional<int>(4));

    const auto& attrs = w.lobbies[0].attributes;
    ASSERT_EQ(attrs.size(), 5u);
    EXPECT_EQ(attrs[0].type, EOS_EAttributeType::EOS_AT_STRING);
    EXPECT_EQ(attrs[1].type, EOS_EAttributeType::EOS_AT_INT64);
    EXPECT_EQ(attrs[1].as_int64, -7);
    EXPECT_EQ(attrs[2].type, EOS_EAttributeType::EOS_AT_DOUBLE);
    EXPECT_EQ(attrs[3].type, EOS_EAttributeType::EOS_AT_DOUBLE);
    EXPECT_EQ(attrs[3].as_double, 3.0);
    EXPECT_EQ(attrs[4].type, EOS_EAttributeType::EOS_AT_BOOLEAN);
    EXPECT_EQ(attrs[4].visibility, EOS_ELobbyAttributeVisibility::EOS_LAT_PRIVATE);

    ASSERT_EQ(w.script.size(), 6u);
    EXPECT_EQ(w.script[0].when, ScriptEvent::When::AfterSignIn);
    EXPECT_EQ(w.script[0].connection_key, "new-room");
    EXPECT_EQ(w.script[1].when, ScriptEvent::When::AfterEvent);
    EXPECT_EQ(w.script[1].ticks, 0u);
    EXPECT_EQ(w.script[3].times, -1);
    EXPECT_EQ(w.script[3].code, R::EOS_NoConnection);
    EXPECT_EQ(w.script[4].code, R::EOS_NotFound);
    EXPECT_EQ(w.script[4].times, 2);
    // Everything survives writing and reading again.
    EXPECT_EQ(eos_sim::world_to_json(eos_sim::parse_world(eos_sim::world_to_json(w), "again")), eos_sim::world_to_json(w));
}

TEST_F(WorldFile, EachMistakeIsNamedWithTheFileThePlaceAndTheReason) {
    const std::string file = (dir_ / "bad.json").string();
    struct Case {
        std::function<void(json&)> spoil;
        std::string where, reason;
    };
    const std::vector<Case> cases = {
        {[](json& d) { d["accounts"][0]["frends"] = json::array(); }, "/accounts/0/frends", "unknown key \"frends\""},
        {[](json& d) { d["extra"] = 1; }, "/extra", "unknown key \"extra\""},
        {[](json& d) { d["accounts"][1]["display_name"] = 5; }, "/accounts/1/display_name",
         "expected a string, got number"},
        {[](json& d) { d["accounts"][0]["friends"] = "alice"; }, "/accounts/0/friends", "expected an array, got string"},
        {[](json& d) { d["accounts"][1]["friends"][0] = "zed"; }, "/accounts/1/friends/0", "\"zed\" is not an account"},
        {[](json& d) { d["lobbies"][0]["members"] = {"me", "zed"}; }, "/lobbies/0/members/1", "\"zed\" is not an account"},
        {[](json& d) { d["lobbies"][0]["owner"] = "zed"; }, "/lobbies/0/owner", "\"zed\" is not an account"},
        {[](json& d) { d["script"].push_back({{"after", "nope"}, {"do", "overlay_accept_invite"}, {"invite", "first"}}); },
         "/script/1/after", "\"nope\" is not an event name"},
        {[](json& d) { d["script"].push_back({{"at", 5}, {"do", "overlay_accept_invite"}, {"invite", "nope"}}); },
         "/script/1/invite", "\"nope\" is not an event name"},
        {[](json& d) { d["script"][0]["from"] = "zed"; }, "/script/0/from", "\"zed\" is not an account"},
        {[](json& d) { d["script"][0]["lobby"] = "no-such-room"; }, "/script/0/lobby",
         "\"no-such-room\" is not a lobby of this world"},
        {[](json& d) { d["script"][0]["from"] = "me"; }, "/script/0/from", "\"me\" is not a member of lobby"},
        {[](json& d) { d["script"].push_back({{"at", 5}, {"do", "overlay_accept_invite"}, {"invite", "x"}, {"name", "x"}}); },
         "/script/1/invite", "\"x\" is not an invite event"},
        {[](json& d) {
             d["script"][0].erase("at");
             d["script"][0]["after"] = "second";
             d["script"].push_back({{"name", "second"}, {"after", "first"}, {"do", "accept_invitation"}, {"account", "alice"}});
         },
         "/script/0/after", "the events wait for each other in a circle"},
        {[](json& d) { d["script"][0]["connection_key"] = "k"; }, "/script/0", "an invite needs either"},
        {[](json& d) { d["script"][0]["after_sign_in"] = 2; }, "/script/0", "needs exactly one of"},
        {[](json& d) { d["script"][0]["at"] = 0; }, "/script/0/at", "only a \"fail\" event can happen at tick 0"},
        {[](json& d) { d["script"].push_back({{"at", 1}, {"do", "fail"}, {"function", "EOS_X"}, {"code", "EOS_Nope"}}); },
         "/script/1/code", "unknown result \"EOS_Nope\""},
        {[](json& d) { d["script"].push_back({{"at", 1}, {"do", "explode"}}); }, "/script/1/do", "unknown value \"explode\""},
        {[](json& d) { d["accounts"][1]["name"] = "me"; }, "/accounts/1/name", "account \"me\" is defined twice"},
        {[](json& d) { d["accounts"][0]["epic_id"] = "XYZ"; }, "/accounts/0/epic_id", "expected 32 lowercase hexadecimal"},
        {[](json& d) { d["local_account"] = "nobody"; }, "/local_account", "\"nobody\" is not an account"},
        {[](json& d) { d["lobbies"][0]["attributes"][0]["type"] = "int64"; }, "/lobbies/0/attributes/0/value",
         "expected an integer, got string"},
        {[](json& d) { d["lobbies"][0]["max_members"] = 1; d["lobbies"][0]["members"] = {"me"}; }, "/lobbies/0/members",
         "2 members, more than max_members (1)"},
    };
    for (size_t i = 0; i < cases.size(); ++i) {
        json doc = base_world();
        cases[i].spoil(doc);
        EXPECT_THAT(refusal(doc), StartsWith(file + ": " + cases[i].where + ": " + cases[i].reason)) << "case " << i;
    }
    EXPECT_EQ(refusal(base_world()), "") << "the unspoilt world loads";

    write("broken.json", std::string("{\n  \"accounts\": [\n}"));
    try {
        eos_sim::load_world_file((dir_ / "broken.json").string());
        ADD_FAILURE() << "malformed JSON loaded";
    } catch (const std::runtime_error& e) {
        EXPECT_THAT(e.what(), StartsWith((dir_ / "broken.json").string() + ": not valid JSON: parse error at line 3"));
    }
    EXPECT_THROW(eos_sim::load_world_file((dir_ / "missing.json").string()), std::runtime_error);
}

// ---- loading at EOS_Initialize --------------------------------------------------------------

TEST_F(WorldFile, ARefusedFileFailsInitializeAndLeavesTheWorldAlone) {
    eos_sim::World before = eos_sim::default_world();
    before.accounts[0].display_name = "Before";
    eos_sim::set_world(before);
    const json expected = eos_sim::world_to_json(eos_sim::get_world());
    json doc = base_world();
    doc["lobbies"][0]["members"] = {"ghost"};
    eos_sim::set_world_file(write("bad.json", doc));

    testing::internal::CaptureStderr();
    EXPECT_EQ(initialize(), R::EOS_InvalidParameters);
    const std::string err = testing::internal::GetCapturedStderr();
    EXPECT_THAT(err, HasSubstr("bad.json: /lobbies/0/members/0: \"ghost\" is not an account"));
    EXPECT_FALSE(eos_sim::initialized());
    EXPECT_EQ(eos_sim::world_to_json(eos_sim::get_world()), expected) << "nothing of the refused file is loaded";

    eos_sim::set_world_file(write("good.json", base_world()));
    ASSERT_EQ(initialize(), R::EOS_Success);
    EXPECT_EQ(eos_sim::get_world().local_account, "me");
    EXPECT_EQ(eos_sim::find_lobby("alice-room")->owner, "alice");
}

TEST_F(WorldFile, InitializeReadsTheEnvironmentVariableAndOtherwiseKeepsTheWorld) {
    eos_sim::World mine;
    mine.accounts.resize(1);
    mine.accounts[0].name = "solo";
    mine.local_account = "solo";
    eos_sim::set_world(mine);
    ::unsetenv("EOS_SIM_WORLD");
    ASSERT_EQ(initialize(), R::EOS_Success);
    EXPECT_EQ(eos_sim::get_world().local_account, "solo") << "no file: the world set by the caller stays";
    EOS_Shutdown();

    eos_sim::reset();
    ::setenv("EOS_SIM_WORLD", write("env.json", base_world()).c_str(), 1);
    ASSERT_EQ(initialize(), R::EOS_Success);
    ::unsetenv("EOS_SIM_WORLD");
    EXPECT_EQ(eos_sim::get_world().local_account, "me");
    EXPECT_TRUE(eos_sim::find_lobby("alice-room").has_value());
}

// ---- the script -----------------------------------------------------------------------------

struct Seen {
    std::vector<uint64_t> received, accepted, join_accepted;
    std::vector<std::string> invite_ids;
};

void EOS_CALL on_received(const EOS_Lobby_LobbyInviteReceivedCallbackInfo* info) {
    auto* seen = static_cast<Seen*>(info->ClientData);
    seen->received.push_back(eos_sim::ticks());
    seen->invite_ids.push_back(info->InviteId);
}
void EOS_CALL on_accepted(const EOS_Lobby_LobbyInviteAcceptedCallbackInfo* info) {
    static_cast<Seen*>(info->ClientData)->accepted.push_back(eos_sim::ticks());
}
void EOS_CALL on_join_accepted(const EOS_Lobby_JoinLobbyAcceptedCallbackInfo* info) {
    static_cast<Seen*>(info->ClientData)->join_accepted.push_back(eos_sim::ticks());
}
void EOS_CALL on_sent(const EOS_Lobby_SendInviteCallbackInfo*) {}
void EOS_CALL on_created(const EOS_Lobby_CreateLobbyCallbackInfo* info) {
    static_cast<std::vector<R>*>(info->ClientData)->push_back(info->ResultCode);
}

class Script : public WorldFile {
protected:
    void load(const json& doc) {
        eos_sim::set_world_file(write("script.json", doc));
        ASSERT_EQ(initialize(), R::EOS_Success);
        start_platform();
        EOS_HLobby lobby = EOS_Platform_GetLobbyInterface(platform_);
        EOS_Lobby_AddNotifyLobbyInviteReceivedOptions r{EOS_LOBBY_ADDNOTIFYLOBBYINVITERECEIVED_API_LATEST};
        EOS_Lobby_AddNotifyLobbyInviteAcceptedOptions a{EOS_LOBBY_ADDNOTIFYLOBBYINVITEACCEPTED_API_LATEST};
        EOS_Lobby_AddNotifyJoinLobbyAcceptedOptions j{EOS_LOBBY_ADDNOTIFYJOINLOBBYACCEPTED_API_LATEST};
        EOS_Lobby_AddNotifyLobbyInviteReceived(lobby, &r, &seen_, on_received);
        EOS_Lobby_AddNotifyLobbyInviteAccepted(lobby, &a, &seen_, on_accepted);
        EOS_Lobby_AddNotifyJoinLobbyAccepted(lobby, &j, &seen_, on_join_accepted);
    }
    void send_invite(const std::string& lobby_id, const std::string& to) {
        EOS_Lobby_SendInviteOptions o{EOS_LOBBY_SENDINVITE_API_LATEST, lobby_id.c_str(), eos_sim::product_user_id("me"),
                                      eos_sim::product_user_id(to)};
        EOS_Lobby_SendInvite(EOS_Platform_GetLobbyInterface(platform_), &o, nullptr, on_sent);
    }
    bool member(const std::string& lobby_id, const std::string& account) {
        auto l = eos_sim::find_lobby(lobby_id);
        return l && std::find(l->members.begin(), l->members.end(), account) != l->members.end();
    }
    Seen seen_;
};

TEST_F(Script, TimedEventsFireOnTheirTicksAndReachTheGameInThatTick) {
    json doc = base_world();
    doc["script"] = json::parse(R"([
      {"name": "first", "at": 3, "do": "invite", "from": "alice", "lobby": "alice-room"},
      {"name": "same-tick", "after": "first", "do": "invite", "from": "alice", "connection_key": "fresh"},
      {"name": "overlay", "after": "first", "ticks": 2, "do": "overlay_accept_invite", "invite": "first"},
      {"name": "signed", "after_sign_in": 3, "do": "overlay_accept_join", "lobby": "alice-room"}
    ])");
    load(doc);
    tick_to(4);
    eos_sim::sign_in("me");   // between ticks 4 and 5: the script counts it as tick 4
    tick_to(9);

    EXPECT_THAT(seen_.received, ElementsAre(3u, 3u));
    EXPECT_THAT(seen_.accepted, ElementsAre(5u));
    EXPECT_THAT(seen_.join_accepted, ElementsAre(7u));
    EXPECT_EQ(eos_sim::script_fired("first"), std::optional<uint64_t>(3));
    EXPECT_EQ(eos_sim::script_fired("same-tick"), std::optional<uint64_t>(3));
    EXPECT_EQ(eos_sim::script_fired("signed"), std::optional<uint64_t>(7));
    // The second invitation came with a new lobby of alice's publishing its key.
    const auto world = eos_sim::get_world();
    ASSERT_EQ(world.invitations.size(), 2u);
    const auto fresh = eos_sim::find_lobby(world.invitations[1].lobby_id);
    ASSERT_TRUE(fresh.has_value());
    EXPECT_EQ(fresh->owner, "alice");
    EXPECT_EQ(fresh->attributes[0].key, "connection_key");
    EXPECT_EQ(fresh->attributes[0].as_utf8, "fresh");
    EXPECT_TRUE(eos_sim::faults().empty());
}

TEST_F(Script, AccountsAcceptTheLocalPlayersInvitationsByRuleOrByEvent) {
    json doc = base_world();
    doc["accounts"][1]["accepts_invites_after"] = 2;
    doc["accounts"].push_back({{"name", "bob"}});
    doc["lobbies"].push_back({{"id", "my-room"}, {"owner", "me"}});
    doc["script"] = json::parse(R"([{"at": 7, "do": "accept_invitation", "account": "bob"}])");
    load(doc);
    eos_sim::sign_in("me");
    tick_to(2);
    send_invite("my-room", "alice");   // completes in tick 3
    send_invite("my-room", "bob");
    tick_to(4);
    EXPECT_FALSE(member("my-room", "alice"));
    tick_to(5);
    EXPECT_TRUE(member("my-room", "alice")) << "two ticks after the tick that sent the invitation";
    tick_to(6);
    EXPECT_FALSE(member("my-room", "bob")) << "bob has no standing rule";
    tick_to(7);
    EXPECT_TRUE(member("my-room", "bob"));
    EXPECT_TRUE(eos_sim::get_world().invitations.empty());
}

TEST_F(Script, FailuresAreInjectedWhenTheyFireAndAtLoadForTickZero) {
    json doc = base_world();
    doc["script"] = json::parse(R"([
      {"at": 0, "do": "fail", "function": "EOS_Lobby_CreateLobby", "code": "EOS_TimedOut"},
      {"at": 3, "do": "fail", "function": "EOS_Lobby_CreateLobby", "code": 22, "times": 1}
    ])");
    load(doc);
    eos_sim::sign_in("me");
    std::vector<R> results;
    EOS_Lobby_CreateLobbyOptions o{};
    o.ApiVersion = EOS_LOBBY_CREATELOBBY_API_LATEST;
    o.LocalUserId = eos_sim::product_user_id("me");
    o.MaxLobbyMembers = 4;
    o.PermissionLevel = EOS_ELobbyPermissionLevel::EOS_LPL_INVITEONLY;
    EOS_HLobby lobby = EOS_Platform_GetLobbyInterface(platform_);
    EOS_Lobby_CreateLobby(lobby, &o, &results, on_created);   // before the first tick
    tick_to(3);
    EOS_Lobby_CreateLobby(lobby, &o, &results, on_created);
    EOS_Lobby_CreateLobby(lobby, &o, &results, on_created);
    tick_to(4);
    EXPECT_THAT(results, ElementsAre(R::EOS_TimedOut, R::EOS_LimitExceeded, R::EOS_Success));
}

TEST_F(Script, TheBuiltInWorldInvitesThePlayerAfterSignIn) {
    ASSERT_EQ(initialize(), R::EOS_Success);
    start_platform();
    EOS_Lobby_AddNotifyLobbyInviteReceivedOptions r{EOS_LOBBY_ADDNOTIFYLOBBYINVITERECEIVED_API_LATEST};
    EOS_Lobby_AddNotifyLobbyInviteReceived(EOS_Platform_GetLobbyInterface(platform_), &r, &seen_, on_received);
    tick_to(10);
    EXPECT_TRUE(seen_.received.empty()) << "nobody invites a player who has not signed in";
    eos_sim::sign_in("player");
    tick_to(30);
    EXPECT_THAT(seen_.received, ElementsAre(14u, 22u));
    EXPECT_EQ(eos_sim::script_fired("overlay-accept"), std::optional<uint64_t>(25));
}

}  // namespace
