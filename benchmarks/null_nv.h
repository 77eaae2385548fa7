// The NV store of the benchmarks: a constant table, the same for the platform that records and the one that does
// nothing.
#pragma once

int null_nv_read(const char *key, char *buffer, int size); // as kiv_nvconfig_read
