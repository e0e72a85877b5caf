// The invite-received chain: from the notification through the sender's id
// mapping and user info to the game's (invite id, sender's name) call.
#include "lobby_flows.h"

#include <map>

using namespace tw;
using nlohmann::json;

class InviteReceived : public LobbyFlowTest {
protected:
    // `from` invites the local player to a lobby of its own.
    static std::string invite_from(const std::string &from)
    {
        std::string lobby = remote_lobby(from, "key");
        std::string invite = eos_sim::remote_invite(from, lobby);
        EXPECT_FALSE(invite.empty()) << from;
        return invite;
    }

    // A lobby and an invitation with ids of the given lengths, put straight
    // into the world, then notified.
    static std::string raise_with_ids(size_t invite_length, size_t lobby_length)
    {
        std::string invite(invite_length, 'i');
        std::string lobby(lobby_length, 'l');
        eos_sim::update_world([&](eos_sim::World &w) {
            eos_sim::Lobby l;
            l.id = lobby;
            l.owner = "alice";
            l.members = {"alice"};
            l.attributes = {eos_sim::Attribute::string("connection_key", "k")};
            w.lobbies.push_back(l);
            w.invitations.push_back(eos_sim::Invitation{invite, lobby, "alice", "me"});
        });
        eos_sim::raise_invite_received(invite);
        return invite;
    }

    static void expect_invitation(const host::Call &call, const std::string &invite, const std::string &name)
    {
        ASSERT_EQ(call.args.size(), 2u);
        EXPECT_EQ(arg_bytes(call, 0), std::optional<std::string>(invite));
        EXPECT_EQ(arg_bytes(call, 1), std::optional<std::string>(name));
        EXPECT_EQ(call.args[0].bytes_size, static_cast<long>(invite.size() + 1));
        EXPECT_EQ(call.args[1].bytes_size, static_cast<long>(name.size() + 1));
    }

    static bool chain_ended(size_t count = 1)
    {
        auto copies = eos_sim::calls("EOS_UserInfo_CopyUserInfo");
        return copies.size() >= count;
    }
};

TEST_F(InviteReceived, TheGameGetsTheInviteIdAndTheSendersDisplayName)
{
    host::ClosureRef onInvite = host::make_closure("PBB_v");
    p.notify_invite_received(onInvite->vm);
    auto adds = eos_sim::calls("EOS_Lobby_AddNotifyLobbyInviteReceived");
    ASSERT_EQ(adds.size(), 1u);
    EXPECT_EQ(adds[0].options, (json{{"ApiVersion", 1}}));
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_RemoveNotifyLobbyInviteReceived").empty());
    EXPECT_EQ(hlrt::root_count(), 1u);
    size_t from = mark();

    std::string invite = invite_from("bob");
    ASSERT_TRUE(settle([&] { return onInvite->count() > 0; }));
    ASSERT_EQ(onInvite->count(), 1u);
    // The sender's name, never the local player's own.
    expect_invitation(onInvite->last(), invite, "Bob");
    EXPECT_EQ(lines_since(from), std::vector<std::string>{});

    EXPECT_EQ(eos_sim::calls("EOS_Connect_QueryProductUserIdMappings")[0].options,
              (json{{"ApiVersion", 2},
                    {"LocalUserId", puid("me")},
                    {"AccountIdType_DEPRECATED", 0},
                    {"ProductUserIds", json::array({puid("bob")})},
                    {"ProductUserIdCount", 1}}));
    EXPECT_EQ(eos_sim::calls("EOS_Connect_GetProductUserIdMapping")[0].options,
              (json{{"ApiVersion", 1},
                    {"LocalUserId", puid("me")},
                    {"AccountIdType", 0},
                    {"TargetProductUserId", puid("bob")},
                    {"InOutBufferLength", 33}}));
    EXPECT_EQ(eos_sim::calls("EOS_UserInfo_QueryUserInfo")[0].options,
              (json{{"ApiVersion", 1}, {"LocalUserId", epic("me")}, {"TargetUserId", epic("bob")}}));
    EXPECT_EQ(eos_sim::calls("EOS_UserInfo_CopyUserInfo")[0].options,
              (json{{"ApiVersion", 3}, {"LocalUserId", epic("me")}, {"TargetUserId", epic("bob")}}));
    expect_clean(1);
}

TEST_F(InviteReceived, ASenderWithoutDisplayNameGivesAnEmptyName)
{
    eos_sim::update_world([](eos_sim::World &w) {
        for (eos_sim::Account &a : w.accounts)
            if (a.name == "carol")
                a.display_name = std::nullopt;
    });
    host::ClosureRef onInvite = host::make_closure("PBB_v");
    p.notify_invite_received(onInvite->vm);
    std::string invite = invite_from("carol");
    ASSERT_TRUE(settle([&] { return onInvite->count() > 0; }));
    ASSERT_EQ(onInvite->count(), 1u);
    expect_invitation(onInvite->last(), invite, "");
    expect_clean(1);
}

