/* A libcurl that fetches one fixed text. Each function can be left out with -DWITHOUT_<name>. */
#include <stdarg.h>
#include <stddef.h>

typedef size_t (*write_function)(char*, size_t, size_t, void*);

enum { OPTION_FILE = 10001, OPTION_WRITEFUNCTION = 20011 };

static write_function writer;
static void* stream;
static int handle;

const char* curl_version(void);
int curl_global_init(long flags);
void curl_global_cleanup(void);
void* curl_easy_init(void);
int curl_easy_setopt(void* easy, int option, ...);
int curl_easy_perform(void* easy);
void curl_easy_cleanup(void* easy);

#ifndef WITHOUT_curl_version
const char* curl_version(void) {
  return "stand-in";
}
#endif
#ifndef WITHOUT_curl_global_init
int curl_global_init(long flags) {
  return flags == 3 ? 0 : 2;
}
#endif
#ifndef WITHOUT_curl_global_cleanup
void curl_global_cleanup(void) {}
#endif
#ifndef WITHOUT_curl_easy_init
void* curl_easy_init(void) {
  return &handle;
}
#endif
#ifndef WITHOUT_curl_easy_setopt
int curl_easy_setopt(void* easy, int option, ...) {
  va_list arguments;
  va_start(arguments, option);
  if (option == OPTION_FILE) stream = va_arg(arguments, void*);
  if (option == OPTION_WRITEFUNCTION) writer = va_arg(arguments, write_function);
  va_end(arguments);
  return easy == &handle ? 0 : 43;
}
#endif
#ifndef WITHOUT_curl_easy_perform
int curl_easy_perform(void* easy) {
  char text[] = "stand-in";
  if (easy != &handle) return 43;
  return writer == NULL || writer(text, 1, sizeof text - 1, stream) == sizeof text - 1 ? 0 : 23;
}
#endif
#ifndef WITHOUT_curl_easy_cleanup
void curl_easy_cleanup(void* easy) {
  if (easy == &handle) handle = 0;
}
#endif
