// The friend list: one list query fanning out into a user-info and a presence
// query per friend and mappings queries for all of them, delivered once, by
// whichever completion arrives last; and the friends overlay.
#include "tarnwick_test.h"

#include <algorithm>
#include <map>
#include <memory>
#include <random>

using namespace tw;
using eos_sim::Failure;

namespace {

struct Friend {
    std::optional<std::string> epicId, name, productId;
    std::optional<bool> online;
    bool operator==(const Friend &o) const
    {
        return epicId == o.epicId && name == o.name && productId == o.productId && online == o.online;
    }
};

std::ostream &operator<<(std::ostream &out, const std::optional<Friend> &f)
{
    if (!f)
        return out << "null";
    auto s = [](const std::optional<std::string> &v) { return v ? *v : std::string("-"); };
    return out << "{epicId " << s(f->epicId) << ", name " << s(f->name) << ", online "
               << (f->online ? (*f->online ? "true" : "false") : "-") << ", productId " << s(f->productId) << "}";
}

using Slots = std::vector<std::optional<Friend>>;

struct Delivery {
    bool null_list = false;
    Slots slots;
    int outstanding = 0;  // friend queries issued since the request and not yet completed
};

const char *const kFanOut[] = {"EOS_UserInfo_QueryUserInfo", "EOS_Presence_QueryPresence",
                               "EOS_Connect_QueryExternalAccountMappings"};

int outstanding_since(uint64_t seq)
{
    int n = 0;
    for (const eos_sim::Call &c : eos_sim::calls())
        if (c.seq > seq && !c.result)
            for (const char *f : kFanOut)
                n += c.function == f;
    return n;
}

uint64_t last_seq()
{
    auto all = eos_sim::calls();
    return all.empty() ? 0 : all.back().seq;
}

// Reads a delivered list completely, while the closure runs: afterwards only
// the collector knows of it.
Delivery read_delivery(const host::Call &call, uint64_t since)
{
    Delivery d;
    d.outstanding = outstanding_since(since);
    varray *list = arg_array(call, 0);
    d.null_list = list == nullptr;
    if (!list)
        return d;
    EXPECT_EQ(list->at, &hlt_dynobj);
    for (void *slot : host::array_slots(list)) {
        if (!slot) {
            d.slots.push_back(std::nullopt);
            continue;
        }
        auto *o = static_cast<const vdynobj *>(slot);
        Friend f;
        f.epicId = host::field_bytes(o, "epicId");
        f.name = host::field_bytes(o, "name");
        f.productId = host::field_bytes(o, "productId");
        f.online = host::field_bool(o, "online");
        // A field is either absent or holds a value: never a null string.
        EXPECT_EQ(host::has_field(o, "name"), f.name.has_value());
        EXPECT_EQ(host::has_field(o, "productId"), f.productId.has_value());
        for (const char *field : {"epicId", "productId"}) {
            auto *text = static_cast<vbyte *>(
                hl_dyn_getp(reinterpret_cast<vdynamic *>(const_cast<vdynobj *>(o)), hl_hash_utf8(field), &hlt_bytes));
            if (text)
                EXPECT_EQ(host::bytes_size(text), 33) << field;
        }
        d.slots.push_back(f);
    }
    return d;
}

std::string epic_of(const std::string &account) { return eos_sim::derive_id("epic:" + account); }
std::string puid_of(const std::string &account) { return eos_sim::derive_id("puid:" + account); }

eos_sim::Account player(const std::string &name, std::optional<std::string> product,
                        EOS_Presence_EStatus status = EOS_Presence_EStatus::EOS_PS_Online)
{
    eos_sim::Account a;
    a.name = name;
    a.display_name = "Name of " + name;
    a.friends = {{"me"}};
    a.presence = eos_sim::Presence{status, std::move(product)};
    return a;
}

// Replaces the local player's friends with these accounts, added to the world.
void befriend(const std::vector<eos_sim::Account> &accounts)
{
    eos_sim::update_world([&](eos_sim::World &w) {
        w.accounts[0].friends.clear();
        for (const eos_sim::Account &a : accounts) {
            w.accounts[0].friends.push_back({a.name});
            auto same = [&](const eos_sim::Account &x) { return x.name == a.name; };
            w.accounts.erase(std::remove_if(w.accounts.begin() + 1, w.accounts.end(), same), w.accounts.end());
            w.accounts.push_back(a);
        }
    });
}

Friend full(const std::string &account, const std::string &name, bool online)
{
    return Friend{epic_of(account), name, puid_of(account), online};
}

}  // namespace

