/*
 * Ecom interface types: ownership queries and checkout.
 * Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_ECOM_TYPES_H_INCLUDED
#define EOS_ECOM_TYPES_H_INCLUDED

#include "eos_common.h"

EXTERN_C typedef struct EOS_EcomHandle* EOS_HEcom;
EXTERN_C typedef struct EOS_Ecom_TransactionHandle* EOS_Ecom_HTransaction;

typedef const char* EOS_Ecom_CatalogItemId;
typedef const char* EOS_Ecom_CatalogOfferId;

#define EOS_ECOM_TRANSACTIONID_MAXIMUM_LENGTH 64

EOS_ENUM(EOS_EOwnershipStatus,
	EOS_OS_NotOwned = 0,
	EOS_OS_Owned = 1
);

#define EOS_ECOM_ITEMOWNERSHIP_API_LATEST 1

EOS_STRUCT(EOS_Ecom_ItemOwnership, (
	int32_t ApiVersion;
	EOS_Ecom_CatalogItemId Id;
	EOS_EOwnershipStatus OwnershipStatus;
));

#define EOS_ECOM_QUERYOWNERSHIP_API_LATEST 2
#define EOS_ECOM_QUERYOWNERSHIP_MAX_CATALOG_IDS 400

/* CatalogNamespace NULL means the sandbox's own catalog. */
EOS_STRUCT(EOS_Ecom_QueryOwnershipOptions, (
	int32_t ApiVersion;
	EOS_EpicAccountId LocalUserId;
	EOS_Ecom_CatalogItemId* CatalogItemIds;
	uint32_t CatalogItemIdCount;
	const char* CatalogNamespace;
));

/* ItemOwnership is valid only during the callback. */
EOS_STRUCT(EOS_Ecom_QueryOwnershipCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_EpicAccountId LocalUserId;
	const EOS_Ecom_ItemOwnership* ItemOwnership;
	uint32_t ItemOwnershipCount;
));

EOS_DECLARE_CALLBACK(EOS_Ecom_OnQueryOwnershipCallback, const EOS_Ecom_QueryOwnershipCallbackInfo* Data);

#define EOS_ECOM_CHECKOUTENTRY_API_LATEST 1

EOS_STRUCT(EOS_Ecom_CheckoutEntry, (
	int32_t ApiVersion;
	EOS_Ecom_CatalogOfferId OfferId;
));

#define EOS_ECOM_CHECKOUT_API_LATEST 1
#define EOS_ECOM_CHECKOUT_MAX_ENTRIES 10

EOS_STRUCT(EOS_Ecom_CheckoutOptions, (
	int32_t ApiVersion;
	EOS_EpicAccountId LocalUserId;
	const char* OverrideCatalogNamespace;
	uint32_t EntryCount;
	const EOS_Ecom_CheckoutEntry* Entries;
));

EOS_STRUCT(EOS_Ecom_CheckoutCallbackInfo, (
	EOS_EResult ResultCode;
	void* ClientData;
	EOS_EpicAccountId LocalUserId;
	const char* TransactionId;
));

EOS_DECLARE_CALLBACK(EOS_Ecom_OnCheckoutCallback, const EOS_Ecom_CheckoutCallbackInfo* Data);

#endif /* EOS_ECOM_TYPES_H_INCLUDED */
