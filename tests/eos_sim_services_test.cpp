// The simulator's Friends, Presence, Connect mappings, UI, Achievements and Ecom services,
// driven through the EOS_* functions the way the library calls them.
#include <gtest/gtest.h>

#include <ctime>
#include <string>
#include <vector>

#include <eos_sim.h>

namespace {

constexpr const char* kProduct = "tw-product";

// Completion record of one async call, filled by `capture`.
template <class Info>
struct Got {
    int calls = 0;
    EOS_EResult result = EOS_EResult::EOS_UnexpectedError;
    Info info{};
};

template <class Info>
void EOS_CALL capture(const Info* data) {
    auto* got = static_cast<Got<Info>*>(data->ClientData);
    ++got->calls;
    got->result = data->ResultCode;
    got->info = *data;
}

// Ownership entries are valid during the callback only: they are copied out there.
struct Owned {
    int calls = 0;
    EOS_EResult result = EOS_EResult::EOS_UnexpectedError;
    std::vector<std::pair<std::string, EOS_EOwnershipStatus>> items;
};

void EOS_CALL on_ownership(const EOS_Ecom_QueryOwnershipCallbackInfo* data) {
    auto* got = static_cast<Owned*>(data->ClientData);
    ++got->calls;
    got->result = data->ResultCode;
    for (uint32_t i = 0; i < data->ItemOwnershipCount; ++i) {
        EXPECT_EQ(data->ItemOwnership[i].ApiVersion, EOS_ECOM_ITEMOWNERSHIP_API_LATEST);
        got->items.emplace_back(data->ItemOwnership[i].Id, data->ItemOwnership[i].OwnershipStatus);
    }
}

class Services : public ::testing::Test {
protected:
    virtual uint64_t flags() const { return 0; }

    void SetUp() override {
        eos_sim::reset();
        EOS_InitializeOptions init{};
        init.ApiVersion = EOS_INITIALIZE_API_LATEST;
        init.ProductName = "tarnwick tests";
        init.ProductVersion = "1.0";
        ASSERT_EQ(EOS_Initialize(&init), EOS_EResult::EOS_Success);
        EOS_Platform_Options po{};
        po.ApiVersion = EOS_PLATFORM_OPTIONS_API_LATEST;
        po.ProductId = kProduct;
        po.SandboxId = "tw-sandbox";
        po.DeploymentId = "tw-deployment";
        po.Flags = flags();
        platform_ = EOS_Platform_Create(&po);
        ASSERT_NE(platform_, nullptr);
        eos_sim::sign_in("player");
        me_ = eos_sim::epic_account_id("player");
        me_puid_ = eos_sim::product_user_id("player");
    }

    void TearDown() override {
        if (platform_) EOS_Platform_Release(platform_);
        EOS_Shutdown();
        EXPECT_EQ(eos_sim::outstanding_total(), 0);
        EXPECT_TRUE(eos_sim::faults().empty()) << eos_sim::faults().front();
    }

    void tick(int n = 2) {
        for (int i = 0; i < n; ++i) EOS_Platform_Tick(platform_);
    }

    EOS_HFriends friends() { return EOS_Platform_GetFriendsInterface(platform_); }
    EOS_HPresence presence() { return EOS_Platform_GetPresenceInterface(platform_); }
    EOS_HConnect connect() { return EOS_Platform_GetConnectInterface(platform_); }
    EOS_HAchievements achievements() { return EOS_Platform_GetAchievementsInterface(platform_); }
    EOS_HEcom ecom() { return EOS_Platform_GetEcomInterface(platform_); }

