// The library's entry point on Windows. Loading and unloading need no work of their own:
// every object the library keeps is built on first use or by the C++ runtime.
#include <windows.h>

BOOL APIENTRY DllMain(HMODULE module, DWORD reason, LPVOID reserved) { return TRUE; }
