#pragma once

// The data-store library (libvekex.so): the data-store environment, its
// configurations with the store-type (Parselet) catalogue, the query
// interface over them, and the string containers in which callers hand lists
// to the server API library.
//
// Conventions: every object is reference counted and every returned object
// carries one reference for the caller. Every operation that can fail takes
// `std::int32_t *status` as its last argument; the callee sets it to a
// negative code on failure (codes below) and leaves it alone on success, so
// callers set it to 0 first. After a failure the result is null, empty or 0.

#include "sorvik/com.h"
#include "sorvik/refcounted.h"
#include "sorvik/wstring.h"

#include <cstdint>

namespace cv::vekex {

using krn::IRefCounted;
using krn::WString;

namespace status {
constexpr std::int32_t OutOfMemory = -20001;
constexpr std::int32_t InvalidArgument = -20002;      // null pointer, bad flags, unknown kind
constexpr std::int32_t NotFound = -20003;             // unknown environment, configuration, store type or attribute
constexpr std::int32_t CatalogueUnreadable = -20004;  // the catalogue file or an icon it names cannot be read
constexpr std::int32_t CatalogueMalformed = -20005;   // not well-formed XML, or not a catalogue
constexpr std::int32_t InvalidQuery = -20006;         // a selection path that does not parse
constexpr std::int32_t OutOfRange = -20007;           // an index beyond a list
constexpr std::int32_t Internal = -20008;             // a failure the library did not foresee
} // namespace status

// Environment kinds passed to vekGetEnvironment.
constexpr std::int32_t kEnvironmentDesktop = 82;
constexpr std::int32_t kEnvironmentValdorn = 84; // a server whose SorvikType is "valdorn"

// The one configuration this library offers.
inline constexpr char16_t kDataStoreConfiguration[] = u"cv.vek.config.datastore";

// A list of texts: a count and a pointer to that many consecutive WStrings,
// valid while the list is referenced and not changed.
struct SORVIK_EXPORT IStringList : IRefCounted
{
    virtual std::uint32_t GetCount() = 0;
    virtual const WString *GetElements() = 0; // null when the count is 0
};

// A container made by vekCreateContainer. It holds a list of texts and,
// separately, a list of 16-bit values; an operation that takes a container
// states which of the two it reads or fills.
struct SORVIK_EXPORT IContainer : IStringList
{
    // Replaces the texts by count copies of items (items may be null when count is 0).
    virtual void AssignFromArray(const WString *items, std::uint32_t count, std::int32_t *status) = 0;
    virtual void Append(const WString &item, std::int32_t *status) = 0;
    virtual void Clear() = 0; // both lists