    EOS_EResult query_friends(EOS_EpicAccountId local) {
        Got<EOS_Friends_QueryFriendsCallbackInfo> got;
        EOS_Friends_QueryFriendsOptions o{EOS_FRIENDS_QUERYFRIENDS_API_LATEST, local};
        EOS_Friends_QueryFriends(friends(), &o, &got, &capture<EOS_Friends_QueryFriendsCallbackInfo>);
        EXPECT_EQ(got.calls, 0) << "completed inside the call";
        tick();
        EXPECT_EQ(got.calls, 1);
        return got.result;
    }
    int32_t friends_count() {
        EOS_Friends_GetFriendsCountOptions o{EOS_FRIENDS_GETFRIENDSCOUNT_API_LATEST, me_};
        return EOS_Friends_GetFriendsCount(friends(), &o);
    }
    EOS_EpicAccountId friend_at(int32_t i) {
        EOS_Friends_GetFriendAtIndexOptions o{EOS_FRIENDS_GETFRIENDATINDEX_API_LATEST, me_, i};
        return EOS_Friends_GetFriendAtIndex(friends(), &o);
    }

    Got<EOS_Presence_QueryPresenceCallbackInfo> query_presence(const std::string& target) {
        Got<EOS_Presence_QueryPresenceCallbackInfo> got;
        EOS_Presence_QueryPresenceOptions o{EOS_PRESENCE_QUERYPRESENCE_API_LATEST, me_,
                                            eos_sim::epic_account_id(target)};
        EOS_Presence_QueryPresence(presence(), &o, &got, &capture<EOS_Presence_QueryPresenceCallbackInfo>);
        tick();
        return got;
    }
    EOS_EResult copy_presence(const std::string& target, EOS_Presence_Info** out) {
        EOS_Presence_CopyPresenceOptions o{EOS_PRESENCE_COPYPRESENCE_API_LATEST, me_, eos_sim::epic_account_id(target)};
        return EOS_Presence_CopyPresence(presence(), &o, out);
    }

    EOS_EResult query_mappings(const std::vector<const char*>& ids, uint32_t count) {
        Got<EOS_Connect_QueryExternalAccountMappingsCallbackInfo> got;
        EOS_Connect_QueryExternalAccountMappingsOptions o{};
        o.ApiVersion = EOS_CONNECT_QUERYEXTERNALACCOUNTMAPPINGS_API_LATEST;
        o.LocalUserId = me_puid_;
        o.AccountIdType = EOS_EExternalAccountType::EOS_EAT_EPIC;
        o.ExternalAccountIds = ids.empty() ? nullptr : const_cast<const char**>(ids.data());
        o.ExternalAccountIdCount = count;
        EOS_Connect_QueryExternalAccountMappings(connect(), &o, &got,
                                                 &capture<EOS_Connect_QueryExternalAccountMappingsCallbackInfo>);
        tick();
        EXPECT_EQ(got.calls, 1);
        EXPECT_EQ(got.info.LocalUserId, me_puid_);
        return got.result;
    }
    EOS_ProductUserId mapping(const std::string& epic_text) {
        EOS_Connect_GetExternalAccountMappingsOptions o{EOS_CONNECT_GETEXTERNALACCOUNTMAPPING_API_LATEST, me_puid_,
                                                        EOS_EExternalAccountType::EOS_EAT_EPIC, epic_text.c_str()};
        return EOS_Connect_GetExternalAccountMapping(connect(), &o);
    }

