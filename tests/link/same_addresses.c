/* Pairs of names that are one function compare equal in a program, too. */
#include <stdio.h>

#include "hb_client.h"

static int failures = 0;

static void expect(int condition, const char* what) {
  if (!condition) {
    fprintf(stderr, "%s are two functions\n", what);
    ++failures;
  }
}

/* Read from memory, as a compiler may decide for itself that two names are two functions. */
int main(void) {
  Hb_Rc (*volatile split_info)(Hb_Group*, Hb_Split_Merge_Info*) = hb_get_split_info;
  Hb_Rc (*volatile merge_info)(Hb_Group*, Hb_Split_Merge_Info*) = hb_get_merge_info;
  void (*volatile free_split)(Hb_Split_Merge_Info*) = hb_free_split_info;
  void (*volatile free_merge)(Hb_Split_Merge_Info*) = hb_free_merge_info;
  Hb_Rc (*volatile site_down)(Hb_Group*) = hb_site_down;
  Hb_Rc (*volatile site_merge)(Hb_Group*) = hb_site_merge;
  expect(split_info == merge_info, "hb_get_split_info and hb_get_merge_info");
  expect(free_split == free_merge, "hb_free_split_info and hb_free_merge_info");
  expect(site_down == site_merge, "hb_site_down and hb_site_merge");
  return failures == 0 ? 0 : 1;
}
