// Compares the headers with the facts of the standard in cmpi-abi.json, entry by entry. generate_abi_test.py turns the
// facts into the abi_*.inc files; the counts at the end of each test make sure that no entry is skipped.
//
// Built three times: as it is, with inline functions in place of macros (and the slots of CMPI_VER_86), and for
// version 1.0 of CMPI. CMPI_ABI_SUITE names the variant.

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cstdarg>
#include <cstddef>
#include <cstdint>
#include <set>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

#include "cmpidt.h"
#include "cmpift.h"
#include "cmpimacs.h"
#include "cmpios.h"
#include "cmpipl.h"

// The functions of abi_test.c, the view of a C program.
extern "C" const CMPIBroker* cProviderBroker(void);

namespace {

#include "abi_counts.inc"

// The text of a macro's expansion without blanks, which compilers place differently.
#define CMPI_ABI_SPELLED_(...) #__VA_ARGS__
#define CMPI_ABI_SPELLED(...) withoutBlanks(CMPI_ABI_SPELLED_(__VA_ARGS__))

std::string withoutBlanks(std::string text) {
  std::erase(text, ' ');
  for (std::size_t at; (at = text.find("__null")) != std::string::npos;) text.replace(at, 6, "NULL");
  return text;
}

// ---- Records, types, constants ----

// One comparison each, and no macro of the test framework: there are thousands, and those macros take long to compile.
void expectTrue(bool isTrue, const char* name) { EXPECT_TRUE(isTrue) << name; }
void expectEqual(long long actual, long long expected, const char* name) { EXPECT_EQ(actual, expected) << name; }

template <typename Type>
constexpr bool isFunctionPointer = std::is_pointer_v<Type>&& std::is_function_v<std::remove_pointer_t<Type>>;

TEST(CMPI_ABI_SUITE, EveryRecordIsLaidOutAsTheStandardSays) {
  int records = 0;
  int fields = 0;
  int functions = 0;
#define RECORD(name, tagged, kind, bytes, alignment)                             \
  ++records;                                                                     \
  expectTrue(std::is_same_v<name, tagged>, #name);                               \
  expectEqual(std::is_union_v<name>, std::string_view(#kind) == "union", #name); \
  expectEqual(sizeof(name), bytes, #name);                                       \
  expectEqual(alignof(name), alignment, #name);
#define FIELD(record, field, at, bytes, ...)                       \
  ++fields;                                                        \
  functions += isFunctionPointer<decltype(record::field)> ? 1 : 0; \
  expectEqual(offsetof(record, field), at, #record "::" #field);   \
  expectEqual(sizeof(record::field), bytes, #record "::" #field);  \
  expectTrue(std::is_same_v<decltype(record::field), __VA_ARGS__>, #record "::" #field);
#include "abi_records.inc"
#undef RECORD
#undef FIELD
#ifdef CMPI_VER_200
  EXPECT_EQ(records, kRecords);
  EXPECT_EQ(fields, kFields);
  EXPECT_EQ(functions, kFunctionPointerFields);
#else
  EXPECT_LT(fields, kFields);
  EXPECT_GT(functions, kFunctionPointerFields / 2);
#endif
}

TEST(CMPI_ABI_SUITE, EveryTypedefNamesTheTypeOfTheStandard) {
  int typedefs = 0;
#define TYPEDEF(name, bytes, alignment, ...)            \
  ++typedefs;                                           \
  expectTrue(std::is_same_v<name, __VA_ARGS__>, #name); \
  expectEqual(sizeof(name), bytes, #name);              \
  expectEqual(alignof(name), alignment, #name);
#define TYPEDEF_WITHOUT_SIZE(name, ...) \
  ++typedefs;                           \
  expectTrue(std::is_same_v<name, __VA_ARGS__>, #name);
#include "abi_typedefs.inc"
#undef TYPEDEF
#undef TYPEDEF_WITHOUT_SIZE
#ifdef CMPI_VER_200
  EXPECT_EQ(typedefs, kTypedefs);
#else
  EXPECT_GT(typedefs, kTypedefs / 2);
#endif
}

TEST(CMPI_ABI_SUITE, EveryEnumeratorHasTheValueOfTheStandard) {
  int enums = 0;
  int values = 0;
#define ENUM(name, tagged, bytes)                  \
  ++enums;                                         \
  expectTrue(std::is_same_v<name, tagged>, #name); \
  expectEqual(sizeof(name), bytes, #name);
#define ENUMERATOR(type, name, number)                     \
  ++values;                                                \
  expectTrue(std::is_same_v<decltype(name), type>, #name); \
  expectEqual(name, number, #name);
#include "abi_enums.inc"
#undef ENUM
#undef ENUMERATOR
#ifdef CMPI_VER_200
  EXPECT_EQ(enums, kEnums);
  EXPECT_EQ(values, kEnumValues);
#else
  EXPECT_GT(values, 0);
#endif
}

TEST(CMPI_ABI_SUITE, EveryConstantHasTheValueOfTheStandard) {
  int integers = 0;
  int strings = 0;
#define INTEGER(name, number) \
  ++integers;                 \
  EXPECT_EQ(name, number) << #name;
#define STRING(name, text) \
  ++strings;               \
  EXPECT_STREQ(name, text) << #name;
#ifdef CMPI_VER_200
#define CURRENT_VERSION(name, number) INTEGER(name, number)
#else
#define CURRENT_VERSION(name, number) INTEGER(name, CMPIVersion100)
#endif
#include "abi_constants.inc"
#undef INTEGER
#undef STRING
#undef CURRENT_VERSION
#ifdef CMPI_VER_200
  EXPECT_EQ(integers, kConstantsInteger);
#else
  EXPECT_GT(integers, kConstantsInteger / 2);
#endif
  EXPECT_EQ(strings, kConstantsString);
}

// ---- Function macros: each is called on a fake object whose slots all record who called them with what ----

using Words = std::vector<std::uint64_t>;

// Any value that passes through a slot, as a number that can be compared.
template <typename Type>
std::uint64_t word(Type value) {
  if constexpr (std::is_pointer_v<Type>) {
    return reinterpret_cast<std::uintptr_t>(value);
  } else if constexpr (std::is_floating_point_v<Type>) {
    return std::bit_cast<std::uint64_t>(double{value});
  } else if constexpr (std::is_same_v<Type, CMPIStatus>) {
    return word(value.rc) ^ word(value.msg);
  } else if constexpr (std::is_same_v<Type, CMPIData>) {
    return (word(value.type) << 48) ^ (word(value.state) << 32) ^ value.value.uint64;
  } else {
    return static_cast<std::uint64_t>(value);
  }
}

// A value to pass at a position, different from that of any other position of the same type. Pointers point into memory
// that is never read.
template <typename Type>
std::remove_cv_t<Type> argument(int position) {
  using Plain = std::remove_cv_t<Type>;
  alignas(16) static std::array<char, 1024> memory;
  if constexpr (std::is_pointer_v<Plain>) {
    return reinterpret_cast<Plain>(reinterpret_cast<std::uintptr_t>(&memory[static_cast<std::size_t>(position) * 16]));
  } else if constexpr (std::is_enum_v<Plain>) {
    return static_cast<Plain>(1 + position % 3);
  } else if constexpr (std::is_same_v<Plain, CMPIStatus>) {
    return {CMPI_RC_ERR_NOT_FOUND, argument<CMPIString*>(position)};
  } else if constexpr (std::is_same_v<Plain, CMPIData>) {
    CMPIData data{CMPI_uint64, CMPI_keyValue, {}};
    data.value.uint64 = static_cast<CMPIUint64>(position);
    return data;
  } else {
    return static_cast<Plain>(100 + position);
  }
}

// The position of a slot's return value.
constexpr int kAnswer = 60;

struct Call {
  const void* slot;
  Words words;
};

std::vector<Call>& calls() {
  static std::vector<Call> made;
  return made;
}

// Inserts of a message, as count and pairs of type and value.
Words insertsOf(unsigned count, std::va_list list) {
  Words words{count};
  for (unsigned i = 0; i < count; ++i) {
    const int type = va_arg(list, int);
    words.push_back(word(type));
    switch (type) {
      case CMPI_sint32:
        words.push_back(word(va_arg(list, long)));
        break;
      case CMPI_uint32:
        words.push_back(word(va_arg(list, unsigned long)));
        break;
      case CMPI_sint64:
        words.push_back(word(va_arg(list, long long)));
        break;
      case CMPI_uint64:
        words.push_back(word(va_arg(list, unsigned long long)));
        break;
      case CMPI_real64:
        words.push_back(word(va_arg(list, double)));
        break;
      case CMPI_boolean:
        words.push_back(word(va_arg(list, int)));
        break;
      case CMPI_chars:
        words.push_back(word(va_arg(list, const char*)));
        break;
      case CMPI_string:
        words.push_back(word(va_arg(list, const CMPIString*)));
        break;
      default:
        ADD_FAILURE() << "insert of the unknown type " << type;
        return words;
    }
  }
  return words;
}

Words inserts(unsigned count, ...) {
  std::va_list list;
  va_start(list, count);
  Words words = insertsOf(count, list);
  va_end(list);
  return words;
}

// The recorder of one slot.
template <auto Member>
struct Slot;

template <typename Table, typename Result, typename... Args, Result (*Table::*Member)(Args...)>
struct Slot<Member> {
  using Answer = Result;
  static inline char id = 0;
  static Result call(Args... args) {
    calls().push_back({&id, {word(args)...}});
    return argument<Result>(kAnswer);
  }
};

template <>
struct Slot<&CMPIBrokerEncFT::getMessage> {
  using Answer = CMPIString*;
  static inline char id = 0;
  static CMPIString* call(const CMPIBroker* mb, const char* msgId, const char* defMsg, CMPIStatus* rc, CMPICount count,
                          ...) {
    std::va_list list;
    va_start(list, count);
    Words words{word(mb), word(msgId), word(defMsg), word(rc)};
    for (std::uint64_t insert : insertsOf(count, list)) words.push_back(insert);
    va_end(list);
    calls().push_back({&id, words});
    return argument<CMPIString*>(kAnswer);
  }
};

#ifdef CMPI_VER_200
template <>
struct Slot<&CMPIBrokerEncFT::getMessage2> {
  using Answer = CMPIString*;
  static inline char id = 0;
  static CMPIString* call(const CMPIBroker* mb, const char* msgId, const CMPIMsgFileHandle file, const char* defMsg,
                          CMPIStatus* rc, CMPICount count, ...) {
    std::va_list list;
    va_start(list, count);
    Words words{word(mb), word(msgId), word(file), word(defMsg), word(rc)};
    for (std::uint64_t insert : insertsOf(count, list)) words.push_back(insert);
    va_end(list);
    calls().push_back({&id, words});
    return argument<CMPIString*>(kAnswer);
  }
};
#endif

#include "abi_fill.inc"

// An object whose table records.
template <typename Object>
struct Fake {
  Fake() {
    fill(ft);
    object.ft = &ft;
    calls().clear();
  }
  Object* get() { return &object; }
  std::remove_pointer_t<decltype(Object::ft)> ft{};
  Object object{};
};

template <>
struct Fake<CMPIBroker> {
  Fake() {
    fill(bft);
    fill(eft);
    object.bft = &bft;
    object.eft = &eft;
    calls().clear();
  }
  CMPIBroker* get() { return &object; }
  CMPIBrokerFT bft{};
  CMPIBrokerEncFT eft{};
  CMPIBroker object{};
};

void expectAnswerOf(bool isOfTheSlotsType, std::uint64_t got, std::uint64_t given) {
  EXPECT_TRUE(isOfTheSlotsType) << "the macro's type is not that of the slot";
  EXPECT_EQ(got, given) << "the slot's answer got lost";
}

void expectOneCall(const void* slot, const Words& words) {
  ASSERT_EQ(calls().size(), 1u);
  EXPECT_EQ(calls().front().slot, slot) << "another slot was called";
  EXPECT_EQ(calls().front().words, words);
}

template <auto Member, typename Type>
void expectAnswer(Type got) {
  using Answer = typename Slot<Member>::Answer;
  expectAnswerOf(std::is_same_v<Type, Answer>, word(got), word(argument<Answer>(kAnswer)));
}

template <auto Member>
void expectCall(const Words& words) {
  expectOneCall(&Slot<Member>::id, words);
}

// Macros take a pointer to any variable that holds a value; the inline functions have the type of the slot.
#ifdef CMPI_INLINE
#define CMPI_ABI_VALUE(position) argument<const CMPIValue*>(position)
#else
#define CMPI_ABI_VALUE(position) argument<double*>(position)
#endif

// The type of the value in a CMFmt... pair, without const where it is a pointer.
template <typename Type>
Type second(int, Type);
template <typename Type>
using Unqualified = std::conditional_t<std::is_pointer_v<Type>,
                                       std::add_pointer_t<std::remove_const_t<std::remove_pointer_t<Type>>>, Type>;

#include "abi_macro_checks.inc"

CMPIStatus returnsCode() { CMReturn(CMPI_RC_ERR_FAILED); }

CMPIStatus returnsString(CMPIString* text) {
  if (text)
    CMReturnWithString(CMPI_RC_ERR_ACCESS_DENIED, text);
  else
    CMReturn(CMPI_RC_OK);
}

CMPIStatus returnsChars(const CMPIBroker* broker, const char* text) {
  CMReturnWithChars(broker, CMPI_RC_ERR_NOT_SUPPORTED, text);
}

void checkCMReturn() {
  const CMPIStatus status = returnsCode();
  EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED);
  EXPECT_EQ(status.msg, nullptr);
}

void checkCMReturnWithString() {
  CMPIString text{};
  const CMPIStatus status = returnsString(&text);
  EXPECT_EQ(status.rc, CMPI_RC_ERR_ACCESS_DENIED);
  EXPECT_EQ(status.msg, &text);
  EXPECT_EQ(returnsString(nullptr).rc, CMPI_RC_OK);
}

void checkCMReturnWithChars() {
  Fake<CMPIBroker> fake;
  const char* text = "no";
  const CMPIStatus status = returnsChars(fake.get(), text);
  EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(status.msg, argument<CMPIString*>(kAnswer));
  expectCall<&CMPIBrokerEncFT::newString>({word(fake.get()), word(text), 0});
}

void checkCMSetStatus() {
  CMPIString text{};
  CMPIStatus status{CMPI_RC_OK, &text};
  CMSetStatus(&status, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(status.msg, nullptr);
  CMSetStatus(nullptr, CMPI_RC_OK);
}

void checkCMSetStatusWithString() {
  const CMPIString text{};
  CMPIStatus status{CMPI_RC_OK, nullptr};
  CMSetStatusWithString(&status, CMPI_RC_ERR_INVALID_CLASS, &text);
  EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_CLASS);
  EXPECT_EQ(status.msg, &text);
  CMSetStatusWithString(nullptr, CMPI_RC_OK, &text);
}

void checkCMSetStatusWithChars() {
  Fake<CMPIBroker> fake;
  const char* text = "no such class";
  CMPIStatus status{CMPI_RC_OK, nullptr};
  CMSetStatusWithChars(fake.get(), &status, CMPI_RC_ERR_INVALID_CLASS, text);
  EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_CLASS);
  EXPECT_EQ(status.msg, argument<CMPIString*>(kAnswer));
  expectCall<&CMPIBrokerEncFT::newString>({word(fake.get()), word(text), 0});

  CMSetStatusWithChars(nullptr, &status, CMPI_RC_ERR_FAILED, text);
  EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED);
  EXPECT_EQ(status.msg, nullptr);
  CMSetStatusWithChars(fake.get(), nullptr, CMPI_RC_OK, text);
  EXPECT_EQ(calls().size(), 1u);
}

void checkCMIsNullObject() {
  int handle = 0;
  CMPIString object{&handle, nullptr};
  EXPECT_EQ(CMIsNullObject(&object), 0);
  object.hdl = nullptr;
  EXPECT_EQ(CMIsNullObject(&object), 1);
  EXPECT_EQ(CMIsNullObject(nullptr), 1);
}

// The bits are above those of a CMPIBoolean; the macro must show them even so.
void checkCMIsNullValue() {
  CMPIData data{CMPI_string, CMPI_goodValue, {}};
  CMPIBoolean isNull = CMIsNullValue(data);
  EXPECT_EQ(isNull, 0);
  data.state = CMPI_nullValue | CMPI_keyValue;
  isNull = CMIsNullValue(data);
  EXPECT_EQ(isNull, 1);
}

void checkCMIsKeyValue() {
  CMPIData data{CMPI_string, CMPI_nullValue, {}};
  CMPIBoolean isKey = CMIsKeyValue(data);
  EXPECT_EQ(isKey, 0);
  data.state = CMPI_keyValue;
  isKey = CMIsKeyValue(data);
  EXPECT_EQ(isKey, 1);
}

void checkCMIsArray() {
  CMPIData data{CMPI_string, CMPI_goodValue, {}};
  CMPIBoolean isArray = CMIsArray(data);
  EXPECT_EQ(isArray, 0);
  data.type = CMPI_stringA;
  isArray = CMIsArray(data);
  EXPECT_EQ(isArray, 1);
}

void checkCMGetCharPtr() {
  char text[] = "text";
  CMPIString string{text, nullptr};
  EXPECT_TRUE((std::is_same_v<decltype(CMGetCharPtr(&string)), char*>));
  EXPECT_EQ(CMGetCharPtr(&string), text);
}

struct Check {
  std::string name;
  void (*run)();
};

void run(const Check& check) {
  SCOPED_TRACE(check.name);
  check.run();
}

TEST(CMPI_ABI_SUITE, EveryMacroReachesItsSlotWithItsArgumentsInOrder) {
  const Check byHand[] = {
      {"CMReturn", checkCMReturn},
      {"CMReturnWithString", checkCMReturnWithString},
      {"CMReturnWithChars", checkCMReturnWithChars},
      {"CMSetStatus", checkCMSetStatus},
      {"CMSetStatusWithString", checkCMSetStatusWithString},
      {"CMSetStatusWithChars", checkCMSetStatusWithChars},
      {"CMIsNullObject", checkCMIsNullObject},
      {"CMIsNullValue", checkCMIsNullValue},
      {"CMIsKeyValue", checkCMIsKeyValue},
      {"CMIsArray", checkCMIsArray},
      {"CMGetCharPtr", checkCMGetCharPtr},
  };
  int checked = 0;
  int withdrawn = 0;
  std::set<std::string> parts;
#define CASE(name, check) \
  ++checked;              \
  run({#name, check});
#define CASE_PART(name, check) \
  parts.insert(#name);         \
  run({#name, check});
#define CASE_OF_PARTS(name) \
  ++checked;                \
  EXPECT_TRUE(parts.contains(#name));
#define CASE_BY_HAND(macro)                                                           \
  {                                                                                   \
    ++checked;                                                                        \
    const auto* check = std::ranges::find(byHand, std::string(#macro), &Check::name); \
    ASSERT_NE(check, std::end(byHand)) << "no check of " #macro;                      \
    run(*check);                                                                      \
  }
#define WITHDRAWN(name) ++withdrawn;
#include "abi_macro_cases.inc"
#undef CASE
#undef CASE_PART
#undef CASE_OF_PARTS
#undef CASE_BY_HAND
#undef WITHDRAWN
  EXPECT_EQ(withdrawn, 2);  // CMEvaluatePredicate and CBSetInstance with a property list
#ifdef CMPI_VER_200
  EXPECT_EQ(checked + withdrawn, kFunctionMacros);
#else
  EXPECT_GT(checked, kFunctionMacros / 2);
#endif
}

TEST(CMPI_ABI_SUITE, MacrosTakeExpressionsAsArguments) {
  Fake<CMPIInstance> fake;
  CMPIInstance* none = nullptr;
  bool second = true;
  const CMPIUint16 number = 7;
  expectAnswer<&CMPIInstanceFT::getPropertyAt>(
      CMGetPropertyAt(second ? fake.get() : none, second ? 1u : 0u, nullptr, nullptr));
  expectCall<&CMPIInstanceFT::getPropertyAt>({word(fake.get()), 1, 0, 0});
#ifndef CMPI_INLINE
  calls().clear();
  CMSetProperty(second ? fake.get() : none, "Port", &number, second ? CMPI_uint16 : CMPI_uint32);
  EXPECT_EQ(calls().at(0).words.at(2), word(&number));
  calls().clear();
  CMSetProperty(fake.get(), "Port", nullptr, CMPI_null);
  EXPECT_EQ(calls().at(0).words.at(2), 0u);
#else
  EXPECT_EQ(number, 7);
#endif
}

// ---- Making providers ----

const CMPIBroker* sampleBroker = nullptr;
int sampleHooks = 0;

}  // namespace

// The classes below the C++ factories, which a program that uses the factories must define.
struct CmpiBroker {
  explicit CmpiBroker(CMPIBroker* given) : broker(given) {}
  const CMPIBroker* broker;
};

struct CmpiContext {
  explicit CmpiContext(CMPIContext* given) : context(given) {}
  const CMPIContext* context;
};

struct CmpiBaseMI;

struct CmpiProviderBase {
  CmpiBaseMI* getBaseMI() { return provider; }
  void setBaseMI(CmpiBaseMI* made) { provider = made; }
  void incUseCount() { ++uses; }
  CmpiBaseMI* provider = nullptr;
  int uses = 0;
};

#define BASE_MEMBERS                                                     \
  virtual ~CmpiBaseMI() = default;                                       \
  void setProviderBase(CmpiProviderBase* given) { base = given; }        \
  void initialize(const CmpiContext& given) { context = given.context; } \
  CmpiProviderBase* base = nullptr;                                      \
  const CMPIBroker* broker = nullptr;                                    \
  const CMPIContext* context = nullptr;

#include "abi_factory_functions.inc"

template <typename Base>
struct ClassProvider : Base {
  ClassProvider(const CmpiBroker& given, const CmpiContext&) { this->broker = given.broker; }
};

CMProviderBase(ClassProvider)
#include "abi_factory_uses.inc"

    namespace {

  template <typename Provider>
  Provider* createSample(Provider * (*create)(const CMPIBroker*, const CMPIContext*, CMPIStatus*)) {
    const CMPIBroker broker{};
    const int hooks = sampleHooks;
    Provider* provider = create(&broker, nullptr, nullptr);
    EXPECT_EQ(sampleBroker, &broker);
    EXPECT_EQ(sampleHooks, hooks + 1);
    EXPECT_EQ(create(&broker, nullptr, nullptr), provider);
    sampleBroker = nullptr;
    return provider;
  }

  template <typename Provider>
  Provider* createOfClass(Provider * (*create)(const CMPIBroker*, const CMPIContext*, CMPIStatus*)) {
    baseClassProvider = {};
    const CMPIBroker broker{};
    const CMPIContext context{};
    Provider* provider = create(&broker, &context, nullptr);
    CmpiBaseMI* made = baseClassProvider.provider;
    EXPECT_EQ(provider->hdl, made);
    EXPECT_EQ(made->base, &baseClassProvider);
    EXPECT_EQ(made->broker, &broker);
    EXPECT_EQ(made->context, &context);
    EXPECT_EQ(baseClassProvider.uses, 1);
    // A provider of several kinds is one object.
    EXPECT_EQ(create(&broker, &context, nullptr)->hdl, made);
    EXPECT_EQ(baseClassProvider.uses, 2);
    delete made;
    return provider;
  }

#include "abi_factory_checks.inc"

  TEST(CMPI_ABI_SUITE, EveryFactoryFillsItsTableAndItsEntryPointGivesIt) {
    int checked = 0;
    int otherBranch = 0;
    int withdrawn = 0;
#define CASE(name, check) \
  ++checked;              \
  run({#name, check});
#define HELPER(call, text) \
  ++checked;               \
  EXPECT_EQ(CMPI_ABI_SPELLED(call), text);
#define OTHER_BRANCH(name) ++otherBranch;
#define WITHDRAWN_HELPER(name) ++withdrawn;
#include "abi_factory_cases.inc"
#undef CASE
#undef HELPER
#undef OTHER_BRANCH
#undef WITHDRAWN_HELPER
    EXPECT_EQ(otherBranch, 1);  // CMIndicationMIStubExtensions without CMPI_VER_86, or with it
    EXPECT_EQ(withdrawn, 1);    // CMInstanceMIStubChange before version 1.0
    EXPECT_EQ(checked + otherBranch + withdrawn, kMiFactories);
  }

  // ---- C ----

#ifdef CMPI_VER_200
  extern "C" CMPIInstanceMI* CProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

  TEST(CMPI_ABI_SUITE, AProviderWrittenInCIsFoundUnderItsNameAndCalled) {
    const CMPIBroker broker{};
    CMPIInstanceMI* provider = CProvider_Create_InstanceMI(&broker, nullptr, nullptr);
    EXPECT_EQ(cProviderBroker(), &broker);
    EXPECT_STREQ(provider->ft->miName, "instanceCProvider");
    EXPECT_EQ(provider->ft->cleanup(provider, nullptr, 1).rc, CMPI_RC_OK);
  }
#endif

}  // namespace
