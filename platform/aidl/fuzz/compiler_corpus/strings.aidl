package p;
@JavaDerive(toString=true, equals=true)
parcelable Foo {
    @utf8InCpp String name = "x";
    @nullable @utf8InCpp String[] names;
    List<String> list;
    int[] numbers = {1, 2, 0x10};
    byte[] bytes = {-1, 2};
    @nullable ParcelFileDescriptor fd;
    IBinder binder;
}
