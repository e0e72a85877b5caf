// Achievements: unlocking one by id, and the local player's list with each
// achievement's unlock state.
#include "tarnwick_test.h"

using namespace tw;
using eos_sim::Failure;

namespace {

struct Achievement {
    std::optional<std::string> id;
    std::optional<bool> unlock;
    bool operator==(const Achievement &o) const { return id == o.id && unlock == o.unlock; }
};

std::ostream &operator<<(std::ostream &out, const std::optional<Achievement> &a)
{
    if (!a)
        return out << "null";
    return out << "{" << a->id.value_or("-") << ", " << (a->unlock ? (*a->unlock ? "true" : "false") : "-") << "}";
}

using List = std::vector<std::optional<Achievement>>;

std::string puid_of(const std::string &account) { return eos_sim::derive_id("puid:" + account); }

}  // namespace

class Achievements : public TarnwickTest {
protected:
    // Queries and ticks until the closure ran; the list is read while it runs.
    std::optional<List> query()
    {
        auto got = std::make_shared<std::vector<std::optional<List>>>();
        host::ClosureBehaviour behaviour;
        behaviour.on_call = [got](const host::Call &c) {
            varray *array = arg_array(c, 0);
            if (!array) {
                got->push_back(std::nullopt);
                return;
            }
            EXPECT_EQ(array->at, &hlt_dynobj);
            List list;
            for (void *slot : host::array_slots(array)) {
                auto *o = static_cast<const vdynobj *>(slot);
                list.push_back(o ? std::optional<Achievement>(Achievement{host::field_bytes(o, "id"),
                                                                          host::field_bool(o, "unlock")})
                                 : std::nullopt);
            }
            got->push_back(list);
        };
        host::ClosureRef onAchievements = host::make_closure("PA_v", behaviour);
        p.query_achievements(onAchievements->vm);
        EXPECT_EQ(hlrt::root_count(), 1u);
        for (int i = 0; i < 10 && got->empty(); ++i)
            tick_collecting(1);
        tick_collecting(2);
        EXPECT_EQ(got->size(), 1u);
        return got->empty() ? std::nullopt : got->front();
    }
};

TEST_F(Achievements, TheListTellsLockedFromUnlockedByMinusOneAlone)
{
    sign_in();
    eos_sim::update_world([](eos_sim::World &w) { w.accounts[0].achievements.push_back({"negative", -5}); });
    std::optional<List> list = query();
    ASSERT_TRUE(list.has_value());
    EXPECT_EQ(*list, (List{Achievement{"first_win", false}, Achievement{"explorer", true}, Achievement{"dawn", true},
                           Achievement{"negative", true}}));

    const std::string me = puid_of("me");
    auto asked = eos_sim::calls("EOS_Achievements_QueryPlayerAchievements");
    ASSERT_EQ(asked.size(), 1u);
    EXPECT_EQ(asked[0].options, (nlohmann::json{{"ApiVersion", 2}, {"TargetUserId", me}, {"LocalUserId", me}}));
    EXPECT_EQ(eos_sim::calls("EOS_Achievements_GetPlayerAchievementCount")[0].options,
              (nlohmann::json{{"ApiVersion", 1}, {"UserId", me}}));
    auto copies = eos_sim::calls("EOS_Achievements_CopyPlayerAchievementByIndex");
    ASSERT_EQ(copies.size(), 4u);
    for (int i = 0; i < 4; ++i)
        EXPECT_EQ(copies[i].options, (nlohmann::json{{"ApiVersion", 2},
                                                    {"TargetUserId", me},
                                                    {"AchievementIndex", i},
                                                    {"LocalUserId", me}}));
    EXPECT_EQ(eos_sim::calls("EOS_Achievements_PlayerAchievement_Release").size(), 4u);
    expect_clean();
}

TEST_F(Achievements, AnEmptyOrFailedQueryStillDeliversAnEmptyList)
{
    sign_in();
    eos_sim::update_world([](eos_sim::World &w) { w.accounts[0].achievements.clear(); });
    std::optional<List> list = query();
    ASSERT_TRUE(list.has_value());
    EXPECT_TRUE(list->empty());
    // A failed query is not told apart: the list is what the SDK holds.
    eos_sim::inject("EOS_Achievements_QueryPlayerAchievements", Failure::once(EOS_EResult::EOS_NoConnection));
    list = query();
    ASSERT_TRUE(list.has_value());
    EXPECT_TRUE(list->empty());
    EXPECT_TRUE(eos_sim::calls("EOS_Achievements_CopyPlayerAchievementByIndex").empty());
    expect_clean();
}

TEST_F(Achievements, AFailedCopyLeavesANullSlotAndKeepsLengthAndOrder)
{
    sign_in();
    eos_sim::inject("EOS_Achievements_CopyPlayerAchievementByIndex",
                    Failure::once(EOS_EResult::EOS_NoConnection).on_call(2));
    std::optional<List> list = query();
    ASSERT_TRUE(list.has_value());
    EXPECT_EQ(*list, (List{Achievement{"first_win", false}, std::nullopt, Achievement{"dawn", true}}));
    // Released exactly the copies made.
    EXPECT_EQ(eos_sim::calls("EOS_Achievements_PlayerAchievement_Release").size(), 2u);
    expect_clean();
}

