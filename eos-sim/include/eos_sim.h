/*
 * Control API of the EOS SDK simulator (libEOSSDK-Linux-Shipping.so built from eos-sim/).
 *
 * Not part of the real SDK: tests, the demo and the benchmarks use it to build the online
 * world the simulated services answer from, to steer completions and failures, and to read
 * back what the game's code asked of the SDK. Everything here is meant to be called from the
 * thread that calls the EOS_* functions; nothing runs behind the caller's back (completions and
 * notifications only run inside EOS_Platform_Tick).
 */
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

#include "eos_sdk.h"
#include "eos_logging.h"
#include "eos_auth.h"
#include "eos_connect.h"
#include "eos_userinfo.h"
#include "eos_lobby.h"
#include "eos_friends.h"
#include "eos_presence.h"
#include "eos_ui.h"
#include "eos_achievements.h"
#include "eos_ecom.h"

namespace eos_sim {

// ---------------------------------------------------------------------------------------------
// World model: plain data, filled by tests, by the built-in default world or by a world file.
// Accounts are referred to everywhere by their `name`.
// ---------------------------------------------------------------------------------------------

// Special presence product id: stands for the ProductId the platform was created with.
inline constexpr const char* kThisProduct = "@product";

struct FriendEntry {
    std::string account;          // name of the befriended account
    bool invalid = false;         // the SDK hands back an invalid (null) id for this entry
};

struct Presence {
    EOS_Presence_EStatus status = EOS_Presence_EStatus::EOS_PS_Online;
    std::optional<std::string> product_id;   // product being played (kThisProduct allowed), none = not playing
};

struct Achievement {
    std::string id;
    int64_t unlock_time = -1;     // seconds since the epoch; -1 while locked
};

struct Account {
    std::string name;                          // key used by controls and Developer logins
    std::string epic_id;                       // 32 lowercase hex digits; empty = derived from name
    std::optional<std::string> display_name;   // UTF-8; none = the SDK reports a null DisplayName
    std::string product_user_id;               // 32 lowercase hex digits; empty = derived from name
    bool has_connect_user = true;              // false: Connect login asks for EOS_Connect_CreateUser
    std::string credential;                    // Developer login Token naming this account; empty = name
    std::vector<FriendEntry> friends;          // in the order the SDK lists them
    std::optional<Presence> presence;          // none = no presence known
    std::vector<Achievement> achievements;     // in the order the SDK lists them
    std::map<std::string, EOS_EOwnershipStatus> ownership;   // catalogue item id -> status (absent = not owned)
    std::optional<int> accepts_invites_after;  // the local player's invitations to this account are
                                               // accepted (the account joins) this many ticks after they are sent
};

struct Attribute {
    std::string key;
    EOS_EAttributeType type = EOS_EAttributeType::EOS_AT_STRING;
    bool as_bool = false;
    int64_t as_int64 = 0;
    double as_double = 0.0;
    std::string as_utf8;
    EOS_ELobbyAttributeVisibility visibility = EOS_ELobbyAttributeVisibility::EOS_LAT_PUBLIC;

