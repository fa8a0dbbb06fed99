// The client of main.c as C++: the same code against the headers' C++ view.
#include "main.c"
