// Stands in for a running suite application until the test process ends or the time limit passes.
//   waiting_process - <test process id> <time limit in milliseconds>
#include <windows.h>

#include <cstdlib>

int main(int argc, char** argv) {
  if (argc != 4) return 2;
  HANDLE parent = OpenProcess(SYNCHRONIZE, FALSE, std::strtoul(argv[2], nullptr, 10));
  if (!parent) return 1;
  WaitForSingleObject(parent, std::strtoul(argv[3], nullptr, 10));
  return 0;
}
