package p;
@Backing(type="int")
enum Foo { A = 1, B, C = A | 8, D = C << 2, }
