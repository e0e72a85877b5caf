// tarnwick's primitives as a game declares them: name, signature and C type,
// in one table for every program here that loads tarnwick.hdll (the demo, the
// tests, the benchmarks). Binding goes through the stand-in host, which checks
// each signature against the hdll's descriptor as the VM does.
#pragma once

#include <hl.h>
#include <host.h>

namespace tarnwick {

// X(name, signature, return type, parameter list)
#define TARNWICK_PRIMITIVES(X)                                                                  \
    X(init, "POBBBBBBBBBBiib_PiBBB_v_b", bool, (void *config, vclosure *onLogin))               \
    X(notify_invite_received, "PPBB_v_v", void, (vclosure * onInvite))                          \
    X(notify_invite_accepted, "PPBB_v_v", void, (vclosure * onAccepted))                        \
    X(update, "P_v", void, ())                                                                  \
    X(set_achievement, "PB_v", void, (vbyte * id))                                              \
    X(query_ownership, "PAPA_v_v", void, (varray * itemIds, vclosure *onOwned))                 \
    X(query_achievements, "PPA_v_v", void, (vclosure * onAchievements))                         \
    X(show_friends, "P_v", void, ())                                                            \
    X(query_friends, "PPA_v_v", void, (vclosure * onFriends))                                   \
    X(send_invite, "PBB_v", void, (vbyte * targetUserId, vbyte *lobbyId))                       \
    X(reject_invite, "PB_v", void, (vbyte * inviteId))                                          \
    X(accept_invite, "PBPBB_v_v", void, (vbyte * inviteId, vclosure *onJoined))                 \
    X(create_lobby, "PBPB_v_v", void, (vbyte * connectionKey, vclosure *onCreated))             \
    X(leave_lobby, "PBPi_v_v", void, (vbyte * lobbyId, vclosure *onLeft))                       \
    X(destroy_lobby, "PBPi_v_v", void, (vbyte * lobbyId, vclosure *onDestroyed))                \
    X(exit, "P_v", void, ())                                                                    \
    X(store_checkout, "PB_v", void, (vbyte * offerId))

struct Declared {
    const char *name;
    const char *signature;
};

#define TARNWICK_DECLARED(name, signature, ret, params) {#name, signature},
inline constexpr Declared kDeclared[] = {TARNWICK_PRIMITIVES(TARNWICK_DECLARED)};
#undef TARNWICK_DECLARED

struct Primitives {
#define TARNWICK_POINTER(name, signature, ret, params) ret(*name) params = nullptr;
    TARNWICK_PRIMITIVES(TARNWICK_POINTER)
#undef TARNWICK_POINTER
};

// Binds every primitive of the loaded hdll (host::load), as the VM binds a
// module's natives when it loads: a wrong signature stops the process.
inline Primitives bind_primitives()
{
    Primitives p;
#define TARNWICK_BIND(name, signature, ret, params) p.name = host::bind_as<ret(*) params>(#name, signature);
    TARNWICK_PRIMITIVES(TARNWICK_BIND)
#undef TARNWICK_BIND
    return p;
}

}  // namespace tarnwick
