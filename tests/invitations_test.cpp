// Invitations and joining: sending and rejecting, accepting by joining,
// acceptance in the overlay, join requests, and replacing the subscriptions.
#include "lobby_flows.h"

using namespace tw;
using nlohmann::json;

class Invitations : public LobbyFlowTest {
protected:
    // `owner` hosts a lobby with `key` and invites the local player.
    std::string invitation(const std::string &owner, const char *key, uint32_t max_members = 10)
    {
        lobby_ = remote_lobby(owner, key, max_members);
        std::string invite = eos_sim::remote_invite(owner, lobby_);
        EXPECT_FALSE(invite.empty());
        return invite;
    }

    static void expect_delivery(const host::ClosureRef &closure, const std::string &lobby, const std::string &key)
    {
        ASSERT_EQ(closure->count(), 1u);
        const host::Call &call = closure->last();
        ASSERT_EQ(call.args.size(), 2u);
        EXPECT_EQ(arg_bytes(call, 0), std::optional<std::string>(lobby));
        EXPECT_EQ(arg_bytes(call, 1), std::optional<std::string>(key));
        EXPECT_EQ(call.args[0].bytes_size, static_cast<long>(lobby.size() + 1));
        EXPECT_EQ(call.args[1].bytes_size, static_cast<long>(key.size() + 1));
    }

    static bool delivered(const char *function, size_t count = 1)
    {
        auto calls = eos_sim::calls(function);
        return calls.size() >= count && !calls[count - 1].deliveries.empty();
    }

    static bool local_is_member(const std::string &lobby)
    {
        std::optional<eos_sim::Lobby> l = eos_sim::find_lobby(lobby);
        return l && is_member(*l, "me");
    }

    static bool invitation_exists(const std::string &id)
    {
        for (const eos_sim::Invitation &i : eos_sim::get_world().invitations)
            if (i.id == id)
                return true;
        return false;
    }

    std::string lobby_;
};

// ---- sending and rejecting ------------------------------------------------------------------

TEST_F(Invitations, SendingNamesTheTargetPlayerFirstAndTheLobbySecond)
{
    host::ClosureRef onCreated = host::make_closure("PB_v");
    p.create_lobby(host::bytes("k"), onCreated->vm);
    ASSERT_TRUE(settle([&] { return onCreated->count() > 0; }));
    std::string lobby = arg_bytes(onCreated->last(), 0).value_or("");
    size_t from = mark();

    p.send_invite(host::bytes(puid("bob")), host::bytes(lobby));
    auto sends = eos_sim::calls("EOS_Lobby_SendInvite");
    ASSERT_EQ(sends.size(), 1u);
    EXPECT_EQ(sends[0].options,
              (json{{"ApiVersion", 1}, {"LobbyId", lobby}, {"LocalUserId", puid("me")}, {"TargetUserId", puid("bob")}}));
    EXPECT_EQ(sends[0].client_data, nullptr);
    EXPECT_EQ(hlrt::root_count(), 0u);
    ASSERT_TRUE(settle([] { return delivered("EOS_Lobby_SendInvite"); }));
    auto invitations = eos_sim::get_world().invitations;
    ASSERT_EQ(invitations.size(), 1u);
    EXPECT_EQ(invitations[0].from, "me");
    EXPECT_EQ(invitations[0].to, "bob");
    EXPECT_EQ(invitations[0].lobby_id, lobby);
    EXPECT_EQ(lines_since(from), std::vector<std::string>{});
    expect_clean();
}

TEST_F(Invitations, FailedSendsAndRejectionsShowOnlyInTheLog)
{
    std::string kept = invitation("alice", "k");
    std::string rejected = invitation("bob", "k");
    size_t from = mark();
    p.send_invite(host::bytes(puid("alice")), host::bytes("no-such-lobby"));
    p.reject_invite(host::bytes(rejected));
    p.reject_invite(host::bytes("no-such-invite"));
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_RejectInvite")[0].options,
              (json{{"ApiVersion", 1}, {"InviteId", rejected}, {"LocalUserId", puid("me")}}));
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_RejectInvite")[0].client_data, nullptr);
    ASSERT_TRUE(settle([] { return delivered("EOS_Lobby_SendInvite") && delivered("EOS_Lobby_RejectInvite", 2); }));
    const std::string nf = std::to_string(code(EOS_EResult::EOS_NotFound));
    // The rejection line names the invite id the SDK returned with its result.
    std::string reported = eos_sim::calls("EOS_Lobby_RejectInvite")[1].output.value("InviteId", std::string("?"));
    EXPECT_EQ(reported, "no-such-invite");
    EXPECT_EQ(lines_since(from), (std::vector<std::string>{"[EGS] Failed to send invite : " + nf,
                                                           "[EGS] Failed to reject invite " + reported + " : " + nf}));
    EXPECT_FALSE(invitation_exists(rejected));
    EXPECT_TRUE(invitation_exists(kept));
    expect_clean();
}

