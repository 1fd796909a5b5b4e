// What starting a process costs.
#include <iostream>

int main() { return 0; }
