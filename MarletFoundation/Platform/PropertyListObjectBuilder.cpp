#include "MarletFoundation/Platform/PropertyListObjectBuilder.h"

namespace MarletFoundation {

void PropertyListObjectBuilder::end() {
  auto container = std::move(open_.back());
  open_.pop_back();
  if (!container.isDictionary) return add(std::make_shared<ArrayObject>(std::move(container.values)));
  auto plain = std::make_shared<PlainDictionary>(container.values, container.keys);
  if (dictionaries_ == Dictionaries::plain) return add(std::move(plain));
  add(std::make_shared<MLFSortedDictionary>(*plain));
}

void PropertyListObjectBuilder::key(std::string_view text) {
  open_.back().keys.push_back(std::make_shared<StringObject>(std::string(text)));
}

void PropertyListObjectBuilder::string(std::string_view text) {
  add(std::make_shared<StringObject>(std::string(text)));
}
void PropertyListObjectBuilder::data(Data bytes) { add(std::make_shared<DataObject>(std::move(bytes))); }
void PropertyListObjectBuilder::date(Date date) { add(std::make_shared<DateObject>(date)); }
void PropertyListObjectBuilder::integer(std::int64_t number) { add(NumberObject::integer(number)); }
void PropertyListObjectBuilder::real(double number) { add(NumberObject::real(number)); }
void PropertyListObjectBuilder::boolean(bool flag) { add(NumberObject::boolean(flag)); }

void PropertyListObjectBuilder::add(PropertyListObjectPointer object) {
  if (open_.empty()) {
    root_ = std::move(object);
  } else {
    open_.back().values.push_back(std::move(object));
  }
}

PropertyListObjectPointer readPropertyListObject(const Data& data) {
  PropertyListObjectBuilder builder(PropertyListObjectBuilder::Dictionaries::plain);
  readPropertyList(data, builder);
  return builder.take();
}

}  // namespace MarletFoundation
