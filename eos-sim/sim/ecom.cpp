// Ecom: ownership queries (Account::ownership) and the store checkout.
#include "sim_internal.h"

using namespace eos_sim::sim;
using eos_sim::Account;

namespace eos_sim::sim {
bool overlay_disabled(const Platform* p, bool social);   // ui.cpp
}

namespace {

const auto kEcom = EOS_ELogCategory::EOS_LC_Ecom;

// Reads a caller's list of `count` strings during the call. Sets *bad for a null or empty entry.
json read_strings(const char* const* list, uint32_t count, std::vector<std::string>* out, bool* bad) {
    json j = json::array();
    for (uint32_t i = 0; i < count; ++i) {
        const char* s = list[i];
        j.push_back(str_json(s));
        if (s == nullptr || s[0] == '\0')
            *bad = true;
        else
            out->emplace_back(s);
    }
    return j;
}

}  // namespace

EOS_DECLARE_FUNC(void) EOS_Ecom_QueryOwnership(EOS_HEcom Handle, const EOS_Ecom_QueryOwnershipOptions* Options,
                                               void* ClientData,
                                               const EOS_Ecom_OnQueryOwnershipCallback CompletionDelegate) {
    Op op("EOS_Ecom_QueryOwnership", Handle, Iface::Ecom, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    EOS_EpicAccountId local = nullptr;
    std::string local_name;
    std::vector<std::string> ids;
    if (Options == nullptr) {
        pre = op.invalid(kEcom, "EOS_Ecom_QueryOwnershipOptions: null");
    } else {
        local = Options->LocalUserId;
        const uint32_t count = Options->CatalogItemIdCount;
        bool bad_entry = false;
        json list = nullptr;
        // An over-long list is refused before it is read, as the SDK does.
        if (Options->CatalogItemIds != nullptr && count <= EOS_ECOM_QUERYOWNERSHIP_MAX_CATALOG_IDS)
            list = read_strings(Options->CatalogItemIds, count, &ids, &bad_entry);
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(local)},
                    {"CatalogItemIds", list},
                    {"CatalogItemIdCount", count},
                    {"CatalogNamespace", str_json(Options->CatalogNamespace)}});
        Account* a = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_ECOM_QUERYOWNERSHIP_API_LATEST)) {
            pre = op.invalid(kEcom, "EOS_Ecom_QueryOwnershipOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = auth_user(op, local, &a, kEcom, "LocalUserId")) != EOS_EResult::EOS_Success) {
        } else if (count > EOS_ECOM_QUERYOWNERSHIP_MAX_CATALOG_IDS) {
            pre = op.invalid(kEcom, "CatalogItemIdCount: more than " +
                                        std::to_string(EOS_ECOM_QUERYOWNERSHIP_MAX_CATALOG_IDS));
        } else if (count > 0 && Options->CatalogItemIds == nullptr) {
            pre = op.invalid(kEcom, "CatalogItemIds: null with a non-zero count");
        } else if (bad_entry) {
            pre = op.invalid(kEcom, "CatalogItemIds: null or empty entry");
        } else {
            local_name = a->name;   // an empty list is a valid query with an empty answer
        }
    }
    // The entries belong to the completion job, which is destroyed right after the callback
    // returns: they are valid during the callback only, as the SDK promises no more.
    auto entries = std::make_shared<std::vector<EOS_Ecom_ItemOwnership>>();
    start_async<EOS_Ecom_QueryOwnershipCallbackInfo>(
        op, CompletionDelegate, pre,
        [local, local_name, ids, entries](EOS_Ecom_QueryOwnershipCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
            Account* a = account_by_name(local_name);
            if (a == nullptr || !sessions().auth.count(local_name)) return EOS_EResult::EOS_InvalidUser;
            entries->assign(ids.size(), EOS_Ecom_ItemOwnership{});
            json out = json::array();
            for (size_t i = 0; i < ids.size(); ++i) {
                auto it = a->ownership.find(ids[i]);
                const auto status = it == a->ownership.end() ? EOS_EOwnershipStatus::EOS_OS_NotOwned : it->second;
                auto& e = (*entries)[i];
                e.ApiVersion = EOS_ECOM_ITEMOWNERSHIP_API_LATEST;
                k.strings.push_back(ids[i]);
                e.Id = k.strings.back().c_str();
                e.OwnershipStatus = status;
                out.push_back({{"Id", ids[i]}, {"OwnershipStatus", static_cast<int32_t>(status)}});
            }
            k.out["ItemOwnership"] = out;
            info.ItemOwnership = entries->empty() ? nullptr : entries->data();
            info.ItemOwnershipCount = static_cast<uint32_t>(entries->size());
            return EOS_EResult::EOS_Success;
        },
        [local](EOS_Ecom_QueryOwnershipCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
            k.out["ItemOwnership"] = json::array();
        });
}

