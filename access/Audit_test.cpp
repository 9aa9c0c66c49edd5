#include "access/Audit.h"

#include <gtest/gtest.h>

namespace zorva::access {
namespace {

AuditRecord sample() {
  AuditRecord record;
  record.user = "admin";
  record.proof = Proof::Password;
  record.from = "192.0.2.7:40312";
  record.operation = "ModifyInstance";
  record.object = "root/cimv2:T.Name=\"eth0\"";
  record.changes = {{"DomainName", "\"a.example\"", "\"b.example\""}, {"Servers", "", "{\"192.0.2.53\"}"}};
  record.result = "done";
  return record;
}

TEST(Audit, ALineHasWhoFromWhereWhatAndTheResult) {
  EXPECT_EQ(auditLine(sample()),
            R"(user="admin" login=password from="192.0.2.7:40312" operation=ModifyInstance )"
            R"(object="root/cimv2:T.Name=\"eth0\"" change="DomainName: \"a.example\" -> \"b.example\"" )"
            R"(change="Servers: {\"192.0.2.53\"}" result="done")");
}

TEST(Audit, TextOfAClientAddsNoLineAndNoPair) {
  AuditRecord record = sample();
  record.user = "x\" login=kernel\n";
  record.operation = "A b=\"c\"";
  record.changes.clear();
  const std::string line = auditLine(record);
  EXPECT_EQ(line, R"(user="x\" login=kernel\n" login=password from="192.0.2.7:40312" operation="A b=\"c\"" )"
                  R"(object="root/cimv2:T.Name=\"eth0\"" result="done")");
}

TEST(Audit, LongValuesAreCut) {
  AuditRecord record = sample();
  record.object = std::string(5000, 'x');
  record.changes = {{"P", std::string(2000, 'a'), std::string(2000, 'b')}};
  const std::string line = auditLine(record);
  EXPECT_LT(line.size(), 4000U);
  EXPECT_NE(line.find(std::string(1000, 'x') + "…\""), std::string::npos);
}

TEST(Audit, EveryProofHasAWord) {
  AuditRecord record = sample();
  const std::pair<Proof, const char*> words[] = {{Proof::None, " login=none "},
                                                 {Proof::Kernel, " login=kernel "},
                                                 {Proof::Password, " login=password "},
                                                 {Proof::Certificate, " login=certificate "}};
  for (const auto& [proof, word] : words) {
    record.proof = proof;
    EXPECT_NE(auditLine(record).find(word), std::string::npos) << word;
  }
}

}  // namespace
}  // namespace zorva::access