class Friends : public TarnwickTest {
protected:
    struct Request {
        host::ClosureRef closure;
        std::shared_ptr<std::vector<Delivery>> got;
        size_t count() const { return got->size(); }
        const Delivery &last() const { return got->back(); }
    };

    Request query()
    {
        auto got = std::make_shared<std::vector<Delivery>>();
        host::ClosureBehaviour behaviour;
        uint64_t since = last_seq();
        behaviour.on_call = [got, since](const host::Call &c) { got->push_back(read_delivery(c, since)); };
        Request r{host::make_closure("PA_v", behaviour), got};
        p.query_friends(r.closure->vm);
        return r;
    }

    // Queries and ticks, collecting before every tick, until delivered.
    Delivery query_and_wait()
    {
        Request r = query();
        for (int i = 0; i < 20 && r.count() == 0; ++i)
            tick_collecting(1);
        tick_collecting(3);
        EXPECT_EQ(r.count(), 1u);
        return r.count() ? r.last() : Delivery{true, {}, -1};
    }

    // With completions held: runs the list query's own completion (the fan-out).
    void release_list_query()
    {
        for (const eos_sim::Pending &pending : eos_sim::pending())
            if (pending.function == "EOS_Friends_QueryFriends")
                eos_sim::release(pending.id);
        tick_collecting(1);
    }

    std::vector<std::string> targets_of(const std::string &function, uint64_t since) const
    {
        std::vector<std::string> out;
        for (const eos_sim::Call &c : eos_sim::calls(function))
            if (c.seq > since)
                out.push_back(c.options["TargetUserId"].get<std::string>());
        return out;
    }
};

TEST_F(Friends, AFailedListQueryDeliversNullOnceAndAsksNothingMore)
{
    sign_in();
    eos_sim::inject("EOS_Friends_QueryFriends", Failure::once(EOS_EResult::EOS_NoConnection));
    Delivery d = query_and_wait();
    EXPECT_TRUE(d.null_list);
    EXPECT_TRUE(logged("[EGS] Failed to query friends : 1"));
    EXPECT_TRUE(eos_sim::calls("EOS_Friends_GetFriendsCount").empty());
    for (const char *f : kFanOut)
        EXPECT_TRUE(eos_sim::calls(f).empty()) << f;
    expect_clean();

    // A not-final result first is no answer yet: the list still comes once.
    eos_sim::inject("EOS_Friends_QueryFriends", Failure::retry());
    d = query_and_wait();
    EXPECT_FALSE(d.null_list);
    EXPECT_EQ(d.slots.size(), 3u);
    expect_clean();
}

TEST_F(Friends, AnEmptyListStillAsksForMappingsAndDeliversAnEmptyArray)
{
    sign_in();
    befriend({});
    for (bool fail : {false, true}) {
        if (fail)
            eos_sim::inject("EOS_Connect_QueryExternalAccountMappings", Failure::once(EOS_EResult::EOS_NoConnection));
        uint64_t since = last_seq();
        Delivery d = query_and_wait();
        EXPECT_FALSE(d.null_list);
        EXPECT_TRUE(d.slots.empty());
        auto mappings = eos_sim::calls("EOS_Connect_QueryExternalAccountMappings");
        ASSERT_FALSE(mappings.empty());
        EXPECT_GT(mappings.back().seq, since);
        EXPECT_EQ(mappings.back().options["ExternalAccountIdCount"], 0);
        expect_clean();
    }
    EXPECT_TRUE(logged("[EGS] Failed to retreive external products id : 1"));
}

