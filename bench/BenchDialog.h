// Identifiers shared by the benchmark floor's code and its resources.
#pragma once

#define IDD_BENCH_DIALOG 100
#define IDC_BENCH_TREE 1001
#define IDC_BENCH_REPORT 1002
#define IDC_BENCH_APPLY 1003
#define IDC_BENCH_HELP 1004
#define IDS_BENCH_ROOT 2001
#define IDS_BENCH_REPORT 2002
