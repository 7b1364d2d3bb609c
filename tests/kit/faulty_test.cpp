// A test program in which one test passes, one is skipped, one fails and one ends the program. The test of
// run_tests checks that all four are counted.
#include <gtest/gtest.h>

#include <cstdlib>

TEST(Faulty, Passes) {}

TEST(Faulty, IsSkipped) {
  GTEST_SKIP() << "for a reason";
}

TEST(Faulty, Fails) {
  FAIL() << "as intended";
}

TEST(Faulty, EndsTheProgram) {
  std::_Exit(7);
}
