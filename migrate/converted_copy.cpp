// Converted copies: content in memory, one atomic create, and the source itself (a link followed
// only where the run's doors let it) when the content cannot be converted.

#include "migrate/converted_copy.h"

#include "foundation/files/file_manager.h"
#include "foundation/files/resolved_path.h"

namespace {

vxConvertedCopy Written(int created, vxConvertedCopy success) {
  if (created == 0) return success;
  return created == 2 ? vxConvertedCopy::kExists : vxConvertedCopy::kFailed;
}

// The source as it is, under the target's name, never over an existing entry.
vxConvertedCopy CopyAsIs(const vxStringBase& source, const vxStringBase& target,
                         vxConvertedCopy success) {
  if (vxFileManager::CopyFile(ResolvedCopySource(source), target, 0, 0, 0, 0, 0, nullptr,
                              nullptr) == 0) {
    return success;
  }
  return vxFileManager::Exists(target) ? vxConvertedCopy::kExists : vxConvertedCopy::kFailed;
}

}  // namespace

vxConvertedCopy WriteConvertedCopy(const vxStringBase& source, const vxStringBase& target,
                                   const vxSettingsConversion& convert) {
  vxMappedINIFile content(source);
  if (content.Open(1) != 0) return CopyAsIs(source, target, vxConvertedCopy::kNotSettings);
  if (!convert(content)) return CopyAsIs(source, target, vxConvertedCopy::kDeclined);
  return Written(content.CreateAs(target), vxConvertedCopy::kConverted);
}

vxConvertedCopy WriteConvertedCopy(const vxMappedINIFile& content, const vxStringBase& target,
                                   const vxSettingsConversion& convert) {
  vxMappedINIFile copy;
  copy.CopyFrom(content);
  if (!convert(copy)) return vxConvertedCopy::kDeclined;
  return Written(copy.CreateAs(target), vxConvertedCopy::kConverted);
}
