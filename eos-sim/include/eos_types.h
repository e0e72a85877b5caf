/*
 * Platform instance types: the platform handle and the options of EOS_Platform_Create.
 * Part of the EOS SDK stand-in (SDK names and layouts, tarnwick's subset).
 */
#ifndef EOS_TYPES_H_INCLUDED
#define EOS_TYPES_H_INCLUDED

#include "eos_common.h"
#include "eos_integratedplatform_types.h"

EXTERN_C typedef struct EOS_PlatformHandle* EOS_HPlatform;

#define EOS_COUNTRYCODE_MAX_LENGTH 4
#define EOS_LOCALECODE_MAX_LENGTH 9

#define EOS_PLATFORM_CLIENTCREDENTIALS_CLIENTID_MAX_LENGTH 64
#define EOS_PLATFORM_CLIENTCREDENTIALS_CLIENTSECRET_MAX_LENGTH 64

/* Client credentials of the product; embedded by value in EOS_Platform_Options. */
EOS_STRUCT(EOS_Platform_ClientCredentials, (
	const char* ClientId;
	const char* ClientSecret;
));

/* What voice rooms do while the application is in the background. */
EOS_ENUM(EOS_ERTCBackgroundMode,
	EOS_RTCBM_LeaveRooms = 0,
	EOS_RTCBM_KeepRoomsAlive = 1
);

#define EOS_PLATFORM_RTCOPTIONS_API_LATEST 2

EOS_STRUCT(EOS_Platform_RTCOptions, (
	int32_t ApiVersion;
	void* PlatformSpecificOptions;
	EOS_ERTCBackgroundMode BackgroundMode;
));

/* Bits of EOS_Platform_Options.Flags. */
#define EOS_PF_LOADING_IN_EDITOR 0x00001
#define EOS_PF_DISABLE_OVERLAY 0x00002
#define EOS_PF_DISABLE_SOCIAL_OVERLAY 0x00004
#define EOS_PF_RESERVED1 0x00008
#define EOS_PF_WINDOWS_ENABLE_OVERLAY_D3D9 0x00010
#define EOS_PF_WINDOWS_ENABLE_OVERLAY_D3D10 0x00020
#define EOS_PF_WINDOWS_ENABLE_OVERLAY_OPENGL 0x00040
#define EOS_PF_CONSOLE_ENABLE_OVERLAY_AUTOMATIC_UNLOADING 0x00080

#define EOS_PLATFORM_OPTIONS_PRODUCTID_MAX_LENGTH 64
#define EOS_PLATFORM_OPTIONS_SANDBOXID_MAX_LENGTH 64
#define EOS_PLATFORM_OPTIONS_DEPLOYMENTID_MAX_LENGTH 64
#define EOS_PLATFORM_OPTIONS_ENCRYPTIONKEY_LENGTH 64

#define EOS_PLATFORM_OPTIONS_API_LATEST 13

EOS_STRUCT(EOS_Platform_Options, (
	int32_t ApiVersion;
	void* Reserved;
	const char* ProductId;
	const char* SandboxId;
	EOS_Platform_ClientCredentials ClientCredentials;
	EOS_Bool bIsServer;
	const char* EncryptionKey;
	const char* OverrideCountryCode;
	const char* OverrideLocaleCode;
	const char* DeploymentId;
	uint64_t Flags;
	const char* CacheDirectory;
	uint32_t TickBudgetInMilliseconds;
	const EOS_Platform_RTCOptions* RTCOptions;
	EOS_HIntegratedPlatformOptionsContainer IntegratedPlatformOptionsContainerHandle;
	const void* SystemSpecificOptions;
));

#endif /* EOS_TYPES_H_INCLUDED */