TEST_F(Friends, TheTestWorldsFriendsArriveWithWhatEachOfThemHas)
{
    sign_in();
    const std::string me = epic_of("me"), me_puid = puid_of("me");
    Delivery d = query_and_wait();
    ASSERT_FALSE(d.null_list);
    // carol has no presence: her copy fails and she is not playing.
    EXPECT_EQ(d.slots, (Slots{full("alice", "Alice", true), full("bob", "Bob", false), full("carol", "Carol", false)}));
    EXPECT_EQ(d.outstanding, 0);
    EXPECT_TRUE(logged("[EGS] Can't copy presence info : 18"));

    auto list = eos_sim::calls("EOS_Friends_QueryFriends");
    ASSERT_EQ(list.size(), 1u);
    EXPECT_EQ(list[0].options, (nlohmann::json{{"ApiVersion", 1}, {"LocalUserId", me}}));
    EXPECT_EQ(eos_sim::calls("EOS_Friends_GetFriendsCount")[0].options,
              (nlohmann::json{{"ApiVersion", 1}, {"LocalUserId", me}}));
    auto at = eos_sim::calls("EOS_Friends_GetFriendAtIndex");
    ASSERT_EQ(at.size(), 3u);
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(at[i].options, (nlohmann::json{{"ApiVersion", 1}, {"LocalUserId", me}, {"Index", i}}));
    for (const char *f : {"EOS_UserInfo_QueryUserInfo", "EOS_Presence_QueryPresence"}) {
        auto calls = eos_sim::calls(f);
        ASSERT_EQ(calls.size(), 3u) << f;
        for (const auto &c : calls) {
            EXPECT_EQ(c.options["ApiVersion"], 1);
            EXPECT_EQ(c.options["LocalUserId"], me);
        }
        // Every per-friend query carries the one record of the request.
        EXPECT_EQ(calls[0].client_data, calls[2].client_data);
    }
    EXPECT_EQ(targets_of("EOS_Presence_QueryPresence", 0),
              (std::vector<std::string>{epic_of("alice"), epic_of("bob"), epic_of("carol")}));
    auto mappings = eos_sim::calls("EOS_Connect_QueryExternalAccountMappings");
    ASSERT_EQ(mappings.size(), 1u);
    EXPECT_EQ(mappings[0].options["ApiVersion"], 1);
    EXPECT_EQ(mappings[0].options["LocalUserId"], me_puid);
    EXPECT_EQ(mappings[0].options["AccountIdType"], 0);
    EXPECT_EQ(mappings[0].options["ExternalAccountIds"],
              (nlohmann::json{epic_of("alice"), epic_of("bob"), epic_of("carol")}));
    for (const auto &c : eos_sim::calls("EOS_UserInfo_CopyUserInfo"))
        EXPECT_EQ(c.options["ApiVersion"], 3);
    for (const auto &c : eos_sim::calls("EOS_Presence_CopyPresence")) {
        EXPECT_EQ(c.options["ApiVersion"], 3);
        EXPECT_EQ(c.options["LocalUserId"], me);
    }
    auto get = eos_sim::calls("EOS_Connect_GetExternalAccountMapping");
    ASSERT_EQ(get.size(), 3u);
    EXPECT_EQ(get[1].options, (nlohmann::json{{"ApiVersion", 1},
                                              {"LocalUserId", me_puid},
                                              {"AccountIdType", 0},
                                              {"TargetExternalUserId", epic_of("bob")}}));
    expect_clean();
}

TEST_F(Friends, OneFriendIsDeliveredByWhicheverOfItsThreeCompletionsArrivesLast)
{
    sign_in();
    befriend({player("alice", std::string(eos_sim::kThisProduct))});
    eos_sim::hold(true);
    std::vector<int> order = {0, 1, 2};
    do {
        Request r = query();
        release_list_query();
        std::vector<eos_sim::Pending> held = eos_sim::pending();
        ASSERT_EQ(held.size(), 3u);
        // While gathering, the list is rooted along with the closure's cell.
        EXPECT_EQ(hlrt::root_count(), 2u);
        for (size_t step = 0; step < 3; ++step) {
            EXPECT_EQ(r.count(), 0u) << "before " << held[order[step]].function;
            eos_sim::release(held[order[step]].id);
            tick_collecting(1);
        }
        ASSERT_EQ(r.count(), 1u) << "last: " << held[order[2]].function;
        EXPECT_EQ(r.last().outstanding, 0);
        EXPECT_EQ(r.last().slots, (Slots{full("alice", "Name of alice", true)}));
        tick_collecting(2);
        EXPECT_EQ(r.count(), 1u);
        expect_clean();
    } while (std::next_permutation(order.begin(), order.end()));
}

TEST_F(Friends, OnlineMeansTheVeryProductIdWhateverTheStatus)
{
    host::InitConfigValues values = config();
    ASSERT_EQ(values.eosProductId, std::optional<std::string>("tarnwick-product"));
    sign_in();
    befriend({player("prefix", std::string("tarnwick-produc")), player("extension", std::string("tarnwick-product2")),
              player("case", std::string("Tarnwick-Product")), player("same_away", std::string("tarnwick-product"), EOS_Presence_EStatus::EOS_PS_Away),
              player("same_offline", std::string("tarnwick-product"), EOS_Presence_EStatus::EOS_PS_Offline),
              player("nothing", std::nullopt), player("empty", std::string(""))});
    Delivery d = query_and_wait();
    std::vector<std::optional<bool>> online;
    for (const auto &slot : d.slots)
        online.push_back(slot ? slot->online : std::nullopt);
    EXPECT_EQ(online, (std::vector<std::optional<bool>>{false, false, false, true, true, false, false}));
    expect_clean();
}

