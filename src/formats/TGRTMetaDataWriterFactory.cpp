#include "formats/TGRTMetaDataWriterFactory.h"

#include "formats/TGRTFileNode.h"

namespace qvct {

std::shared_ptr<TGRTTaggingsWriter> TGRTMetaDataWriterFactory::taggingWriterForURL(const URL& url) {
    return TGRTFileNode::nodeWithFileURL(url)->taggingWriterForFileURL(url);
}

std::shared_ptr<TGRTContentInfoWriter> TGRTMetaDataWriterFactory::contentInfoWriterForURL(const URL& url) {
    return TGRTFileNode::nodeWithFileURL(url)->contentInfoWriterForFileURL(url);
}

std::shared_ptr<TGRTMetaDataWriter> TGRTMetaDataWriterFactory::metaDataWriterForURL(const URL& url) {
    return TGRTFileNode::nodeWithFileURL(url)->metaDataWriterForFileURL(url);
}

}  // namespace qvct
