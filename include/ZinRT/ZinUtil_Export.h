// Export macro of libZinUtil.
#ifndef ZINRT_ZINUTIL_EXPORT_H
#define ZINRT_ZINUTIL_EXPORT_H
#define ZINUTIL_API __attribute__((visibility("default")))
#endif