    EOS_EResult query_achievements(EOS_ProductUserId target) {
        Got<EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo> got;
        EOS_Achievements_QueryPlayerAchievementsOptions o{EOS_ACHIEVEMENTS_QUERYPLAYERACHIEVEMENTS_API_LATEST, target,
                                                          me_puid_};
        EOS_Achievements_QueryPlayerAchievements(
            achievements(), &o, &got, &capture<EOS_Achievements_OnQueryPlayerAchievementsCompleteCallbackInfo>);
        tick();
        EXPECT_EQ(got.calls, 1);
        EXPECT_EQ(got.info.UserId, target);
        return got.result;
    }
    uint32_t achievement_count() {
        EOS_Achievements_GetPlayerAchievementCountOptions o{EOS_ACHIEVEMENTS_GETPLAYERACHIEVEMENTCOUNT_API_LATEST,
                                                            me_puid_};
        return EOS_Achievements_GetPlayerAchievementCount(achievements(), &o);
    }
    // Copies index i; returns {result, id, unlock time} and releases the copy.
    struct Copied {
        EOS_EResult result;
        std::string id;
        int64_t unlock = 0;
    };
    Copied copy_achievement(uint32_t i, int32_t version = EOS_ACHIEVEMENTS_COPYPLAYERACHIEVEMENTBYINDEX_API_LATEST,
                            EOS_ProductUserId local = nullptr) {
        EOS_Achievements_CopyPlayerAchievementByIndexOptions o{version, me_puid_, i, local ? local : me_puid_};
        EOS_Achievements_PlayerAchievement* a = nullptr;
        Copied c{EOS_Achievements_CopyPlayerAchievementByIndex(achievements(), &o, &a), {}, 0};
        if (c.result == EOS_EResult::EOS_Success) {
            EXPECT_EQ(a->ApiVersion, EOS_ACHIEVEMENTS_PLAYERACHIEVEMENT_API_LATEST);
            c.id = a->AchievementId;
            c.unlock = a->UnlockTime;
            EOS_Achievements_PlayerAchievement_Release(a);
        } else {
            EXPECT_EQ(a, nullptr);
        }
        return c;
    }
    Got<EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo> unlock(std::vector<const char*> ids) {
        Got<EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo> got;
        EOS_Achievements_UnlockAchievementsOptions o{EOS_ACHIEVEMENTS_UNLOCKACHIEVEMENTS_API_LATEST, me_puid_,
                                                     ids.data(), static_cast<uint32_t>(ids.size())};
        EOS_Achievements_UnlockAchievements(achievements(), &o, &got,
                                            &capture<EOS_Achievements_OnUnlockAchievementsCompleteCallbackInfo>);
        tick();
        return got;
    }

    Owned query_ownership(std::vector<const char*> ids, uint32_t count) {
        Owned got;
        EOS_Ecom_QueryOwnershipOptions o{EOS_ECOM_QUERYOWNERSHIP_API_LATEST, me_, ids.empty() ? nullptr : ids.data(),
                                         count, nullptr};
        EOS_Ecom_QueryOwnership(ecom(), &o, &got, &on_ownership);
        tick();
        EXPECT_EQ(got.calls, 1);
        return got;
    }
    Got<EOS_Ecom_CheckoutCallbackInfo> checkout(std::vector<EOS_Ecom_CheckoutEntry> entries) {
        Got<EOS_Ecom_CheckoutCallbackInfo> got;
        EOS_Ecom_CheckoutOptions o{EOS_ECOM_CHECKOUT_API_LATEST, me_, nullptr, static_cast<uint32_t>(entries.size()),
                                   entries.data()};
        EOS_Ecom_Checkout(ecom(), &o, &got, &capture<EOS_Ecom_CheckoutCallbackInfo>);
        tick();
        EXPECT_EQ(got.calls, 1);
        return got;
    }

