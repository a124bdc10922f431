#include "wavemill/instrument/HardwareResource.h"

#include "support/ExpectThrow.h"
#include "support/TestInstrument.h"
#include "wavemill/tools/Exceptions.h"
#include "wavemill/tools/Tools.h"

#include <gtest/gtest.h>

#include <memory>

using namespace Corvane::Wavemill;
using Testing::thrown;
using Strings = std::vector<std::string>;

TEST(HardwareResourceTest, HasNeedsSeparatorsAroundTheOptionAndLooksAtTheIndexOfItsLength) {
  const struct {
    const char *options;
    const char *option;
    bool expected;
  } rows[] = {
      {"B10,B22,K20", "B10", true}, {"B10,B22,K20", "K20", true}, // first and last always hold
      {"B10,B22,K20", "B22", true},                               // inner: index 3 of the list is ','
      {"A,BC,D", "BC", false},                                    // inner: index 2 is 'B'
      {"XB10", "B10", false},       {"B10 B22", " B22 ", true},   {"B10,K20", "k20", false}, {"B10", "   ", true},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(std::string(row.options) + " has " + row.option);
    HardwareResource resource;
    resource.setOptions(row.options);
    EXPECT_EQ(resource.has(row.option), row.expected);
  }
}

TEST(HardwareResourceTest, ChecksNameTheMissingOptionsJoinedForTheModel) {
  HardwareResource resource;
  resource.setModelNumber("SG200");
  resource.setOptions("B10,K20");
  Strings none, two{"A", "B"}, five{"A", "B", "C", "D", "E"};
  EXPECT_TRUE(resource.hasAny("") && resource.hasAny(none));
  EXPECT_TRUE(resource.hasAny("X1,K20"));
  EXPECT_FALSE(resource.hasAny("X1,X2"));
  EXPECT_EQ(resource.checkAll("B10,K20", true) + resource.checkAll("", true), "");
  EXPECT_EQ(resource.checkAll("X1,B10", false), "Option X1 is required for SG200.");
  EXPECT_EQ(resource.checkAll("X1,B10,Y2", false), "Options X1Y2are required for SG200.");
  EXPECT_EQ(resource.checkAll("X1,Y2,Z3", false), "Options X1Y2and Z3are required for SG200.");
  EXPECT_EQ(resource.checkAny("X1,K20", true) + resource.checkAny("", true), "");
  EXPECT_EQ(resource.checkAny("X1", false), "Option X1is required for SG200.");
  EXPECT_EQ(resource.checkAny("X1,Y2", false), "One of the options(X1/Y2) is required for SG200.");
  EXPECT_EQ(HardwareResource::join(none) + "|" + HardwareResource::join(two), "|AB");
  EXPECT_EQ(HardwareResource::join(five), "AB, C, Dand E"); // no separator after the first part
  EXPECT_EQ(thrown([&] { resource.checkAll("X1", true); }), "InstrumentException: Option X1 is required for SG200.");
  EXPECT_EQ(thrown([&] { resource.checkAny("X1,Y2", true); }),
            "InstrumentException: One of the options(X1/Y2) is required for SG200.");
}

TEST(HardwareResourceTest, UpdateConnectionTakesACompleteIdentityOnlyAndKeepsItForTheAddress) {
  Testing::SimulatedBench bench({}, 500);
  auto &simulator = bench.simulator;
  const auto &instrument = bench.instrument;
  HardwareResource resource;

  simulator.setIdentity("Corvane, SG200 ,100123,1.4.2,extra");
  resource.updateConnection(instrument);
  EXPECT_EQ((Strings{resource.getManufacturer(), resource.getModelNumber(), resource.getSerialNumber(),
                     resource.getFirmwareRevision(), resource.getOptions(), resource.getExtOptions()}),
            (Strings{"Corvane", "SG200", "100123", "1.4.2", SimulatorOptions().options, ""}));
  resource.updateConnection(instrument); // valid for this address: nothing is asked, as the commands show
  resource.setAddress(Tools::toUpper(simulator.getAddress()));
  EXPECT_TRUE(resource.isValid());
  EXPECT_EQ(resource.getAddress(), simulator.getAddress());
  EXPECT_EQ(simulator.getCommands(), (Strings{"*IDN?", "*OPT?"}));

  resource.setAddress("TCPIP0::127.0.0.2::5025::SOCKET");
  EXPECT_FALSE(resource.isValid());
  EXPECT_EQ(resource.getModelNumber(), "");
  EXPECT_EQ(resource.getManufacturer(), "Corvane");

  simulator.setIdentity("Corvane,SG200,100123");
  simulator.clearCommands();
  resource.updateConnection(instrument);
  resource.updateConnection(instrument); // not valid: asked again
  EXPECT_EQ(resource.getIdentity(), "Corvane,SG200,100123");
  EXPECT_EQ(resource.getManufacturer(), "");
  EXPECT_EQ(simulator.getCommands(), (Strings{"*IDN?", "*IDN?"}));

  simulator.setFault(SimulatorFault::Stall); // the answer is empty after the time-out
  resource.setIdentity("kept");
  resource.updateConnection(instrument);
  EXPECT_EQ(resource.getIdentity(), "kept");
}