// ---- accepting in the game ------------------------------------------------------------------

TEST_F(Invitations, AnUnknownInvitationIsNeitherJoinedNorAnswered)
{
    size_t from = mark();
    host::ClosureRef onJoined = host::make_closure("PBB_v");
    host::Held keep(onJoined->vm);
    p.accept_invite(host::bytes("no-such-invite"), onJoined->vm);
    EXPECT_EQ(hlrt::root_count(), 0u);
    EXPECT_EQ(lines_since(from), std::vector<std::string>{"[EGS] Failed to receive lobby details : " +
                                                          std::to_string(code(EOS_EResult::EOS_NotFound))});
    settle([] { return false; }, 5);
    EXPECT_EQ(onJoined->count(), 0u);
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_JoinLobby").empty());
    expect_clean();
}

TEST_F(Invitations, AcceptingJoinsTheLobbyAndHandsOverItsIdAndKey)
{
    std::string invite = invitation("alice", "alice.example:9000");
    size_t from = mark();
    host::ClosureRef onJoined = host::make_closure("PBB_v");
    p.accept_invite(host::bytes(invite), onJoined->vm);

    auto joins = eos_sim::calls("EOS_Lobby_JoinLobby");
    ASSERT_EQ(joins.size(), 1u);
    EXPECT_EQ(joins[0].options, (json{{"ApiVersion", 4},
                                      {"LobbyDetailsHandle", lobby_},
                                      {"LocalUserId", puid("me")},
                                      {"bPresenceEnabled", 1},
                                      {"LocalRTCOptions", false},
                                      {"bCrossplayOptOut", 0}}));
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_CopyLobbyDetailsHandleByInviteId")[0].options,
              (json{{"ApiVersion", 1}, {"InviteId", invite}}));
    // The handle copied for the join is given back as soon as the join has
    // been requested.
    EXPECT_EQ(eos_sim::outstanding_total(), 0);
    EXPECT_EQ(hlrt::root_count(), 1u);

    ASSERT_TRUE(settle([&] { return onJoined->count() > 0; }));
    expect_delivery(onJoined, lobby_, "alice.example:9000");
    EXPECT_EQ(lines_since(from),
              (std::vector<std::string>{"[EGS] on lobby joined : " + lobby_, "[EGS] call lobby joined callback"}));
    EXPECT_TRUE(local_is_member(lobby_));
    auto details = eos_sim::calls("EOS_Lobby_CopyLobbyDetailsHandle");
    ASSERT_EQ(details.size(), 1u);
    EXPECT_EQ(details[0].options, (json{{"ApiVersion", 1}, {"LobbyId", lobby_}, {"LocalUserId", puid("me")}}));
    EXPECT_EQ(eos_sim::calls("EOS_LobbyDetails_CopyAttributeByKey")[0].options,
              (json{{"ApiVersion", 1}, {"AttrKey", "connection_key"}}));
    expect_clean();
}

TEST_F(Invitations, AFailedJoinStillDeliversWhenTheLobbyCanBeRead)
{
    std::string invite = invitation("alice", "k1");
    size_t from = mark();
    eos_sim::inject("EOS_Lobby_JoinLobby", eos_sim::Failure::once(EOS_EResult::EOS_TimedOut));
    host::ClosureRef onJoined = host::make_closure("PBB_v");
    p.accept_invite(host::bytes(invite), onJoined->vm);
    // The player got in by another road meanwhile.
    ASSERT_TRUE(eos_sim::remote_join("me", lobby_));
    ASSERT_TRUE(settle([&] { return onJoined->count() > 0; }));
    expect_delivery(onJoined, lobby_, "k1");
    EXPECT_EQ(lines_since(from),
              (std::vector<std::string>{"[EGS] on lobby joined : " + lobby_,
                                        "[EGS] Failed to join lobby : " + std::to_string(code(EOS_EResult::EOS_TimedOut)),
                                        "[EGS] call lobby joined callback"}));
    expect_clean();
}

