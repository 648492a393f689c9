// For programs under address checks that use GL or open windows.

/// The GL driver leaves blocks behind and is unloaded before the checks look for such, which then cannot say whose they
/// are. Kept loaded it has a name, and tests/leaks.supp holds it.
extern "C" __attribute__((visibility("default"))) int dlclose(void*) noexcept
{
    return 0;
}

/// The checks guess where the libraries' thread-local data lie. They guess wrong for some of the driver's, and then die
/// of reading there.
extern "C" __attribute__((visibility("default"))) const char*
__asan_default_options() // NOLINT(bugprone-reserved-identifier)
{
    return "intercept_tls_get_addr=0";
}