    static Attribute string(std::string key, std::string value);
    static Attribute int64(std::string key, int64_t value);
    static Attribute number(std::string key, double value);
    static Attribute boolean(std::string key, bool value);
};

struct Lobby {
    std::string id;                            // unique; empty = assigned by set_world
    std::string owner;                         // account name
    std::vector<std::string> members;          // account names, owner included
    uint32_t max_members = 10;
    EOS_ELobbyPermissionLevel permission = EOS_ELobbyPermissionLevel::EOS_LPL_INVITEONLY;
    bool presence_enabled = true;
    bool allow_invites = true;
    bool allow_host_migration = true;
    std::string bucket_id;                     // empty = the SDK reports a null BucketId
    std::vector<Attribute> attributes;
};

struct Invitation {
    std::string id;                            // unique; empty = assigned by set_world
    std::string lobby_id;
    std::string from;                          // sender's account name
    std::string to;                            // receiver's account name
};

// One timed event of a world's script. Events fire at the start of an EOS_Platform_Tick, before
// the completions of that tick run, so what they raise reaches the game within that same tick.
struct ScriptEvent {
    enum class When {
        AtTick,        // on tick `ticks` (0: as soon as the world is loaded at EOS_Initialize)
        AfterEvent,    // `ticks` ticks after the event named `after` fired
        AfterSignIn,   // `ticks` ticks after the tick on which the local player signed in to Connect
    };
    enum class Action {
        Invite,               // `account` invites the local player to `lobby_id`, or to a new lobby of
                              // its own publishing `connection_key` when `lobby_id` is empty
        OverlayAcceptInvite,  // the invitation sent by the Invite event named `invite` is accepted in the overlay
        OverlayAcceptJoin,    // a join of `lobby_id` is accepted in the overlay
        AcceptInvitation,     // `account` accepts the local player's latest invitation to it and joins
        Fail,                 // the next `times` calls of `function` fail with `code`
    };
    std::string name;                          // empty: the event cannot be referred to
    When when = When::AtTick;
    uint64_t ticks = 0;
    std::string after;                         // AfterEvent: the name of the earlier event
    Action action = Action::Invite;
    std::string account;
    std::string lobby_id;
    std::string connection_key;
    std::string invite;
    std::string function;
    EOS_EResult code = EOS_EResult::EOS_UnexpectedError;
    int times = 1;                             // -1: every call
};

struct World {
    std::vector<Account> accounts;
    std::string local_account;                 // the player on this machine
    std::vector<Lobby> lobbies;
    std::vector<Invitation> invitations;
    std::vector<ScriptEvent> script;           // in file order; run by EOS_Platform_Tick
};

// ---------------------------------------------------------------------------------------------
// What the simulator records.
// ---------------------------------------------------------------------------------------------

struct Call {
    uint64_t seq = 0;                          // global call order, from 1
    std::string function;                      // e.g. "EOS_Lobby_CreateLobby"
    nlohmann::json options;                    // options record by field name (ids as text); null if none
    void* client_data = nullptr;               // ClientData of async calls and subscriptions
    std::optional<EOS_EResult> result;         // sync result, or the final completion's ResultCode
    std::vector<EOS_EResult> deliveries;       // every ResultCode delivered for this call, in order
    nlohmann::json output;                     // what came back: returned handles/ids, completion fields
};

struct Pending {
    uint64_t id = 0;                           // completion id for release()/delay()
    std::string function;                      // the call that queued it
    void* client_data = nullptr;
    int delay = 0;                             // ticks still to skip
    bool held = false;                         // waiting for release()
};

struct Subscription {
    uint64_t id = 0;                           // the EOS_NotificationId
    std::string kind;                          // "LobbyInviteReceived", "LobbyInviteAccepted", "JoinLobbyAccepted"
    void* client_data = nullptr;
};

// A failure to inject into one EOS_* function (by name). Sync functions return `code`
// (functions returning a handle or id return null, AddNotify returns 0); async functions
// deliver `code` as the completion's ResultCode and change nothing in the world.
struct Failure {
    EOS_EResult code = EOS_EResult::EOS_UnexpectedError;
    int times = 1;                             // calls it hits; -1 = every call
    int nth_call = 0;                          // 0 = any call; k = only the k-th call of the function
    bool retry_first = false;                  // async: deliver EOS_OperationWillRetry first, then the
                                               // real completion (with `code` unless it is EOS_Success)

