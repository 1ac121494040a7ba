#include "autotagging/ContentItem.h"

#include "autotagging/xml/QVCTXMLDocument.h"
#include "formats/QVContentEditorFileUtilities.h"
#include "formats/TGRTFileNode.h"

#include <utility>

namespace qvct {

ContentItem::ContentItem(URL url) : ContentItem(std::move(url), Reading{}) {}

ContentItem::ContentItem(URL url, Reading reading) : file_(std::move(url)), reading_(std::move(reading)) {
    if (!reading_.taxonomy) reading_.taxonomy = TGRTTaxonomy::mutableDefaultTaxonomy();
}

ContentItem::~ContentItem() = default;

ItemFile* ContentItem::descriptionFile() {
    if (!descriptionFile_) {
        const auto cache = QVContentEditorFileUtilities::intermediateCacheURLForURL(url());
        descriptionFile_ = cache ? std::make_unique<ItemFile>(*cache) : nullptr;
    }
    return descriptionFile_->get();
}

std::shared_ptr<QVCTXMLDocument> ContentItem::xmlDocument() {
    if (!xmlDocument_) {
        ItemFile* description = reading_.withXmlDocument ? descriptionFile() : nullptr;
        xmlDocument_ =
            description != nullptr ? QVCTXMLDocument::initWithContentsOfFile(*description) : nullptr;
    }
    return *xmlDocument_;
}

std::shared_ptr<TGRTMetaData> ContentItem::record(Error* error) {
    if (!record_) {
        Error reason;
        record_.emplace();
        record_->record =
            TGRTFileNode::readMetaDataOfFile(file_, reading_.options, reading_.taxonomy, &reason);
        if (reason.code != 0) record_->error = std::move(reason);
    }
    if (record_->error && error != nullptr) *error = *record_->error;
    return record_->record;
}

}  // namespace qvct
