// Ownership of catalogue items and the store checkout.
#include "state.h"

#include <cstdlib>
#include <cstring>

static void EOS_CALL on_query_ownership(const EOS_Ecom_QueryOwnershipCallbackInfo *info);

HL_PRIM void HL_NAME(query_ownership)(varray *itemIds, vclosure *onOwned)
{
    if (!platform_ready("query_ownership"))
        return;
    // The ids go to the SDK in place; a missing array, one that does not hold
    // bytes, or null entries are never handed over as they are.
    EOS_Ecom_CatalogItemId *ids = nullptr;
    EOS_Ecom_CatalogItemId *copy = nullptr;
    uint32_t count = 0;
    if (!itemIds || itemIds->size <= 0) {
        if (!itemIds)
            egs_log("[EGS] No catalogue item ids, ownership asked for none\n");
    } else if (!itemIds->at || itemIds->at->kind != HBYTES) {
        egs_log("[EGS] Catalogue item ids are not bytes, ownership asked for none\n");
    } else {
        ids = hl_aptr(itemIds, EOS_Ecom_CatalogItemId);
        count = static_cast<uint32_t>(itemIds->size);
        for (uint32_t i = 0; i < count; ++i) {
            if (ids[i])
                continue;
            copy = static_cast<EOS_Ecom_CatalogItemId *>(std::malloc(count * sizeof(EOS_Ecom_CatalogItemId)));
            uint32_t kept = 0;
            for (uint32_t j = 0; copy && j < count; ++j)
                if (ids[j])
                    copy[kept++] = ids[j];
            egs_log("[EGS] Null catalogue item ids skipped : %d\n", static_cast<int>(count - kept));
            ids = copy;
            count = copy ? kept : 0;
            break;
        }
    }
    EOS_Ecom_QueryOwnershipOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 2;
    options.LocalUserId = g_epic_account_id;
    options.CatalogItemIds = ids;
    options.CatalogItemIdCount = count;
    options.CatalogNamespace = nullptr;
    closure_cell *cell = closure_cell_new(onOwned);
    EOS_Ecom_QueryOwnership(EOS_Platform_GetEcomInterface(g_platform), &options, cell, on_query_ownership);
    std::free(copy);
}

static void EOS_CALL on_query_ownership(const EOS_Ecom_QueryOwnershipCallbackInfo *info)
{
    if (!result_is_final(info->ResultCode))
        return;
    closure_cell *cell = static_cast<closure_cell *>(info->ClientData);
    if (!cell)
        return;
    if (info->ResultCode != EOS_EResult::EOS_Success) {
        deliver_array(cell->closure, nullptr);
        closure_cell_free(cell);
        return;
    }
    const EOS_Ecom_ItemOwnership *items = info->ItemOwnership;
    uint32_t entries = items ? info->ItemOwnershipCount : 0;
    int owned = 0;
    for (uint32_t i = 0; i < entries; ++i)
        if (items[i].OwnershipStatus == EOS_EOwnershipStatus::EOS_OS_Owned && owned < INT32_MAX)
            ++owned;
    varray *list = hl_alloc_array(&hlt_bytes, owned);
    int next = 0;
    for (uint32_t i = 0; i < entries && next < owned; ++i)
        if (items[i].OwnershipStatus == EOS_EOwnershipStatus::EOS_OS_Owned)
            hl_aptr(list, vbyte *)[next++] = to_vm_bytes(items[i].Id);
    deliver_array(cell->closure, list);
    closure_cell_free(cell);
}

HL_PRIM void HL_NAME(store_checkout)(vbyte *offerId)
{
    if (!platform_ready("store_checkout"))
        return;
    EOS_Ecom_CheckoutEntry entry;
    std::memset(&entry, 0, sizeof entry);
    entry.ApiVersion = 1;
    entry.OfferId = reinterpret_cast<const char *>(offerId);
    EOS_Ecom_CheckoutOptions options;
    std::memset(&options, 0, sizeof options);
    options.ApiVersion = 1;
    options.LocalUserId = g_epic_account_id;
    options.OverrideCatalogNamespace = nullptr;
    options.EntryCount = 1;
    options.Entries = &entry;
    // The game is told nothing of the outcome; a completion that ignores it
    // keeps SDK releases that insist on one content.
    EOS_Ecom_Checkout(EOS_Platform_GetEcomInterface(g_platform), &options, nullptr,
                      on_complete_ignore<EOS_Ecom_CheckoutCallbackInfo>);
}