    virtual std::uint32_t GetValueCount() = 0;
    virtual const std::int16_t *GetValues() = 0; // null when there are none
    virtual void AssignValues(const std::int16_t *values, std::uint32_t count, std::int32_t *status) = 0;
};

// A list of objects, each held with one reference by the list.
struct SORVIK_EXPORT IInstList : IRefCounted
{
    virtual std::uint32_t GetCount() = 0;
    // A new reference to the object at index; index beyond the list: OutOfRange.
    virtual IUnknown *GetAt(std::uint32_t index, std::int32_t *status) = 0;
    virtual void Append(IUnknown *object, std::int32_t *status) = 0; // null: InvalidArgument
    virtual void Clear() = 0;
};

// A list of containers, each held with one reference by the list.
struct SORVIK_EXPORT IContainerList : IRefCounted
{
    virtual std::uint32_t GetCount() = 0;
    virtual IContainer *GetAt(std::uint32_t index, std::int32_t *status) = 0;
    virtual void Append(IContainer *container, std::int32_t *status) = 0;
    virtual void Clear() = 0;
};

// Bytes of an attribute: size and data, valid while the object is referenced.
struct SORVIK_EXPORT IByteValue : IRefCounted
{
    virtual std::uint32_t GetSize() = 0;
    virtual const std::uint8_t *GetData() = 0; // null when the size is 0
};

// The query interface {9B03E039-20FD-4B12-AB62-23B367C5CF7E}, answered by the
// data-store configuration (the root) and by every element it selects.
//
// Paths: "/#data_store_manager.storetypes" selects the store types of the
// catalogue, in catalogue order, from any node; a relative "filefilters"
// selects the file filters of a store-type element. Either may end in a filter
// "(attr=value attr='value' ...)" whose terms must all hold; values compare
// without regard to case, and flags compare as "0" or "1".
// Example: "/#data_store_manager.storetypes(system=0 importsupported=1)".
//
// Store-type elements have the text attributes "name", "model", "system",
// "importsupported", "description" and "icon" (the icon's file name, empty
// when there is none). File-filter elements have "extension" (without "*.")
// and "userdefined".
constexpr IID IID_IVekQuery = MakeGuid("{9B03E039-20FD-4B12-AB62-23B367C5CF7E}");

struct SORVIK_EXPORT IVekQuery : IUnknown
{
    // Every matching element (each answers QueryInterface for IID_IVekQuery);
    // an empty list when nothing matches; a path that does not parse: InvalidQuery.
    virtual IInstList *SelectElements(const WString &path, std::int32_t *status) = 0;
    // The first matching element, or null without error when nothing matches.
    virtual IUnknown *SelectElement(const WString &path, std::int32_t *status) = 0;
    // An attribute's text; an attribute the element does not have: NotFound.
    virtual WString GetTextAttribute(const WString &name, std::int32_t *status) = 0;
    // An attribute's bytes: for "icon" the contents of the icon file (size 0
    // when the store type has none), for any other attribute its text in UTF-8.
    virtual IByteValue *GetAttribute(const WString &name, std::int32_t *status) = 0;
};

// The description of one store type (Parselet).
struct SORVIK_EXPORT IStoreTypeDescription : IRefCounted
{
    virtual WString GetName(std::int32_t *status) = 0;
    virtual WString GetModel(std::int32_t *status) = 0;
    // One "*." + extension per file filter, in catalogue order.
    virtual IStringList *GetFilePatterns(std::int32_t *status) = 0;
    virtual bool IsSystem(std::int32_t *status) = 0;
    virtual bool IsImportSupported(std::int32_t *status) = 0;
};

struct SORVIK_EXPORT IStoreTypeCatalogue : IRefCounted
{
    // Names of the store types in catalogue order. modelFilter, when not
    // empty, keeps those whose model contains it; extension, when not empty,
    // keeps those reading that extension (without "*."). Both ignore case.
    virtual IStringList *ListStoreTypes(const WString &modelFilter, const WString &extension,
                                        std::int32_t *status) = 0;
    // Unknown name (compared without regard to case): NotFound.
    virtual IStoreTypeDescription *GetStoreType(const WString &name, std::int32_t *status) = 0;
};

struct SORVIK_EXPORT IDataStoreManager : IRefCounted
{
    virtual IStoreTypeCatalogue *GetStoreTypes(std::int32_t *status) = 0;
};

// A configuration of the environment. QueryInterface answers IID_IUnknown
// and IID_IVekQuery.
struct SORVIK_EXPORT IConfiguration : IUnknown
{
    virtual WString GetName(std::int32_t *status) = 0;
    virtual IDataStoreManager *GetDataStoreManager(std::int32_t *status) = 0;
};

struct SORVIK_EXPORT IEnvironment : IRefCounted
{
    // name "cv.vek.config.datastore" (any case) is the only configuration;
    // flags must be 0. A catalogue that cannot be read or parsed fails here
    // with CatalogueUnreadable or CatalogueMalformed.
    virtual IConfiguration *GetConfiguration(const WString &name, std::int32_t flags, std::int32_t *status) = 0;
    virtual std::int32_t GetKind(std::int32_t *status) = 0;
};

} // namespace cv::vekex

// Entry points, resolved by name. Init and Cleanup count uses; every other
// function works between them.
extern "C" {
SORVIK_EXPORT void Init(void);
SORVIK_EXPORT void Cleanup(void);
// kind: kEnvironmentDesktop or kEnvironmentValdorn; name: empty for the
// default (the only) environment; version: the caller's packed version.
SORVIK_EXPORT cv::vekex::IEnvironment *vekGetEnvironment(std::int32_t kind, const cv::krn::WString &name,
                                                         std::uint32_t version, std::int32_t *status);
SORVIK_EXPORT cv::vekex::IContainer *vekCreateContainer(std::int32_t *status);
SORVIK_EXPORT cv::vekex::IInstList *vekCreateInstList(std::int32_t *status);
SORVIK_EXPORT cv::vekex::IContainerList *vekCreateContainerList(std::int32_t *status);
// A readable description of the last failure on the calling thread (empty
// when there was none); not one of the entry points a caller must find.
SORVIK_EXPORT void vekGetLastErrorText(cv::krn::WString *text);
}

namespace cv::vekex {
using PFN_Init = void (*)();
using PFN_Cleanup = void (*)();
using PFN_vekGetEnvironment = IEnvironment *(*)(std::int32_t, const WString &, std::uint32_t, std::int32_t *);
using PFN_vekCreateContainer = IContainer *(*)(std::int32_t *);
using PFN_vekCreateInstList = IInstList *(*)(std::int32_t *);
using PFN_vekCreateContainerList = IContainerList *(*)(std::int32_t *);
using PFN_vekGetLastErrorText = void (*)(WString *);
} // namespace cv::vekex
