// For programs with address checks that use GL or open windows.

/// The GL driver leaks blocks and is unloaded before the leak check, which then cannot name it. Kept loaded, its leaks
/// are suppressed by tests/leaks.supp.
extern "C" __attribute__((visibility("default"))) int dlclose(void*) noexcept
{
    return 0;
}

/// The leak check guesses the location of thread-local data, wrongly for some of the driver's, and crashes when it
/// reads there.
extern "C" __attribute__((visibility("default"))) const char*
__asan_default_options() // NOLINT(bugprone-reserved-identifier)
{
    return "intercept_tls_get_addr=0";
}
