#include "fixtures.h"

namespace cairn::test {

std::vector<FixtureMaker>& FixtureMakers() {
  static std::vector<FixtureMaker> makers;
  return makers;
}

std::vector<Fixture> AllFixtures() {
  std::vector<Fixture> all;
  for (FixtureMaker make : FixtureMakers()) all.push_back(make());
  return all;
}

}  // namespace cairn::test
