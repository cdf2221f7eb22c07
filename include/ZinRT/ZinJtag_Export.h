// Export macro of libZinJtag.
#ifndef ZINRT_ZINJTAG_EXPORT_H
#define ZINRT_ZINJTAG_EXPORT_H
#define ZINJTAG_API __attribute__((visibility("default")))
#endif
