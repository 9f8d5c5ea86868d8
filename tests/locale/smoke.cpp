#include <gtest/gtest.h>
#include <windows.h>
#include "framework/Strings.h"
TEST(Smoke, Lang) { printf("ui=%04x\n", GetUserDefaultUILanguage()); EXPECT_EQ(fw::Format(L"%s-%d", L"a", 3), L"a-3"); }
