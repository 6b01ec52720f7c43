// The names are AddressSanitizer's. Whole stacks cost time, but without them the suppression could not see
// who allocated.
extern "C" const char*
__asan_default_options() // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
{
    return "fast_unwind_on_malloc=0";
}

// Where a key occurs twice in an object, the JSON parser of Qt 5.15 loses the list or object of the first.
extern "C" const char*
__lsan_default_suppressions() // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
{
    return "leak:QJsonDocument::fromJson\n";
}
