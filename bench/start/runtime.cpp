// A program that links the C++ runtime.
#include <new>

int main()
{
    ::operator delete(::operator new(1));
    return 0;
}