TEST_F(Achievements, ACountThatIsNoArrayLengthGivesAnEmptyListAndALargerOneNullSlots)
{
    sign_in();
    eos_sim::force_achievement_count(0x80000000u);
    std::optional<List> list = query();
    ASSERT_TRUE(list.has_value());
    EXPECT_TRUE(list->empty());
    EXPECT_TRUE(eos_sim::calls("EOS_Achievements_CopyPlayerAchievementByIndex").empty());

    eos_sim::force_achievement_count(5u);
    list = query();
    ASSERT_TRUE(list.has_value());
    EXPECT_EQ(*list, (List{Achievement{"first_win", false}, Achievement{"explorer", true}, Achievement{"dawn", true},
                           std::nullopt, std::nullopt}));
    expect_clean();
}

TEST_F(Achievements, WithoutAClosureTheQueryIsSentAndItsCompletionReadsNothing)
{
    sign_in();
    p.query_achievements(nullptr);
    EXPECT_EQ(hlrt::root_count(), 0u);
    auto asked = eos_sim::calls("EOS_Achievements_QueryPlayerAchievements");
    ASSERT_EQ(asked.size(), 1u);
    EXPECT_EQ(asked[0].client_data, nullptr);
    tick_collecting(3);
    EXPECT_EQ(eos_sim::calls("EOS_Achievements_QueryPlayerAchievements")[0].result,
              std::optional<EOS_EResult>(EOS_EResult::EOS_Success));
    EXPECT_TRUE(eos_sim::calls("EOS_Achievements_GetPlayerAchievementCount").empty());
    EXPECT_TRUE(eos_sim::calls("EOS_Achievements_CopyPlayerAchievementByIndex").empty());
    expect_clean();
}

TEST_F(Achievements, TwoQueriesInFlightEachReachTheirOwnClosure)
{
    sign_in();
    eos_sim::hold(true);
    host::ClosureRef first = host::make_closure("PA_v"), second = host::make_closure("PA_v");
    p.query_achievements(first->vm);
    p.query_achievements(second->vm);
    EXPECT_EQ(hlrt::root_count(), 2u);
    eos_sim::release_shuffled(3);
    EXPECT_EQ(tick(), nullptr);
    ASSERT_EQ(first->count(), 1u);
    ASSERT_EQ(second->count(), 1u);
    EXPECT_EQ(host::array_size(arg_array(first->last(), 0)), 3);
    EXPECT_EQ(host::array_size(arg_array(second->last(), 0)), 3);
    expect_clean();
}

TEST_F(Achievements, EachUnlockSendsItsOwnRequestForTheOneId)
{
    sign_in();
    size_t lines = egs_lines().size();
    p.set_achievement(host::bytes("first_win"));
    p.set_achievement(host::bytes("first_win"));
    auto unlocks = eos_sim::calls("EOS_Achievements_UnlockAchievements");
    ASSERT_EQ(unlocks.size(), 2u);
    for (const auto &u : unlocks) {
        EXPECT_EQ(u.options, (nlohmann::json{{"ApiVersion", 1},
                                             {"UserId", puid_of("me")},
                                             {"AchievementIds", nlohmann::json::array({"first_win"})},
                                             {"AchievementsCount", 1}}));
        EXPECT_EQ(u.client_data, nullptr);
    }
    tick_collecting(2);
    // An unknown id fails in the SDK; the game and the log hear of neither.
    p.set_achievement(host::bytes("no_such_achievement"));
    tick_collecting(2);
    unlocks = eos_sim::calls("EOS_Achievements_UnlockAchievements");
    EXPECT_EQ(unlocks[0].result, std::optional<EOS_EResult>(EOS_EResult::EOS_Success));
    EXPECT_EQ(unlocks[2].result, std::optional<EOS_EResult>(EOS_EResult::EOS_NotFound));
    EXPECT_EQ(egs_lines().size(), lines);
    std::optional<List> list = query();
    ASSERT_TRUE(list.has_value());
    EXPECT_EQ(list->at(0), (Achievement{"first_win", true}));
    expect_clean();
}

TEST_F(Achievements, NothingIsAskedWithoutAPlatform)
{
    host::ClosureRef onAchievements = host::make_closure("PA_v");
    p.query_achievements(onAchievements->vm);
    p.set_achievement(host::bytes("first_win"));
    EXPECT_EQ(onAchievements->count(), 0u);
    EXPECT_TRUE(logged("[EGS] No EOS platform, query_achievements ignored"));
    EXPECT_TRUE(logged("[EGS] No EOS platform, set_achievement ignored"));
    EXPECT_TRUE(eos_sim::calls().empty());
    expect_clean();
}
