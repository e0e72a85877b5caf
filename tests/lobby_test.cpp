// Lobby lifecycle: creation and the published connection key, leaving and
// destroying, and two players meeting in one lobby.
#include "lobby_flows.h"

using namespace tw;
using nlohmann::json;

class Lobby : public LobbyFlowTest {
protected:
    // What onCreated saw at its call: the lobby updates and modification
    // releases requested by then.
    struct AtCreated {
        size_t updates = 0;
        size_t releases = 0;
    };

    host::ClosureRef created_closure(AtCreated *seen)
    {
        host::ClosureBehaviour b;
        b.on_call = [seen](const host::Call &) {
            seen->updates = eos_sim::calls("EOS_Lobby_UpdateLobby").size();
            seen->releases = eos_sim::calls("EOS_LobbyModification_Release").size();
        };
        return host::make_closure("PB_v", b);
    }

    // Creates a lobby with `key` and waits until its attribute update has
    // completed; returns the id the game received.
    std::string create_and_publish(const std::optional<std::string> &key)
    {
        host::ClosureRef onCreated = host::make_closure("PB_v");
        p.create_lobby(host::bytes_or_null(key), onCreated->vm);
        EXPECT_TRUE(settle([&] {
            auto updates = eos_sim::calls("EOS_Lobby_UpdateLobby");
            return onCreated->count() > 0 && !updates.empty() && !updates.back().deliveries.empty();
        }));
        EXPECT_EQ(onCreated->count(), 1u);
        if (onCreated->count() == 0)
            return {};
        return arg_bytes(onCreated->last(), 0).value_or("");
    }

    // The connection_key the lobby holds, as the service keeps it.
    static std::optional<std::string> published_key(const std::string &lobby_id)
    {
        std::optional<eos_sim::Lobby> lobby = eos_sim::find_lobby(lobby_id);
        if (!lobby)
            return std::nullopt;
        const eos_sim::Attribute *a = find_attribute(*lobby, "connection_key");
        if (!a)
            return std::nullopt;
        EXPECT_EQ(a->type, EOS_EAttributeType::EOS_AT_STRING);
        EXPECT_EQ(a->visibility, EOS_ELobbyAttributeVisibility::EOS_LAT_PUBLIC);
        return a->as_utf8;
    }
};

TEST_F(Lobby, CreationPublishesTheKeyBeforeTellingTheGame)
{
    size_t from = mark();
    AtCreated seen;
    host::ClosureRef onCreated = created_closure(&seen);
    p.create_lobby(host::bytes("host:7777"), onCreated->vm);
    EXPECT_EQ(hlrt::root_count(), 1u);

    auto creates = eos_sim::calls("EOS_Lobby_CreateLobby");
    ASSERT_EQ(creates.size(), 1u);
    EXPECT_EQ(creates[0].options, (json{{"ApiVersion", 9},
                                        {"LocalUserId", puid("me")},
                                        {"MaxLobbyMembers", 10},
                                        {"PermissionLevel", 2},
                                        {"bPresenceEnabled", 1},
                                        // Members may invite: the lobby is invite-only.
                                        {"bAllowInvites", 1},
                                        {"BucketId", nullptr},
                                        {"bDisableHostMigration", 0},
                                        {"bEnableRTCRoom", 0},
                                        {"LocalRTCOptions", false},
                                        {"LobbyId", nullptr},
                                        {"bEnableJoinById", 0},
                                        {"bRejoinAfterKickRequiresInvite", 0},
                                        {"AllowedPlatformIds", nullptr},
                                        {"AllowedPlatformIdsCount", 0},
                                        {"bCrossplayOptOut", 0}}));

    ASSERT_TRUE(settle([&] { return onCreated->count() > 0; }));
    ASSERT_EQ(onCreated->count(), 1u);
    const host::Call &call = onCreated->last();
    ASSERT_EQ(call.args.size(), 1u);
    std::optional<std::string> id = arg_bytes(call, 0);
    ASSERT_TRUE(id.has_value());
    EXPECT_EQ(*id, eos_sim::calls("EOS_Lobby_CreateLobby")[0].output.value("LobbyId", std::string()));
    EXPECT_EQ(call.args[0].bytes_size, static_cast<long>(id->size() + 1));
    // The update carrying the key was requested, and its modification
    // released, before the game heard of the lobby.
    EXPECT_EQ(seen.updates, 1u);
    EXPECT_EQ(seen.releases, 1u);

    EXPECT_EQ(call_order({"EOS_Lobby_UpdateLobbyModification", "EOS_LobbyModification_AddAttribute",
                          "EOS_Lobby_UpdateLobby", "EOS_LobbyModification_Release"}),
              (std::vector<std::string>{"EOS_Lobby_UpdateLobbyModification", "EOS_LobbyModification_AddAttribute",
                                        "EOS_Lobby_UpdateLobby", "EOS_LobbyModification_Release"}));
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_UpdateLobbyModification")[0].options,
              (json{{"ApiVersion", 1}, {"LocalUserId", puid("me")}, {"LobbyId", *id}}));
    EXPECT_EQ(eos_sim::calls("EOS_LobbyModification_AddAttribute")[0].options,
              (json{{"ApiVersion", 2},
                    {"Visibility", 0},
                    {"Attribute", {{"ApiVersion", 1}, {"Key", "connection_key"}, {"ValueType", 3}, {"Value", "host:7777"}}}}));
    eos_sim::Call update = eos_sim::calls("EOS_Lobby_UpdateLobby")[0];
    EXPECT_EQ(update.options["ApiVersion"], 1);
    EXPECT_EQ(update.options["LobbyModificationHandle"]["LobbyId"], *id);
    EXPECT_EQ(update.client_data, nullptr);

    ASSERT_TRUE(settle([] { return !eos_sim::calls("EOS_Lobby_UpdateLobby")[0].deliveries.empty(); }));
    std::optional<eos_sim::Lobby> lobby = eos_sim::find_lobby(*id);
    ASSERT_TRUE(lobby.has_value());
    EXPECT_EQ(lobby->owner, "me");
    EXPECT_EQ(lobby->max_members, 10u);
    EXPECT_EQ(lobby->permission, EOS_ELobbyPermissionLevel::EOS_LPL_INVITEONLY);
    EXPECT_TRUE(lobby->presence_enabled);
    EXPECT_EQ(published_key(*id), std::optional<std::string>("host:7777"));
    EXPECT_EQ(lines_since(from), std::vector<std::string>{});
    EXPECT_EQ(onCreated->count(), 1u);
    expect_clean();
}

