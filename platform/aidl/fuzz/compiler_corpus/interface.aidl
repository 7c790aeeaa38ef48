package p;
/** An interface that uses much of the language. */
@VintfStability
@Descriptor(value="p.IOther")
interface Foo {
    const int A = (1 << 3) | ~0x0F & 7 % 3;
    const long B = -9223372036854775807L - 1;
    const byte C = 0xffu8;
    const String D = "a\tb";
    /** @param in_x a @return b */
    @nullable IBinder get(@utf8InCpp String name, in int[] numbers, out boolean[] flags) = 1;
    oneway void tell(in @nullable byte[] data, char c, double d) = 2;
    List<String> names(inout @nullable String[] more) = 7;
    ParcelFileDescriptor open(in ParcelFileDescriptor fd) = 8;
}
