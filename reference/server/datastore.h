#pragma once

#include "reference/rovoapi/catalogueinfo.h"

#include <memory>
#include <string>

namespace sorvik::server {

// The data-store library (libvekex.so) as the server uses it: loaded from
// the folder the registry names (Software\Corvane\Common\VEK, binDir), as
// every product library loads it, so the server reads the same Parselet
// catalogue as the configuration view that answers which Parselet reads an
// extension.
class DataStore
{
public:
    // Raises std::runtime_error naming what is missing.
    DataStore();
    ~DataStore();

    DataStore(const DataStore &) = delete;
    DataStore &operator=(const DataStore &) = delete;

    // The catalogue as it is now (the library reads the file again when it
    // has changed). Raises ref::Failure.
    std::shared_ptr<const rovo::CatalogueInfo> Catalogue();

private:
    void *m_library = nullptr;
    void (*m_cleanup)() = nullptr;
    cv::vekex::IEnvironment *m_environment = nullptr;
};

} // namespace sorvik::server
