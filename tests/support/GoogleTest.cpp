// An empty program: CMake needs one to build the precompiled headers that the tests share.
int main() { }
