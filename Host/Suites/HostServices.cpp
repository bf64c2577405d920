// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Suites/HostServices.h"

#include <atomic>

#include "Host/Suites/DescriptionSuites.h"
#include "Host/Suites/HandleTables.h"

namespace Vantrel::Host {
namespace {

constexpr VantrelHostStatus kUnknownSuite = static_cast<VantrelHostStatus>(0x80004002);

VantrelHostStatus AcquireSuite(const char* name, std::int32_t version, const void** suite) {
    *suite = HostServices::Instance().FindSuite(name, version);
    return *suite != nullptr ? 0 : kUnknownSuite;
}

/// Tables live as long as the process: there is nothing to count.
VantrelHostStatus ReleaseSuite(const char* name, std::int32_t version) {
    return HostServices::Instance().FindSuite(name, version) != nullptr ? 0 : kUnknownSuite;
}

constexpr QuillBasicSuite kBasicSuite = {&AcquireSuite, &ReleaseSuite};

}  // namespace

HostServices& HostServices::Instance() {
    static HostServices theServices;
    return theServices;
}

HostServices::HostServices()
    : mNodes(std::make_unique<NodeTable>()),
      mSegmentLists(std::make_unique<SegmentListTable>()),
      mOpaqueData(std::make_unique<OpaqueDataTable>()) {
    OfferDescriptionSuites(*this);
}

HostServices::~HostServices() = default;

const QuillBasicSuite* HostServices::GetBasicSuite() const { return &kBasicSuite; }

void HostServices::OfferSuite(const std::string& name, std::int32_t version, const void* table) {
    mSuites[{name, version}] = table;
}

const void* HostServices::FindSuite(const char* name, std::int32_t version) const {
    const auto suite = mSuites.find({name, version});
    return suite != mSuites.end() ? suite->second : nullptr;
}

void HostServices::Publish(SnapshotPtr snapshot) {
    if (snapshot) mOpaqueData->SetSnapshot(*snapshot);
    std::atomic_store(&mSnapshot, std::move(snapshot));
}

SnapshotPtr HostServices::GetSnapshot() const { return std::atomic_load(&mSnapshot); }

NodePtr HostServices::FindNode(std::uint32_t nodeID) const { return mNodes->Find(nodeID); }

}  // namespace Vantrel::Host
