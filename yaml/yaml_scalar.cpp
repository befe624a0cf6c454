#include "yaml/yaml_scalar.h"

#include <array>
#include <climits>
#include <locale>
#include <sstream>
#include <vector>

#include "platform/mutex.h"
#include "platform/text_hash.h"
#include "yaml/murmur_hash.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

// A text on its way into the registry, hashed once for both the thread's table and the registry.
struct Probe {
  std::string_view text;
  uint64_t hash;
};

// One piece of the registry: a table with open addressing and linear probing, whose every other entry at
// least is free. With a single one, three reader threads stand in line for its lock for most of their time.
struct RegistryShard {
  struct Entry {
    uint64_t hash;
    const YAMLScalar* scalar;
  };

  Entry& Find(const Probe& probe) {
    for (size_t at = probe.hash >> 32;; ++at) {
      Entry& entry = entries[at & (entries.size() - 1)];
      if (entry.scalar == nullptr || (entry.hash == probe.hash && entry.scalar->GetText() == probe.text))
        return entry;
    }
  }

  void Grow() {
    std::vector<Entry> old(entries.size() * 2);
    entries.swap(old);
    for (const Entry& entry : old) {
      size_t at = entry.hash >> 32;
      if (entry.scalar == nullptr) continue;
      while (entries[at & (entries.size() - 1)].scalar != nullptr) ++at;
      entries[at & (entries.size() - 1)] = entry;
    }
  }

  Mutex g_LookupMutex;
  size_t count = 0;
  std::vector<Entry> entries = std::vector<Entry>(16);
};

const YAMLScalar* LookupInRegistry(const Probe& probe) {
  // Never destroyed: scalars must outlive every other static object.
  static auto& shards = *new std::array<RegistryShard, 256>;
  RegistryShard& shard = shards[(probe.hash ^ (probe.hash >> 11)) % shards.size()];
  AutoLock lock(shard.g_LookupMutex);
  RegistryShard::Entry& found = shard.Find(probe);
  if (found.scalar != nullptr) return found.scalar;
  const YAMLScalar* scalar = YAMLAlloc<YAMLScalar>::create(probe.text);
  found = {probe.hash, scalar};
  if (++shard.count * 2 > shard.entries.size()) shard.Grow();
  return scalar;
}

// The length of the UTF-8 sequence that `text`, which is not empty, starts with; 0 where it starts with none.
size_t Utf8SequenceLength(std::string_view text) {
  const auto byte = [&](size_t i) { return static_cast<unsigned char>(text[i]); };
  const unsigned char first = byte(0);
  if (first < 0x80) return 1;
  const size_t length = first >= 0xF0 ? 4 : first >= 0xE0 ? 3 : 2;
  if (first < 0xC2 || first > 0xF4 || text.size() < length) return 0;
  uint32_t value = first & (0x7FU >> length);
  for (size_t i = 1; i < length; ++i) {
    if ((byte(i) & 0xC0) != 0x80) return 0;
    value = value << 6 | (byte(i) & 0x3FU);
  }
  // Longer than it needs to be, half of a UTF-16 pair, or beyond the last character.
  constexpr uint32_t kFirstOfLength[] = {0x80, 0x800, 0x10000};
  const bool is_surrogate = value >= 0xD800 && value <= 0xDFFF;
  return value < kFirstOfLength[length - 2] || is_surrogate || value > 0x10FFFF ? 0 : length;
}

bool IsUtf8(std::string_view text) {
  while (!text.empty()) {
    const size_t length = Utf8SequenceLength(text);
    if (length == 0) return false;
    text.remove_prefix(length);
  }
  return true;
}

}  // namespace

