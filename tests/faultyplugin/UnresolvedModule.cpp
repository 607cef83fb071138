// A module that leans on a function that no library has.
extern "C" const void* aFunctionThatNoLibraryHas();

extern "C" const void* VXPluginPrincipalClass(const char*) {
    return aFunctionThatNoLibraryHas();
}
