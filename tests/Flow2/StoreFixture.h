#pragma once
// A store of the test types with a buffer factory, as most store tests need.

#include "FlowTestTypes.h"

#include "Flow2/Flow2Store/VFlowStoreFactory.h"

#include <gtest/gtest.h>

namespace FlowTest {

class StoreFixture : public ::testing::Test {
protected:
  void SetUp() override {
    auto& factory = Flow2Store::GetFlowStoreFactory();
    ASSERT_TRUE(factory.CreateStore(m_Store, TestFactories(), 77).IsSuccess());
    ASSERT_TRUE(factory.CreateBufferFactory(m_Buffers, nullptr).IsSuccess());
  }

  template <class T> ZMT::IFlowItemHandle Create() {
    ZMT::IFlowItemHandle item;
    EXPECT_TRUE(m_Store->CreateItem(TypeOf<T>(), item).IsSuccess());
    return item;
  }

  void Counts(const ZMT::IFlowItemTypeInfo& type, std::uint64_t& live, std::uint64_t& created) {
    std::uint64_t peak = 0;
    ASSERT_TRUE(m_Store->GetItemCounts(type, live, peak, created).IsSuccess());
  }

  /// The item's bytes as a chain the caller owns.
  ZMT::IFlowBuffer* BytesOf(const ZMT::IFlowItem& item) {
    ZMT::IFlowBuffer* pBytes = nullptr;
    EXPECT_TRUE(m_Buffers->GetItemWriter().Write(item, pBytes).IsSuccess());
    return pBytes;
  }

  ZMT::IFlowStoreHandle m_Store;
  ZMT::IFlowBufferFactoryHandle m_Buffers;
};

} // namespace FlowTest