struct KeyCase {
    const char *name;
    std::string given;
    std::string published;
};

void PrintTo(const KeyCase &c, std::ostream *os) { *os << c.name; }

class LobbyKey : public Lobby, public ::testing::WithParamInterface<KeyCase> {};

TEST_P(LobbyKey, IsPublishedAsItsFirst255Bytes)
{
    const KeyCase &c = GetParam();
    std::string id = create_and_publish(c.given);
    ASSERT_FALSE(id.empty());
    auto adds = eos_sim::calls("EOS_LobbyModification_AddAttribute");
    ASSERT_EQ(adds.size(), 1u);
    EXPECT_TRUE(adds[0].options["Attribute"]["Value"].get<std::string>() == c.published);
    std::optional<std::string> key = published_key(id);
    ASSERT_TRUE(key.has_value());
    EXPECT_EQ(key->size(), c.published.size());
    EXPECT_TRUE(*key == c.published);
    expect_clean();
}

INSTANTIATE_TEST_SUITE_P(
    Lengths, LobbyKey,
    ::testing::Values(KeyCase{"Long", patterned(300), patterned(255)}, KeyCase{"Exactly255", patterned(255), patterned(255)},
                      KeyCase{"Just256", patterned(256), patterned(255)}, KeyCase{"Empty", "", ""},
                      // The cut counts bytes: a two-byte character across the
                      // limit loses its second byte.
                      KeyCase{"CutInsideACharacter", patterned(254) + "\xc3\xa9xyz", patterned(254) + "\xc3"}),
    [](const ::testing::TestParamInfo<KeyCase> &info) { return std::string(info.param.name); });

TEST_F(Lobby, ANullKeyPublishesAnEmptyOneAndSaysSo)
{
    size_t from = mark();
    std::string id = create_and_publish(std::nullopt);
    ASSERT_FALSE(id.empty());
    EXPECT_EQ(published_key(id), std::optional<std::string>(""));
    EXPECT_EQ(lines_since(from),
              std::vector<std::string>{"[EGS] No connection key given, the lobby publishes an empty one"});
    expect_clean();
}

