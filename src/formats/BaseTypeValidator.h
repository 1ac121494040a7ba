#pragma once

#include "formats/TGRTBaseMetaDataReader.h"
#include "formats/TGRTContentNodeTypeValidator.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <memory>

namespace qvct {

/// What all validators of ours share: readers and writers are made anew, and for valid URLs only. Validators
/// have no state and may be used from any thread.
class BaseTypeValidator : public TGRTContentNodeTypeValidator {
  public:
    /// Resolves labels in the shared writable default taxonomy.
    std::shared_ptr<TGRTBaseMetaDataReader> readerForFileURL(const URL& url) const {
        return readerForFileURL(url, TGRTTaxonomy::mutableDefaultTaxonomy());
    }
    std::shared_ptr<TGRTBaseMetaDataReader> readerForFileURL(
        const URL& url, const std::shared_ptr<TGRTTaxonomy>& taxonomy) const {
        return taxonomy && isValidContentTypeAtFileURL(url) ? makeReader(taxonomy) : nullptr;
    }
    std::shared_ptr<TGRTMetaDataReader> metaDataReaderForFileURL(const URL& url) const override {
        return readerForFileURL(url);
    }
    std::shared_ptr<TGRTTaggingsReader> taggingReaderForFileURL(const URL& url) const override {
        return readerForFileURL(url);
    }
    std::shared_ptr<TGRTTaggingsWriter> taggingWriterForFileURL(const URL& url) const override {
        return isValidContentTypeAtFileURL(url) ? makeTaggingWriter() : nullptr;
    }
    std::shared_ptr<TGRTContentInfoWriter> contentInfoWriterForFileURL(const URL& url) const override {
        return isValidContentTypeAtFileURL(url) ? makeContentInfoWriter() : nullptr;
    }
    std::shared_ptr<TGRTMetaDataWriter> metaDataWriterForFileURL(const URL& url) const override {
        return isValidContentTypeAtFileURL(url) ? makeMetaDataWriter() : nullptr;
    }

  protected:
    virtual std::shared_ptr<TGRTBaseMetaDataReader> makeReader(
        const std::shared_ptr<TGRTTaxonomy>& taxonomy) const = 0;
    virtual std::shared_ptr<TGRTTaggingsWriter> makeTaggingWriter() const = 0;
    virtual std::shared_ptr<TGRTContentInfoWriter> makeContentInfoWriter() const = 0;
    virtual std::shared_ptr<TGRTMetaDataWriter> makeMetaDataWriter() const = 0;
};

/// A validator's four classes, made as they are; `Base` is the validator that it extends.
template <typename Base, typename Reader, typename TaggingWriter, typename ContentInfoWriter,
          typename MetaDataWriter>
class TypeValidatorFor : public Base {
  protected:
    std::shared_ptr<TGRTBaseMetaDataReader> makeReader(
        const std::shared_ptr<TGRTTaxonomy>& taxonomy) const override {
        return Reader::initWithTaxonomy(taxonomy);
    }
    std::shared_ptr<TGRTTaggingsWriter> makeTaggingWriter() const override {
        return std::make_shared<TaggingWriter>();
    }
    std::shared_ptr<TGRTContentInfoWriter> makeContentInfoWriter() const override {
        return std::make_shared<ContentInfoWriter>();
    }
    std::shared_ptr<TGRTMetaDataWriter> makeMetaDataWriter() const override {
        return std::make_shared<MetaDataWriter>();
    }
};

}  // namespace qvct
