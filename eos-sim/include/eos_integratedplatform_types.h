/*
 * Integrated-platform (e.g. Steam) option containers and platform names.
 * Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_INTEGRATEDPLATFORM_TYPES_H_INCLUDED
#define EOS_INTEGRATEDPLATFORM_TYPES_H_INCLUDED

#include "eos_common.h"

/* Container of integrated-platform options handed to EOS_Platform_Create (NULL: none). */
typedef struct EOS_IntegratedPlatformOptionsContainerHandle* EOS_HIntegratedPlatformOptionsContainer;

#define EOS_IPT_Unknown ((EOS_IntegratedPlatformType)0)
#define EOS_IPT_Steam ((EOS_IntegratedPlatformType)"STEAM")

#endif /* EOS_INTEGRATEDPLATFORM_TYPES_H_INCLUDED */
