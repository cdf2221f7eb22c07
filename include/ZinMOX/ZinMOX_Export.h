/* Export macros of libZinMOX. */
#ifndef ZINMOX_EXPORT_H
#define ZINMOX_EXPORT_H
#define ZINMOX_API __attribute__((visibility("default")))
#define ZINMOX_HIDDEN __attribute__((visibility("hidden")))
#endif