TEST_F(Friends, AFailedPresenceQueryLeavesOnlineAbsentAndAFailedCopyLeavesItFalse)
{
    sign_in();
    befriend({player("a", std::string(eos_sim::kThisProduct)), player("b", std::string(eos_sim::kThisProduct)),
              player("c", std::string(eos_sim::kThisProduct))});
    eos_sim::inject("EOS_Presence_QueryPresence", Failure::once(EOS_EResult::EOS_TooManyRequests).on_call(1));
    eos_sim::inject("EOS_Presence_CopyPresence", Failure::once(EOS_EResult::EOS_NoConnection));
    Delivery d = query_and_wait();
    ASSERT_EQ(d.slots.size(), 3u);
    EXPECT_EQ(d.slots[0], (Friend{epic_of("a"), "Name of a", puid_of("a"), std::nullopt}));
    // The first presence copy made is b's (a's query failed).
    EXPECT_EQ(d.slots[1], full("b", "Name of b", false));
    EXPECT_EQ(d.slots[2], full("c", "Name of c", true));
    EXPECT_TRUE(logged("[EGS] Can't receive presence info : 8"));
    EXPECT_TRUE(logged("[EGS] Can't copy presence info : 1"));
    expect_clean();
}

TEST_F(Friends, AFailedUserInfoQueryOrCopyOrAMissingDisplayNameLeavesNameAbsent)
{
    sign_in();
    eos_sim::Account anonymous = player("anonymous", std::string("elsewhere"));
    anonymous.display_name.reset();
    befriend({player("a", std::nullopt), player("b", std::nullopt), player("c", std::nullopt), anonymous});
    // Sign-in queried and copied the local player's own user info already.
    int queries_before = static_cast<int>(eos_sim::calls("EOS_UserInfo_QueryUserInfo").size());
    size_t copies_before = eos_sim::calls("EOS_UserInfo_CopyUserInfo").size();
    eos_sim::inject("EOS_UserInfo_QueryUserInfo",
                    Failure::once(EOS_EResult::EOS_TooManyRequests).on_call(queries_before + 2));
    eos_sim::inject("EOS_UserInfo_CopyUserInfo",
                    Failure::once(EOS_EResult::EOS_NoConnection).on_call(static_cast<int>(copies_before) + 2));
    size_t lines_before = egs_lines().size();
    Delivery d = query_and_wait();
    ASSERT_EQ(d.slots.size(), 4u);
    EXPECT_EQ(d.slots[1], (Friend{epic_of("b"), std::nullopt, puid_of("b"), false}));
    // Of a, c and anonymous, the second copy made failed: that one has no name either.
    auto copies = eos_sim::calls("EOS_UserInfo_CopyUserInfo");
    ASSERT_EQ(copies.size(), copies_before + 3);
    std::string failed = copies[copies_before + 1].options["TargetUserId"];
    for (const std::string who : {"a", "c", "anonymous"}) {
        size_t i = who == "a" ? 0 : who == "c" ? 2 : 3;
        bool named = who != "anonymous" && epic_of(who) != failed;
        EXPECT_EQ(d.slots[i], (Friend{epic_of(who), named ? std::optional<std::string>("Name of " + who) : std::nullopt,
                                      puid_of(who), false}))
            << who;
    }
    std::vector<std::string> lines = egs_lines();
    lines.erase(lines.begin(), lines.begin() + static_cast<long>(lines_before));
    EXPECT_EQ(std::count(lines.begin(), lines.end(), "[EGS] Failed to retreive user infos : 8"), 1);
    EXPECT_EQ(std::count(lines.begin(), lines.end(), "[EGS] Failed to retreive name : 1"), 1);
    expect_clean();
}

TEST_F(Friends, FailedMappingsLeaveEveryProductIdAbsentAndAFriendWithoutOneGetsNone)
{
    sign_in();
    eos_sim::update_world([](eos_sim::World &w) { w.accounts[2].has_connect_user = false; });  // bob
    Delivery d = query_and_wait();
    ASSERT_EQ(d.slots.size(), 3u);
    EXPECT_EQ(d.slots[0]->productId, puid_of("alice"));
    EXPECT_EQ(d.slots[1]->productId, std::nullopt);
    EXPECT_EQ(d.slots[2]->productId, puid_of("carol"));

    eos_sim::inject("EOS_Connect_QueryExternalAccountMappings", Failure::once(EOS_EResult::EOS_TooManyRequests));
    d = query_and_wait();
    EXPECT_EQ(d.slots, (Slots{Friend{epic_of("alice"), "Alice", std::nullopt, true},
                              Friend{epic_of("bob"), "Bob", std::nullopt, false},
                              Friend{epic_of("carol"), "Carol", std::nullopt, false}}));
    EXPECT_TRUE(logged("[EGS] Failed to retreive external products id : 8"));
    expect_clean();
}