TEST_F(Invitations, AFailedJoinOfAnUnreadableLobbyCallsNothing)
{
    // A lobby of one, already full with its owner.
    std::string invite = invitation("alice", "k", 1);
    size_t from = mark();
    host::ClosureRef onJoined = host::make_closure("PBB_v");
    host::Held keep(onJoined->vm);
    p.accept_invite(host::bytes(invite), onJoined->vm);
    ASSERT_TRUE(settle([] { return delivered("EOS_Lobby_JoinLobby"); }));
    EXPECT_EQ(onJoined->count(), 0u);
    EXPECT_EQ(lines_since(from),
              (std::vector<std::string>{
                  "[EGS] on lobby joined : " + lobby_,
                  "[EGS] Failed to join lobby : " + std::to_string(code(EOS_EResult::EOS_Lobby_TooManyPlayers)),
                  "[EGS] Can't receive lobby details : " + std::to_string(code(EOS_EResult::EOS_NotFound))}));
    EXPECT_FALSE(local_is_member(lobby_));
    expect_clean();
}

TEST_F(Invitations, AJoinedLobbyWithoutAStringKeyCallsNothing)
{
    std::string missing = invitation("alice", nullptr);
    std::string missing_lobby = lobby_;
    std::string number = eos_sim::remote_invite(
        "bob", lobby_ = eos_sim::remote_create_lobby("bob", {eos_sim::Attribute::int64("connection_key", 42)}));
    size_t from = mark();
    host::ClosureRef onJoined = host::make_closure("PBB_v");
    host::Held keep(onJoined->vm);
    p.accept_invite(host::bytes(missing), onJoined->vm);
    p.accept_invite(host::bytes(number), onJoined->vm);
    EXPECT_EQ(hlrt::root_count(), 2u);
    ASSERT_TRUE(settle([] { return delivered("EOS_Lobby_JoinLobby", 2); }));
    EXPECT_EQ(onJoined->count(), 0u);
    EXPECT_EQ(lines_since(from),
              (std::vector<std::string>{
                  "[EGS] on lobby joined : " + missing_lobby, "[EGS] call lobby joined callback",
                  "[EGS] Failed to receive lobby attribute : " + std::to_string(code(EOS_EResult::EOS_NotFound)),
                  "[EGS] on lobby joined : " + lobby_, "[EGS] call lobby joined callback",
                  "[EGS] Lobby attribute connection_key is not a string : " +
                      std::to_string(static_cast<int>(EOS_EAttributeType::EOS_AT_INT64))}));
    EXPECT_TRUE(local_is_member(missing_lobby));
    EXPECT_TRUE(local_is_member(lobby_));
    expect_clean();
}

TEST_F(Invitations, ANullOnJoinedStillJoinsWithEveryLine)
{
    std::string invite = invitation("alice", "k");
    size_t from = mark();
    p.accept_invite(host::bytes(invite), nullptr);
    EXPECT_EQ(hlrt::root_count(), 0u);
    ASSERT_TRUE(settle([] { return delivered("EOS_Lobby_JoinLobby"); }));
    EXPECT_EQ(lines_since(from),
              (std::vector<std::string>{"[EGS] on lobby joined : " + lobby_, "[EGS] call lobby joined callback"}));
    EXPECT_TRUE(local_is_member(lobby_));
    EXPECT_EQ(eos_sim::calls("EOS_LobbyDetails_CopyAttributeByKey").size(), 1u);
    expect_clean();
}

// ---- accepting in the overlay ---------------------------------------------------------------

