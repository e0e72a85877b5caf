/*
 * Base macros and types shared by every EOS SDK header: calling convention, export
 * attributes, and the struct/enum/callback/function declaration helpers.
 *
 * Part of the EOS SDK stand-in: same file name, names and binary layout as the SDK header,
 * declaring only what tarnwick and the simulator use. Usable from C and C++.
 */
#ifndef EOS_BASE_H_INCLUDED
#define EOS_BASE_H_INCLUDED

#if defined(__cplusplus) && defined(_MSC_VER) && _MSC_VER >= 1800
#include <cstdint>
#else
#include <stdint.h>
#include <stddef.h>
#endif

/* Windows-style import/export (dllexport/dllimport) or ELF/Mach-O visibility. */
#ifndef EOS_USE_DLLEXPORT
#if defined(_WIN32) || defined(__CYGWIN__)
#define EOS_USE_DLLEXPORT 1
#else
#define EOS_USE_DLLEXPORT 0
#endif
#endif

/* __stdcall on 32-bit Windows only; empty on every 64-bit target. */
#ifndef EOS_CALL
#if defined(_WIN32) && (defined(__i386) || defined(_M_IX86))
#define EOS_CALL __stdcall
#else
#define EOS_CALL
#endif
#endif

#ifndef EOS_MEMORY_CALL
#if defined(_WIN32) && (defined(__i386) || defined(_M_IX86))
#define EOS_MEMORY_CALL __stdcall
#else
#define EOS_MEMORY_CALL
#endif
#endif

#ifndef EOS_API
#if defined(EOS_BUILDING_SDK) && EOS_BUILDING_SDK > 0
/* The SDK library itself: export every EOS_API symbol. */
#if EOS_USE_DLLEXPORT
#ifdef __GNUC__
#define EOS_API __attribute__((dllexport))
#else
#define EOS_API __declspec(dllexport)
#endif
#else
#if defined(__GNUC__) && __GNUC__ >= 4
#define EOS_API __attribute__((visibility("default")))
#else
#define EOS_API
#endif
#endif
#else
/* A consumer of the SDK. */
#if EOS_USE_DLLEXPORT
#if defined(EOS_MONOLITHIC) && EOS_MONOLITHIC > 0
#define EOS_API
#elif defined(EOS_BUILD_DLL) && EOS_BUILD_DLL > 0
#ifdef __GNUC__
#define EOS_API __attribute__((dllexport))
#else
#define EOS_API __declspec(dllexport)
#endif
#else
#ifdef __GNUC__
#define EOS_API __attribute__((dllimport))
#else
#define EOS_API __declspec(dllimport)
#endif
#endif
#else
#if defined(__GNUC__) && __GNUC__ >= 4
#define EOS_API __attribute__((visibility("default")))
#else
#define EOS_API
#endif
#endif
#endif
#endif

#ifdef __cplusplus
#define EXTERN_C extern "C"
#else
#define EXTERN_C
#endif

/* Expands to its arguments; strips the parentheses around an EOS_STRUCT body. */
#define EOS_PASTE(...) __VA_ARGS__

#define EOS_DECLARE_FUNC(return_type) EXTERN_C EOS_API return_type EOS_CALL
#define EOS_DECLARE_CALLBACK(callback_name, ...) EXTERN_C typedef void (EOS_CALL * callback_name)(__VA_ARGS__)
#define EOS_DECLARE_CALLBACK_RETVALUE(return_type, callback_name, ...) \
	EXTERN_C typedef return_type (EOS_CALL * callback_name)(__VA_ARGS__)

/* Every struct is tagged _tag<Name> and typedef'd to <Name>. */
#define EOS_STRUCT(struct_name, struct_def) \
	EXTERN_C typedef struct _tag ## struct_name { EOS_PASTE struct_def } struct_name

#if (defined(__cplusplus) && __cplusplus >= 201103L) || (defined(_MSVC_LANG) && _MSVC_LANG >= 201103L)
#define EOS_HAS_ENUM_CLASS 1
#endif

/*
 * Enums are 32 bits wide. C++ gets scoped enums (write EOS_EResult::EOS_Success);
 * C gets a plain enum padded to int32 range.
 */
#ifdef EOS_HAS_ENUM_CLASS
#define EOS_ENUM_START(name) enum class name : int32_t {
#define EOS_ENUM_END(name) }
#else
#define EOS_ENUM_START(name) typedef enum name {
#define EOS_ENUM_END(name) , __ ## name ## _PAD_INT32__ = 0x7FFFFFFF } name
#endif

#define EOS_ENUM(name, ...) EOS_ENUM_START(name) __VA_ARGS__ EOS_ENUM_END(name)

/* Bitwise operators for flag enums (C++ only; C enums convert to int anyway). */
#ifdef EOS_HAS_ENUM_CLASS
#define EOS_ENUM_BOOLEAN_OPERATORS(name) \
	inline constexpr name operator|(name lhs, name rhs) { \
		return static_cast<name>(static_cast<__underlying_type(name)>(lhs) | static_cast<__underlying_type(name)>(rhs)); \
	} \
	inline constexpr name operator&(name lhs, name rhs) { \
		return static_cast<name>(static_cast<__underlying_type(name)>(lhs) & static_cast<__underlying_type(name)>(rhs)); \
	} \
	inline constexpr name operator^(name lhs, name rhs) { \
		return static_cast<name>(static_cast<__underlying_type(name)>(lhs) ^ static_cast<__underlying_type(name)>(rhs)); \
	} \
	inline constexpr name operator~(name value) { \
		return static_cast<name>(~static_cast<__underlying_type(name)>(value)); \
	} \
	inline name& operator|=(name& lhs, name rhs) { lhs = lhs | rhs; return lhs; } \
	inline name& operator&=(name& lhs, name rhs) { lhs = lhs & rhs; return lhs; } \
	inline name& operator^=(name& lhs, name rhs) { lhs = lhs ^ rhs; return lhs; }
#else
#define EOS_ENUM_BOOLEAN_OPERATORS(name)
#endif

#undef EOS_HAS_ENUM_CLASS

typedef int32_t EOS_Bool;
#define EOS_TRUE 1
#define EOS_FALSE 0

#endif /* EOS_BASE_H_INCLUDED */
