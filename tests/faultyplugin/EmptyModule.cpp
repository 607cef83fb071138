// A module without the symbol that the host looks for.
extern "C" int nothingThatAHostWants() {
    return 0;
}