struct ChainFailure {
    const char *name;
    const char *function;   // where the failure is injected
    const char *line;       // the one line it produces, before the code
    const char *not_after;  // a call the chain must not reach
};

void PrintTo(const ChainFailure &f, std::ostream *os) { *os << f.function; }

class InviteChainFailure : public InviteReceived, public ::testing::WithParamInterface<ChainFailure> {};

TEST_P(InviteChainFailure, StopsTheChainWithItsOwnLineOnly)
{
    const ChainFailure &f = GetParam();
    host::ClosureRef onInvite = host::make_closure("PBB_v");
    p.notify_invite_received(onInvite->vm);
    eos_sim::inject(f.function, eos_sim::Failure::once(EOS_EResult::EOS_TimedOut));
    size_t from = mark();
    std::string failing = invite_from("alice");
    settle([] { return false; }, 6);
    EXPECT_EQ(onInvite->count(), 0u);
    EXPECT_EQ(lines_since(from),
              std::vector<std::string>{std::string(f.line) + std::to_string(code(EOS_EResult::EOS_TimedOut))});
    EXPECT_TRUE(eos_sim::calls(f.not_after).empty()) << f.not_after;
    // The failed chain has released everything it held.
    expect_clean(1);

    // The next invitation goes all the way.
    std::string next = invite_from("bob");
    ASSERT_TRUE(settle([&] { return onInvite->count() > 0; }));
    ASSERT_EQ(onInvite->count(), 1u);
    expect_invitation(onInvite->last(), next, "Bob");
    expect_clean(1);
}

INSTANTIATE_TEST_SUITE_P(
    Steps, InviteChainFailure,
    ::testing::Values(
        ChainFailure{"LobbyDetails", "EOS_Lobby_CopyLobbyDetailsHandleByInviteId",
                     "[EGS] Failed to receive lobby details : ", "EOS_LobbyDetails_CopyInfo"},
        ChainFailure{"DetailsInfo", "EOS_LobbyDetails_CopyInfo", "[EGS] Failed to copy lobby details : ",
                     "EOS_Connect_QueryProductUserIdMappings"},
        ChainFailure{"MappingsQuery", "EOS_Connect_QueryProductUserIdMappings",
                     "[EGS] Failed to receive id mappings : ", "EOS_Connect_GetProductUserIdMapping"},
        ChainFailure{"MappingRead", "EOS_Connect_GetProductUserIdMapping",
                     "[EGS] Failed to get product id mapping : ", "EOS_UserInfo_QueryUserInfo"},
        ChainFailure{"UserInfoQuery", "EOS_UserInfo_QueryUserInfo",
                     "[EGS] Failed to query the hoster's user info : ", "EOS_UserInfo_CopyUserInfo"},
        ChainFailure{"UserInfoCopy", "EOS_UserInfo_CopyUserInfo", "[EGS] Failed to retreive name : ",
                     "EOS_UserInfo_Release"}),
    [](const ::testing::TestParamInfo<ChainFailure> &info) { return std::string(info.param.name); });

TEST_F(InviteReceived, IdsOf64CharactersPassAndLongerOnesAreIgnored)
{
    host::ClosureRef onInvite = host::make_closure("PBB_v");
    p.notify_invite_received(onInvite->vm);

    std::string fits = raise_with_ids(64, 64);
    ASSERT_TRUE(settle([&] { return onInvite->count() > 0; }));
    ASSERT_EQ(onInvite->count(), 1u);
    expect_invitation(onInvite->last(), fits, "Alice");
    size_t queries = eos_sim::calls("EOS_Connect_QueryProductUserIdMappings").size();

    // A lobby id one character too long for the chain's record.
    size_t from = mark();
    std::string long_lobby = raise_with_ids(63, 65);
    settle([] { return false; }, 4);
    EXPECT_EQ(lines_since(from), std::vector<std::string>{"[EGS] Invitation ignored, its ids do not fit : " + long_lobby});

    // The SDK itself refuses invite ids longer than 64 characters when the
    // lobby details are copied, so such an invitation stops there.
    from = mark();
    raise_with_ids(65, 62);
    settle([] { return false; }, 4);
    std::vector<std::string> lines = lines_since(from);
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_TRUE(lines[0].rfind("[EGS] Failed to receive lobby details : ", 0) == 0 ||
                lines[0].rfind("[EGS] Invitation ignored, its ids do not fit : ", 0) == 0)
        << lines[0];

    EXPECT_EQ(onInvite->count(), 1u);
    EXPECT_EQ(eos_sim::calls("EOS_Connect_QueryProductUserIdMappings").size(), queries);
    expect_clean(1);
}