TEST_F(Lobby, AFailedCreationIsLoggedAndTheGameGetsNull)
{
    size_t from = mark();
    eos_sim::inject("EOS_Lobby_CreateLobby", eos_sim::Failure::once(EOS_EResult::EOS_LimitExceeded));
    host::ClosureRef onCreated = host::make_closure("PB_v");
    p.create_lobby(host::bytes("key"), onCreated->vm);
    ASSERT_TRUE(settle([&] { return onCreated->count() > 0; }));
    ASSERT_EQ(onCreated->count(), 1u);
    ASSERT_EQ(onCreated->last().args.size(), 1u);
    EXPECT_EQ(onCreated->last().args[0].ptr, nullptr);
    EXPECT_EQ(lines_since(from),
              std::vector<std::string>{"[EGS] Failed to create lobby : " + std::to_string(code(EOS_EResult::EOS_LimitExceeded))});
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_UpdateLobbyModification").empty());
    EXPECT_TRUE(eos_sim::calls("EOS_LobbyModification_AddAttribute").empty());
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_UpdateLobby").empty());
    EXPECT_TRUE(eos_sim::get_world().lobbies.empty());
    expect_clean();
}

TEST_F(Lobby, ARetriedCreationWaitsForItsFinalResult)
{
    eos_sim::inject("EOS_Lobby_CreateLobby", eos_sim::Failure::retry());
    host::ClosureRef onCreated = host::make_closure("PB_v");
    p.create_lobby(host::bytes("key"), onCreated->vm);
    ASSERT_TRUE(settle([&] { return onCreated->count() > 0; }));
    EXPECT_EQ(onCreated->count(), 1u);
    auto creates = eos_sim::calls("EOS_Lobby_CreateLobby");
    ASSERT_EQ(creates[0].deliveries.size(), 2u);
    std::optional<std::string> id = arg_bytes(onCreated->last(), 0);
    ASSERT_TRUE(id.has_value());
    ASSERT_TRUE(settle([] { return !eos_sim::calls("EOS_Lobby_UpdateLobby").empty(); }));
    EXPECT_EQ(eos_sim::calls("EOS_LobbyModification_AddAttribute").size(), 1u);
    EXPECT_EQ(published_key(*id), std::optional<std::string>("key"));
    expect_clean();
}

TEST_F(Lobby, WithoutAModificationTheLobbyStaysWithoutKey)
{
    size_t from = mark();
    eos_sim::inject("EOS_Lobby_UpdateLobbyModification", eos_sim::Failure::once(EOS_EResult::EOS_TimedOut));
    host::ClosureRef onCreated = host::make_closure("PB_v");
    p.create_lobby(host::bytes("key"), onCreated->vm);
    ASSERT_TRUE(settle([&] { return onCreated->count() > 0; }));
    ASSERT_EQ(onCreated->count(), 1u);
    std::optional<std::string> id = arg_bytes(onCreated->last(), 0);
    ASSERT_TRUE(id.has_value());
    EXPECT_TRUE(eos_sim::find_lobby(*id).has_value());
    EXPECT_EQ(published_key(*id), std::nullopt);
    EXPECT_EQ(lines_since(from), std::vector<std::string>{"[EGS] Failed to update lobby modification: " +
                                                          std::to_string(code(EOS_EResult::EOS_TimedOut))});
    EXPECT_TRUE(eos_sim::calls("EOS_LobbyModification_AddAttribute").empty());
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_UpdateLobby").empty());
    EXPECT_TRUE(eos_sim::calls("EOS_LobbyModification_Release").empty());
    expect_clean();
}

TEST_F(Lobby, AFailedAttributeStillSendsTheUpdateThenReleases)
{
    size_t from = mark();
    eos_sim::inject("EOS_LobbyModification_AddAttribute", eos_sim::Failure::once(EOS_EResult::EOS_LimitExceeded));
    AtCreated seen;
    host::ClosureRef onCreated = created_closure(&seen);
    p.create_lobby(host::bytes("key"), onCreated->vm);
    ASSERT_TRUE(settle([&] {
        auto updates = eos_sim::calls("EOS_Lobby_UpdateLobby");
        return onCreated->count() > 0 && !updates.empty() && !updates[0].deliveries.empty();
    }));
    ASSERT_EQ(onCreated->count(), 1u);
    std::optional<std::string> id = arg_bytes(onCreated->last(), 0);
    ASSERT_TRUE(id.has_value());
    EXPECT_EQ(seen.updates, 1u);
    EXPECT_EQ(seen.releases, 1u);
    EXPECT_EQ(call_order({"EOS_LobbyModification_AddAttribute", "EOS_Lobby_UpdateLobby", "EOS_LobbyModification_Release"}),
              (std::vector<std::string>{"EOS_LobbyModification_AddAttribute", "EOS_Lobby_UpdateLobby",
                                        "EOS_LobbyModification_Release"}));
    EXPECT_EQ(lines_since(from), std::vector<std::string>{"[EGS] Failed to add attribute to the lobby: " +
                                                          std::to_string(code(EOS_EResult::EOS_LimitExceeded))});
    EXPECT_EQ(published_key(*id), std::nullopt);
    expect_clean();
}

