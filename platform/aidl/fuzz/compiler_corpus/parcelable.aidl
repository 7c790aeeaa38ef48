package p;
// a comment
@FixedSize parcelable Foo {
    const int N = 3 > 2 ? 1 : 0;
    int a = N + 2 * 3;
    long b = -1;
    float c = 1.5f;
    double d = .5e3;
    boolean e = !false && 1 == 1;
    char f = '\n';
    byte g = 0x7f;
}