// The simulator reports each per-friend completion for the very handle that
// was queried, so a TargetUserId matching no slot cannot be produced here.

TEST_F(Friends, InvalidEntriesGetANullSlotAndNoQueries)
{
    sign_in();
    eos_sim::update_world([](eos_sim::World &w) {
        w.accounts[0].friends = {{"alice"}, {"bob", true}, {"carol"}, {"dave", true}};
    });
    uint64_t since = last_seq();
    Delivery d = query_and_wait();
    EXPECT_EQ(d.slots, (Slots{full("alice", "Alice", true), std::nullopt, full("carol", "Carol", false), std::nullopt}));
    EXPECT_TRUE(logged("[EGS] Invalid friend id (index 1)"));
    EXPECT_TRUE(logged("[EGS] Invalid friend id (index 3)"));
    const std::vector<std::string> valid = {epic_of("alice"), epic_of("carol")};
    EXPECT_EQ(targets_of("EOS_UserInfo_QueryUserInfo", since), valid);
    EXPECT_EQ(targets_of("EOS_Presence_QueryPresence", since), valid);
    auto mappings = eos_sim::calls("EOS_Connect_QueryExternalAccountMappings");
    ASSERT_EQ(mappings.size(), 1u);
    EXPECT_EQ(mappings[0].options["ExternalAccountIds"], nlohmann::json(valid));
    EXPECT_EQ(mappings[0].options["ExternalAccountIdCount"], 2);
    expect_clean();

    // Only invalid entries: nothing per friend, an empty mappings query, the list once.
    eos_sim::update_world([](eos_sim::World &w) { w.accounts[0].friends = {{"bob", true}, {"dave", true}}; });
    since = last_seq();
    d = query_and_wait();
    EXPECT_EQ(d.slots, (Slots{std::nullopt, std::nullopt}));
    EXPECT_TRUE(targets_of("EOS_UserInfo_QueryUserInfo", since).empty());
    EXPECT_EQ(eos_sim::calls("EOS_Connect_QueryExternalAccountMappings").back().options["ExternalAccountIdCount"], 0);
    expect_clean();
}

TEST_F(Friends, LargeListsAskForMappingsInBatchesOf128AndABatchFailsAlone)
{
    sign_in();
    std::vector<eos_sim::Account> many;
    for (int i = 0; i < 300; ++i)
        many.push_back(player("f" + std::to_string(i), std::string(i % 2 ? "elsewhere" : eos_sim::kThisProduct)));
    for (int total : {129, 300}) {
        befriend(std::vector<eos_sim::Account>(many.begin(), many.begin() + total));
        size_t before = eos_sim::calls("EOS_Connect_QueryExternalAccountMappings").size();
        if (total == 300)
            eos_sim::inject("EOS_Connect_QueryExternalAccountMappings",
                            Failure::once(EOS_EResult::EOS_TooManyRequests).on_call(static_cast<int>(before) + 2));
        Delivery d = query_and_wait();
        ASSERT_EQ(d.slots.size(), static_cast<size_t>(total));
        auto batches = eos_sim::calls("EOS_Connect_QueryExternalAccountMappings");
        batches.erase(batches.begin(), batches.begin() + static_cast<long>(before));
        std::vector<int> sizes;
        nlohmann::json asked = nlohmann::json::array();
        for (const auto &b : batches) {
            sizes.push_back(b.options["ExternalAccountIdCount"]);
            for (const auto &id : b.options["ExternalAccountIds"])
                asked.push_back(id);
        }
        EXPECT_EQ(sizes, (total == 129 ? std::vector<int>{128, 1} : std::vector<int>{128, 128, 44}));
        ASSERT_EQ(asked.size(), static_cast<size_t>(total));
        for (int i = 0; i < total; ++i) {
            std::string who = "f" + std::to_string(i);
            EXPECT_EQ(asked[i], epic_of(who));
            bool mapped = total == 129 || i < 128 || i >= 256;
            EXPECT_EQ(d.slots[i], (Friend{epic_of(who), "Name of " + who,
                                          mapped ? std::optional<std::string>(puid_of(who)) : std::nullopt, i % 2 == 0}))
                << i;
        }
        expect_clean();
    }
}

