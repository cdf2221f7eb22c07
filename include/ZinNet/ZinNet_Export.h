// Export macro of libZinNet.
#ifndef ZINNET_ZINNET_EXPORT_H
#define ZINNET_ZINNET_EXPORT_H
#define ZINNET_API __attribute__((visibility("default")))
#endif
