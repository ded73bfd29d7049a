#pragma once
// The type side of compiled readers: for each local type a tree parallel to its schema, telling
// where each member lies and how to make the reader of a node once its children are compiled.

#include "Flow2/Flow2Types/FlowFieldTraits.h"
#include "Flow2/Flow2Types/FlowReaders.h"

#include <cstddef>
#include <functional>
#include <memory>
#include <vector>

namespace ZMT {

class IReaderInfo {
public:
  struct IParams {
    /// The file's node (its type decides the reader).
    const ISchema& m_File;
    /// The compiled children, in the file's order.
    std::vector<IReaderPtr> m_Children;
    /// The field's offset in its parent.
    std::uint64_t m_Offset = 0;
  };
  using VCreate = std::function<IReaderPtr(const IParams&)>;

  /// Parallel to the local schema's members, with each member's offset in this value.
  std::vector<std::shared_ptr<const IReaderInfo>> m_Children;
  std::vector<std::uint64_t> m_ChildOffsets;
  /// Makes the node's reader; null when the file's node can't be read into this one.
  VCreate m_Create;
};

using IReaderInfoPtr = std::shared_ptr<const IReaderInfo>;

/// Whether a field of type `field` reads a file value of type `file` (a field always reads its own
/// type; integers only widen, floats go either way, enums of any width read each other).
bool AcceptsFileType(std::uint32_t field, std::uint32_t file);

namespace IO {
/// A class's reader from its children in file order: adjacent block copies merge, and a class
/// read by one block of its full size becomes a block copy its own parent can merge.
IReaderPtr Collapse(std::vector<IReaderPtr> children, std::uint64_t offset, std::uint64_t size);
} // namespace IO

template <class T, class = void> struct TFlowReaderInfo;

namespace Detail {
template <class To> IReaderPtr MakeConverter(std::uint32_t fileType, std::uint64_t offset) {
  using namespace IO;
  switch (fileType) {
  case ISchema::Bool:
    return std::make_shared<VReaderConverter<bool, To>>(offset);
  case ISchema::Int8:
    return std::make_shared<VReaderConverter<std::int8_t, To>>(offset);
  case ISchema::Int16:
    return std::make_shared<VReaderConverter<std::int16_t, To>>(offset);
  case ISchema::Int32:
    return std::make_shared<VReaderConverter<std::int32_t, To>>(offset);
  case ISchema::Int64:
    return std::make_shared<VReaderConverter<std::int64_t, To>>(offset);
  case ISchema::UInt8:
  case ISchema::Enum8:
    return std::make_shared<VReaderConverter<std::uint8_t, To>>(offset);
  case ISchema::UInt16:
  case ISchema::Enum16:
    return std::make_shared<VReaderConverter<std::uint16_t, To>>(offset);
  case ISchema::UInt32:
  case ISchema::Enum32:
    return std::make_shared<VReaderConverter<std::uint32_t, To>>(offset);
  case ISchema::UInt64:
    return std::make_shared<VReaderConverter<std::uint64_t, To>>(offset);
  case ISchema::Float32:
    return std::make_shared<VReaderConverter<float, To>>(offset);
  case ISchema::Float64:
    return std::make_shared<VReaderConverter<double, To>>(offset);
  default:
    return nullptr;
  }
}

template <class T> IReaderInfoPtr Leaf(IReaderInfo::VCreate create) {
  auto pInfo = std::make_shared<IReaderInfo>();
  pInfo->m_Create = std::move(create);
  return pInfo;
}

inline std::uint64_t OffsetIn(const void* pOwner, const void* pMember) {
  return static_cast<std::uint64_t>(static_cast<const std::byte*>(pMember) -
                                    static_cast<const std::byte*>(pOwner));
}
} // namespace Detail

template <class T> struct TFlowReaderInfo<T, std::enable_if_t<std::is_arithmetic_v<T>>> {
  static IReaderInfoPtr Get() {
    static const IReaderInfoPtr s_Info =
        Detail::Leaf<T>([](const IReaderInfo::IParams& p) -> IReaderPtr {
          constexpr std::uint32_t own = Detail::ScalarType<T>();
          if (p.m_File.m_Type == own) {
            // A bool is normalised rather than copied, so that no byte other than 0 or 1 lands in
            // one; it therefore never joins a block copy.
            if constexpr (std::is_same_v<T, bool>)
              return std::make_shared<IO::VReaderConverter<bool, bool>>(p.m_Offset);
            else
              return std::make_shared<IO::VReaderBytes>(p.m_Offset, std::uint32_t(sizeof(T)));
          }
          if (!AcceptsFileType(own, p.m_File.m_Type)) return nullptr;
          return Detail::MakeConverter<T>(p.m_File.m_Type, p.m_Offset);
        });
    return s_Info;
  }
};

template <class E> struct TFlowReaderInfo<E, std::enable_if_t<std::is_enum_v<E>>> {
  using U = std::underlying_type_t<E>;
  static IReaderInfoPtr Get() {
    static const IReaderInfoPtr s_Info =
        Detail::Leaf<E>([](const IReaderInfo::IParams& p) -> IReaderPtr {
          const std::uint32_t file = p.m_File.m_Type;
          if (file != ISchema::Enum8 && file != ISchema::Enum16 && file != ISchema::Enum32)
            return nullptr;
          if (ISchema::ScalarSize(file) == sizeof(U))
            return std::make_shared<IO::VReaderBytes>(p.m_Offset, std::uint32_t(sizeof(U)));
          return Detail::MakeConverter<std::make_unsigned_t<U>>(file, p.m_Offset);
        });
    return s_Info;
  }
};

template <> struct TFlowReaderInfo<std::string> {
  static IReaderInfoPtr Get() {
    static const IReaderInfoPtr s_Info =
        Detail::Leaf<std::string>([](const IReaderInfo::IParams& p) -> IReaderPtr {
          if (p.m_File.m_Type != ISchema::String) return nullptr;
          return std::make_shared<IO::VReaderString>(p.m_Offset);
        });
    return s_Info;
  }
};

template <class T, std::size_t N> struct TFlowReaderInfo<std::array<T, N>> {
  static IReaderInfoPtr Get() {
    static const IReaderInfoPtr s_Info = [] {
      auto pInfo = std::make_shared<IReaderInfo>();
      pInfo->m_Children = {TFlowReaderInfo<T>::Get()};
      pInfo->m_ChildOffsets = {0};
      pInfo->m_Create = [](const IReaderInfo::IParams& p) -> IReaderPtr {
        if (p.m_File.m_Type != ISchema::Array || p.m_File.m_Count != N || p.m_Children.size() != 1)
          return nullptr;
        const IReaderPtr& pElement = p.m_Children[0];
        if (pElement->m_Size == sizeof(T) && pElement->m_Offset == 0 &&
            N * sizeof(T) <= 0xFFFFFFFFu)
          return std::make_shared<IO::VReaderBytes>(p.m_Offset, std::uint32_t(N * sizeof(T)));
        return std::make_shared<IO::VReaderArray<T, N>>(p.m_Offset, pElement);
      };
      return pInfo;
    }();
    return s_Info;
  }
};

template <class T> struct TFlowReaderInfo<std::vector<T>> {
  static IReaderInfoPtr Get() {
    static const IReaderInfoPtr s_Info = [] {
      auto pInfo = std::make_shared<IReaderInfo>();
      pInfo->m_Children = {TFlowReaderInfo<T>::Get()};
      pInfo->m_ChildOffsets = {0};
      pInfo->m_Create = [](const IReaderInfo::IParams& p) -> IReaderPtr {
        if (p.m_File.m_Type != ISchema::List || p.m_Children.size() != 1) return nullptr;
        const IReaderPtr& pElement = p.m_Children[0];
        if constexpr (!std::is_same_v<T, bool>)
          if (pElement->m_Size == sizeof(T) && pElement->m_Offset == 0)
            return std::make_shared<IO::VReaderContiguousVector<T>>(p.m_Offset);
        return std::make_shared<IO::VReaderVector<T>>(p.m_Offset, pElement);
      };
      return pInfo;
    }();
    return s_Info;
  }
};

template <class A, class B> struct TFlowReaderInfo<std::pair<A, B>> {
  static IReaderInfoPtr Get() {
    static const IReaderInfoPtr s_Info = [] {
      auto pInfo = std::make_shared<IReaderInfo>();
      const std::pair<A, B> probe{};
      pInfo->m_Children = {TFlowReaderInfo<std::remove_const_t<A>>::Get(),
                           TFlowReaderInfo<B>::Get()};
      pInfo->m_ChildOffsets = {Detail::OffsetIn(&probe, &probe.first),
                               Detail::OffsetIn(&probe, &probe.second)};
      pInfo->m_Create = [](const IReaderInfo::IParams& p) -> IReaderPtr {
        if (p.m_File.m_Type != ISchema::Tuple) return nullptr;
        return IO::Collapse(p.m_Children, p.m_Offset, sizeof(std::pair<A, B>));
      };
      return pInfo;
    }();
    return s_Info;
  }
};

template <class K, class V> struct TFlowReaderInfo<std::map<K, V>> {
  static IReaderInfoPtr Get() {
    static const IReaderInfoPtr s_Info = [] {
      auto pInfo = std::make_shared<IReaderInfo>();
      pInfo->m_Children = {TFlowReaderInfo<std::pair<K, V>>::Get()};
      pInfo->m_ChildOffsets = {0};
      pInfo->m_Create = [](const IReaderInfo::IParams& p) -> IReaderPtr {
        if (p.m_File.m_Type != ISchema::List || p.m_Children.size() != 1) return nullptr;
        return std::make_shared<IO::VReaderMap<K, V>>(p.m_Offset, p.m_Children[0]);
      };
      return pInfo;
    }();
    return s_Info;
  }
};

template <class K> struct TFlowReaderInfo<std::set<K>> {
  static IReaderInfoPtr Get() {
    static const IReaderInfoPtr s_Info = [] {
      auto pInfo = std::make_shared<IReaderInfo>();
      pInfo->m_Children = {TFlowReaderInfo<K>::Get()};
      pInfo->m_ChildOffsets = {0};
      pInfo->m_Create = [](const IReaderInfo::IParams& p) -> IReaderPtr {
        if (p.m_File.m_Type != ISchema::List || p.m_Children.size() != 1) return nullptr;
        return std::make_shared<IO::VReaderSet<K>>(p.m_Offset, p.m_Children[0]);
      };
      return pInfo;
    }();
    return s_Info;
  }
};

template <CFlowClass T> struct TFlowReaderInfo<T> {
  static IReaderInfoPtr Get() {
    static const IReaderInfoPtr s_Info = [] {
      auto pInfo = std::make_shared<IReaderInfo>();
      const T probe{};
      T::FlowFields(probe, [&](const char*, const char*, const auto& field) {
        pInfo->m_Children.push_back(TFlowReaderInfo<std::decay_t<decltype(field)>>::Get());
        pInfo->m_ChildOffsets.push_back(Detail::OffsetIn(&probe, &field));
      });
      pInfo->m_Create = [](const IReaderInfo::IParams& p) -> IReaderPtr {
        if (p.m_File.m_Type != ISchema::NamedTuple) return nullptr;
        return IO::Collapse(p.m_Children, p.m_Offset, sizeof(T));
      };
      return pInfo;
    }();
    return s_Info;
  }
};

} // namespace ZMT
