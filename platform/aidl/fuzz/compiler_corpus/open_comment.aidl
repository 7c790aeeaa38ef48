package p;
/* never closed