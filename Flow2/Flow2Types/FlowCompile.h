#pragma once
// Compiling a reader for data written with another version of a type, and comparing two versions
// of a schema in words.

#include "Flow2/Flow2Types/FlowReaderInfo.h"

#include <string>
#include <vector>

namespace ZMT {

/// The reader of values written with `fileSchema` into values of the local type that `localSchema`
/// and `info` describe; null when the two can't be reconciled. Members the file lacks keep the
/// target's values; members the local type lacks are skipped byte for byte; renamed members are
/// found through the rename histories; widened numbers convert; renumbered enum values map by
/// name.
IReaderPtr Compile(const ISchema& fileSchema, const ISchema& localSchema, const IReaderInfo& info);

/// Walks two versions of a schema and describes what changed; errors are changes a reader can't
/// follow, warnings those it can. Each message starts with the member's path.
void CompareSchemas(const ISchema& oldSchema, const ISchema& newSchema,
                    std::vector<std::string>& o_rErrors, std::vector<std::string>& o_rWarnings);

/// The reader of a described class for data written with `fileSchema`.
template <class T> IReaderPtr CompileReader(const ISchema& fileSchema, const ISchema& localSchema) {
  return Compile(fileSchema, localSchema, *TFlowReaderInfo<T>::Get());
}

} // namespace ZMT
