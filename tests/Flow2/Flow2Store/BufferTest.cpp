// Buffers as chains of fixed pages; streams across page boundaries; shared, in-place and alias
// buffers.

#include "Flow2/Flow2Store/VFlowBufferFactory.h"
#include "Flow2/Flow2Store/VFlowBuffers.h"
#include "Flow2/Flow2Store/VFlowStoreFactory.h"
#include "Flow2/Flow2Store/VFlowStreams.h"

#include <gtest/gtest.h>

#include <memory_resource>
#include <numeric>
#include <vector>

namespace {

using namespace Flow2Store;

class FlowBuffers : public ::testing::Test {
protected:
  void SetUp() override {
    ASSERT_TRUE(GetFlowStoreFactory().CreateBufferFactory(m_Factory, nullptr).IsSuccess());
  }
  ZMT::IFlowBufferFactoryHandle m_Factory;
};

std::vector<std::uint64_t> PageSizes(const ZMT::IFlowBufferConst* pChain) {
  std::vector<std::uint64_t> sizes;
  for (; pChain; pChain = pChain->GetNext())
    sizes.push_back(pChain->GetSize());
  return sizes;
}

TEST_F(FlowBuffers, ChainsHaveFullPagesAndARemainder) {
  ZMT::IFlowBuffer* pChain = m_Factory->AllocateChain(10000);
  EXPECT_EQ(PageSizes(pChain), (std::vector<std::uint64_t>{4096, 4096, 1808}));
  EXPECT_EQ(pChain->GetChainSize(), 10000u);
  EXPECT_EQ(pChain->GetCapacity(), 4096u);
  EXPECT_FALSE(pChain->HasSharedBuffer());
  pChain->ReleaseChain();

  pChain = m_Factory->AllocateChain(4096);
  EXPECT_EQ(PageSizes(pChain), (std::vector<std::uint64_t>{4096}));
  pChain->ReleaseChain();
  pChain = m_Factory->AllocateChain(4097);
  EXPECT_EQ(PageSizes(pChain), (std::vector<std::uint64_t>{4096, 1}));
  pChain->ReleaseChain();
  pChain = m_Factory->AllocateChain(0);
  EXPECT_EQ(PageSizes(pChain), (std::vector<std::uint64_t>{0}));
  EXPECT_FALSE(pChain->SetSize(4097));
  EXPECT_EQ(pChain->GetSize(), 0u);
  pChain->ReleaseChain();
}

TEST_F(FlowBuffers, ABodyThatFitsASmallPageTakesOneAndGivesItBack) {
  const std::uint32_t references = m_Factory->GetReferenceCount();
  ZMT::IFlowBuffer* pSmall = m_Factory->AllocateChain(VFlowBufferSmall::Capacity);
  ZMT::IFlowBuffer* pLarger = m_Factory->AllocateChain(VFlowBufferSmall::Capacity + 1);
  EXPECT_EQ(PageSizes(pSmall), (std::vector<std::uint64_t>{VFlowBufferSmall::Capacity}));
  EXPECT_EQ(pSmall->GetCapacity(), VFlowBufferSmall::Capacity);
  EXPECT_EQ(pLarger->GetCapacity(), VFlowBufferFixed::Capacity);
  EXPECT_FALSE(pSmall->SetSize(VFlowBufferSmall::Capacity + 1));
  std::iota(pSmall->GetMutableData(), pSmall->GetMutableData() + pSmall->GetSize(), 0);
  EXPECT_EQ(pSmall->GetData()[VFlowBufferSmall::Capacity - 1], VFlowBufferSmall::Capacity - 1);
  // Each page holds the factory until it goes back.
  EXPECT_EQ(m_Factory->GetReferenceCount(), references + 2);
  pSmall->ReleaseChain();
  pLarger->ReleaseChain();
  EXPECT_EQ(m_Factory->GetReferenceCount(), references);
  // A reused small page comes back empty.
  pSmall = m_Factory->AllocateChain(3);
  EXPECT_EQ(PageSizes(pSmall), (std::vector<std::uint64_t>{3}));
  EXPECT_EQ(pSmall->GetNext(), nullptr);
  pSmall->ReleaseChain();
}

TEST_F(FlowBuffers, StreamsCrossPageBoundariesBothWays) {
  std::vector<std::uint8_t> data(10001);
  std::iota(data.begin(), data.end(), 0); // wraps every 256
  VFlowOutputStream out(*m_Factory);
  std::size_t offset = 0;
  for (std::size_t piece : {1u, 4094u, 3u, 5000u, 903u}) {
    ASSERT_TRUE(out.Write(data.data() + offset, piece));
    offset += piece;
  }
  ASSERT_EQ(offset, data.size());
  ZMT::IFlowBuffer* pChain = out.Detach();
  ASSERT_NE(pChain, nullptr);
  EXPECT_EQ(PageSizes(pChain), (std::vector<std::uint64_t>{4096, 4096, 1809}));

  VFlowInputStream in(pChain);
  std::vector<std::uint8_t> back(data.size());
  offset = 0;
  for (std::size_t piece : {4097u, 2u, 4095u, 1807u}) {
    ASSERT_TRUE(in.Read(back.data() + offset, piece));
    offset += piece;
  }
  EXPECT_EQ(back, data);
  EXPECT_TRUE(in.AtEnd());
  std::uint8_t extra = 0;
  EXPECT_FALSE(in.Read(&extra, 1));
  EXPECT_TRUE(in.IsFailed());
  pChain->ReleaseChain();
}

TEST_F(FlowBuffers, PagesReturnToThePoolAndHoldTheirFactory) {
  const std::uint32_t references = m_Factory->GetReferenceCount();
  ZMT::IFlowBuffer* pPage = m_Factory->AllocatePage();
  EXPECT_EQ(m_Factory->GetReferenceCount(), references + 1);
  pPage->SetSize(3);
  pPage->Release();
  EXPECT_EQ(m_Factory->GetReferenceCount(), references);
  ZMT::IFlowBuffer* pAgain = m_Factory->AllocatePage();
  EXPECT_EQ(pAgain, pPage); // last in, first out from this thread's vector
  EXPECT_EQ(pAgain->GetSize(), 0u);
  EXPECT_EQ(pAgain->GetNext(), nullptr);

  // A page outlives the handle to its factory.
  m_Factory.Reset();
  pAgain->Release();
}

TEST_F(FlowBuffers, SharedPagesPresentAnotherBuffersBytes) {
  std::shared_ptr<ZMT::IBuffer> pStandard = m_Factory->AllocateStandard(100);
  ASSERT_EQ(pStandard->GetSize(), 100u);
  pStandard->GetMutableData()[99] = 42;
  ZMT::IFlowBuffer* pShared = m_Factory->WrapShared(pStandard);
  EXPECT_EQ(pShared->GetSize(), 100u);
  EXPECT_EQ(pShared->GetData()[99], 42);
  EXPECT_EQ(pShared->GetMutableData(), nullptr); // someone else holds the bytes too
  EXPECT_FALSE(pShared->SetSize(101));

  ZMT::IFlowBuffer* pHead = m_Factory->AllocatePage();
  pHead->SetNext(pShared);
  EXPECT_TRUE(pHead->HasSharedBuffer());
  EXPECT_EQ(pHead->GetChainSize(), 100u);
  pStandard.reset();
  EXPECT_NE(pShared->GetMutableData(), nullptr); // now the page is the only holder
  pHead->ReleaseChain();

  // A read-only buffer never becomes writable.
  auto pAlias = std::make_shared<VBufferAlias>(m_Factory->AllocateStandard(10), 4, 100);
  EXPECT_EQ(pAlias->GetSize(), 6u);
  ZMT::IFlowBuffer* pView = m_Factory->WrapShared(pAlias);
  pAlias.reset();
  EXPECT_EQ(pView->GetMutableData(), nullptr);
  pView->ReleaseChain();
}

TEST(FlowBufferAllocator, InPlaceBuffersComeFromTheGivenAllocatorInOneBlock) {
  struct VCounting : std::pmr::memory_resource {
    int m_Live = 0;
    std::size_t m_Bytes = 0;
    void* do_allocate(std::size_t n, std::size_t a) override {
      ++m_Live;
      m_Bytes = n;
      return std::pmr::new_delete_resource()->allocate(n, a);
    }
    void do_deallocate(void* p, std::size_t n, std::size_t a) override {
      --m_Live;
      std::pmr::new_delete_resource()->deallocate(p, n, a);
    }
    bool do_is_equal(const memory_resource& o) const noexcept override { return this == &o; }
  } counting;
  ZMT::IFlowBufferFactoryHandle factory;
  ASSERT_TRUE(GetFlowStoreFactory().CreateBufferFactory(factory, &counting).IsSuccess());
  {
    std::shared_ptr<ZMT::IBuffer> pBuffer = factory->AllocateInPlace(1000);
    EXPECT_EQ(counting.m_Live, 1);
    EXPECT_GE(counting.m_Bytes, 1000u);
    EXPECT_LT(counting.m_Bytes, 1100u);
    pBuffer->GetMutableData()[999] = 1; // the whole block is there (ASan checks)
    EXPECT_EQ(pBuffer->GetSize(), 1000u);
  }
  EXPECT_EQ(counting.m_Live, 0);
}

TEST(FlowBufferAlias, ViewsAreClippedToTheirBuffer) {
  auto pBase = std::make_shared<IStandardBuffer>(8);
  for (int i = 0; i < 8; ++i)
    pBase->GetMutableData()[i] = static_cast<std::uint8_t>(i);
  VBufferAlias middle(pBase, 2, 3);
  EXPECT_EQ(middle.GetSize(), 3u);
  EXPECT_EQ(middle.GetData()[0], 2);
  VBufferAlias past(pBase, 20, 3);
  EXPECT_EQ(past.GetSize(), 0u);
  VBufferAlias none(nullptr, 0, 3);
  EXPECT_EQ(none.GetSize(), 0u);
  EXPECT_EQ(none.GetData(), nullptr);
}

} // namespace