TEST_F(Friends, ACountThatIsNoListGivesAnEmptyOneAndTooLargeACountNullSlots)
{
    sign_in();
    for (int32_t count : {-1, INT32_MIN, (1 << 20) + 1, INT32_MAX}) {
        eos_sim::force_friends_count(count);
        Delivery d = query_and_wait();
        EXPECT_FALSE(d.null_list);
        EXPECT_TRUE(d.slots.empty());
        EXPECT_TRUE(logged("[EGS] Invalid friends count : " + std::to_string(count)));
        EXPECT_EQ(eos_sim::calls("EOS_Connect_QueryExternalAccountMappings").back().options["ExternalAccountIdCount"], 0);
    }
    EXPECT_TRUE(eos_sim::calls("EOS_Friends_GetFriendAtIndex").empty());
    // More than the SDK lists: the indices past its end are invalid ids.
    eos_sim::force_friends_count(5);
    Delivery d = query_and_wait();
    EXPECT_EQ(d.slots, (Slots{full("alice", "Alice", true), full("bob", "Bob", false), full("carol", "Carol", false),
                              std::nullopt, std::nullopt}));
    EXPECT_TRUE(logged("[EGS] Invalid friend id (index 4)"));
    expect_clean();
}

TEST_F(Friends, TwoRequestsInFlightAreGatheredAndDeliveredIndependently)
{
    sign_in();
    // The first mappings query fails: only the first request lacks product ids.
    eos_sim::inject("EOS_Connect_QueryExternalAccountMappings", Failure::once(EOS_EResult::EOS_NoConnection));
    eos_sim::hold(true);
    Request first = query();
    Request second = query();
    eos_sim::release_all();
    tick_collecting(1);
    EXPECT_EQ(hlrt::root_count(), 4u);  // a cell and a list each
    eos_sim::release_shuffled(7);
    tick_collecting(1);
    ASSERT_EQ(first.count(), 1u);
    ASSERT_EQ(second.count(), 1u);
    EXPECT_EQ(first.last().slots, (Slots{Friend{epic_of("alice"), "Alice", std::nullopt, true},
                                         Friend{epic_of("bob"), "Bob", std::nullopt, false},
                                         Friend{epic_of("carol"), "Carol", std::nullopt, false}}));
    EXPECT_EQ(second.last().slots,
              (Slots{full("alice", "Alice", true), full("bob", "Bob", false), full("carol", "Carol", false)}));
    EXPECT_NE(arg_array(first.closure->last(), 0), arg_array(second.closure->last(), 0));
    tick_collecting(2);
    EXPECT_EQ(first.count() + second.count(), 2u);
    expect_clean();
}

TEST_F(Friends, WithoutAClosureEverythingRunsAndNothingIsLeft)
{
    sign_in();
    eos_sim::hold(true);
    size_t lines = egs_lines().size();
    p.query_friends(nullptr);
    EXPECT_EQ(eos_sim::calls("EOS_Friends_QueryFriends")[0].client_data, nullptr);
    EXPECT_EQ(hlrt::root_count(), 0u);
    release_list_query();
    EXPECT_EQ(hlrt::root_count(), 1u);  // the list alone
    EXPECT_EQ(eos_sim::pending().size(), 7u);
    eos_sim::hold(false);
    tick_collecting(3);
    for (const char *f : kFanOut)
        for (const auto &c : eos_sim::calls(f))
            EXPECT_EQ(c.result, std::optional<EOS_EResult>(EOS_EResult::EOS_Success)) << f;
    EXPECT_EQ(eos_sim::calls("EOS_Connect_GetExternalAccountMapping").size(), 3u);
    EXPECT_EQ(egs_lines().size(), lines + 1);  // carol's presence copy
    expect_clean();
}

TEST_F(Friends, NothingIsAskedWithoutAPlatform)
{
    host::ClosureRef onFriends = host::make_closure("PA_v");
    p.query_friends(onFriends->vm);
    p.show_friends();
    EXPECT_EQ(onFriends->count(), 0u);
    EXPECT_TRUE(logged("[EGS] No EOS platform, query_friends ignored"));
    EXPECT_TRUE(logged("[EGS] No EOS platform, show_friends ignored"));
    EXPECT_TRUE(eos_sim::calls().empty());
    expect_clean();
}

TEST_F(Friends, TheOverlayOpensForTheLocalUserAndReportsNothing)
{
    sign_in();
    size_t lines = egs_lines().size();
    p.show_friends();
    auto shown = eos_sim::calls("EOS_UI_ShowFriends");
    ASSERT_EQ(shown.size(), 1u);
    EXPECT_EQ(shown[0].options, (nlohmann::json{{"ApiVersion", 1}, {"LocalUserId", epic_of("me")}}));
    EXPECT_EQ(shown[0].client_data, nullptr);
    tick_collecting(2);
    EXPECT_EQ(eos_sim::calls("EOS_UI_ShowFriends")[0].result, std::optional<EOS_EResult>(EOS_EResult::EOS_Success));
    EXPECT_EQ(egs_lines().size(), lines);
    expect_clean();
}

