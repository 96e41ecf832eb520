// ThreadSanitizer asks every program for this. GLib's locks are futexes of its own, which it cannot see, so
// that all that threads hand each other by them, in GLib and in umockdev, looks like a race to it.
extern "C" const char* __tsan_default_suppressions();

extern "C" const char* __tsan_default_suppressions() {
    return "called_from_lib:libglib-2.0.so\n"
           "called_from_lib:libgobject-2.0.so\n"
           "called_from_lib:libgio-2.0.so\n"
           "race:libglib-2.0.so\n"
           "race:libgobject-2.0.so\n"
           "race:libgio-2.0.so\n"
           "called_from_lib:libumockdev.so\n"
           "race:libumockdev.so\n"
           "race:libudev.so\n";
}
