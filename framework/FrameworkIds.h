/* Identifiers the framework routes or loads, shared by C++ and the resource compiler (so plain
   #defines only). A program's resource.h includes this file. */
#pragma once

/* Command of the Help button; the framework's default help handler serves it. */
#define ID_HELP 57670
/* Command of a property-sheet style Apply button. */
#define ID_APPLY_NOW 57000
/* String-table entry holding the program name (message box captions). */
#define IDS_FRAMEWORK_APP_TITLE 57344
/* "...%s..." with the description of a failure that escaped a window's handler. */
#define IDS_FRAMEWORK_OPERATION_FAILED 61700
