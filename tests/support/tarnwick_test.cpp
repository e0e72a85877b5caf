#include "tarnwick_test.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <regex>
#include <unistd.h>

namespace tw {

eos_sim::World test_world()
{
    using namespace eos_sim;
    World w;
    w.local_account = "me";
    Account me;
    me.name = "me";
    me.display_name = "Local Player";
    me.friends = {{"alice"}, {"bob"}, {"carol"}};
    me.presence = Presence{EOS_Presence_EStatus::EOS_PS_Online, std::string(kThisProduct)};
    me.achievements = {{"first_win", -1}, {"explorer", 1700000000}, {"dawn", 0}};
    me.ownership = {{"item_sword", EOS_EOwnershipStatus::EOS_OS_Owned},
                    {"item_shield", EOS_EOwnershipStatus::EOS_OS_NotOwned}};
    Account alice;
    alice.name = "alice";
    alice.display_name = "Alice";
    alice.friends = {{"me"}};
    alice.presence = Presence{EOS_Presence_EStatus::EOS_PS_Online, std::string(kThisProduct)};
    Account bob;
    bob.name = "bob";
    bob.display_name = "Bob";
    bob.friends = {{"me"}};
    bob.presence = Presence{EOS_Presence_EStatus::EOS_PS_Online, std::string("another-product")};
    Account carol;
    carol.name = "carol";
    carol.display_name = "Carol";
    carol.friends = {{"me"}};
    w.accounts = {me, alice, bob, carol};
    return w;
}

static bool g_ran_a_test = false;

void TarnwickTest::SetUp()
{
    if (g_ran_a_test)
        GTEST_SKIP() << "the library keeps process-wide state: run each test in its own process (ctest)";
    g_ran_a_test = true;

    char pattern[] = "/tmp/tarnwick-test-XXXXXX";
    char *made = mkdtemp(pattern);
    ASSERT_NE(made, nullptr);
    dir_ = made;
    ASSERT_EQ(chdir(dir_.c_str()), 0);

    eos_sim::reset();
    eos_sim::set_world(test_world());
    hlrt::reset();
    host::load(TARNWICK_HDLL_PATH);
    p = tarnwick::bind_primitives();
}

void TarnwickTest::TearDown()
{
    if (!dir_.empty()) {
        (void)chdir("/");
        std::error_code ignored;
        std::filesystem::remove_all(dir_, ignored);
    }
}

host::InitConfigValues TarnwickTest::config() const
{
    host::InitConfigValues v;
    v.productName = "tarnwick tests";
    v.productVersion = "1.0";
    v.eosProductId = "tarnwick-product";
    v.spare = "unused";
    v.sandboxId = "sandbox";
    v.deploymentId = "deployment";
    v.clientId = "client";
    v.clientSecret = "secret";
    v.loginId = "localhost:6547";
    v.loginToken = "me";
    v.loginType = static_cast<int>(EOS_ELoginCredentialType::EOS_LCT_Developer);
    v.externalType = 0;
    v.enableOverlay = true;
    return v;
}

bool TarnwickTest::init(const host::InitConfigValues &values, const host::ClosureRef &onLogin)
{
    void *object = host::init_config(values);
    host::Held keep(object);
    bool result = false;
    vdynamic *exception = host::call_guarded([&] { result = p.init(object, vm(onLogin)); });
    EXPECT_EQ(exception, nullptr);
    return result;
}

host::ClosureRef TarnwickTest::sign_in()
{
    host::ClosureRef onLogin = host::make_closure("PiBBB_v");
    EXPECT_TRUE(init(config(), onLogin));
    EXPECT_TRUE(tick_until([&] { return onLogin->count() > 0; }));
    if (onLogin->count() > 0)
        EXPECT_EQ(arg_i32(onLogin->last(), 0), 0);
    return onLogin;
}

// TARNWICK_COLLECT_EVERY_TICK=1 runs a collection before every tick: whatever
// the library keeps across ticks must then be reachable from a root.
static bool collect_every_tick()
{
    static const bool on = [] {
        const char *value = std::getenv("TARNWICK_COLLECT_EVERY_TICK");
        return value && std::string(value) == "1";
    }();
    return on;
}

vdynamic *TarnwickTest::tick()
{
    if (collect_every_tick())
        hlrt::collect();
    return host::call_guarded([&] { p.update(); });
}

void TarnwickTest::tick(int count)
{
    for (int i = 0; i < count; ++i)
        EXPECT_EQ(tick(), nullptr);
}

bool TarnwickTest::tick_until(const std::function<bool()> &done, int limit)
{
    for (int i = 0; i < limit; ++i) {
        if (done())
            return true;
        EXPECT_EQ(tick(), nullptr);
    }
    return done();
}

void TarnwickTest::tick_collecting(int count)
{
    for (int i = 0; i < count; ++i) {
        hlrt::collect();
        EXPECT_EQ(tick(), nullptr);
    }
}

std::vector<std::string> TarnwickTest::log_lines() const
{
    std::vector<std::string> lines;
    std::ifstream in(dir_ + "/egs.log", std::ios::binary);
    std::string line;
    while (std::getline(in, line))
        lines.push_back(line);
    return lines;
}

std::vector<std::string> TarnwickTest::log_lines_with(const std::string &part) const
{
    std::vector<std::string> out;
    for (const std::string &line : log_lines())
        if (line.find(part) != std::string::npos)
            out.push_back(line);
    return out;
}

std::vector<std::string> TarnwickTest::egs_lines() const
{
    static const std::regex sdk_line(R"(^\[EGS\] \[-?[0-9]+\] \[)");
    std::vector<std::string> out;
    for (const std::string &line : log_lines())
        if (!std::regex_search(line, sdk_line))
            out.push_back(line);
    return out;
}

bool TarnwickTest::logged(const std::string &line) const
{
    for (const std::string &l : log_lines())
        if (l == line)
            return true;
    return false;
}

void TarnwickTest::expect_clean(size_t roots) const
{
    EXPECT_EQ(eos_sim::outstanding_total(), 0);
    for (const auto &[kind, count] : eos_sim::outstanding_copies())
        EXPECT_EQ(count, 0) << kind;
    EXPECT_TRUE(eos_sim::faults().empty()) << (eos_sim::faults().empty() ? "" : eos_sim::faults().front());
    EXPECT_EQ(hlrt::root_count(), roots);
}

int arg_i32(const host::Call &call, size_t index)
{
    EXPECT_LT(index, call.args.size());
    return index < call.args.size() ? call.args[index].i : 0;
}

std::optional<std::string> arg_bytes(const host::Call &call, size_t index)
{
    EXPECT_LT(index, call.args.size());
    return index < call.args.size() ? call.args[index].bytes : std::nullopt;
}

varray *arg_array(const host::Call &call, size_t index)
{
    EXPECT_LT(index, call.args.size());
    return index < call.args.size() ? call.args[index].array() : nullptr;
}

}  // namespace tw
