#include "locale/KVELLocale.h"