    EOS_HPlatform platform_ = nullptr;
    EOS_EpicAccountId me_ = nullptr;
    EOS_ProductUserId me_puid_ = nullptr;
};

class ServicesWithoutOverlay : public Services {
protected:
    uint64_t flags() const override { return EOS_PF_DISABLE_OVERLAY; }
};

std::string epic_text_of(const std::string& account) {
    for (const auto& a : eos_sim::get_world().accounts)
        if (a.name == account) return a.epic_id;
    return {};
}

// ---- Friends --------------------------------------------------------------------------------

TEST_F(Services, FriendListIsCachedByTheQueryInWorldOrder) {
    EXPECT_EQ(friends_count(), 0) << "nothing before a query";
    EXPECT_EQ(friend_at(0), nullptr);

    ASSERT_EQ(query_friends(me_), EOS_EResult::EOS_Success);
    ASSERT_EQ(friends_count(), 3);
    EXPECT_EQ(friend_at(0), eos_sim::epic_account_id("alice"));
    EXPECT_EQ(friend_at(1), eos_sim::epic_account_id("bob"));
    EXPECT_EQ(friend_at(2), eos_sim::epic_account_id("carol"));
    EXPECT_EQ(friend_at(3), nullptr);
    EXPECT_EQ(friend_at(-1), nullptr);

    // The cache is what the query saw; a change in the world shows after the next query.
    eos_sim::update_world([](eos_sim::World& w) { w.accounts[0].friends.pop_back(); });
    EXPECT_EQ(friends_count(), 3);
    ASSERT_EQ(query_friends(me_), EOS_EResult::EOS_Success);
    EXPECT_EQ(friends_count(), 2);
}

TEST_F(Services, InvalidFriendEntryKeepsItsSlotWithANullHandle) {
    eos_sim::update_world([](eos_sim::World& w) { w.accounts[0].friends[1].invalid = true; });
    ASSERT_EQ(query_friends(me_), EOS_EResult::EOS_Success);
    ASSERT_EQ(friends_count(), 3);
    EXPECT_NE(friend_at(0), nullptr);
    EXPECT_EQ(friend_at(1), nullptr);
    EXPECT_EQ(EOS_EpicAccountId_IsValid(friend_at(1)), EOS_FALSE);
    EXPECT_EQ(friend_at(2), eos_sim::epic_account_id("carol"));
}

TEST_F(Services, FriendQueryNeedsTheSignedInEpicAccountAndCanBeForcedToAbsurdCounts) {
    EXPECT_EQ(query_friends(eos_sim::epic_account_id("bob")), EOS_EResult::EOS_InvalidUser);
    EXPECT_EQ(query_friends(nullptr), EOS_EResult::EOS_InvalidParameters);
    EXPECT_EQ(friends_count(), 0);

    eos_sim::force_friends_count(-7);
    EXPECT_EQ(friends_count(), -7);
    ASSERT_EQ(query_friends(me_), EOS_EResult::EOS_Success);
    eos_sim::force_friends_count(1000000);
    EXPECT_EQ(friends_count(), 1000000);
    EXPECT_EQ(friend_at(500000), nullptr);
    EXPECT_EQ(friend_at(0), eos_sim::epic_account_id("alice"));
    eos_sim::force_friends_count(std::nullopt);
    EXPECT_EQ(friends_count(), 3);
}

// ---- Presence -------------------------------------------------------------------------------

TEST_F(Services, PresenceIsCopiedOnlyAfterItsQueryAndNamesTheProduct) {
    EOS_Presence_Info* info = nullptr;
    EXPECT_EQ(copy_presence("alice", &info), EOS_EResult::EOS_NotFound);
    EXPECT_EQ(info, nullptr);

    auto got = query_presence("alice");
    ASSERT_EQ(got.calls, 1);
    ASSERT_EQ(got.result, EOS_EResult::EOS_Success);
    EXPECT_EQ(got.info.LocalUserId, me_);
    EXPECT_EQ(got.info.TargetUserId, eos_sim::epic_account_id("alice"));

    ASSERT_EQ(copy_presence("alice", &info), EOS_EResult::EOS_Success);
    EXPECT_EQ(info->ApiVersion, EOS_PRESENCE_INFO_API_LATEST);
    EXPECT_EQ(info->Status, EOS_Presence_EStatus::EOS_PS_Online);
    EXPECT_EQ(info->UserId, eos_sim::epic_account_id("alice"));
    ASSERT_NE(info->ProductId, nullptr);
    EXPECT_STREQ(info->ProductId, kProduct) << "the world's this-product marker resolves to the platform's id";
    EOS_Presence_Info_Release(info);

    // Still uncached for another target.
    EXPECT_EQ(copy_presence("bob", &info), EOS_EResult::EOS_NotFound);
}

TEST_F(Services, PresenceOfAnotherProductOrOfNoProduct) {
    eos_sim::update_world([](eos_sim::World& w) {
        for (auto& a : w.accounts)
            if (a.name == "carol") a.presence = eos_sim::Presence{EOS_Presence_EStatus::EOS_PS_Offline, std::nullopt};
    });
    ASSERT_EQ(query_presence("bob").result, EOS_EResult::EOS_Success);
    ASSERT_EQ(query_presence("carol").result, EOS_EResult::EOS_Success);

    EOS_Presence_Info* info = nullptr;
    ASSERT_EQ(copy_presence("bob", &info), EOS_EResult::EOS_Success);
    EXPECT_EQ(info->Status, EOS_Presence_EStatus::EOS_PS_Away);
    EXPECT_STREQ(info->ProductId, "another-product");
    EOS_Presence_Info_Release(info);

    ASSERT_EQ(copy_presence("carol", &info), EOS_EResult::EOS_Success);
    EXPECT_EQ(info->Status, EOS_Presence_EStatus::EOS_PS_Offline);
    EXPECT_EQ(info->ProductId, nullptr);
    EOS_Presence_Info_Release(info);
}

TEST_F(Services, PresenceUnknownToTheWorldQueriesButDoesNotCopy) {
    // carol of the default world has no presence at all.
    ASSERT_EQ(query_presence("carol").result, EOS_EResult::EOS_Success);
    EOS_Presence_Info* info = nullptr;
    EXPECT_EQ(copy_presence("carol", &info), EOS_EResult::EOS_NotFound);

    // An injected copy failure hands out nothing.
    ASSERT_EQ(query_presence("alice").result, EOS_EResult::EOS_Success);
    eos_sim::inject("EOS_Presence_CopyPresence", eos_sim::Failure::once(EOS_EResult::EOS_UnexpectedError));
    EXPECT_EQ(copy_presence("alice", &info), EOS_EResult::EOS_UnexpectedError);
    EXPECT_EQ(info, nullptr);
}

// ---- Connect mappings and user info of friends ----------------------------------------------

TEST_F(Services, MappingsCoverOnlyQueriedAccountsWithAConnectUser) {
    const std::string alice = epic_text_of("alice"), bob = epic_text_of("bob"), carol = epic_text_of("carol");
    EXPECT_EQ(mapping(alice), nullptr) << "not queried yet";

    ASSERT_EQ(query_mappings({alice.c_str(), carol.c_str()}, 2), EOS_EResult::EOS_Success);
    EXPECT_EQ(mapping(alice), eos_sim::product_user_id("alice"));
    EXPECT_EQ(mapping(carol), nullptr) << "carol never created a Connect user";
    EXPECT_EQ(mapping(bob), nullptr) << "bob was not in the query";

    auto call = eos_sim::calls("EOS_Connect_QueryExternalAccountMappings").back();
    EXPECT_EQ(call.options["ExternalAccountIds"], nlohmann::json::array({alice, carol}));
    EXPECT_EQ(call.options["AccountIdType"], 0);
}

TEST_F(Services, MappingQueriesAcceptAnEmptyListAndRefuseMoreThan128Ids) {
    EXPECT_EQ(query_mappings({}, 0), EOS_EResult::EOS_Success);

    const std::string alice = epic_text_of("alice");
    std::vector<const char*> ids(129, alice.c_str());
    EXPECT_EQ(query_mappings(ids, 129), EOS_EResult::EOS_InvalidParameters);
    EXPECT_EQ(mapping(alice), nullptr) << "a refused query caches nothing";
    EXPECT_EQ(query_mappings(ids, 128), EOS_EResult::EOS_Success);
    EXPECT_EQ(mapping(alice), eos_sim::product_user_id("alice"));

    // A hole in the list (an unset entry) is refused as well.
    std::vector<const char*> holed{alice.c_str(), nullptr};
    EXPECT_EQ(query_mappings(holed, 2), EOS_EResult::EOS_InvalidParameters);
}

TEST_F(Services, UserInfoOfFriendsCarriesTheirDisplayNames) {
    EOS_HUserInfo ui = EOS_Platform_GetUserInfoInterface(platform_);
    for (const char* name : {"alice", "carol"}) {
        Got<EOS_UserInfo_QueryUserInfoCallbackInfo> got;
        EOS_UserInfo_QueryUserInfoOptions q{EOS_USERINFO_QUERYUSERINFO_API_LATEST, me_, eos_sim::epic_account_id(name)};
        EOS_UserInfo_QueryUserInfo(ui, &q, &got, &capture<EOS_UserInfo_QueryUserInfoCallbackInfo>);
        tick();
        ASSERT_EQ(got.result, EOS_EResult::EOS_Success) << name;
        EXPECT_EQ(got.info.TargetUserId, eos_sim::epic_account_id(name));
    }
    EOS_UserInfo_CopyUserInfoOptions c{EOS_USERINFO_COPYUSERINFO_API_LATEST, me_, eos_sim::epic_account_id("alice")};
    EOS_UserInfo* info = nullptr;
    ASSERT_EQ(EOS_UserInfo_CopyUserInfo(ui, &c, &info), EOS_EResult::EOS_Success);
    EXPECT_STREQ(info->DisplayName, "Alice");
    EOS_UserInfo_Release(info);
    c.TargetUserId = eos_sim::epic_account_id("carol");
    ASSERT_EQ(EOS_UserInfo_CopyUserInfo(ui, &c, &info), EOS_EResult::EOS_Success);
    EXPECT_EQ(info->DisplayName, nullptr);
    EOS_UserInfo_Release(info);
}

// ---- UI -------------------------------------------------------------------------------------

TEST_F(Services, ShowFriendsCompletesAndIsRecorded) {
    Got<EOS_UI_ShowFriendsCallbackInfo> got;
    EOS_UI_ShowFriendsOptions o{EOS_UI_SHOWFRIENDS_API_LATEST, me_};
    EOS_UI_ShowFriends(EOS_Platform_GetUIInterface(platform_), &o, &got, &capture<EOS_UI_ShowFriendsCallbackInfo>);
    tick();
    EXPECT_EQ(got.calls, 1);
    EXPECT_EQ(got.result, EOS_EResult::EOS_Success);
    EXPECT_EQ(got.info.LocalUserId, me_);
    ASSERT_EQ(eos_sim::calls("EOS_UI_ShowFriends").size(), 1u);
}

TEST_F(ServicesWithoutOverlay, OverlayCallsFailWhenThePlatformDisabledIt) {
    Got<EOS_UI_ShowFriendsCallbackInfo> got;
    EOS_UI_ShowFriendsOptions o{EOS_UI_SHOWFRIENDS_API_LATEST, me_};
    EOS_UI_ShowFriends(EOS_Platform_GetUIInterface(platform_), &o, &got, &capture<EOS_UI_ShowFriendsCallbackInfo>);
    tick();
    EXPECT_EQ(got.result, EOS_EResult::EOS_NotConfigured);

    EOS_Ecom_CheckoutEntry entry{EOS_ECOM_CHECKOUTENTRY_API_LATEST, "offer-1"};
    auto bought = checkout({entry});
    EXPECT_EQ(bought.result, EOS_EResult::EOS_NotConfigured);
    EXPECT_EQ(bought.info.TransactionId, nullptr);
}

// ---- Achievements ---------------------------------------------------------------------------

TEST_F(Services, AchievementsAreCountedAndCopiedOnlyAfterTheQuery) {
    EXPECT_EQ(achievement_count(), 0u);
    EXPECT_EQ(copy_achievement(0).result, EOS_EResult::EOS_NotFound);
    EXPECT_EQ(query_achievements(nullptr), EOS_EResult::EOS_InvalidParameters) << "the target is required";
    EXPECT_EQ(achievement_count(), 0u);

    ASSERT_EQ(query_achievements(me_puid_), EOS_EResult::EOS_Success);
    ASSERT_EQ(achievement_count(), 2u);
    auto first = copy_achievement(0);
    ASSERT_EQ(first.result, EOS_EResult::EOS_Success);
    EXPECT_EQ(first.id, "first_steps");
    EXPECT_EQ(first.unlock, 1700000000);
    auto second = copy_achievement(1);
    EXPECT_EQ(second.id, "explorer");
    EXPECT_EQ(second.unlock, EOS_ACHIEVEMENTS_ACHIEVEMENT_UNLOCKTIME_UNDEFINED);
    EXPECT_EQ(copy_achievement(2).result, EOS_EResult::EOS_NotFound);
}

TEST_F(Services, OldCopyLayoutIgnoresTheFieldItDoesNotHave) {
    ASSERT_EQ(query_achievements(me_puid_), EOS_EResult::EOS_Success);
    // Version 1 callers pass a shorter record: whatever lies past it must not be read.
    auto old = copy_achievement(0, 1, reinterpret_cast<EOS_ProductUserId>(0x5a5a5a5a));
    EXPECT_EQ(old.result, EOS_EResult::EOS_Success);
    EXPECT_EQ(old.id, "first_steps");
    EXPECT_EQ(copy_achievement(0, 3).result, EOS_EResult::EOS_IncompatibleVersion);
}

TEST_F(Services, InjectedCopyFailureHitsOnlyTheChosenIndex) {
    eos_sim::update_world([](eos_sim::World& w) { w.accounts[0].achievements.push_back({"veteran", 5}); });
    ASSERT_EQ(query_achievements(me_puid_), EOS_EResult::EOS_Success);
    eos_sim::inject("EOS_Achievements_CopyPlayerAchievementByIndex",
                    eos_sim::Failure::always(EOS_EResult::EOS_UnexpectedError).on_call(2));
    EXPECT_EQ(copy_achievement(0).result, EOS_EResult::EOS_Success);
    EXPECT_EQ(copy_achievement(1).result, EOS_EResult::EOS_UnexpectedError);
    auto third = copy_achievement(2);
    EXPECT_EQ(third.result, EOS_EResult::EOS_Success);
    EXPECT_EQ(third.id, "veteran");
}

TEST_F(Services, UnlockIsAllOrNothingAndKeepsFirstUnlockTimes) {
    auto failed = unlock({"explorer", "no_such_achievement"});
    EXPECT_EQ(failed.calls, 1);
    EXPECT_EQ(failed.result, EOS_EResult::EOS_NotFound);
    EXPECT_EQ(failed.info.UserId, me_puid_);
    ASSERT_EQ(query_achievements(me_puid_), EOS_EResult::EOS_Success);
    EXPECT_EQ(copy_achievement(1).unlock, EOS_ACHIEVEMENTS_ACHIEVEMENT_UNLOCKTIME_UNDEFINED);

    const int64_t before = static_cast<int64_t>(std::time(nullptr));
    auto done = unlock({"explorer", "first_steps"});
    EXPECT_EQ(done.result, EOS_EResult::EOS_Success);
    EXPECT_EQ(done.info.AchievementsCount, 2u);
    // The cache is what the last query saw until the next one.
    EXPECT_EQ(copy_achievement(1).unlock, EOS_ACHIEVEMENTS_ACHIEVEMENT_UNLOCKTIME_UNDEFINED);
    ASSERT_EQ(query_achievements(me_puid_), EOS_EResult::EOS_Success);
    EXPECT_EQ(copy_achievement(0).unlock, 1700000000);
    const int64_t t = copy_achievement(1).unlock;
    EXPECT_GE(t, before);
    EXPECT_LE(t, static_cast<int64_t>(std::time(nullptr)));
}

TEST_F(Services, ForcedAchievementCountLeavesCopiesBoundedByTheCache) {
    ASSERT_EQ(query_achievements(me_puid_), EOS_EResult::EOS_Success);
    eos_sim::force_achievement_count(0xFFFFFFF0u);
    EXPECT_EQ(achievement_count(), 0xFFFFFFF0u);
    EXPECT_EQ(copy_achievement(2).result, EOS_EResult::EOS_NotFound);
    EXPECT_EQ(copy_achievement(1).result, EOS_EResult::EOS_Success);
    eos_sim::force_achievement_count(std::nullopt);
    EXPECT_EQ(achievement_count(), 2u);
}

// ---- Ecom -----------------------------------------------------------------------------------

TEST_F(Services, OwnershipAnswersInTheOrderAskedWithUnknownItemsNotOwned) {
    eos_sim::update_world([](eos_sim::World& w) {
        w.accounts[0].ownership["dlc_one"] = EOS_EOwnershipStatus::EOS_OS_NotOwned;
        w.accounts[0].ownership["dlc_two"] = EOS_EOwnershipStatus::EOS_OS_Owned;
    });
    auto got = query_ownership({"dlc_two", "never_heard_of", "base_game", "dlc_one"}, 4);
    ASSERT_EQ(got.result, EOS_EResult::EOS_Success);
    using S = EOS_EOwnershipStatus;
    std::vector<std::pair<std::string, S>> want{{"dlc_two", S::EOS_OS_Owned},
                                                {"never_heard_of", S::EOS_OS_NotOwned},
                                                {"base_game", S::EOS_OS_Owned},
                                                {"dlc_one", S::EOS_OS_NotOwned}};
    EXPECT_EQ(got.items, want);

    auto empty = query_ownership({}, 0);
    EXPECT_EQ(empty.result, EOS_EResult::EOS_Success);
    EXPECT_TRUE(empty.items.empty());
}

TEST_F(Services, OwnershipRefusesMoreThan400Ids) {
    std::vector<const char*> ids(401, "base_game");
    auto refused = query_ownership(ids, 401);
    EXPECT_EQ(refused.result, EOS_EResult::EOS_InvalidParameters);
    EXPECT_TRUE(refused.items.empty());
    auto full = query_ownership(ids, 400);
    EXPECT_EQ(full.result, EOS_EResult::EOS_Success);
    EXPECT_EQ(full.items.size(), 400u);
}

TEST_F(Services, CheckoutCompletesWithATransactionAndRecordsItsEntries) {
    EOS_Ecom_CheckoutEntry entry{EOS_ECOM_CHECKOUTENTRY_API_LATEST, "offer-1"};
    auto got = checkout({entry});
    ASSERT_EQ(got.result, EOS_EResult::EOS_Success);
    EXPECT_EQ(got.info.LocalUserId, me_);
    auto call = eos_sim::calls("EOS_Ecom_Checkout").back();
    EXPECT_EQ(call.options["Entries"][0]["OfferId"], "offer-1");
    EXPECT_TRUE(call.output["TransactionId"].is_string());

    EXPECT_EQ(checkout({}).result, EOS_EResult::EOS_InvalidParameters);
    EXPECT_EQ(checkout(std::vector<EOS_Ecom_CheckoutEntry>(11, entry)).result, EOS_EResult::EOS_InvalidParameters);

    // No completion delegate: accepted, and the outcome still shows in the record.
    EOS_Ecom_CheckoutOptions o{EOS_ECOM_CHECKOUT_API_LATEST, me_, nullptr, 1, &entry};
    EOS_Ecom_Checkout(ecom(), &o, nullptr, nullptr);
    tick();
    auto unobserved = eos_sim::calls("EOS_Ecom_Checkout").back();
    ASSERT_TRUE(unobserved.result.has_value());
    EXPECT_EQ(*unobserved.result, EOS_EResult::EOS_Success);
}

}  // namespace
