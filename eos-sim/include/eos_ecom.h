/*
 * Ecom interface functions. Part of the EOS SDK stand-in (SDK names, tarnwick's subset).
 */
#ifndef EOS_ECOM_H_INCLUDED
#define EOS_ECOM_H_INCLUDED

#include "eos_ecom_types.h"

EOS_DECLARE_FUNC(void) EOS_Ecom_QueryOwnership(EOS_HEcom Handle, const EOS_Ecom_QueryOwnershipOptions* Options, void* ClientData, const EOS_Ecom_OnQueryOwnershipCallback CompletionDelegate);

EOS_DECLARE_FUNC(void) EOS_Ecom_Checkout(EOS_HEcom Handle, const EOS_Ecom_CheckoutOptions* Options, void* ClientData, const EOS_Ecom_OnCheckoutCallback CompletionDelegate);

#endif /* EOS_ECOM_H_INCLUDED */
