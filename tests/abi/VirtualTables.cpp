// SPDX-License-Identifier: Apache-2.0
#include "tests/abi/VirtualTables.h"

#include <cxxabi.h>
#include <elf.h>
#include <link.h>

#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>
#include <memory>
#include <stdexcept>

namespace {

constexpr const char* kTableStart = "_ZTV";
// In front of the slots: the offset to the whole object and the type information.
constexpr std::size_t kWordsInFront = 2;

// The kind of file that this build's compiler writes.
using Header = ElfW(Ehdr);
using Section = ElfW(Shdr);
using Symbol = ElfW(Sym);
constexpr std::size_t kWordBytes = sizeof(void*);
constexpr char kClass = kWordBytes == 4 ? ELFCLASS32 : ELFCLASS64;
constexpr unsigned kSymbolIndexShift = kWordBytes == 4 ? 8 : 32;

std::string Demangled(const std::string& name) {
  int status = 0;
  const std::unique_ptr<char, decltype(&std::free)> text(
      abi::__cxa_demangle(name.c_str(), nullptr, nullptr, &status), &std::free);
  return text != nullptr ? text.get() : name;
}

bool EndsWith(const std::string& text, const std::string& end) {
  return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
}

// Compilers give the complete destructor a second name when it is the base's one too. Which class
// along the line implements an operation is its own business, so its name is left out.
std::string SlotName(const std::string& symbol) {
  if (EndsWith(symbol, "D0Ev")) return "destructor, deleting";
  if (EndsWith(symbol, "D1Ev") || EndsWith(symbol, "D2Ev")) return "destructor, complete";
  const std::string name = Demangled(symbol);
  const std::size_t scope = name.substr(0, name.find('(')).rfind("::");
  return scope != std::string::npos ? name.substr(scope + 2) : name;
}

// "vtable for X" as "X"; empty for a table that is not one of ours.
std::string ClassName(const std::string& symbol) {
  if (symbol.compare(0, std::strlen(kTableStart), kTableStart) != 0) return {};
  const std::string name = Demangled(symbol).substr(std::strlen("vtable for "));
  for (const char* foreign : {"std::", "__cxxabiv1::", "__gnu_cxx::", "testing::"}) {
    if (name.compare(0, std::strlen(foreign), foreign) == 0) return {};
  }
  return name;
}

class ObjectFile {
 public:
  explicit ObjectFile(const std::string& bytes) : bytes_(bytes) {
    const auto header = At<Header>(0);
    if (header.e_type != ET_REL) throw std::runtime_error("not an object file");
    for (std::size_t i = 0; i < header.e_shnum; ++i) {
      sections_.push_back(At<Section>(header.e_shoff + i * header.e_shentsize));
    }
    for (const auto& section : sections_) {
      if (section.sh_type == SHT_SYMTAB) ReadSymbols(section);
    }
  }

  void AddTables(SlotTables& tables) const {
    for (std::size_t i = 0; i < symbols_.size(); ++i) {
      const auto& symbol = symbols_[i];
      const std::string name = symbol.st_shndx != SHN_UNDEF ? ClassName(names_[i]) : std::string();
      if (name.empty()) continue;
      std::vector<std::string> slots = Slots(symbol);
      bool isConcrete = !slots.empty();
      for (const std::string& slot : slots) isConcrete = isConcrete && slot != "__cxa_pure_virtual";
      if (isConcrete) tables[name] = std::move(slots);
    }
  }

 private:
  template <class Record>
  Record At(std::size_t offset) const {
    Record record;
    if (offset > bytes_.size() || bytes_.size() - offset < sizeof(record)) {
      throw std::runtime_error("the file is too short");
    }
    std::memcpy(&record, bytes_.data() + offset, sizeof(record));
    return record;
  }

  void ReadSymbols(const Section& section) {
    const std::size_t texts = sections_.at(section.sh_link).sh_offset;
    for (std::size_t done = 0; done < section.sh_size; done += sizeof(Symbol)) {
      symbols_.push_back(At<Symbol>(section.sh_offset + done));
      const std::size_t start = texts + symbols_.back().st_name;
      names_.push_back(bytes_.substr(start, bytes_.find('\0', start) - start));
    }
  }

  std::vector<std::string> Slots(const Symbol& table) const {
    std::vector<std::string> slots(table.st_size / kWordBytes - kWordsInFront, "(nothing)");
    for (const auto& section : sections_) {
      if (section.sh_info != table.st_shndx) continue;
      if (section.sh_type == SHT_REL) {
        FillSlots<ElfW(Rel)>(section, table, slots);
      } else if (section.sh_type == SHT_RELA) {
        FillSlots<ElfW(Rela)>(section, table, slots);
      }
    }
    return slots;
  }

  template <class Relocation>
  void FillSlots(const Section& section, const Symbol& table,
                 std::vector<std::string>& slots) const {
    for (std::size_t done = 0; done < section.sh_size; done += sizeof(Relocation)) {
      const auto relocation = At<Relocation>(section.sh_offset + done);
      const std::size_t start = table.st_value + kWordsInFront * kWordBytes;
      if (relocation.r_offset < start) continue;
      const std::size_t slot = (relocation.r_offset - start) / kWordBytes;
      if (slot < slots.size())
        slots[slot] = SlotName(names_.at(relocation.r_info >> kSymbolIndexShift));
    }
  }

  const std::string& bytes_;
  std::vector<Section> sections_;
  std::vector<Symbol> symbols_;
  std::vector<std::string> names_;
};

}  // namespace

void AddSlotTables(const std::string& objectFile, SlotTables& tables) {
  std::ifstream file(objectFile, std::ios::binary);
  const std::string bytes((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
  if (bytes.size() < EI_NIDENT || bytes.compare(0, SELFMAG, ELFMAG) != 0 ||
      bytes[EI_CLASS] != kClass) {
    throw std::runtime_error(objectFile + " is not an object file");
  }
  ObjectFile(bytes).AddTables(tables);
}

std::string FormatSlotTables(const SlotTables& tables) {
  std::string text;
  for (const auto& [name, slots] : tables) {
    text += name + "\n";
    for (std::size_t i = 0; i < slots.size(); ++i) {
      text += "  " + std::to_string(i) + " " + slots[i] + "\n";
    }
  }
  return text;
}
