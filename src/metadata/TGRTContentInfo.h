#pragma once

#include "metadata/TGRTApplicationInfo.h"
#include "metadata/TGRTDependencyItem.h"
#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyList.h"

#include <memory>
#include <set>
#include <string>
#include <vector>

namespace qvct {

/// What a piece of content needs: the files it depends on and the applications that can open it.
class QVCT_API TGRTContentInfo : public Object {
  public:
    /// An empty one.
    static std::shared_ptr<TGRTContentInfo> init();
    /// From the form that files store. Entries of the wrong type are passed over; without a dictionary the
    /// result is empty.
    static std::shared_ptr<TGRTContentInfo> initWithDictionary(const PropertyList* dictionary);
    /// A new one made from `dictionary`, as if it had been written and read.
    std::shared_ptr<TGRTContentInfo> copy() const;

    /// No dependencies.
    void setup() { resetDependencyPaths(); }
    /// Forgets all dependencies.
    void resetDependencyPaths() { assetDependencyItems_ = {}; }
    /// Adds a dependency for each path that has none yet.
    void updateDependencyPaths(const std::vector<std::string>& paths);
    /// Replaces the application infos by those of the dictionaries that have an application identifier.
    void setupApplicationInfosFromArray(const PropertyList::Array& array);

    const ObjectSet<TGRTDependencyItem>& assetDependencyItems() const { return assetDependencyItems_; }
    std::set<std::string> assetDependencyPaths() const;
    std::set<std::string> assetDependencyIdentifiers() const;
    const ObjectSet<TGRTApplicationInfo>& applicationInfos() const { return applicationInfos_; }
    void setApplicationInfos(ObjectSet<TGRTApplicationInfo> infos) { applicationInfos_ = std::move(infos); }

    /// As files store it: the paths sorted, the application infos; what is empty is left out.
    PropertyList::Dictionary dictionary() const;

    std::string description() const override;

  private:
    TGRTContentInfo() = default;

    ObjectSet<TGRTDependencyItem> assetDependencyItems_;
    ObjectSet<TGRTApplicationInfo> applicationInfos_;
};

}  // namespace qvct
