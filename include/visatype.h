/* Base types of the VISA and IVI-C interfaces: fixed-width integer and real
 * types, strings, sessions and status values. Usable from C and C++. */
#ifndef QN_VISATYPE_H
#define QN_VISATYPE_H

#include <stdint.h>

typedef int8_t ViInt8;
typedef uint8_t ViUInt8;
typedef int16_t ViInt16;
typedef uint16_t ViUInt16;
typedef int32_t ViInt32;
typedef uint32_t ViUInt32;
typedef int64_t ViInt64;
typedef uint64_t ViUInt64;
typedef float ViReal32;
typedef double ViReal64;
typedef uint16_t ViBoolean;
typedef char ViChar;
typedef unsigned char ViByte;
typedef ViChar* ViString;
typedef const ViChar* ViConstString;
typedef ViString ViRsrc;
typedef ViConstString ViConstRsrc;
typedef void* ViAddr;

typedef ViInt32 ViStatus;   /* 0 success, > 0 warning, < 0 error */
typedef ViUInt32 ViObject;
typedef ViObject ViSession; /* 0 is no session */
typedef ViUInt32 ViAttr;

#define VI_SUCCESS ((ViStatus)0)
#define VI_NULL 0
#define VI_TRUE ((ViBoolean)1)
#define VI_FALSE ((ViBoolean)0)

/* Error statuses have the sign bit set: VI_STATUS_ERROR_BASE + low bits. */
#define VI_STATUS_ERROR_BASE (-2147483647L - 1)

#ifdef __cplusplus
static_assert(sizeof(ViInt32) == 4 && sizeof(ViStatus) == 4 && sizeof(ViSession) == 4,
              "ViInt32, ViStatus and ViSession are 32-bit");
static_assert(sizeof(ViBoolean) == 2, "ViBoolean is 16-bit");
#endif

#endif /* QN_VISATYPE_H */