    static Failure once(EOS_EResult code);
    static Failure repeated(EOS_EResult code, int times);
    static Failure always(EOS_EResult code);
    static Failure retry(int times = 1);       // not-final-first, real outcome afterwards
    Failure& on_call(int k);                   // restrict to the k-th call
};

// ---------------------------------------------------------------------------------------------
// Controls.
// ---------------------------------------------------------------------------------------------

void reset();                                  // back to process start: SDK uninitialized, default world, nothing recorded
void set_recording(bool on);                   // record EOS_* calls (on by default; benchmarks may turn it off)

// Self-timing, for benchmarks: the time this thread spends inside EOS_* functions, less the time
// spent in the client's callbacks they call. `entries` counts the measured stretches; each one
// also holds about one clock reading (self_timing_clock_cost()), which a precise caller subtracts.
struct SelfTime {
    std::chrono::nanoseconds inside{0};
    uint64_t entries = 0;
};
void set_self_timing(bool on);                 // on: start measuring from zero on this thread
SelfTime self_time();                          // what this thread measured since it was turned on
std::chrono::nanoseconds self_timing_clock_cost();  // the cost of one clock reading, measured once

// World.
void set_world(const World& world);            // replace the world (fills derived ids) and forget every session
World get_world();                             // a copy of the current world, derived ids filled in
void update_world(const std::function<void(World&)>& change);   // edit the world in place, sessions kept
World default_world();                         // the built-in world used when nothing else is given
std::string derive_id(const std::string& seed);                 // 32 lowercase hex digits, stable per seed
EOS_EpicAccountId epic_account_id(const std::string& account);  // the account's interned Epic id handle
EOS_ProductUserId product_user_id(const std::string& account);  // the account's interned product user id
void set_login_account(const std::string& account);             // account a non-Developer Auth login signs in (empty = local)
void sign_in(const std::string& account);      // signed in to Auth and Connect at once, as after both logins
std::optional<Lobby> find_lobby(const std::string& lobby_id);   // the lobby as every member sees it

// World files (JSON). load_world_file throws std::runtime_error naming the file, the place in it
// (a JSON pointer such as /accounts/2/friends/0) and what is wrong; nothing is changed then.
World load_world_file(const std::string& path);
World parse_world(const nlohmann::json& document, const std::string& source);   // same checks, `source` names it
nlohmann::json world_to_json(const World& world);   // the file form; parse_world() reads it back unchanged
// The file EOS_Initialize loads (replacing the world); empty = the one named by the environment
// variable EOS_SIM_WORLD, if any. Without either, EOS_Initialize keeps the current world. Kept by reset().
void set_world_file(const std::string& path);
// The tick on which the script event `name` fired, if it has.
std::optional<uint64_t> script_fired(const std::string& name);

// Other players and the overlay. Notifications are queued and delivered inside EOS_Platform_Tick.
std::string remote_create_lobby(const std::string& owner, const std::vector<Attribute>& attributes,
                                uint32_t max_members = 10);    // returns the new lobby id
std::string remote_invite(const std::string& from, const std::string& lobby_id,
                          const std::string& to = {});          // invite id; to = local account raises LobbyInviteReceived
bool remote_accept_invite(const std::string& account, const std::string& invite_id);  // account joins the invite's lobby
bool remote_join(const std::string& account, const std::string& lobby_id);           // account joins the lobby
void raise_invite_received(const std::string& invite_id);      // LobbyInviteReceived for an existing invitation
void raise_invite_accepted(const std::string& invite_id);      // LobbyInviteAccepted, as the overlay does
uint64_t raise_join_lobby_accepted(const std::string& lobby_id);  // JoinLobbyAccepted; returns its UiEventId

// Completions.
void hold(bool on);                            // on: new completions (not notifications) wait for release; off: releases all held
std::vector<Pending> pending();                // queued completions in delivery order
bool release(uint64_t id);                     // let one held completion run on a coming tick
void release_all();                            // release every held completion in queue order
void release_in_order(const std::vector<uint64_t>& ids);        // release these, in this order
void release_shuffled(uint32_t seed);          // release every held completion in a seeded random order
bool delay(uint64_t id, int ticks);            // the completion skips the next `ticks` ticks
uint64_t ticks();                              // EOS_Platform_Tick calls that ran so far

// Failures.
void inject(const std::string& function, const Failure& failure);  // rules are tried in the order added
void clear_injections();

// Records.
std::vector<Call> calls(const std::string& function = {});      // all calls, or those of one function
void clear_calls();
std::vector<std::string> faults();             // misuse detected (released platform, double release, ...)
void clear_faults();
std::map<std::string, int> outstanding_copies();                 // kind -> copies not yet released
int outstanding_copies(const std::string& kind);                 // e.g. "EOS_UserInfo", "EOS_HLobbyDetails"
int outstanding_total();
std::vector<Subscription> subscriptions(const std::string& kind = {});   // live subscriptions

// SDK state.
bool initialized();                            // EOS_Initialize succeeded and EOS_Shutdown not yet called
int live_platforms();                          // created and not released

// Logging.
void emit_log(EOS_ELogCategory category, EOS_ELogLevel level, const std::string& message);  // through the callback, if the level passes
void emit_log_from_thread(int count, EOS_ELogCategory category, EOS_ELogLevel level,
                          const std::string& message);          // same, `count` times from a new thread; returns after it ends
EOS_ELogLevel log_level(EOS_ELogCategory category);             // current threshold of a category
const char* log_category_name(EOS_ELogCategory category);       // "LogEOS", "LogEOSAuth", ...

// ---------------------------------------------------------------------------------------------
// Service overrides (Friends, Achievements). Added with those services; unlike the controls
// above they change what a sync getter reports, to drive callers through absurd values.
// Both are cleared by reset() and set_world().
// ---------------------------------------------------------------------------------------------

// EOS_Friends_GetFriendsCount reports `count` (negative allowed) for every call with valid options,
// queried or not; GetFriendAtIndex still answers from the cached list. nullopt = the real count.
void force_friends_count(std::optional<int32_t> count);
// EOS_Achievements_GetPlayerAchievementCount reports `count` for every call with valid options;
// copies still answer from the cached list (EOS_NotFound past its end). nullopt = the real count.
void force_achievement_count(std::optional<uint32_t> count);

}  // namespace eos_sim
