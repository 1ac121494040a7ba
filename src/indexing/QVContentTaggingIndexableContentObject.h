#pragma once

#include "metadata/TGRTDependencyItem.h"
#include "metadata/TGRTKeyValue.h"
#include "platform/base/Export.h"
#include "platform/base/ObjectSet.h"
#include "taxonomy/TGRTTagging.h"

#include <cstdint>
#include <set>
#include <string>

namespace qvct {

/// What a host's database stores of one content item.
///
/// The elements of its sets are meant to be read through their own protocols:
/// QVContentTaggingIndexableTaggingData, QVContentTaggingIndexableValueData and
/// QVContentTaggingDependencyItem. Those return texts and numbers of their own, which stay valid whatever
/// becomes of the taxonomy; everything else about the elements depends on it.
class QVCT_API QVContentTaggingIndexableContentObject {
  public:
    virtual ~QVContentTaggingIndexableContentObject() = default;
    virtual const std::string& displayName() const = 0;
    /// A FileType, though files may hold other numbers; 0 for unknown.
    virtual std::int64_t fileType() const = 0;
    virtual std::int64_t subFileType() const = 0;
    /// Whether there is a recording to listen to, which may be the item itself.
    virtual bool previewAvailable() const = 0;
    /// The content packs that the item belongs to.
    virtual const std::set<std::string>& packageIdentifiers() const = 0;
    /// The files that the item needs.
    virtual const ObjectSet<TGRTDependencyItem>& dependencyItems() const = 0;
    virtual const ObjectSet<TGRTTagging>& taggingDatas() const = 0;
    virtual const ObjectSet<TGRTKeyValue>& valueDatas() const = 0;
};

}  // namespace qvct