const YAMLScalar* YAMLScalar::underscore;
const YAMLScalar* YAMLScalar::empty;
const YAMLScalar* YAMLScalar::zero;
const YAMLScalar* YAMLScalar::one;
const YAMLScalar* YAMLScalar::monoBehaviour;
const YAMLScalar* YAMLScalar::mScript;
const YAMLScalar* YAMLScalar::mFather;
const YAMLScalar* YAMLScalar::transform;
const YAMLScalar* YAMLScalar::rectTransform;
const YAMLScalar* YAMLScalar::fileID;
const YAMLScalar* YAMLScalar::star;
const YAMLScalar* YAMLScalar::prefab;
const YAMLScalar* YAMLScalar::prefabInstance;
const YAMLScalar* YAMLScalar::mModification;
const YAMLScalar* YAMLScalar::mTransformParent;
const YAMLScalar* YAMLScalar::mPrefabInstance;
const YAMLScalar* YAMLScalar::mPrefabInternal;
const YAMLScalar* YAMLScalar::mPrefab;
const YAMLScalar* YAMLScalar::guid;
const YAMLScalar* YAMLScalar::fileIDPlaceHolderName;
const YAMLScalar* YAMLScalar::classIDPlaceHolderName;
const YAMLScalar* YAMLScalar::strippedPrefabPlaceHolderName;
const YAMLScalar* YAMLScalar::mergeTypeInfo;
const YAMLScalar* YAMLScalar::mergeTypeInfoPersistentTypeID;
const YAMLScalar* YAMLScalar::mergeTypeInfoTypeName;
const YAMLScalar* YAMLScalar::mergeTypeInfoIsMultiInstance;
const YAMLScalar* YAMLScalar::mergeTypeInfoBasePersistentTypeID;
const YAMLScalar* YAMLScalar::mergeTypeInfoRequires;
const YAMLScalar* YAMLScalar::mergeTypeInfoConflicts;
const YAMLScalar* YAMLScalar::gameObject;
const YAMLScalar* YAMLScalar::mComponent;
const YAMLScalar* YAMLScalar::mGameObject;

YAMLScalar::YAMLScalar(std::string_view text)
    : YAMLNode(Kind::kScalar), text_(text), is_writable_(text.size() <= INT_MAX && IsUtf8(text)) {
  SetHash(MurmurHash3(text, 42));
}

const YAMLScalar* YAMLScalar::Lookup(std::string_view text) {
  // Three reader threads ask for the same few thousand texts again and again: most are found here, without
  // the lock.
  thread_local std::array<const YAMLScalar*, 8192> recent = {};
  const Probe probe = {text, HashText(text)};
  const YAMLScalar*& slot = recent[(probe.hash ^ (probe.hash >> 13) ^ (probe.hash >> 29)) % recent.size()];
  if (slot == nullptr || slot->text_ != text) slot = LookupInRegistry(probe);
  return slot;
}

void YAMLScalar::RefuseToWrite() const {
  throw YAMLError(text_.size() > INT_MAX ? "Cannot write a value of 2 GiB or more"
                                         : "Cannot write a value that is not UTF-8");
}

void YAMLScalar::initializeConstants() {
  underscore = Lookup("_");
  empty = Lookup("");
  zero = Lookup("0");
  one = Lookup("1");
  monoBehaviour = Lookup("MonoBehaviour");
  mScript = Lookup("m_Script");
  mFather = Lookup("m_Father");
  transform = Lookup("Transform");
  rectTransform = Lookup("RectTransform");
  fileID = Lookup("fileID");
  star = Lookup("*");
  prefab = Lookup("Prefab");
  prefabInstance = Lookup("PrefabInstance");
  mModification = Lookup("m_Modification");
  mTransformParent = Lookup("m_TransformParent");
  mPrefabInstance = Lookup("m_PrefabInstance");
  mPrefabInternal = Lookup("m_PrefabInternal");
  mPrefab = Lookup("m_Prefab");
  guid = Lookup("guid");
  fileIDPlaceHolderName = Lookup("MERGE_FileID");
  classIDPlaceHolderName = Lookup("MERGE_ClassID");
  strippedPrefabPlaceHolderName = Lookup("MERGE_StrippedPrefab");
  mergeTypeInfo = Lookup("MergeTypeInfo");
  mergeTypeInfoPersistentTypeID = Lookup("id");
  mergeTypeInfoTypeName = Lookup("name");
  mergeTypeInfoIsMultiInstance = Lookup("ismulti");
  mergeTypeInfoBasePersistentTypeID = Lookup("baseid");
  mergeTypeInfoRequires = Lookup("requires");
  mergeTypeInfoConflicts = Lookup("conflicts");
  gameObject = Lookup("GameObject");
  mComponent = Lookup("m_Component");
  mGameObject = Lookup("m_GameObject");
}

bool YAMLScalar::EqualsExpensive(const YAMLNode* other) const {
  const YAMLScalar* scalar = other == nullptr ? nullptr : other->AsScalar();
  return scalar != nullptr && scalar->text_ == text_;
}

namespace {

template <typename Number>
Number ParsePrefix(const std::string& text) {
  std::istringstream stream(text);
  stream.imbue(std::locale::classic());
  Number number = 0;
  stream >> number;
  return number;
}

}  // namespace

int32_t YAMLScalar::GetIntValue() const { return ParsePrefix<int32_t>(text_); }

float YAMLScalar::GetFloatValue() const { return ParsePrefix<float>(text_); }

void initialize() { YAMLScalar::initializeConstants(); }

std::string IntToString(int value) { return std::to_string(value); }

}  // namespace vexel_yaml