TEST_F(Invitations, AnOverlayAcceptanceRejectsTheInvitationAndDeliversWithoutJoining)
{
    size_t rejects_at_call = 99;
    host::ClosureBehaviour b;
    b.on_call = [&](const host::Call &) { rejects_at_call = eos_sim::calls("EOS_Lobby_RejectInvite").size(); };
    host::ClosureRef onAccepted = host::make_closure("PBB_v", b);
    p.notify_invite_accepted(onAccepted->vm);
    auto accepted = eos_sim::calls("EOS_Lobby_AddNotifyLobbyInviteAccepted");
    auto join_accepted = eos_sim::calls("EOS_Lobby_AddNotifyJoinLobbyAccepted");
    ASSERT_EQ(accepted.size(), 1u);
    ASSERT_EQ(join_accepted.size(), 1u);
    EXPECT_EQ(accepted[0].options, (json{{"ApiVersion", 1}}));
    EXPECT_EQ(join_accepted[0].options, (json{{"ApiVersion", 1}}));
    EXPECT_NE(accepted[0].client_data, nullptr);
    EXPECT_EQ(join_accepted[0].client_data, nullptr);
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_RemoveNotifyLobbyInviteAccepted").empty());
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_RemoveNotifyJoinLobbyAccepted").empty());

    std::string invite = invitation("alice", "alice.example:9000");
    size_t from = mark();
    eos_sim::raise_invite_accepted(invite);
    ASSERT_TRUE(settle([&] { return onAccepted->count() > 0 && delivered("EOS_Lobby_RejectInvite"); }));
    expect_delivery(onAccepted, lobby_, "alice.example:9000");
    EXPECT_EQ(rejects_at_call, 1u);
    auto rejects = eos_sim::calls("EOS_Lobby_RejectInvite");
    ASSERT_EQ(rejects.size(), 1u);
    EXPECT_EQ(rejects[0].options, (json{{"ApiVersion", 1}, {"InviteId", invite}, {"LocalUserId", puid("me")}}));
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_JoinLobby").empty());
    EXPECT_FALSE(local_is_member(lobby_));
    EXPECT_FALSE(invitation_exists(invite));
    EXPECT_EQ(lines_since(from), std::vector<std::string>{"[EGS] Accept to join the lobby " + lobby_});
    expect_clean(1);
}

TEST_F(Invitations, AnOverlayAcceptanceOfAnUnreadableLobbyEndsAfterItsLine)
{
    host::ClosureRef onAccepted = host::make_closure("PBB_v");
    p.notify_invite_accepted(onAccepted->vm);
    std::string invite = invitation("alice", "k");
    const std::string timed_out = std::to_string(code(EOS_EResult::EOS_TimedOut));

    size_t from = mark();
    eos_sim::inject("EOS_Lobby_CopyLobbyDetailsHandleByInviteId", eos_sim::Failure::once(EOS_EResult::EOS_TimedOut));
    eos_sim::raise_invite_accepted(invite);
    settle([] { return false; }, 3);
    EXPECT_EQ(lines_since(from),
              std::vector<std::string>{"[EGS] Failed to receive lobby details (invite accepted): " + timed_out});

    from = mark();
    eos_sim::inject("EOS_LobbyDetails_CopyInfo", eos_sim::Failure::once(EOS_EResult::EOS_TimedOut));
    eos_sim::raise_invite_accepted(invite);
    settle([] { return false; }, 3);
    EXPECT_EQ(lines_since(from),
              std::vector<std::string>{"[EGS] Failed to copy lobby details (invite accepted): " + timed_out});
    EXPECT_EQ(onAccepted->count(), 0u);
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_RejectInvite").empty());
    EXPECT_TRUE(invitation_exists(invite));
    expect_clean(1);

    // The subscription itself is unharmed.
    eos_sim::raise_invite_accepted(invite);
    ASSERT_TRUE(settle([&] { return onAccepted->count() > 0; }));
    expect_delivery(onAccepted, lobby_, "k");
    expect_clean(1);
}

TEST_F(Invitations, ANullOnAcceptedStillLogsAndRejects)
{
    p.notify_invite_accepted(nullptr);
    EXPECT_EQ(hlrt::root_count(), 0u);
    std::string invite = invitation("alice", "k");
    size_t from = mark();
    eos_sim::raise_invite_accepted(invite);
    ASSERT_TRUE(settle([] { return delivered("EOS_Lobby_RejectInvite"); }));
    EXPECT_EQ(lines_since(from), std::vector<std::string>{"[EGS] Accept to join the lobby " + lobby_});
    EXPECT_FALSE(invitation_exists(invite));
    EXPECT_EQ(eos_sim::calls("EOS_LobbyDetails_CopyAttributeByKey").size(), 1u);
    expect_clean();
}

TEST_F(Invitations, AJoinRequestAcceptedInTheOverlayIsOnlyLogged)
{
    host::ClosureRef onAccepted = host::make_closure("PBB_v");
    p.notify_invite_accepted(onAccepted->vm);
    std::string lobby = remote_lobby("alice", "k");
    size_t from = mark();
    eos_sim::raise_join_lobby_accepted(lobby);
    settle([] { return false; }, 3);
    EXPECT_EQ(lines_since(from), std::vector<std::string>{"[EGS] On join lobby accepted"});
    EXPECT_EQ(onAccepted->count(), 0u);
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_JoinLobby").empty());
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_RejectInvite").empty());
    EXPECT_FALSE(local_is_member(lobby));
    expect_clean(1);
}

