// Helpers shared by the lobby, invitation and invite-received suites: account
// ids of the test world, the library's log lines since a point, recorded call
// order, and ticking with collections until the game has been answered.
#pragma once

#include "tarnwick_test.h"

#include <string>
#include <vector>

namespace tw {

inline int code(EOS_EResult result) { return static_cast<int>(result); }

inline const eos_sim::Account *account_named(const eos_sim::World &world, const std::string &name)
{
    for (const eos_sim::Account &a : world.accounts)
        if (a.name == name)
            return &a;
    return nullptr;
}

// The text of an account's product user id and Epic account id.
inline std::string puid(const std::string &name)
{
    eos_sim::World w = eos_sim::get_world();
    const eos_sim::Account *a = account_named(w, name);
    return a ? a->product_user_id : std::string();
}

inline std::string epic(const std::string &name)
{
    eos_sim::World w = eos_sim::get_world();
    const eos_sim::Account *a = account_named(w, name);
    return a ? a->epic_id : std::string();
}

// A text of `length` bytes whose every position is recognisable, so a cut
// or a shift shows.
inline std::string patterned(size_t length)
{
    std::string s;
    for (size_t i = 0; i < length; ++i)
        s.push_back(static_cast<char>('a' + (i * 7) % 26));
    return s;
}

inline const eos_sim::Attribute *find_attribute(const eos_sim::Lobby &lobby, const std::string &key)
{
    for (const eos_sim::Attribute &a : lobby.attributes)
        if (a.key == key)
            return &a;
    return nullptr;
}

inline bool is_member(const eos_sim::Lobby &lobby, const std::string &account)
{
    for (const std::string &m : lobby.members)
        if (m == account)
            return true;
    return false;
}

// Global sequence numbers of the recorded calls of one function.
inline std::vector<uint64_t> seqs(const std::string &function)
{
    std::vector<uint64_t> out;
    for (const eos_sim::Call &c : eos_sim::calls(function))
        out.push_back(c.seq);
    return out;
}

// The names of the recorded calls among `functions`, in call order, from
// sequence number `from` on.
inline std::vector<std::string> call_order(const std::vector<std::string> &functions, uint64_t from = 0)
{
    std::vector<std::string> out;
    for (const eos_sim::Call &c : eos_sim::calls())
        if (c.seq >= from)
            for (const std::string &f : functions)
                if (c.function == f)
                    out.push_back(f);
    return out;
}

inline uint64_t next_seq()
{
    std::vector<eos_sim::Call> all = eos_sim::calls();
    return all.empty() ? 1 : all.back().seq + 1;
}

// Every flow starts signed in, with the sign-in's own calls forgotten.
class LobbyFlowTest : public TarnwickTest {
protected:
    void SetUp() override
    {
        TarnwickTest::SetUp();
        if (IsSkipped())
            return;
        sign_in();
        // Only what the flow under test asks of the SDK is looked at.
        eos_sim::clear_calls();
    }

    // The library's own lines written after `mark` lines were there.
    size_t mark() const { return egs_lines().size(); }
    std::vector<std::string> lines_since(size_t from) const
    {
        std::vector<std::string> all = egs_lines();
        return from < all.size() ? std::vector<std::string>(all.begin() + static_cast<long>(from), all.end())
                                 : std::vector<std::string>{};
    }

    // Ticks, collecting before each tick, until `done` holds; then a few
    // more collecting ticks so that a second delivery would show.
    bool settle(const std::function<bool()> &done, int limit = 40)
    {
        bool reached = false;
        for (int i = 0; i < limit; ++i) {
            if (done()) {
                reached = true;
                break;
            }
            tick_collecting(1);
        }
        tick_collecting(3);
        return reached || done();
    }

    // A lobby owned by a remote account, holding a string connection_key
    // (none when `key` is null).
    static std::string remote_lobby(const std::string &owner, const char *key, uint32_t max_members = 10)
    {
        std::vector<eos_sim::Attribute> attributes;
        if (key)
            attributes.push_back(eos_sim::Attribute::string("connection_key", key));
        return eos_sim::remote_create_lobby(owner, attributes, max_members);
    }
};

}  // namespace tw
