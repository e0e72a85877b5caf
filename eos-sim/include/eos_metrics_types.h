/*
 * Metrics interface types. Part of the EOS SDK stand-in (SDK names, tarnwick's subset).
 */
#ifndef EOS_METRICS_TYPES_H_INCLUDED
#define EOS_METRICS_TYPES_H_INCLUDED

#include "eos_common.h"

EXTERN_C typedef struct EOS_MetricsHandle* EOS_HMetrics;

#endif /* EOS_METRICS_TYPES_H_INCLUDED */
