// Takes up the resource whose property list is in the file named; exits with 0 when it may be read.

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/PathUtilities/MLFSandboxedResource.h"
#include "MarletFoundation/Platform/FileManager.h"

using namespace MarletFoundation;

int main(int, char** arguments) {
  const auto list = PropertyListSerialization::read(FileManager::readFile(URL::file(arguments[1])));
  return MLFSandboxedResource(list).resourceURL ? 0 : 1;
}