namespace {

// Checkout's completion when the caller gives none: the outcome is still recorded.
void EOS_CALL checkout_unobserved(const EOS_Ecom_CheckoutCallbackInfo*) {}

}  // namespace

EOS_DECLARE_FUNC(void) EOS_Ecom_Checkout(EOS_HEcom Handle, const EOS_Ecom_CheckoutOptions* Options, void* ClientData,
                                         const EOS_Ecom_OnCheckoutCallback CompletionDelegate) {
    Op op("EOS_Ecom_Checkout", Handle, Iface::Ecom, ClientData);
    EOS_EResult pre = EOS_EResult::EOS_Success;
    EOS_EpicAccountId local = nullptr;
    std::string local_name;
    if (Options == nullptr) {
        pre = op.invalid(kEcom, "EOS_Ecom_CheckoutOptions: null");
    } else {
        local = Options->LocalUserId;
        const uint32_t count = Options->EntryCount;
        json entries = nullptr;
        bool bad_entry = false;
        if (Options->Entries != nullptr && count <= EOS_ECOM_CHECKOUT_MAX_ENTRIES) {
            entries = json::array();
            for (uint32_t i = 0; i < count; ++i) {
                const EOS_Ecom_CheckoutEntry& e = Options->Entries[i];
                entries.push_back({{"ApiVersion", e.ApiVersion}, {"OfferId", str_json(e.OfferId)}});
                if (e.ApiVersion != EOS_ECOM_CHECKOUTENTRY_API_LATEST || e.OfferId == nullptr || e.OfferId[0] == '\0')
                    bad_entry = true;
            }
        }
        op.options({{"ApiVersion", Options->ApiVersion},
                    {"LocalUserId", id_json(local)},
                    {"OverrideCatalogNamespace", str_json(Options->OverrideCatalogNamespace)},
                    {"EntryCount", count},
                    {"Entries", entries}});
        Account* a = nullptr;
        if (!version_ok(Options->ApiVersion, EOS_ECOM_CHECKOUT_API_LATEST)) {
            pre = op.invalid(kEcom, "EOS_Ecom_CheckoutOptions.ApiVersion", EOS_EResult::EOS_IncompatibleVersion);
        } else if ((pre = auth_user(op, local, &a, kEcom, "LocalUserId")) != EOS_EResult::EOS_Success) {
        } else if (count == 0 || count > EOS_ECOM_CHECKOUT_MAX_ENTRIES) {
            pre = op.invalid(kEcom, "EntryCount: must be 1.." + std::to_string(EOS_ECOM_CHECKOUT_MAX_ENTRIES));
        } else if (Options->Entries == nullptr) {
            pre = op.invalid(kEcom, "Entries: null");
        } else if (bad_entry) {
            pre = op.invalid(kEcom, "Entries: an entry has a wrong ApiVersion or no OfferId");
        } else if (op.ok() && overlay_disabled(op.platform(), false)) {
            // The purchase flow runs in the overlay; without it nothing can be bought.
            log(kEcom, EOS_ELogLevel::EOS_LOG_Warning, "EOS_Ecom_Checkout: the overlay is disabled on this platform");
            pre = EOS_EResult::EOS_NotConfigured;
        } else {
            local_name = a->name;
        }
    }
    const EOS_Ecom_OnCheckoutCallback callback = CompletionDelegate ? CompletionDelegate : &checkout_unobserved;
    const size_t call = op.index();
    start_async<EOS_Ecom_CheckoutCallbackInfo>(
        op, callback, pre,
        [local, call](EOS_Ecom_CheckoutCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
            info.TransactionId = k.str("TransactionId", "txn-" + eos_sim::derive_id("checkout:" + std::to_string(call)));
            return EOS_EResult::EOS_Success;
        },
        [local](EOS_Ecom_CheckoutCallbackInfo& info, Keep& k) {
            info.LocalUserId = k.id("LocalUserId", local);
            info.TransactionId = nullptr;
        });
}
