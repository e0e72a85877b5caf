// The tour that tarnwick-demo plays: a game's session against the simulated EOS world, driven
// through tarnwick.hdll exactly as the HashLink VM drives it, printing what the game receives at
// each step. Tests run it in-process and check the report.
#pragma once

#include <cstdint>
#include <optional>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

namespace tour {

struct Options {
    std::string hdll;                          // path of tarnwick.hdll
    std::string world_file;                    // empty: EOS_SIM_WORLD, else the simulator's current world
    std::string login_as;                      // empty: the world's local player (account portal login);
                                               // else a Developer login with this credential
    std::vector<std::string> items = {"base_game", "soundtrack", "season_pass", "expansion"};
    std::string connection_key = "demo-host:7777";
    int step_ticks = 100;                      // a step that has not happened after this many ticks fails
    bool echo_log = false;                     // also print the library's own log lines
};

struct FriendSeen {
    std::optional<std::string> epic_id, name, product_id;
    std::optional<bool> online;
};

struct AchievementSeen {
    std::string id;
    bool unlocked = false;
};

struct LobbySeen {
    uint64_t tick = 0;
    std::optional<std::string> lobby_id, connection_key;
};

// What the game received, step by step.
struct Report {
    std::string failed_step;                   // empty when the whole tour ran
    std::vector<std::string> lines;            // everything printed, in order

    uint64_t login_tick = 0;
    int login_result = -1;
    std::optional<std::string> account, display_name, token;
    std::vector<FriendSeen> friends;
    std::vector<AchievementSeen> achievements, achievements_after_unlock;
    std::string unlocked;                      // the achievement the tour unlocked
    std::optional<std::vector<std::string>> owned;
    std::optional<std::string> lobby_id;       // the tour's own lobby
    std::string invited;                       // account name of the friend who joined it (read from the world)
    uint64_t friend_joined_tick = 0;
    std::vector<std::pair<std::string, std::string>> invitations;   // (invite id, sender's name), as received
    std::vector<uint64_t> invitation_ticks;
    LobbySeen joined;                          // accepting the first invitation in the game
    LobbySeen overlay;                         // the acceptance made in the overlay
    int left = -1, destroyed = -1;
    uint64_t ticks = 0;                        // ticks the whole tour took
};

// Loads the hdll (the first call only: a process holds one), plays the tour and reports.
// Everything printed also goes to `out`.
Report run(const Options& options, std::ostream& out);

}  // namespace tour
