#include "vlx_test.hpp"
TEST(Frame, Version) { EXPECT_EQ(vlx_version(), 328); EXPECT_EQ(vlxf_version(), 328); }