TEST_F(Friends, AnOverlayTheSdkRefusesIsNeitherLoggedNorReported)
{
    host::InitConfigValues values = config();
    values.enableOverlay = false;
    host::ClosureRef onLogin = host::make_closure("PiBBB_v");
    ASSERT_TRUE(init(values, onLogin));
    ASSERT_TRUE(tick_until([&] { return onLogin->count() > 0; }));
    size_t lines = egs_lines().size();
    p.show_friends();
    tick_collecting(2);
    auto shown = eos_sim::calls("EOS_UI_ShowFriends");
    ASSERT_EQ(shown.size(), 1u);
    EXPECT_EQ(shown[0].result, std::optional<EOS_EResult>(EOS_EResult::EOS_NotConfigured));
    EXPECT_EQ(egs_lines().size(), lines);
    expect_clean();
}

// Random friend lists, random failures, every completion order: the list is
// delivered once, after its last completion, with what each friend's own
// successful steps gave it.
TEST_F(Friends, AFriendListedTwiceIsFilledInItsFirstSlotWhateverTheOrder)
{
    sign_in();
    befriend({player("alice", std::string(eos_sim::kThisProduct)), player("bob", std::nullopt)});
    eos_sim::update_world([](eos_sim::World &w) { w.accounts[0].friends.push_back({"alice"}); });
    eos_sim::hold(true);
    for (bool reversed : {false, true}) {
        SCOPED_TRACE(reversed ? "completions reversed" : "completions in order");
        Request r = query();
        release_list_query();
        std::vector<uint64_t> ids;
        for (const eos_sim::Pending &pending : eos_sim::pending())
            ids.push_back(pending.id);
        ASSERT_EQ(ids.size(), 7u);
        if (reversed)
            std::reverse(ids.begin(), ids.end());
        eos_sim::release_in_order(ids);
        tick_collecting(1);
        ASSERT_EQ(r.count(), 1u);
        // The second alice only has what the mappings give by position.
        Friend second{epic_of("alice"), std::nullopt, puid_of("alice"), std::nullopt};
        EXPECT_EQ(r.last().slots, (Slots{full("alice", "Name of alice", true), full("bob", "Name of bob", false), second}));
        expect_clean();
    }
}

