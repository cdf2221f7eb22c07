// Export macro of libZinCore.
#ifndef ZINRT_ZINCORE_EXPORT_H
#define ZINRT_ZINCORE_EXPORT_H
#define ZINCORE_API __attribute__((visibility("default")))
#endif
