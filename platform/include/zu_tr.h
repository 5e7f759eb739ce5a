/* libzu_tr: trace. A component registers once; afterwards it makes a record only where a category's detail level is
 * not 0, so that tracing which is off costs one byte compared. */
#ifndef ZU_TR_H
#define ZU_TR_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/** What a component says of one of its categories. */
typedef struct tr_category {
  uint32_t category_id;
  const char* category_name;
  uint32_t default_level_of_detail;
  uint32_t minimum_level_of_detail;
} tr_category;

/** Where the records of one category go; opaque to the component. */
typedef void* tr_file_token;

/**
 * Registers a component.
 *
 * @param component its name, four characters.
 * @param detail_levels one byte a category, filled here: 0 means that no record of it is wanted.
 * @param categories what the component has to say of each category.
 * @param num_categories entries of the three arrays.
 * @param tokens one token a category, filled here and passed with every record.
 * @return 0, or -1 when an argument is null or memory runs out; the levels are then left alone.
 */
int tr_ms_register_component_1(const char* component, uint8_t* detail_levels, const tr_category* categories,
                               uint32_t num_categories, tr_file_token* tokens);

/*
 * Making a record changes no `errno`, is no cancellation point and may happen in several threads at once. A record
 * whose token is null or belongs to a category that is off is dropped.
 */

/** A record without values. */
void tr_ms_record_id_1(const char* component, uint32_t record_id, tr_file_token token);

/** A record of `count` 32-bit values, which follow as `uint32_t`. */
void tr_ms_record_values_32_1(const char* component, uint32_t record_id, tr_file_token token, uint32_t count, ...);

/** A record of `count` data blocks, which follow as pairs of `const void*` and `uint32_t` length. */
void tr_ms_record_data_1(const char* component, uint32_t record_id, tr_file_token token, uint32_t count, ...);

/** A record of `count` texts, which follow as `const char*`. */
void tr_ms_record_strings_1(const char* component, uint32_t record_id, tr_file_token token, uint32_t count, ...);

#ifdef __cplusplus
}
#endif

#endif
