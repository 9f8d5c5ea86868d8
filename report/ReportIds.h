/* Identifiers of MaporaReport's own strings, shared by C++ and the resource compiler (so plain
   #defines only). They sit in a string-table block of their own (4208-4223), apart from the
   console's strings that the program also carries. */
#pragma once

#define IDS_REPORT_USAGE 4208
#define IDS_REPORT_UNKNOWN_OPTION 4209
#define IDS_REPORT_MISSING_FILE_NAME 4210
#define IDS_REPORT_CANNOT_WRITE_FILE 4211
#define IDS_REPORT_CANNOT_WRITE_OUTPUT 4212
#define IDS_REPORT_OLE_FAILED 4213
#define IDS_REPORT_FAILED 4214
#define IDS_REPORT_VERSION 4215
