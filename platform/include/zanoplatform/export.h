/* The macro that makes a declaration part of libzanoplatform.so's interface. */
#ifndef ZANOPLATFORM_EXPORT_H
#define ZANOPLATFORM_EXPORT_H

#define ZANOPLATFORM_API __attribute__((visibility("default")))

#ifdef __cplusplus
#define ZANOPLATFORM_C_API_BEGIN extern "C" {
#define ZANOPLATFORM_C_API_END }
#else
#define ZANOPLATFORM_C_API_BEGIN
#define ZANOPLATFORM_C_API_END
#endif

#endif
