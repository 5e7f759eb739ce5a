/* A program with functions of its own that are named like the library's: the library calls its own. */
#define _GNU_SOURCE
#include <dlfcn.h>
#include <stdio.h>
#include <stdlib.h>

#include "hb_client.h"

/* As the library exports them, but the program's. */
int prime(int number);
void* Hash_init(const char* name, int size);
void* Hash_search(unsigned name, void* table);

static int calls = 0;

int prime(int number) {
  ++calls;
  return number + 1;
}

void* Hash_init(const char* name, int size) {
  ++calls;
  return name == NULL ? NULL : malloc((size_t)size);
}

void* Hash_search(unsigned name, void* table) {
  ++calls;
  return name == 0 ? NULL : table;
}

static void fail(const char* what) {
  fprintf(stderr, "%s\n", what);
  exit(1);
}

int main(void) {
  if (dlsym(RTLD_DEFAULT, "prime") != (void*)(size_t)&prime) {
    fail("the program's own names do not come first, so that this test shows nothing");
  }
  /* A table of the library's, searched and filled by its own functions, which call each other. */
  void* library = dlopen("libhb_client.so.1", RTLD_NOW | RTLD_NOLOAD);
  if (library == NULL) {
    fail("the library is not loaded under its soname");
  }
  void* (*init)(const char*, int);
  *(void**)&init = dlsym(library, "Hash_init");
  void* (*insert)(unsigned, void*, void*);
  *(void**)&insert = dlsym(library, "Hash_insert");
  void* (*search)(unsigned, void*);
  *(void**)&search = dlsym(library, "Hash_search");
  int (*library_prime)(int);
  *(void**)&library_prime = dlsym(library, "prime");
  void (*release)(void*);
  *(void**)&release = dlsym(library, "Hash_free");
  if (init == &Hash_init || library_prime == &prime) {
    fail("the library's names lead to the program");
  }
  void* table = init("own", library_prime(300));
  int item = 0;
  insert(5, table, &item);
  if (search(5, table) != &item || library_prime(300) != 307) {
    fail("the library's table does not work beside the program's functions");
  }
  release(table);
  /* What the library does inside never comes here. */
  setenv("HB_SERVER_SOCKET", "/nonexistent/socket", 1);
  hb_init();
  int nodes = 0;
  hb_get_number_of_configured_nodes(&nodes);
  hb_terminate();
  if (calls != 0) {
    fail("the library called functions of the program");
  }
  return 0;
}
