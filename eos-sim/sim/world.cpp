// The simulated online world (accounts, lobbies, invitations) and who is signed in.
#include <algorithm>
#include <cstdio>

#include "sim_internal.h"

namespace eos_sim::sim {

namespace {

struct WorldState {
    World world;
    Sessions sessions;
    std::unordered_map<std::string, size_t> by_name, by_epic, by_product;
    uint64_t next_lobby = 1;
    uint64_t next_invite = 1;
};

WorldState& ws();

uint64_t fnv1a(const std::string& s, uint64_t basis) {
    uint64_t h = basis;
    for (unsigned char ch : s) {
        h ^= ch;
        h *= 0x100000001b3ull;
    }
    // final avalanche so that similar seeds give unrelated-looking ids
    h ^= h >> 33;
    h *= 0xff51afd7ed558ccdull;
    h ^= h >> 33;
    return h;
}

void normalize_accounts(World& w) {
    for (auto& a : w.accounts) {
        if (a.epic_id.empty()) a.epic_id = derive_id("epic:" + a.name);
        if (a.product_user_id.empty()) a.product_user_id = derive_id("puid:" + a.name);
        if (a.credential.empty()) a.credential = a.name;
    }
}

void index_into(WorldState& s) {
    s.by_name.clear();
    s.by_epic.clear();
    s.by_product.clear();
    for (size_t i = 0; i < s.world.accounts.size(); ++i) {
        const Account& a = s.world.accounts[i];
        s.by_name.emplace(a.name, i);
        s.by_epic.emplace(a.epic_id, i);
        s.by_product.emplace(a.product_user_id, i);
    }
}

void normalize(World& w) {
    normalize_accounts(w);
    for (auto& l : w.lobbies) {
        if (l.id.empty()) l.id = new_lobby_id();
        if (!l.owner.empty() && !is_member(l, l.owner)) l.members.insert(l.members.begin(), l.owner);
    }
    for (auto& i : w.invitations)
        if (i.id.empty()) i.id = new_invite_id();
}

WorldState& ws() {
    static WorldState* s = [] {
        auto* st = new WorldState;
        st->world = eos_sim::default_world();
        normalize_accounts(st->world);
        index_into(*st);
        return st;
    }();
    return *s;
}

}  // namespace

World& world() { return ws().world; }
Sessions& sessions() { return ws().sessions; }

void reindex_world() { index_into(ws()); }

std::string issue_token(Account& a) {
    auto& s = ws().sessions;
    const std::string token = "token-" + a.name + "-" + derive_id("token:" + std::to_string(s.next_token++));
    s.auth_token[a.name] = token;
    s.token_owner[token] = a.name;
    return token;
}

static Account* lookup(std::unordered_map<std::string, size_t>& index, const std::string& key) {
    auto it = index.find(key);
    if (it == index.end() || it->second >= ws().world.accounts.size()) return nullptr;
    return &ws().world.accounts[it->second];
}

Account* account_by_name(const std::string& name) { return lookup(ws().by_name, name); }
Account* account_by_epic(const std::string& text) { return lookup(ws().by_epic, text); }
Account* account_by_product(const std::string& text) { return lookup(ws().by_product, text); }
Account* local_account() { return account_by_name(ws().world.local_account); }

Lobby* lobby_by_id(const std::string& id) {
    for (auto& l : ws().world.lobbies)
        if (l.id == id) return &l;
    return nullptr;
}

Invitation* invitation_by_id(const std::string& id) {
    for (auto& i : ws().world.invitations)
        if (i.id == id) return &i;
    return nullptr;
}

std::string new_lobby_id() {
    std::string id;
    do {
        id = derive_id("lobby:" + std::to_string(ws().next_lobby++));
    } while (lobby_by_id(id) != nullptr);
    return id;
}

std::string new_invite_id() {
    std::string id;
    do {
        id = derive_id("invite:" + std::to_string(ws().next_invite++));
    } while (invitation_by_id(id) != nullptr);
    return id;
}

bool is_member(const Lobby& lobby, const std::string& account) {
    return std::find(lobby.members.begin(), lobby.members.end(), account) != lobby.members.end();
}

void add_member(Lobby& lobby, const std::string& account) {
    if (!is_member(lobby, account)) lobby.members.push_back(account);
    // Joining consumes the account's invitations to this lobby.
    auto& inv = ws().world.invitations;
    inv.erase(std::remove_if(inv.begin(), inv.end(),
                             [&](const Invitation& i) { return i.lobby_id == lobby.id && i.to == account; }),
              inv.end());
}

int lobbies_of(const std::string& account) {
    int n = 0;
    for (auto& l : ws().world.lobbies)
        if (is_member(l, account)) ++n;
    return n;
}

void destroy_lobby(const std::string& lobby_id) {
    auto& w = ws().world;
    w.lobbies.erase(std::remove_if(w.lobbies.begin(), w.lobbies.end(), [&](const Lobby& l) { return l.id == lobby_id; }),
                    w.lobbies.end());
    w.invitations.erase(std::remove_if(w.invitations.begin(), w.invitations.end(),
                                       [&](const Invitation& i) { return i.lobby_id == lobby_id; }),
                        w.invitations.end());
}

void remove_member(const std::string& lobby_id, const std::string& account) {
    Lobby* l = lobby_by_id(lobby_id);
    if (l == nullptr) return;
    l->members.erase(std::remove(l->members.begin(), l->members.end(), account), l->members.end());
    if (l->members.empty()) {
        destroy_lobby(lobby_id);
        return;
    }
    if (l->owner == account) l->owner = l->members.front();
}

void reset_world() {
    auto& s = ws();
    s.world = eos_sim::default_world();
    s.sessions = Sessions{};
    s.next_lobby = 1;
    s.next_invite = 1;
    normalize(s.world);
    reindex_world();
}

static EOS_EResult resolve_user(Op& op, IdState state, const std::string& text, Account** out,
                                const std::set<std::string>& signed_in, EOS_ELogCategory cat, const char* field) {
    *out = nullptr;
    if (state == IdState::Null) return op.invalid(cat, std::string(field) + ": null");
    if (state == IdState::Garbage) {
        fault(std::string(op.function()) + ": " + field + " is not an id handle");
        return op.invalid(cat, std::string(field) + ": invalid handle");
    }
    Account* a = nullptr;
    if (&signed_in == &ws().sessions.auth)
        a = account_by_epic(text);
    else
        a = account_by_product(text);
    if (a == nullptr || signed_in.count(a->name) == 0) {
        log(cat, EOS_ELogLevel::EOS_LOG_Warning, std::string(op.function()) + ": " + field + " " + text +
                                                     " is not signed in");
        return EOS_EResult::EOS_InvalidUser;
    }
    *out = a;
    return EOS_EResult::EOS_Success;
}

EOS_EResult auth_user(Op& op, EOS_EpicAccountId id, Account** out, EOS_ELogCategory cat, const char* field) {
    std::string text;
    const IdState state = epic_text(id, &text);
    return resolve_user(op, state, text, out, ws().sessions.auth, cat, field);
}

EOS_EResult connect_user(Op& op, EOS_ProductUserId id, Account** out, EOS_ELogCategory cat, const char* field) {
    std::string text;
    const IdState state = product_text(id, &text);
    return resolve_user(op, state, text, out, ws().sessions.connect, cat, field);
}

}  // namespace eos_sim::sim