// ---- replacing the subscriptions ------------------------------------------------------------

TEST_F(Invitations, SubscribingAgainReplacesBothSubscriptionsAndFreesTheOldClosure)
{
    host::ClosureRef first = host::make_closure("PBB_v");
    p.notify_invite_accepted(first->vm);
    std::vector<eos_sim::Subscription> old_accepted = eos_sim::subscriptions("LobbyInviteAccepted");
    std::vector<eos_sim::Subscription> old_join = eos_sim::subscriptions("JoinLobbyAccepted");
    ASSERT_EQ(old_accepted.size(), 1u);
    ASSERT_EQ(old_join.size(), 1u);

    uint64_t from = next_seq();
    host::ClosureRef second = host::make_closure("PBB_v");
    p.notify_invite_accepted(second->vm);
    // Both old subscriptions are gone before either new one exists.
    std::vector<std::string> order =
        call_order({"EOS_Lobby_RemoveNotifyLobbyInviteAccepted", "EOS_Lobby_RemoveNotifyJoinLobbyAccepted",
                    "EOS_Lobby_AddNotifyLobbyInviteAccepted", "EOS_Lobby_AddNotifyJoinLobbyAccepted"},
                   from);
    ASSERT_EQ(order.size(), 4u);
    EXPECT_EQ(order[0].rfind("EOS_Lobby_RemoveNotify", 0), 0u) << order[0];
    EXPECT_EQ(order[1].rfind("EOS_Lobby_RemoveNotify", 0), 0u) << order[1];
    EXPECT_EQ(order[2].rfind("EOS_Lobby_AddNotify", 0), 0u) << order[2];
    EXPECT_EQ(order[3].rfind("EOS_Lobby_AddNotify", 0), 0u) << order[3];
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_RemoveNotifyLobbyInviteAccepted")[0].options, (json{{"InId", old_accepted[0].id}}));
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_RemoveNotifyJoinLobbyAccepted")[0].options, (json{{"InId", old_join[0].id}}));

    std::vector<eos_sim::Subscription> accepted = eos_sim::subscriptions("LobbyInviteAccepted");
    std::vector<eos_sim::Subscription> join = eos_sim::subscriptions("JoinLobbyAccepted");
    ASSERT_EQ(accepted.size(), 1u);
    ASSERT_EQ(join.size(), 1u);
    EXPECT_NE(accepted[0].id, old_accepted[0].id);
    EXPECT_NE(join[0].id, old_join[0].id);
    // The first closure is no longer rooted.
    EXPECT_EQ(hlrt::root_count(), 1u);
    hlrt::collect();
    EXPECT_TRUE(first->collected);
    EXPECT_FALSE(second->collected);

    std::string invite = invitation("alice", "k");
    eos_sim::raise_invite_accepted(invite);
    ASSERT_TRUE(settle([&] { return second->count() > 0; }));
    expect_delivery(second, lobby_, "k");
    EXPECT_EQ(first->count(), 0u);
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_RejectInvite").size(), 1u);
    expect_clean(1);
}

TEST_F(Invitations, SubscribingAgainFromInsideTheOldClosure)
{
    host::ClosureRef second = host::make_closure("PBB_v");
    host::Held keep(second->vm);
    host::ClosureBehaviour b;
    b.on_call = [&](const host::Call &) {
        p.notify_invite_accepted(second->vm);
        hlrt::collect();
    };
    host::ClosureRef first = host::make_closure("PBB_v", b);
    p.notify_invite_accepted(first->vm);

    std::string invite = invitation("alice", "first");
    std::string first_lobby = lobby_;
    eos_sim::raise_invite_accepted(invite);
    ASSERT_TRUE(settle([&] { return first->count() > 0; }));
    expect_delivery(first, first_lobby, "first");
    EXPECT_EQ(second->count(), 0u);
    EXPECT_EQ(eos_sim::subscriptions("LobbyInviteAccepted").size(), 1u);
    EXPECT_EQ(eos_sim::subscriptions("JoinLobbyAccepted").size(), 1u);
    EXPECT_EQ(hlrt::root_count(), 1u);
    hlrt::collect();
    EXPECT_TRUE(first->collected);

    std::string again = invitation("bob", "second");
    eos_sim::raise_invite_accepted(again);
    ASSERT_TRUE(settle([&] { return second->count() > 0; }));
    expect_delivery(second, lobby_, "second");
    EXPECT_EQ(first->count(), 1u);
    expect_clean(1);
}
