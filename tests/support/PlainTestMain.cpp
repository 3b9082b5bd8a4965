#include "TemporaryHome.h"

#include <gtest/gtest.h>

int main (int argc, char** argv)
{
    veltrane::test::isolateHomeForProcess();
    ::testing::InitGoogleTest (&argc, argv);
    return RUN_ALL_TESTS();
}