TEST_F(InviteReceived, SubscribingAgainSendsLaterInvitationsToTheNewClosureOnly)
{
    host::ClosureRef first = host::make_closure("PBB_v");
    p.notify_invite_received(first->vm);
    uint64_t old_id = eos_sim::subscriptions("LobbyInviteReceived").at(0).id;

    host::ClosureRef second = host::make_closure("PBB_v");
    p.notify_invite_received(second->vm);
    std::vector<uint64_t> removes = seqs("EOS_Lobby_RemoveNotifyLobbyInviteReceived");
    std::vector<uint64_t> adds = seqs("EOS_Lobby_AddNotifyLobbyInviteReceived");
    ASSERT_EQ(removes.size(), 1u);
    ASSERT_EQ(adds.size(), 2u);
    EXPECT_LT(adds[0], removes[0]);
    EXPECT_LT(removes[0], adds[1]);
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_RemoveNotifyLobbyInviteReceived")[0].options, (json{{"InId", old_id}}));
    ASSERT_EQ(eos_sim::subscriptions("LobbyInviteReceived").size(), 1u);
    EXPECT_NE(eos_sim::subscriptions("LobbyInviteReceived")[0].id, old_id);
    EXPECT_EQ(hlrt::root_count(), 1u);
    hlrt::collect();
    EXPECT_TRUE(first->collected);

    std::string invite = invite_from("alice");
    ASSERT_TRUE(settle([&] { return second->count() > 0; }));
    ASSERT_EQ(second->count(), 1u);
    expect_invitation(second->last(), invite, "Alice");
    EXPECT_EQ(first->count(), 0u);
    expect_clean(1);
}

TEST_F(InviteReceived, SubscribingAgainFromInsideTheClosure)
{
    host::ClosureRef second = host::make_closure("PBB_v");
    host::Held keep(second->vm);
    host::ClosureBehaviour b;
    b.on_call = [&](const host::Call &) {
        p.notify_invite_received(second->vm);
        hlrt::collect();
    };
    host::ClosureRef first = host::make_closure("PBB_v", b);
    p.notify_invite_received(first->vm);

    std::string early = invite_from("alice");
    ASSERT_TRUE(settle([&] { return first->count() > 0; }));
    ASSERT_EQ(first->count(), 1u);
    expect_invitation(first->last(), early, "Alice");
    EXPECT_EQ(hlrt::root_count(), 1u);
    hlrt::collect();
    EXPECT_TRUE(first->collected);

    std::string late = invite_from("bob");
    ASSERT_TRUE(settle([&] { return second->count() > 0; }));
    ASSERT_EQ(second->count(), 1u);
    expect_invitation(second->last(), late, "Bob");
    EXPECT_EQ(first->count(), 1u);
    expect_clean(1);
}

TEST_F(InviteReceived, ASubscriptionTheSdkRefusedIsNotRemovedLater)
{
    eos_sim::inject("EOS_Lobby_AddNotifyLobbyInviteReceived", eos_sim::Failure::once(EOS_EResult::EOS_TimedOut));
    host::ClosureRef refused = host::make_closure("PBB_v");
    p.notify_invite_received(refused->vm);
    EXPECT_TRUE(eos_sim::subscriptions("LobbyInviteReceived").empty());

    host::ClosureRef onInvite = host::make_closure("PBB_v");
    p.notify_invite_received(onInvite->vm);
    EXPECT_TRUE(eos_sim::calls("EOS_Lobby_RemoveNotifyLobbyInviteReceived").empty());
    EXPECT_EQ(eos_sim::subscriptions("LobbyInviteReceived").size(), 1u);
    std::string invite = invite_from("alice");
    ASSERT_TRUE(settle([&] { return onInvite->count() > 0; }));
    expect_invitation(onInvite->last(), invite, "Alice");
    EXPECT_EQ(refused->count(), 0u);
    expect_clean(1);
}