TEST_F(Lobby, ANullOnCreatedStillCreatesAndPublishes)
{
    p.create_lobby(host::bytes("quiet"), nullptr);
    EXPECT_EQ(hlrt::root_count(), 0u);
    ASSERT_TRUE(settle([] {
        auto updates = eos_sim::calls("EOS_Lobby_UpdateLobby");
        return !updates.empty() && !updates[0].deliveries.empty();
    }));
    auto lobbies = eos_sim::get_world().lobbies;
    ASSERT_EQ(lobbies.size(), 1u);
    EXPECT_EQ(published_key(lobbies[0].id), std::optional<std::string>("quiet"));
    expect_clean();
}

TEST_F(Lobby, LeavingAndDestroyingReportZeroAndLogNothing)
{
    std::string left = create_and_publish("a");
    std::string destroyed = create_and_publish("b");
    // A second member keeps the left lobby alive.
    ASSERT_TRUE(eos_sim::remote_join("alice", left));
    size_t from = mark();
    host::ClosureRef onLeft = host::make_closure("Pi_v");
    host::ClosureRef onDestroyed = host::make_closure("Pi_v");
    p.leave_lobby(host::bytes(left), onLeft->vm);
    p.destroy_lobby(host::bytes(destroyed), onDestroyed->vm);
    EXPECT_EQ(hlrt::root_count(), 2u);
    ASSERT_TRUE(settle([&] { return onLeft->count() > 0 && onDestroyed->count() > 0; }));
    ASSERT_EQ(onLeft->count(), 1u);
    ASSERT_EQ(onDestroyed->count(), 1u);
    EXPECT_EQ(onLeft->last().args.size(), 1u);
    EXPECT_EQ(arg_i32(onLeft->last(), 0), 0);
    EXPECT_EQ(arg_i32(onDestroyed->last(), 0), 0);
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_LeaveLobby")[0].options,
              (json{{"ApiVersion", 1}, {"LocalUserId", puid("me")}, {"LobbyId", left}}));
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_DestroyLobby")[0].options,
              (json{{"ApiVersion", 1}, {"LocalUserId", puid("me")}, {"LobbyId", destroyed}}));
    std::optional<eos_sim::Lobby> after = eos_sim::find_lobby(left);
    ASSERT_TRUE(after.has_value());
    EXPECT_FALSE(is_member(*after, "me"));
    EXPECT_FALSE(eos_sim::find_lobby(destroyed).has_value());
    EXPECT_EQ(lines_since(from), std::vector<std::string>{});
    expect_clean();
}

TEST_F(Lobby, FailedLeaveAndDestroyGiveTheGameTheirCode)
{
    std::string others = remote_lobby("alice", "theirs");
    ASSERT_TRUE(eos_sim::remote_join("me", others));
    size_t from = mark();
    host::ClosureRef onLeft = host::make_closure("Pi_v");
    host::ClosureRef onDestroyed = host::make_closure("Pi_v");
    p.leave_lobby(host::bytes("no-such-lobby"), onLeft->vm);
    // Only the owner may destroy a lobby.
    p.destroy_lobby(host::bytes(others), onDestroyed->vm);
    ASSERT_TRUE(settle([&] { return onLeft->count() > 0 && onDestroyed->count() > 0; }));
    ASSERT_EQ(onLeft->count(), 1u);
    ASSERT_EQ(onDestroyed->count(), 1u);
    const int not_found = code(EOS_EResult::EOS_NotFound);
    const int not_owner = code(EOS_EResult::EOS_Lobby_NotOwner);
    EXPECT_EQ(arg_i32(onLeft->last(), 0), not_found);
    EXPECT_EQ(arg_i32(onDestroyed->last(), 0), not_owner);
    // The leave line names the lobby id the SDK returned with its result.
    std::string reported = eos_sim::calls("EOS_Lobby_LeaveLobby")[0].output.value("LobbyId", std::string("?"));
    EXPECT_EQ(reported, "no-such-lobby");
    EXPECT_EQ(lines_since(from),
              (std::vector<std::string>{"[EGS] Can't leave lobby " + reported + " : " + std::to_string(not_found),
                                        "[EGS] Can't destroy lobby : " + std::to_string(not_owner)}));
    std::optional<eos_sim::Lobby> still = eos_sim::find_lobby(others);
    ASSERT_TRUE(still.has_value());
    EXPECT_TRUE(is_member(*still, "me"));
    expect_clean();
}

