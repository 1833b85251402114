// A library that looks like a GPIB driver but lacks ibrd: the loader must refuse it.
extern "C" {
int ibdev(int, int, int, int, int, int) {
    return -1;
}
int ThreadIbsta() {
    return 0;
}
}
