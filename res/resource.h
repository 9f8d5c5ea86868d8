// Identifiers of the console's resources. The language packs hold the same identifiers.
#pragma once

#include "framework/FrameworkIds.h"

// Dialog templates
#define IDD_ABOUTBOX 3001
#define IDD_MAPORAADMIN_DIALOG 3003
#define IDD_MAPORA_CONFIG 3052
#define IDD_ADVANCED_CONFIG 3600

// Icon
#define IDR_MAINFRAME 3011

// Images of the page tree (resource type "PNG")
#define IDB_TREE_WORKSTATION 3586
#define IDB_TREE_FOLDER 3587
#define IDB_TREE_PAGE 3588

// Help contexts of the main window: 3004-3010 open the console's help topic, except the About
// command, which shares its number with them.
#define IDH_FIRST 3004
#define IDH_WORKSTATION_PAGE 3005
#define IDM_ABOUTBOX 3008
#define IDH_LAST 3010

// Strings
#define IDS_ABOUTBOX 3012
#define IDS_APP_CAPTION 3013
#define IDS_APPS_RUNNING_SAVE 3016
#define IDS_APPS_RUNNING_CONTINUE 3017
#define IDS_WORKSTATION_NODE 3030
#define IDS_DESKTOP 3039
#define IDS_PRODUCT_REPORT 3040
#define IDS_BUILD_FORMAT 3041
#define IDS_ENGINE 3042
#define IDS_SERVER 3043
#define IDS_OLE_INIT_FAILED 3049
#define IDS_INSTALLATION_INFORMATION 3063
#define IDS_SERVICE_PACK_INFORMATION 3064
#define IDS_DISPLAY_LANGUAGE 3067
#define IDS_DISPLAY_LANGUAGE_FORMAT 3068
#define IDS_LANGUAGE_PACK_MISSING 3603
#define IDS_SKYLOFT 3645
#define IDS_SKYLOFT_REPORT 3654
// Framework strings IDS_FRAMEWORK_* come from framework/FrameworkIds.h.

// Controls
#define IDC_PAGE_TREE 3501
#define IDC_REPORT 3520
#define IDC_REPORT_LABEL 3521
#define IDC_SERVICE_PACK 3524
#define IDC_SERVICE_PACK_BUILD 3525
#define IDC_LANGUAGE_LIST 3563
#define IDC_ADVANCED 3601
#define IDC_LANGUAGE_WARNING 3602
#define IDC_KUEI_CHECK 3625
#define IDC_KUEI_LINK 3626
#define IDC_KUEI_GROUP 3627
#define IDC_MANAGE_PORTALS 3636
#define IDC_ONLINE_GROUP 3637
#define IDC_LOCAL_PORTAL 3661
#define IDC_APPLY_NOW ID_APPLY_NOW
#define IDC_HELP_BUTTON ID_HELP
