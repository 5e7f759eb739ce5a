/* libzu_cu: what every component needs; here the assertion. */
#ifndef ZU_CU_H
#define ZU_CU_H

#ifdef __cplusplus
extern "C" {
#endif

/** Reports a failed assertion, its text and where it stands, and aborts the process. */
void __zu_assert(const char* text, const char* file, int line);

#ifdef __cplusplus
}
#endif

#endif
