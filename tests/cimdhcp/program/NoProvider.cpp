/// The one symbol of a library that no provider is in.
extern "C" __attribute__((visibility("default"))) int cimdhcpNoProvider();
int cimdhcpNoProvider() {
    return 0;
}
