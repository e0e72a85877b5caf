// UI: the overlay's friends view. Nothing is drawn; the call is recorded and completes.
#include "sim_internal.h"

using namespace eos_sim::sim;
using eos_sim::Account;

namespace {

const auto kUI = EOS_ELogCategory::EOS_LC_UI;

uint64_t platform_flags(const Platform* p) {
    if (p == nullptr || !p->options.is_object()) return 0;
    const auto it = p->options.find("Flags");
    return it != p->options.end() && it->is_number_unsigned() ? it->get<uint64_t>() : 0;
}

}  // namespace

namespace eos_sim::sim {

// The overlay (and with it the store checkout) is off for a platform created with
// EOS_PF_DISABLE_OVERLAY; the friends view also needs the social overlay.
bool overlay_disabled(const Platform* p, bool social) {
    const uint64_t flags = platform_flags(p);
    if (flags & EOS_PF_DISABLE_OVERLAY) return true;
    return social && (flags & EOS_PF_DISABLE_SOCIAL_OVERLAY);
}

}  // namespace eos_sim::sim

EOS_DECLARE_FUNC(void) EOS_UI_ShowFriends(EOS_HUI Handle, const EOS_UI_ShowFriendsOptions* Options, void* ClientData,
                                          const EOS_UI_OnShowFriendsCallback CompletionDelegate) {
    Op op("EOS_UI_ShowFriends", Handle, Iface::UI, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    EOS_EpicAccountId local = nullptr;
    if (Options == nullptr) {
        pre = op.invalid(kUI, "EOS_UI_ShowFriendsOptions: null");
    } else {
        local = Options->LocalUserId;
        op.options({{"ApiVersion", Options->ApiVersion}, {"LocalUserId", id_json(local)}});
        Account* a = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_UI_SHOWFRIENDS_API_LATEST)) {
            pre = op.invalid(kUI, "EOS_UI_ShowFriendsOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = auth_user(op, local, &a, kUI, "LocalUserId")) != EOS_EResult::EOS_Success) {
        } else if (op.ok() && overlay_disabled(op.platform(), true)) {
            log(kUI, EOS_ELogLevel::EOS_LOG_Warning, "EOS_UI_ShowFriends: the overlay is disabled on this platform");
            pre = EOS_EResult::EOS_NotConfigured;
        }
    }
    auto ids = [local](EOS_UI_ShowFriendsCallbackInfo& info, Keep& k) { info.LocalUserId = k.id("LocalUserId", local); };
    start_async<EOS_UI_ShowFriendsCallbackInfo>(
        op, CompletionDelegate, pre,
        [ids](EOS_UI_ShowFriendsCallbackInfo& info, Keep& k) {
            ids(info, k);
            return EOS_EResult::EOS_Success;
        },
        ids);
}
