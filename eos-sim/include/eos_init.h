/*
 * SDK start-up and shut-down, and platform instance creation/release.
 * Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_INIT_H_INCLUDED
#define EOS_INIT_H_INCLUDED

#include "eos_types.h"

/* Custom allocator hooks; either all three are set or none. */
EXTERN_C typedef void* (EOS_MEMORY_CALL * EOS_AllocateMemoryFunc)(size_t SizeInBytes, size_t Alignment);
EXTERN_C typedef void* (EOS_MEMORY_CALL * EOS_ReallocateMemoryFunc)(void* Pointer, size_t SizeInBytes, size_t Alignment);
EXTERN_C typedef void (EOS_MEMORY_CALL * EOS_ReleaseMemoryFunc)(void* Pointer);

#define EOS_INITIALIZE_THREADAFFINITY_API_LATEST 2

/* CPU affinity masks of the SDK's worker threads. */
EOS_STRUCT(EOS_Initialize_ThreadAffinity, (
	int32_t ApiVersion;
	uint64_t NetworkWork;
	uint64_t StorageIo;
	uint64_t WebSocketIo;
	uint64_t P2PIo;
	uint64_t HttpRequestIo;
	uint64_t RTCIo;
));

#define EOS_INITIALIZEOPTIONS_PRODUCTNAME_MAX_LENGTH 64
#define EOS_INITIALIZEOPTIONS_PRODUCTVERSION_MAX_LENGTH 64

#define EOS_INITIALIZE_API_LATEST 4

EOS_STRUCT(EOS_InitializeOptions, (
	int32_t ApiVersion;
	EOS_AllocateMemoryFunc AllocateMemoryFunction;
	EOS_ReallocateMemoryFunc ReallocateMemoryFunction;
	EOS_ReleaseMemoryFunc ReleaseMemoryFunction;
	const char* ProductName;
	const char* ProductVersion;
	void* Reserved;
	void* SystemInitializeOptions;
	EOS_Initialize_ThreadAffinity* OverrideThreadAffinity;
));

/* Once per process; a second call answers EOS_AlreadyConfigured. */
EOS_DECLARE_FUNC(EOS_EResult) EOS_Initialize(const EOS_InitializeOptions* Options);

/* Tears the SDK down; no SDK call is allowed afterwards. */
EOS_DECLARE_FUNC(EOS_EResult) EOS_Shutdown(void);

/* NULL on failure. */
EOS_DECLARE_FUNC(EOS_HPlatform) EOS_Platform_Create(const EOS_Platform_Options* Options);

/* Once per platform instance, before EOS_Shutdown. */
EOS_DECLARE_FUNC(void) EOS_Platform_Release(EOS_HPlatform Handle);

#endif /* EOS_INIT_H_INCLUDED */
