// Stands in for a running suite application: tells the test that it is up, then waits until it
// is killed, the test process ends or the time limit passes.
//   waiting_process <semaphore name> <test process id> <time limit in milliseconds>
#include <windows.h>

#include <cstdlib>

int main(int argc, char** argv) {
  if (argc != 4) return 2;
  HANDLE parent = OpenProcess(SYNCHRONIZE, FALSE, std::strtoul(argv[2], nullptr, 10));
  if (HANDLE started = OpenSemaphoreA(SEMAPHORE_MODIFY_STATE, FALSE, argv[1])) ReleaseSemaphore(started, 1, nullptr);
  if (!parent) return 1;
  WaitForSingleObject(parent, std::strtoul(argv[3], nullptr, 10));
  return 0;
}