TEST_F(Lobby, NullClosuresOnLeaveAndDestroyOnlyLogFailures)
{
    std::string mine = create_and_publish("k");
    size_t from = mark();
    p.leave_lobby(host::bytes("nowhere"), nullptr);
    p.destroy_lobby(host::bytes("nowhere"), nullptr);
    p.destroy_lobby(host::bytes(mine), nullptr);
    EXPECT_EQ(hlrt::root_count(), 0u);
    ASSERT_TRUE(settle([] { return eos_sim::calls("EOS_Lobby_DestroyLobby").size() == 2 &&
                                   !eos_sim::calls("EOS_Lobby_DestroyLobby")[1].deliveries.empty(); }));
    const std::string nf = std::to_string(code(EOS_EResult::EOS_NotFound));
    EXPECT_EQ(lines_since(from), (std::vector<std::string>{"[EGS] Can't leave lobby nowhere : " + nf,
                                                           "[EGS] Can't destroy lobby : " + nf}));
    EXPECT_FALSE(eos_sim::find_lobby(mine).has_value());
    expect_clean();
}

// Two players in one process: the local player and remote accounts that the
// simulator plays.

TEST_F(Lobby, ARemoteJoinerReadsTheFirst255BytesOfTheHostsKey)
{
    const std::string key = patterned(300);
    std::string id = create_and_publish(key);
    ASSERT_FALSE(id.empty());
    p.send_invite(host::bytes(puid("alice")), host::bytes(id));
    ASSERT_TRUE(settle([] {
        auto sends = eos_sim::calls("EOS_Lobby_SendInvite");
        return !sends.empty() && !sends[0].deliveries.empty();
    }));
    eos_sim::Call send = eos_sim::calls("EOS_Lobby_SendInvite")[0];
    ASSERT_EQ(send.result, std::optional<EOS_EResult>(EOS_EResult::EOS_Success));
    std::string invite = send.output.value("InviteId", std::string());
    ASSERT_TRUE(eos_sim::remote_accept_invite("alice", invite));

    std::optional<eos_sim::Lobby> seen = eos_sim::find_lobby(id);
    ASSERT_TRUE(seen.has_value());
    EXPECT_TRUE(is_member(*seen, "alice"));
    const eos_sim::Attribute *a = find_attribute(*seen, "connection_key");
    ASSERT_NE(a, nullptr);
    EXPECT_EQ(a->as_utf8, key.substr(0, 255));
    expect_clean();
}

TEST_F(Lobby, ARemoteHostsInvitationLeadsTheLocalPlayerIntoItsLobby)
{
    host::ClosureRef onInvite = host::make_closure("PBB_v");
    p.notify_invite_received(onInvite->vm);
    std::string lobby = remote_lobby("alice", "alice.example:9000");
    std::string invite = eos_sim::remote_invite("alice", lobby);
    ASSERT_FALSE(invite.empty());
    ASSERT_TRUE(settle([&] { return onInvite->count() > 0; }));
    ASSERT_EQ(onInvite->count(), 1u);
    EXPECT_EQ(arg_bytes(onInvite->last(), 0), std::optional<std::string>(invite));
    EXPECT_EQ(arg_bytes(onInvite->last(), 1), std::optional<std::string>("Alice"));

    host::ClosureRef onJoined = host::make_closure("PBB_v");
    p.accept_invite(host::bytes(*arg_bytes(onInvite->last(), 0)), onJoined->vm);
    ASSERT_TRUE(settle([&] { return onJoined->count() > 0; }));
    ASSERT_EQ(onJoined->count(), 1u);
    EXPECT_EQ(arg_bytes(onJoined->last(), 0), std::optional<std::string>(lobby));
    EXPECT_EQ(arg_bytes(onJoined->last(), 1), std::optional<std::string>("alice.example:9000"));
    std::optional<eos_sim::Lobby> joined = eos_sim::find_lobby(lobby);
    ASSERT_TRUE(joined.has_value());
    EXPECT_TRUE(is_member(*joined, "me"));
    EXPECT_EQ(onInvite->count(), 1u);
    expect_clean(1);
}
