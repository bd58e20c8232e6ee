// Merges the old installation's search-engine definitions ("keywords.ini") into the new one's. The
// new installation keeps its engines and their numbers; engines it lacks are appended under fresh
// numbers, and engines on both sides take the old settings for the keys the old file holds.

#include <string>
#include <unordered_set>

#include "foundation/files/file_manager.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/failed_copy.h"
#include "migrate/manager.h"

namespace {

const char kSearchEngines[] = "SearchEngines";

// The next "Engine<n>" key after the section's line count that the section does not use yet. With
// the usual numbering (Engine1..EngineN) that is Engine<N+1>; an irregular numbering never makes an
// added engine replace one of the new installation's.
vxStringBase NextEngineKey(const vxMappedINIFile& keywords, long& engineCount) {
  vxStringBase key;
  vxStringBase taken;
  do {
    ++engineCount;
    key = "Engine";
    key.append(engineCount);
  } while (keywords.GetVal(kSearchEngines, key, taken) == 0);
  return key;
}

}  // namespace

int vxMigrationManager::DoKeywordINIMerge() {
  vxStringBase sourcePath;
  vxStringBase destinationPath;
  vxFileManager::MakePath(sourcePath, m_sourceDirectory, "keywords.ini", 1);
  vxFileManager::MakePath(destinationPath, m_destinationDirectory, "keywords.ini", 1);

  // Every failure gets its error line, naming the side that failed.
  vxMappedINIFile source(sourcePath);
  if (source.Open(0) != 0) {
    if (!vxIsAbsent(sourcePath)) Log(vxMsgUnableToOpenFile, sourcePath.c_str());
    return 1;
  }
  vxMappedINIFile destination(destinationPath);
  if (destination.Open(0) != 0) {
    if (!vxIsAbsent(destinationPath)) {
      Log(vxMsgUnableToOpenFile, destinationPath.c_str());
    }
    return 1;
  }

  const INILineList* destinationEngines = destination.GetPropertyList(kSearchEngines);
  if (destinationEngines == nullptr) return 1;
  long engineCount = static_cast<long>(destinationEngines->size());
  // Engine names are matched exactly: the name is also the name of the engine's section.
  std::unordered_set<std::string> knownEngines(100);
  for (const INILine* line : *destinationEngines) knownEngines.insert(line->m_value.str());

  const INILineList* sourceEngines = source.GetPropertyList(kSearchEngines);
  if (sourceEngines == nullptr) return 1;
  for (const INILine* line : *sourceEngines) {
    const vxStringBase& engine = line->m_value;
    if (engine.isEmpty()) continue;
    const INILineList* settings = source.GetPropertyList(engine);
    if (knownEngines.count(engine.str()) == 0) {
      // The set stays as the new installation had it: an engine the old file lists twice is
      // appended twice, as the old file asked.
      destination.SetVal(kSearchEngines, NextEngineKey(destination, engineCount), engine);
      if (settings != nullptr) destination.AddMapSection(engine.c_str(), settings);
    } else if (settings != nullptr) {
      destination.UpdateMapSection(engine.c_str(), settings);
    }
  }

  if (!vxWroteBack(*this, destination)) return 1;
  Log("keywords.ini merged");
  return 0;
}
