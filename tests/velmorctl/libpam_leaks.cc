/// LeakSanitizer asks for what it shall pass over: libpam 1.5.2 loses memory when it refuses a policy.
extern "C" __attribute__((visibility("default"))) const char* __lsan_default_suppressions();

extern "C" const char* __lsan_default_suppressions() {
  return "leak:libpam.so";
}
