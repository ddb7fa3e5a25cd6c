#include <gtest/gtest.h>

#include "app/qt_platform.h"

namespace quillane {
namespace {

TEST(NameFilters, PairsBecomeDialogFilters) {
  EXPECT_EQ(NameFiltersFromPairs("*.jpg|*.jpg|*.jpeg|*.jpeg|*.bmp|*.bmp|*.wmf|*.wmf|*.emf|*.emf|"
                                 "*.gif|*.gif|All files|*.*"),
            QStringList({"*.jpg", "*.jpeg", "*.bmp", "*.wmf", "*.emf", "*.gif", "All files (*)"}));
  // Several masks are separated by ";" in the pairs and by a blank in a dialog filter.
  EXPECT_EQ(NameFiltersFromPairs("Pictures|*.jpg;*.bmp"), QStringList({"Pictures (*.jpg *.bmp)"}));
  // A name without its mask is dropped rather than read past the end.
  EXPECT_EQ(NameFiltersFromPairs("*.jpg|*.jpg|dangling"), QStringList({"*.jpg"}));
  EXPECT_TRUE(NameFiltersFromPairs("").isEmpty());
}

}  // namespace
}  // namespace quillane
