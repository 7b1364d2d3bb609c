// A test program of which one test passes, one is skipped, one fails and one ends the program: for the test
// of run_tests, which must count all of them.
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
