// Source routes, and messages that the daemon routes to other nodes.
#pragma once

// The order of two ints as qsort() wants it: their difference, or the nearest int to it.
int int_compare(const void* first, const void* second);