// =============================================================================================

namespace eos_sim {

using namespace sim;

Attribute Attribute::string(std::string key, std::string value) {
    Attribute a;
    a.key = std::move(key);
    a.type = EOS_EAttributeType::EOS_AT_STRING;
    a.as_utf8 = std::move(value);
    return a;
}

Attribute Attribute::int64(std::string key, int64_t value) {
    Attribute a;
    a.key = std::move(key);
    a.type = EOS_EAttributeType::EOS_AT_INT64;
    a.as_int64 = value;
    return a;
}

Attribute Attribute::number(std::string key, double value) {
    Attribute a;
    a.key = std::move(key);
    a.type = EOS_EAttributeType::EOS_AT_DOUBLE;
    a.as_double = value;
    return a;
}

Attribute Attribute::boolean(std::string key, bool value) {
    Attribute a;
    a.key = std::move(key);
    a.type = EOS_EAttributeType::EOS_AT_BOOLEAN;
    a.as_bool = value;
    return a;
}

std::string derive_id(const std::string& seed) {
    char buf[33];
    std::snprintf(buf, sizeof buf, "%016llx%016llx", static_cast<unsigned long long>(fnv1a(seed, 0xcbf29ce484222325ull)),
                  static_cast<unsigned long long>(fnv1a(seed, 0x84222325cbf29ce4ull)));
    return buf;
}

World default_world() {
    // Kept identical to examples/default-world.json (a test compares the two).
    World w;
    Account player;
    player.name = "player";
    player.display_name = "Player";
    player.friends = {{"alice", false}, {"bob", false}, {"carol", false}};
    player.presence = Presence{EOS_Presence_EStatus::EOS_PS_Online, std::string(kThisProduct)};
    player.achievements = {{"first_steps", 1700000000}, {"explorer", -1}};
    player.ownership = {{"base_game", EOS_EOwnershipStatus::EOS_OS_Owned},
                        {"soundtrack", EOS_EOwnershipStatus::EOS_OS_Owned},
                        {"season_pass", EOS_EOwnershipStatus::EOS_OS_NotOwned}};

    Account alice;   // playing this game; accepts the player's invitations and invites the player
    alice.name = "alice";
    alice.display_name = "Alice";
    alice.friends = {{"player", false}};
    alice.presence = Presence{EOS_Presence_EStatus::EOS_PS_Online, std::string(kThisProduct)};
    alice.accepts_invites_after = 2;

    Account bob;   // online, in another game
    bob.name = "bob";
    bob.display_name = "Bob";
    bob.friends = {{"player", false}};
    bob.presence = Presence{EOS_Presence_EStatus::EOS_PS_Away, std::string("another-product")};

    Account carol;
    carol.name = "carol";   // offline: no display name, no presence, never signed in to this game
    carol.has_connect_user = false;
    carol.friends = {{"player", false}};

    Lobby lounge;   // a lobby that already exists when the game starts
    lounge.id = "alice-lounge";
    lounge.owner = "alice";
    lounge.members = {"alice", "bob"};
    lounge.attributes = {Attribute::string("connection_key", "alice-lounge:7777"), Attribute::int64("round", 3),
                         Attribute::number("skill", 1.5), Attribute::boolean("ranked", true)};
    lounge.attributes.back().visibility = EOS_ELobbyAttributeVisibility::EOS_LAT_PRIVATE;

    ScriptEvent invite;   // alice invites the player to a new lobby of hers
    invite.name = "alice-invites";
    invite.when = ScriptEvent::When::AfterSignIn;
    invite.ticks = 4;
    invite.action = ScriptEvent::Action::Invite;
    invite.account = "alice";
    invite.connection_key = "alice-host:7777";

    ScriptEvent lounge_invite;   // later, to the lounge
    lounge_invite.name = "lounge-invite";
    lounge_invite.when = ScriptEvent::When::AfterEvent;
    lounge_invite.after = "alice-invites";
    lounge_invite.ticks = 8;
    lounge_invite.action = ScriptEvent::Action::Invite;
    lounge_invite.account = "alice";
    lounge_invite.lobby_id = "alice-lounge";

    ScriptEvent overlay;   // which the player accepts in the overlay
    overlay.name = "overlay-accept";
    overlay.when = ScriptEvent::When::AfterEvent;
    overlay.after = "lounge-invite";
    overlay.ticks = 3;
    overlay.action = ScriptEvent::Action::OverlayAcceptInvite;
    overlay.invite = "lounge-invite";

    w.accounts = {player, alice, bob, carol};
    w.local_account = "player";
    w.lobbies = {lounge};
    w.script = {invite, lounge_invite, overlay};
    return w;
}

void set_world(const World& w) {
    auto& s = ws();
    s.world = w;
    s.sessions = Sessions{};
    normalize(s.world);
    reindex_world();
}

World get_world() { return ws().world; }

void update_world(const std::function<void(World&)>& change) {
    change(ws().world);
    normalize(ws().world);
    reindex_world();
}

EOS_EpicAccountId epic_account_id(const std::string& account) {
    Account* a = account_by_name(account);
    return a ? intern_epic(a->epic_id) : nullptr;
}

EOS_ProductUserId product_user_id(const std::string& account) {
    Account* a = account_by_name(account);
    return a ? intern_product(a->product_user_id) : nullptr;
}

void set_login_account(const std::string& account) { ws().sessions.login_account = account; }

void sign_in(const std::string& account) {
    Account* a = account_by_name(account);
    if (a == nullptr) return;
    auto& s = ws().sessions;
    a->has_connect_user = true;
    s.auth.insert(a->name);
    s.connect.insert(a->name);
    s.user_info[a->name].insert(a->name);
    if (!s.auth_token.count(a->name)) issue_token(*a);
}

std::optional<Lobby> find_lobby(const std::string& lobby_id) {
    Lobby* l = lobby_by_id(lobby_id);
    if (l == nullptr) return std::nullopt;
    return *l;
}

}  // namespace eos_sim
