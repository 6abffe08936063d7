// Effects and parameters by the names that people use.
//
// The records hold keys. What people read comes from the language library that the module has
// loaded; where that has no text, or there is no library, a name is read off the key: the words of
// "IDS_Vi_Param_BubbleMinSize_Name" are "Bubble min size". Short names and the words of keys are
// the same in every language, and what people write may be either.
#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include "interface/HostInterface.h"

namespace kyvhosting {

// The text of a key in the module's language library, or in that of UseTextsBeside; empty when
// there is none.
std::string LanguageText(const EffectDescriptor& effect, const char* key);

// For plug-ins in folders with dots in their names: the module takes its file's name only as far as
// the first dot of the path, and so finds no language library there. Looks beside the module, for
// the user's language and then for English, and keeps the library open. Later calls do nothing once
// one was found.
void UseTextsBeside(const std::filesystem::path& module);

// The part of an effect that a parameter belongs to, in English: "Border"; empty where the effect
// has no parts. Several parameters of the picture-in-picture have the same name, and this tells
// them apart.
std::string SectionOf(const EffectDescriptor& effect, uint32_t param);

// The words of a key, without its prefix, tags, ending and choice labels.
std::string WordsOfKey(std::string_view key);

// "Minimum size"
std::string ParamName(const EffectDescriptor& effect, const ParamDescriptor& param);

// "Color temperature"
std::string EffectName(const EffectDescriptor& effect);

// "color-temperature", for the command line
std::string ShortName(const EffectDescriptor& effect);

// The labels that follow the name key of a choice list.
std::vector<std::string> ChoiceLabels(const ParamDescriptor& param);

// "Top left" for "UL": one for each label, which is itself where the library has no text.
std::vector<std::string> ChoiceNames(const EffectDescriptor& effect, const ParamDescriptor& param);

// Letters and digits only, in lower case, "colour" as "color": what is equal after this is the
// same name.
std::string Normalized(std::string_view text);

// By identifier, index, name, short name or a part of a name that no other effect has. Throws
// CUsageError with the nearest name; where tells in it where all are shown ("list shows all").
const EffectDescriptor& FindEffect(const ModuleDescriptor& module, std::string_view text,
                                   const std::string& where = {});

// By identifier alone; null when there is none.
const EffectDescriptor* EffectOf(const ModuleDescriptor& module, std::string_view identifier);

// The index by key, name or a part of a name that no other parameter has. Throws CUsageError with
// the nearest one, or with the keys among which a name leaves the choice.
uint32_t FindParam(const EffectDescriptor& effect, std::string_view text,
                   const std::string& where = {});

} // namespace kyvhosting
