// Counted allocation, strings and installation paths.
#pragma once

#include <string>

extern int memchunks;     // blocks handed out by cpp_malloc minus calls of ccst_free; nothing decides by it
extern char RUNDIR[256];  // reserved for a run directory

// A new array of size bytes in *p, null for size 0. The tag names the caller. Without memory it throws, as new does.
void cpp_malloc(void** p, int size, const char* tag);

// Releases a block of cpp_malloc. Counts one block less also for a null pointer.
void ccst_free(void* ptr);
void my_free(void* ptr);

// A copy of the text, to be released with ccst_free.
char* copy_string(const char* s);

// Cuts the text behind its last c, a c in the very last position not counted; empty when there is none. Returns str.
char* remove_last_word(char* str, char c);

// Keeps what stands behind the first c; empty when there is none. Returns str.
char* remove_first_word(char* str, char c);

// Both texts with their terminators in one new buffer, and back into two new blocks. get_2_strings returns 0.
char* make_2_strings(char* a, char* b);
int get_2_strings(char* buffer, char** a, char** b);

// Says on standard error that what has a syntax error.
void syntax_error(char* what);

// "/usr/sbin/qarn/..." becomes "/opt/qarn/...", any other path stays as it is, null becomes empty.
std::string convert_usr_sbin_qarn_path_to_opt_qarn_path(const char* path);
