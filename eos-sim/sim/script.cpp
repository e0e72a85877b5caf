// The world's script: timed events played by other players, the overlay and the services, run at
// the start of each EOS_Platform_Tick; and the standing rule by which an account accepts the
// local player's invitations a few ticks after they are sent.
#include <algorithm>

#include "script.h"
#include "sim_internal.h"

namespace eos_sim::sim {

// Progress of the world's script; part of the sessions, so a new world starts it afresh.
struct ScriptProgress {
    std::vector<std::optional<uint64_t>> fired;              // per event: the tick it fired on
    std::map<std::string, std::string> invites;              // invite event name -> invitation it sent
    std::optional<uint64_t> signed_in_at;                    // tick the local player signed in on
    std::set<std::string> noticed;                           // invitations of the local player seen so far
    std::vector<std::pair<uint64_t, std::string>> acceptances;   // (due tick, invitation) of standing rules
};

namespace {

const auto kCore = EOS_ELogCategory::EOS_LC_Core;

ScriptProgress& progress() {
    auto& p = sessions().script;
    if (!p) p = std::make_shared<ScriptProgress>();
    p->fired.resize(world().script.size());
    return *p;
}

void say(const std::string& text) { log(kCore, EOS_ELogLevel::EOS_LOG_Info, "Script: " + text); }
void warn(const std::string& text) { log(kCore, EOS_ELogLevel::EOS_LOG_Warning, "Script: " + text); }

std::string label(const ScriptEvent& e, size_t index) {
    return e.name.empty() ? "event " + std::to_string(index + 1) : "\"" + e.name + "\"";
}

void fire(const ScriptEvent& e, size_t index, ScriptProgress& p) {
    const std::string what = label(e, index);
    const std::string local = world().local_account;
    switch (e.action) {
        case ScriptEvent::Action::Invite: {
            std::string lobby = e.lobby_id;
            if (lobby.empty()) lobby = remote_create_lobby(e.account, {Attribute::string("connection_key", e.connection_key)});
            const std::string invite = lobby.empty() ? std::string() : remote_invite(e.account, lobby, local);
            if (invite.empty()) {
                warn(what + ": " + e.account + " could not invite " + local + (lobby.empty() ? "" : " to lobby " + lobby));
                return;
            }
            p.invites[e.name] = invite;
            say(what + ": " + e.account + " invites " + local + " to lobby " + lobby + " (invitation " + invite + ")");
            return;
        }
        case ScriptEvent::Action::OverlayAcceptInvite: {
            auto it = p.invites.find(e.invite);
            if (it == p.invites.end() || invitation_by_id(it->second) == nullptr) {
                warn(what + ": the invitation of \"" + e.invite + "\" is not pending; nothing accepted in the overlay");
                return;
            }
            raise_invite_accepted(it->second);
            say(what + ": invitation " + it->second + " accepted in the overlay");
            return;
        }
        case ScriptEvent::Action::OverlayAcceptJoin:
            if (lobby_by_id(e.lobby_id) == nullptr) {
                warn(what + ": lobby " + e.lobby_id + " no longer exists; no join accepted in the overlay");
                return;
            }
            raise_join_lobby_accepted(e.lobby_id);
            say(what + ": join of lobby " + e.lobby_id + " accepted in the overlay");
            return;
        case ScriptEvent::Action::AcceptInvitation: {
            const auto& invitations = world().invitations;
            auto latest = std::find_if(invitations.rbegin(), invitations.rend(), [&](const Invitation& i) {
                return i.from == local && i.to == e.account;
            });
            if (latest == invitations.rend()) {
                warn(what + ": " + e.account + " has no invitation from " + local + " to accept");
                return;
            }
            const Invitation inv = *latest;
            if (remote_accept_invite(e.account, inv.id))
                say(what + ": " + e.account + " accepts invitation " + inv.id + " and joins lobby " + inv.lobby_id);
            else
                warn(what + ": " + e.account + " could not join lobby " + inv.lobby_id);
            return;
        }
        case ScriptEvent::Action::Fail:
            inject(e.function, Failure::repeated(e.code, e.times));
            say(what + ": " + e.function + " fails with " + std::to_string(static_cast<int32_t>(e.code)) +
                (e.times < 0 ? " from now on" : " " + std::to_string(e.times) + " time(s)"));
            return;
    }
}

// The local player's invitations, noticed once each: an account with a standing rule accepts
// them `accepts_invites_after` ticks after the tick that sent them.
void notice_invitations(ScriptProgress& p, uint64_t now) {
    const std::string local = world().local_account;
    for (const Invitation& inv : world().invitations) {
        if (inv.from != local || !p.noticed.insert(inv.id).second) continue;
        Account* to = account_by_name(inv.to);
        if (to == nullptr || !to->accepts_invites_after) continue;
        const uint64_t sent = now == 0 ? 0 : now - 1;
        p.acceptances.emplace_back(sent + static_cast<uint64_t>(*to->accepts_invites_after), inv.id);
    }
    std::vector<std::string> due;
    auto& list = p.acceptances;
    for (auto it = list.begin(); it != list.end();) {
        if (it->first <= now) {
            due.push_back(it->second);
            it = list.erase(it);
        } else {
            ++it;
        }
    }
    for (const std::string& id : due) {
        const Invitation* inv = invitation_by_id(id);
        if (inv == nullptr) continue;   // rejected, or its lobby is gone
        const Invitation copy = *inv;
        if (remote_accept_invite(copy.to, copy.id))
            say(copy.to + " accepts invitation " + copy.id + " and joins lobby " + copy.lobby_id);
        else
            warn(copy.to + " could not join lobby " + copy.lobby_id);
    }
}

// Fires every event that is due at `now`; an event that waits for another may fire in the same
// tick as it. Outside a tick (at EOS_Initialize) only failures are armed: nothing else could be
// delivered before a platform exists.
void run_events(ScriptProgress& p, uint64_t now) {
    const auto& script = world().script;
    std::map<std::string, size_t> by_name;
    for (size_t i = 0; i < script.size(); ++i)
        if (!script[i].name.empty()) by_name.emplace(script[i].name, i);
    bool progressed = true;
    while (progressed) {
        progressed = false;
        for (size_t i = 0; i < script.size(); ++i) {
            const ScriptEvent& e = script[i];
            if (p.fired[i]) continue;
            if (!ticking() && e.action != ScriptEvent::Action::Fail) continue;
            std::optional<uint64_t> start;
            switch (e.when) {
                case ScriptEvent::When::AtTick: start = 0; break;
                case ScriptEvent::When::AfterSignIn: start = p.signed_in_at; break;
                case ScriptEvent::When::AfterEvent: {
                    auto it = by_name.find(e.after);
                    if (it != by_name.end()) start = p.fired[it->second];
                    break;
                }
            }
            if (!start || *start + e.ticks > now) continue;
            p.fired[i] = now;
            progressed = true;
            fire(e, i, p);
        }
    }
}

void run_script(uint64_t now) {
    ScriptProgress& p = progress();
    if (!p.signed_in_at) {
        const Account* local = local_account();
        // Sign-in completes inside a tick; it is seen at the start of the next one.
        if (local != nullptr && sessions().connect.count(local->name)) p.signed_in_at = now == 0 ? 0 : now - 1;
    }
    notice_invitations(p, now);
    run_events(p, now);
}

}  // namespace

void script_on_tick(Platform*) { run_script(eos_sim::ticks()); }

void script_world_loaded() { run_script(eos_sim::ticks()); }

}  // namespace eos_sim::sim

namespace eos_sim {

std::optional<uint64_t> script_fired(const std::string& name) {
    const auto& script = sim::world().script;
    const auto& p = sim::sessions().script;
    if (!p) return std::nullopt;
    for (size_t i = 0; i < script.size() && i < p->fired.size(); ++i)
        if (script[i].name == name) return p->fired[i];
    return std::nullopt;
}

}  // namespace eos_sim
