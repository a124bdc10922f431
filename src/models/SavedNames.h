#pragma once

#include <string>

namespace Corvane::Wavemill::SavedNames {

// The names under which documents save classes, in the .NET form that
// documents written by earlier versions of the applications carry. The
// container and the activator both build them, so they are made here only.

/// "Namespace.Type, Assembly".
inline std::string modelName(const std::string &namespaceName, const std::string &typeName,
                             const std::string &assemblyName) {
  return namespaceName + "." + typeName + ", " + assemblyName;
}

/// The name of a collection of items saved as `itemName`.
inline std::string collectionName(const std::string &itemName) {
  return "System.Collections.ObjectModel.Collection`1[[" + itemName + "]], mscorlib";
}

} // namespace Corvane::Wavemill::SavedNames
