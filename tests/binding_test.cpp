// The primitive table as the VM binds it, closure cells and roots, values
// crossing to the game, and the rules every completion follows.
#include "tarnwick_test.h"

#include <cstring>

using namespace tw;

TEST(Descriptors, EveryPrimitiveAnswersWithItsSignatureEveryTime)
{
    host::load(TARNWICK_HDLL_PATH);
    for (const Declared &d : kDeclared) {
        host::Descriptor first = host::describe(d.name);
        host::Descriptor second = host::describe(d.name);
        ASSERT_TRUE(first.found) << d.name;
        EXPECT_EQ(first.signature, std::optional<std::string>(d.signature)) << d.name;
        EXPECT_EQ(first.function, host::symbol(std::string("hleos_") + d.name)) << d.name;
        EXPECT_EQ(first.function, second.function) << d.name;
        EXPECT_EQ(first.signature, second.signature) << d.name;
    }
    EXPECT_FALSE(host::describe("alloc_bytes").found);
}

TEST(Descriptors, AWrongDeclarationStopsTheVmWithItsMessage)
{
    EXPECT_EXIT(
        {
            host::route_stdout_to_stderr();
            host::load(TARNWICK_HDLL_PATH);
            host::bind("leave_lobby", "PBPb_v_v");
        },
        ::testing::ExitedWithCode(1),
        "FATAL ERROR : Invalid signature for function tarnwick@leave_lobby : PBPb_v_v required but PBPi_v_v found in hdll");
}

class Binding : public TarnwickTest {};

TEST_F(Binding, ACellRootsTheClosureUntilItsSingleDelivery)
{
    sign_in();
    size_t before = hlrt::root_count();
    host::ClosureRef onLeft = host::make_closure("Pi_v");
    p.leave_lobby(host::bytes("no-such-lobby"), onLeft->vm);
    EXPECT_EQ(hlrt::root_count(), before + 1);
    // Collections while the request is in flight leave the closure alive:
    // only the cell keeps it reachable.
    tick_collecting(3);
    ASSERT_EQ(onLeft->count(), 1u);
    EXPECT_NE(arg_i32(onLeft->last(), 0), 0);
    EXPECT_EQ(hlrt::root_count(), before);
    expect_clean();
}

TEST_F(Binding, ANullClosureMakesNoCellAndIsNeverCalled)
{
    sign_in();
    size_t before = hlrt::root_count();
    p.leave_lobby(host::bytes("no-such-lobby"), nullptr);
    p.query_achievements(nullptr);
    p.query_friends(nullptr);
    EXPECT_EQ(hlrt::root_count(), before);
    tick(10);
    EXPECT_EQ(hlrt::root_count(), before);
    expect_clean();
}

TEST_F(Binding, StringsCrossWithTheirTerminatorAndNullStaysNull)
{
    eos_sim::update_world([](eos_sim::World &w) { w.accounts[0].display_name = ""; });
    host::ClosureRef onLogin = host::make_closure("PiBBB_v");
    ASSERT_TRUE(init(config(), onLogin));
    ASSERT_TRUE(tick_until([&] { return onLogin->count() > 0; }));
    const host::Call &call = onLogin->last();
    // The Epic account id: 32 characters in a 33-byte copy.
    ASSERT_TRUE(call.args[1].bytes.has_value());
    EXPECT_EQ(call.args[1].bytes->size(), 32u);
    EXPECT_EQ(call.args[1].bytes_size, 33);
    // An empty display name: one byte, the terminator.
    EXPECT_EQ(call.args[2].bytes, std::optional<std::string>(""));
    EXPECT_EQ(call.args[2].bytes_size, 1);
    expect_clean();
}

TEST_F(Binding, ATokenThatCouldNotBeCopiedReachesTheGameAsNull)
{
    eos_sim::inject("EOS_Auth_CopyUserAuthToken", eos_sim::Failure::once(EOS_EResult::EOS_NotFound));
    host::ClosureRef onLogin = host::make_closure("PiBBB_v");
    ASSERT_TRUE(init(config(), onLogin));
    ASSERT_TRUE(tick_until([&] { return onLogin->count() > 0; }));
    EXPECT_EQ(onLogin->last().args[3].bytes, std::nullopt);
    EXPECT_EQ(onLogin->last().args[3].ptr, nullptr);
}

