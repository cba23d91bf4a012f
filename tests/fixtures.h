// Example archives of every readable format, registered by the reader tests
// and replayed by the tests that drive whole hosts (the plug-in as a file
// manager loads it, the command-line tool) and by the mutation test.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "builder.h"

namespace cairn::test {

struct ExpectedEntry {
  std::string name;  // as listed, '\' between path parts
  Bytes bytes;       // what extraction writes
};

struct Fixture {
  std::string label;
  FormatId id = 0;
  std::string fileName;  // recognition may look at the extension
  Bytes bytes;
  std::vector<std::pair<std::string, Bytes>> companions;  // files beside the archive
  std::vector<ExpectedEntry> entries;                     // the whole listing, in order
};

using FixtureMaker = Fixture (*)();
std::vector<FixtureMaker>& FixtureMakers();
std::vector<Fixture> AllFixtures();

struct FixtureRegistrar {
  explicit FixtureRegistrar(FixtureMaker make) { FixtureMakers().push_back(make); }
};

}  // namespace cairn::test

// Defines a function that builds a fixture and registers it:
//   CAIRN_FIXTURE(Pwad) { Fixture f; ...; return f; }
#define CAIRN_FIXTURE(name)                                            \
  static ::cairn::test::Fixture name();                                \
  static const ::cairn::test::FixtureRegistrar name##Registrar(&name); \
  static ::cairn::test::Fixture name()
