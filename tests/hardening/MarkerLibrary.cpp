// Planted under the name of a system library: whoever loads it leaves "<its path>.ran" behind.
#include <windows.h>

BOOL WINAPI DllMain(HINSTANCE module, DWORD reason, LPVOID) {
  wchar_t path[MAX_PATH + 4] = L"";
  if (reason != DLL_PROCESS_ATTACH || GetModuleFileNameW(module, path, MAX_PATH) >= MAX_PATH) return TRUE;
  lstrcatW(path, L".ran");
  CloseHandle(CreateFileW(path, GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS, 0, nullptr));
  return TRUE;
}