TEST_F(InviteReceived, AChainInFlightEndsWithTheClosureItStartedUnder)
{
    host::ClosureRef first = host::make_closure("PBB_v");
    p.notify_invite_received(first->vm);
    eos_sim::hold(true);
    std::string early = invite_from("alice");
    // The notification is handled; the chain waits on its held mapping query.
    ASSERT_TRUE(settle([] { return !eos_sim::calls("EOS_Connect_QueryProductUserIdMappings").empty(); }));
    ASSERT_EQ(eos_sim::pending().size(), 1u);

    host::ClosureRef second = host::make_closure("PBB_v");
    p.notify_invite_received(second->vm);
    // The first cell stays rooted while its chain runs.
    EXPECT_EQ(hlrt::root_count(), 2u);
    hlrt::collect();
    EXPECT_FALSE(first->collected);
    std::string late = invite_from("bob");

    for (int i = 0; i < 20 && (first->count() == 0 || second->count() == 0); ++i) {
        eos_sim::release_all();
        tick_collecting(1);
    }
    eos_sim::hold(false);
    settle([] { return false; }, 3);
    ASSERT_EQ(first->count(), 1u);
    ASSERT_EQ(second->count(), 1u);
    expect_invitation(first->last(), early, "Alice");
    expect_invitation(second->last(), late, "Bob");
    // Its chain over, the replaced subscription's cell is gone.
    EXPECT_EQ(hlrt::root_count(), 1u);
    hlrt::collect();
    EXPECT_TRUE(first->collected);
    expect_clean(1);

    // Replaced by no closure at all: the chain still runs, nothing is called.
    p.notify_invite_received(nullptr);
    EXPECT_EQ(hlrt::root_count(), 0u);
    invite_from("carol");
    ASSERT_TRUE(settle([] { return chain_ended(3); }));
    EXPECT_EQ(second->count(), 1u);
    expect_clean();
}

TEST_F(InviteReceived, ANullClosureRunsTheWholeChainAndCallsNothing)
{
    p.notify_invite_received(nullptr);
    EXPECT_EQ(hlrt::root_count(), 0u);
    ASSERT_EQ(eos_sim::subscriptions("LobbyInviteReceived").size(), 1u);
    EXPECT_EQ(eos_sim::subscriptions("LobbyInviteReceived")[0].client_data, nullptr);
    size_t from = mark();
    invite_from("alice");
    ASSERT_TRUE(settle([] { return chain_ended(); }));
    EXPECT_EQ(eos_sim::calls("EOS_UserInfo_Release").size(), 1u);

    // Failures are still logged.
    eos_sim::inject("EOS_UserInfo_QueryUserInfo", eos_sim::Failure::once(EOS_EResult::EOS_TimedOut));
    invite_from("bob");
    ASSERT_TRUE(settle([] { return eos_sim::calls("EOS_UserInfo_QueryUserInfo").size() == 2 &&
                                   !eos_sim::calls("EOS_UserInfo_QueryUserInfo")[1].deliveries.empty(); }));
    EXPECT_EQ(lines_since(from), std::vector<std::string>{"[EGS] Failed to query the hoster's user info : " +
                                                          std::to_string(code(EOS_EResult::EOS_TimedOut))});
    expect_clean();
}

class InterleavedInvitations : public InviteReceived, public ::testing::WithParamInterface<uint32_t> {};

TEST_P(InterleavedInvitations, EachReachesTheGameOnceWithItsOwnSender)
{
    const uint32_t seed = GetParam();
    eos_sim::update_world([](eos_sim::World &w) {
        eos_sim::Account dave;
        dave.name = "dave";
        dave.display_name = "Dave";
        w.accounts.push_back(dave);
    });
    host::ClosureRef onInvite = host::make_closure("PBB_v");
    p.notify_invite_received(onInvite->vm);
    eos_sim::hold(true);

    // Senders by invitation id; alice invites twice, to two lobbies.
    std::map<std::string, std::string> expected;
    const std::vector<std::pair<std::string, std::string>> senders = {
        {"alice", "Alice"}, {"bob", "Bob"}, {"alice", "Alice"}, {"carol", "Carol"}, {"dave", "Dave"}};
    size_t next = 0;
    for (int round = 0; round < 30 && onInvite->count() < senders.size(); ++round) {
        // New invitations keep arriving while earlier chains are half-way.
        if (next < senders.size() && round % 2 == 0) {
            expected[invite_from(senders[next].first)] = senders[next].second;
            ++next;
        }
        eos_sim::release_shuffled(seed * 100 + static_cast<uint32_t>(round));
        tick_collecting(1);
    }
    eos_sim::hold(false);
    settle([] { return false; }, 3);

    ASSERT_EQ(onInvite->count(), senders.size());
    std::map<std::string, std::string> got;
    for (const host::Call &call : onInvite->calls) {
        ASSERT_EQ(call.args.size(), 2u);
        std::string invite = arg_bytes(call, 0).value_or("");
        EXPECT_EQ(got.count(invite), 0u) << "delivered twice: " << invite;
        got[invite] = arg_bytes(call, 1).value_or("<null>");
    }
    EXPECT_EQ(got, expected);
    expect_clean(1);
}

INSTANTIATE_TEST_SUITE_P(Seeds, InterleavedInvitations, ::testing::Values(1u, 2u, 3u, 4u, 5u, 6u));
