package p;
union Foo {
    int a = 7;
    String b;
    @nullable float[] c;
}
