// The program's entry point and its one application object. Both live in the executable itself:
// kept in the static library, nothing would refer to the object and the linker would drop it.
#include <windows.h>

#include "app/ClientAdminApp.h"

CClientAdminApp theApp;

int WINAPI wWinMain(HINSTANCE instance, HINSTANCE, LPWSTR, int) { return AfxWinMain(instance); }