TEST_F(Friends, AnyOrderOfCompletionsDeliversOnceAfterTheLastWithTheExpectedFields)
{
    sign_in();
    eos_sim::hold(true);
    const std::string product = "tarnwick-product";
    std::map<std::string, int> issued = {{"EOS_UserInfo_QueryUserInfo", 0},
                                         {"EOS_Presence_QueryPresence", 0},
                                         {"EOS_UserInfo_CopyUserInfo", 0},
                                         {"EOS_Presence_CopyPresence", 0}};
    for (uint32_t seed = 1; seed <= 200; ++seed) {
        SCOPED_TRACE("seed " + std::to_string(seed));
        std::mt19937 rng(seed);
        auto chance = [&](int percent) { return static_cast<int>(rng() % 100) < percent; };
        int n = static_cast<int>(rng() % 13);

        struct Plan {
            std::string account;
            bool invalid = false, known = true, named = true, connect = true;
            bool info_fails = false, presence_fails = false;
            std::optional<std::string> product;
            bool has_presence = true;
        };
        std::vector<Plan> plan(static_cast<size_t>(n));
        std::vector<eos_sim::Account> accounts;
        std::vector<eos_sim::FriendEntry> entries;
        for (int i = 0; i < n; ++i) {
            Plan &f = plan[static_cast<size_t>(i)];
            f.account = "p" + std::to_string(i);
            f.invalid = chance(10);
            f.known = !chance(8);
            if (!f.known)
                f.account = "ghost" + std::to_string(i);
            f.named = chance(85);
            f.connect = chance(80);
            f.has_presence = chance(80);
            int which = static_cast<int>(rng() % 4);
            f.product = which == 0 ? std::optional<std::string>(product)
                        : which == 1 ? std::optional<std::string>(product + "x")
                        : which == 2 ? std::optional<std::string>("elsewhere")
                                     : std::nullopt;
            f.info_fails = chance(15);
            f.presence_fails = chance(15);
            entries.push_back({f.account, f.invalid});
            if (f.known) {
                eos_sim::Account a = player(f.account, f.product);
                if (!f.named)
                    a.display_name.reset();
                if (!f.has_presence)
                    a.presence.reset();
                a.has_connect_user = f.connect;
                accounts.push_back(a);
            }
        }
        eos_sim::update_world([&](eos_sim::World &w) {
            w.accounts.resize(1);
            w.accounts.insert(w.accounts.end(), accounts.begin(), accounts.end());
            w.accounts[0].friends = entries;
        });
        eos_sim::clear_injections();
        // Failures are aimed by call number, counted since the start; the
        // records themselves are cleared for every seed to keep this fast.
        for (auto &[f, count] : issued)
            count += static_cast<int>(eos_sim::calls(f).size());
        eos_sim::clear_calls();
        int info_base = issued["EOS_UserInfo_QueryUserInfo"], presence_base = issued["EOS_Presence_QueryPresence"];
        int valid = 0;
        for (const Plan &f : plan) {
            if (f.invalid)
                continue;
            ++valid;
            if (f.info_fails)
                eos_sim::inject("EOS_UserInfo_QueryUserInfo",
                                Failure::once(EOS_EResult::EOS_NoConnection).on_call(info_base + valid));
            if (f.presence_fails)
                eos_sim::inject("EOS_Presence_QueryPresence",
                                Failure::once(EOS_EResult::EOS_NoConnection).on_call(presence_base + valid));
        }
        bool mappings_fail = chance(15);
        if (mappings_fail)
            eos_sim::inject("EOS_Connect_QueryExternalAccountMappings", Failure::once(EOS_EResult::EOS_NoConnection));
        int copy_info_base = issued["EOS_UserInfo_CopyUserInfo"], copy_presence_base = issued["EOS_Presence_CopyPresence"];
        int failing_info_copy = chance(30) ? 1 + static_cast<int>(rng() % 3) : 0;
        int failing_presence_copy = chance(30) ? 1 + static_cast<int>(rng() % 3) : 0;
        if (failing_info_copy)
            eos_sim::inject("EOS_UserInfo_CopyUserInfo",
                            Failure::once(EOS_EResult::EOS_NoConnection).on_call(copy_info_base + failing_info_copy));
        if (failing_presence_copy)
            eos_sim::inject("EOS_Presence_CopyPresence",
                            Failure::once(EOS_EResult::EOS_NoConnection).on_call(copy_presence_base + failing_presence_copy));
        if (chance(20))
            eos_sim::inject("EOS_Presence_QueryPresence", Failure::retry());

        Request r = query();
        release_list_query();
        ASSERT_EQ(eos_sim::pending().size(), static_cast<size_t>(2 * valid + 1));
        if (seed % 2) {
            // Every completion in one tick, in a shuffled order.
            while (!eos_sim::pending().empty()) {
                eos_sim::release_shuffled(seed);
                tick_collecting(1);
            }
        } else {
            // One completion per tick, collecting in between: nothing before the last.
            std::vector<eos_sim::Pending> held;
            while (!(held = eos_sim::pending()).empty()) {
                EXPECT_EQ(r.count(), 0u);
                eos_sim::release(held[rng() % held.size()].id);
                tick_collecting(1);
            }
        }
        ASSERT_EQ(r.count(), 1u);
        const Delivery &d = r.last();
        EXPECT_EQ(d.outstanding, 0);
        ASSERT_FALSE(d.null_list);

        // Which friends the failing copies hit, as the SDK recorded them.
        auto copied_target = [](const char *f, int k) {
            auto calls = eos_sim::calls(f);
            return k && k <= static_cast<int>(calls.size())
                       ? calls[static_cast<size_t>(k - 1)].options["TargetUserId"].get<std::string>()
                       : std::string();
        };
        std::string info_copy_failed = copied_target("EOS_UserInfo_CopyUserInfo", failing_info_copy);
        std::string presence_copy_failed = copied_target("EOS_Presence_CopyPresence", failing_presence_copy);
        Slots expected;
        for (const Plan &f : plan) {
            if (f.invalid) {
                expected.push_back(std::nullopt);
                continue;
            }
            Friend e;
            std::string id = epic_of(f.account);
            e.epicId = id;
            if (f.known && !f.info_fails && f.named && id != info_copy_failed)
                e.name = "Name of " + f.account;
            if (f.known && !f.presence_fails)
                e.online = f.has_presence && id != presence_copy_failed && f.product == product;
            if (f.known && f.connect && !mappings_fail)
                e.productId = puid_of(f.account);
            expected.push_back(e);
        }
        EXPECT_EQ(d.slots, expected);
        tick_collecting(2);
        EXPECT_EQ(r.count(), 1u);
        expect_clean();
        if (HasFailure())
            break;
    }
}
