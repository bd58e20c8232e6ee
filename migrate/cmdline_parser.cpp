// The migration command line's validity rule.

#include "migrate/cmdline_parser.h"

#include <cstdint>

#include "migrate/manager.h"

MigrationCmdLineParser::MigrationCmdLineParser(int argc, char** argv)
    : vxCommandLineParser(argc, argv, '-', ':') {}

MigrationCmdLineParser::~MigrationCmdLineParser() = default;

int MigrationCmdLineParser::Validate() {
  m_valid = 0;
  uint8_t mask = 0xC0;
  if (Exists("V1")) mask |= 0x01;
  if (Exists("D1")) mask |= 0x02;
  if (Exists("V2")) mask |= 0x04;
  if (Exists("D2")) mask |= 0x08;
  // Only the destination product is looked up here: an unknown source product is refused later,
  // by the checks, which can write to the log.
  if (Exists("P1") && Exists("P2") && vxMigrationManager::GetProductID(GetValue("P2").c_str()) > 0) {
    mask |= 0x20;
  }
  mask |= 0x10;
  if (mask == 0xFF) m_valid = 1;
  return m_valid;
}