TEST_F(Binding, AnExceptionInAClosureIsRethrownAfterTheTickWithCleanupDone)
{
    sign_in();
    host::ClosureBehaviour throwing;
    throwing.throws = host::exception("boom");
    // The game makes the value it throws; until then it is the test's to keep.
    host::Held keep(throwing.throws);
    host::ClosureRef onLeft = host::make_closure("Pi_v", throwing);
    host::ClosureRef onDestroyed = host::make_closure("Pi_v", throwing);
    p.leave_lobby(host::bytes("nowhere"), onLeft->vm);
    p.destroy_lobby(host::bytes("nowhere"), onDestroyed->vm);
    vdynamic *thrown = nullptr;
    for (int i = 0; i < 10 && !thrown; ++i)
        thrown = tick();
    ASSERT_NE(thrown, nullptr);
    EXPECT_EQ(host::exception_message(thrown), std::optional<std::string>("boom"));
    // Both completions ran to their end in that tick: both closures were
    // called and both cells released; only the first exception comes back.
    EXPECT_EQ(onLeft->count(), 1u);
    EXPECT_EQ(onDestroyed->count(), 1u);
    EXPECT_EQ(tick(), nullptr);
    expect_clean();
}

TEST_F(Binding, ExitFromInsideAClosureWaitsForTheTickToReturn)
{
    sign_in();
    host::ClosureBehaviour exiting;
    exiting.on_call = [this](const host::Call &) { p.exit(); };
    host::ClosureRef onLeft = host::make_closure("Pi_v", exiting);
    p.leave_lobby(host::bytes("nowhere"), onLeft->vm);
    tick(5);
    EXPECT_EQ(onLeft->count(), 1u);
    EXPECT_EQ(eos_sim::live_platforms(), 0);
    // Nothing touches the released platform afterwards.
    tick(2);
    p.exit();
    EXPECT_TRUE(eos_sim::faults().empty()) << eos_sim::faults().front();
    EXPECT_EQ(eos_sim::calls("EOS_Platform_Release").size(), 1u);
}

TEST_F(Binding, RequestsWithoutAPlatformAreDroppedWithALogLine)
{
    host::ClosureRef onCreated = host::make_closure("PB_v");
    host::ClosureRef onFriends = host::make_closure("PA_v");
    p.create_lobby(host::bytes("key"), onCreated->vm);
    p.query_friends(onFriends->vm);
    p.store_checkout(host::bytes("offer"));
    p.update();
    p.exit();
    EXPECT_EQ(hlrt::root_count(), 0u);
    EXPECT_TRUE(logged("[EGS] No EOS platform, create_lobby ignored"));
    EXPECT_TRUE(logged("[EGS] No EOS platform, query_friends ignored"));
    EXPECT_TRUE(logged("[EGS] No EOS platform, store_checkout ignored"));
    EXPECT_EQ(eos_sim::calls("EOS_Lobby_CreateLobby").size(), 0u);

    // After exit, the same.
    sign_in();
    p.exit();
    p.create_lobby(host::bytes("key"), onCreated->vm);
    tick(3);
    EXPECT_EQ(onCreated->count(), 0u);
    EXPECT_EQ(hlrt::root_count(), 0u);
    EXPECT_TRUE(eos_sim::faults().empty());
}

TEST_F(Binding, ANonFinalResultDeliversAndReleasesNothing)
{
    sign_in();
    eos_sim::inject("EOS_Lobby_LeaveLobby", eos_sim::Failure::retry());
    host::ClosureRef onLeft = host::make_closure("Pi_v");
    p.leave_lobby(host::bytes("nowhere"), onLeft->vm);
    size_t rooted = hlrt::root_count();
    ASSERT_TRUE(tick_until([] { return !eos_sim::calls("EOS_Lobby_LeaveLobby").empty() &&
                                       !eos_sim::calls("EOS_Lobby_LeaveLobby")[0].deliveries.empty(); }));
    EXPECT_EQ(onLeft->count(), 0u);
    EXPECT_EQ(hlrt::root_count(), rooted);
    ASSERT_TRUE(tick_until([&] { return onLeft->count() > 0; }));
    EXPECT_EQ(onLeft->count(), 1u);
    tick(3);
    EXPECT_EQ(onLeft->count(), 1u);
    EXPECT_TRUE(log_lines_with("Can't leave lobby").size() == 1);
    expect_clean();
}
