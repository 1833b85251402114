// liblxi keeps a few bytes from a failed connect for the life of the process; that is the
// library's, not ours. Read by LeakSanitizer in sanitizer builds, unused otherwise.
extern "C" const char* __lsan_default_suppressions();
extern "C" const char* __lsan_default_suppressions() {
    return "leak:liblxi.so\n";
}
