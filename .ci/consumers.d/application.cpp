// Uses both libraries, and takes what their headers hold through the compiler.
#include <pells/kit.h>
#include <pells/pells.h>

#include <iostream>

int main() {
    pells::kit::AtomicFile("made").commit();
    std::cout << pells::Version("1.5") << '\n';
}
