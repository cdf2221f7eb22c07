// Export macro of libZinSim.
#ifndef ZINSIM_ZINSIM_EXPORT_H
#define ZINSIM_ZINSIM_EXPORT_H
#define ZINSIM_API __attribute__((visibility("default")))
#endif
