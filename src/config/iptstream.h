// Reads objects from a byte stream, which may hold anything: whatever is wrong with it is thrown as
// std::runtime_error, no more memory is taken than what its bytes stand for, and nesting is bounded.
#pragma once

#include <cstdint>
#include <istream>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <variant>
#include <vector>

#include "config/PersistentByProxy.h"
#include "config/ptstream.h"

namespace panelglow {

/// Whose objects are whose: the stream owns what it makes for pointers, until it is taken or finds its place as a
/// value; the rest ends with the stream. Objects that are read into, taken objects, and pointers that were filled
/// have to stay where they are as long as the stream is used. After a failure the stream reads nothing more, and the
/// pointers that it has filled are null. For one thread.
class iptstream final : public ptstream {
 public:
  /// The byte stream belongs to the caller and outlives this object.
  explicit iptstream(std::istream& input) : bytes(input) {}
  ~iptstream() override = default;

  std::uint32_t ReadUnsigned();
  std::int32_t ReadInteger() { return static_cast<std::int32_t>(ReadUnsigned()); }
  void ReadString(std::string& target) { target = ReadText(); }

  /// The same, good until the next call.
  std::string_view ReadText();

  /// Reads a value record into an object. An object that was made for a pointer before moves here, and all pointers
  /// that were filled with it follow. Returns the object's number.
  std::uint32_t ReadValue(Persistent& target);
  std::uint32_t ReadValue(PersistentByProxy& target);

  /// Reads a pointer record; the pointer follows its object from then on.
  void ReadPointer(Persistent*& pointer);
  void ReadPointer(PersistentByProxy*& pointer);

  /// The same for a look at the object: nothing follows it.
  Persistent* LookAtPointer();

  /// Gives an object that the stream made to the caller; null when the stream does not own it.
  std::unique_ptr<Persistent> Take(const Persistent* object);
  std::unique_ptr<PersistentByProxy> Take(const PersistentByProxy* object);

  /// For a class that keeps its parts in a list: the part that was read at `from` is at `to` now.
  void Moved(std::uint32_t number, const Persistent* from, Persistent* to);

  /// The same for one whose number is not at hand, if the stream knows it at all: looks through all objects.
  void Moved(const Persistent* from, Persistent* to);

 private:
  using Location = std::variant<Persistent**, PersistentByProxy**>;

  // What belongs to an object that was read through pointers.
  struct Links {
    std::vector<Location> locations;  // pointers that were filled with the object
    std::unique_ptr<Persistent> owned;
    std::unique_ptr<PersistentByProxy> ownedByProxy;
  };

  // An object that the stream has seen; its index in the table is its number.
  struct indexed_pointer {
    Persistent* object = nullptr;  // of a PersistentByProxy: its proxy
    std::uint16_t height = 0;      // levels of objects nested in it
    bool complete = false;         // its payload has been read
    bool isPart = false;           // it has its place inside another object
  };

  template <class Object>
  std::uint32_t ReadValueRecord(Object& target);
  template <class Object>
  void PlaceAt(Object& target, std::uint32_t number);
  template <class Object>
  Object* ReadPointerRecord(std::uint32_t& number);
  template <class Object>
  void FillPointer(Object*& pointer);
  template <class Object>
  Object* Make(const std::string& className, std::uint32_t number);
  template <class Object>
  Object* ObjectOf(const indexed_pointer& entry);
  template <class Object>
  static std::unique_ptr<Object>& OwnedOf(Links& linked);
  template <class Call>
  auto Guarded(Call call);
  template <class Object>
  void ReadPayload(Object& object, std::uint32_t number);
  template <class Object>
  std::unique_ptr<Object> TakeOwned(const Object* object);

  std::uint32_t ReadNewNumber();
  void CheckDepth(std::uint32_t level);
  void PutAt(std::uint32_t number, Persistent* place);
  void Break();
  indexed_pointer& EntryOf(std::uint32_t number);
  std::uint8_t ReadByte();
  void Read(char* data, std::size_t size);
  [[noreturn]] void Fail(const std::string& message);

  std::ios& bytes;                                 // buffer and state of the byte stream
  std::vector<indexed_pointer> table;              // by number
  std::unordered_map<std::uint32_t, Links> links;  // of the objects that were read through pointers, by number
  std::uint32_t depth = 0;                         // of the objects being read
  std::uint32_t deepest = 0;                       // level that was reached since the innermost of them began
  bool broken = false;
  std::string text;  // of the last ReadText
};

}  // namespace panelglow
