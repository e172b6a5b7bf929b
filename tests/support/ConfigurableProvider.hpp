#pragma once

#include <storage/provider/IConfigurableProvider.hpp>

#include <functional>
#include <memory>
#include <stdexcept>
#include <vector>

namespace foundation::tests::support {

/// Keeps the trees that it was configured with, and refuses to be anything of a store.
class ConfigurableProvider : public storage::provider::IConfigurableProvider
{
public:
    using StorageIRI = storage::provider::StorageIRI;

    std::vector<boost::property_tree::ptree> trees;
    std::function<void(ConfigurableProvider&)> onConfigure = [](ConfigurableProvider&) {};
    std::function<void()> onShutdown = [] {};

protected:
    void doConfigure(boost::property_tree::ptree tree) override
    {
        trees.push_back(std::move(tree));
        onConfigure(*this);
    }
    void doShutdown() override { onShutdown(); }

    void doCreateFile(StorageIRI const&) const override { refuse(); }
    void doCreateFolder(StorageIRI const&) const override { refuse(); }
    bool doFileExists(StorageIRI const&) const override { refuse(); }
    bool doFolderExists(StorageIRI const&) const override { refuse(); }
    void doRemoveFile(StorageIRI const&) const override { refuse(); }
    void doMoveFile(StorageIRI const&, StorageIRI const&, storage::provider::ReplacementPolicy const&) const override
    {
        refuse();
    }
    void doRemoveFolder(StorageIRI const&) const override { refuse(); }
    void doMoveFolder(StorageIRI const&, StorageIRI const&, storage::provider::ReplacementPolicy const&) const override
    {
        refuse();
    }
    storage::provider::FileAttributes doGetFileAttributes(StorageIRI const&) const override { refuse(); }
    storage::provider::FolderAttributes doGetFolderAttributes(StorageIRI const&) const override { refuse(); }
    std::unique_ptr<storage::provider::ByteStream>
    doOpenStream(StorageIRI const&, storage::provider::ByteStreamOpenOptions const&) const override
    {
        refuse();
    }
    std::unique_ptr<storage::provider::ByteStream> doOpenReadOnlyStream(StorageIRI const&) const override { refuse(); }
    Listing doListAll(StorageIRI const&) const override { refuse(); }
    Listing doListFiles(StorageIRI const&) const override { refuse(); }
    Listing doListFolders(StorageIRI const&) const override { refuse(); }

private:
    [[noreturn]] static void refuse() { throw std::logic_error("This provider is only configured."); }
};

} // namespace foundation::tests::support
