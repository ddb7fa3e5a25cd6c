#include "cli/cli_docs.h"

#include <sstream>

#include "cli/cli_commands.h"
#include "cli/cli_options.h"
#include "effects/registry.h"

namespace quillane::cli {
namespace {

// The usage text's synopsis (the lines after "Usage:" up to the first blank one) and the rest.
void SplitUsage(std::string& synopsis, std::string& rest) {
  std::istringstream in(UsageText());
  std::string line;
  bool inSynopsis = true;
  while (std::getline(in, line)) {
    if (line == "Usage:") continue;
    if (inSynopsis && line.empty()) {
      inSynopsis = false;
      continue;
    }
    if (inSynopsis) {
      synopsis += line.substr(line.find_first_not_of(' ') == std::string::npos
                                  ? line.size()
                                  : line.find_first_not_of(' ')) +
                  "\n";
    } else {
      rest += line + "\n";
    }
  }
}

}  // namespace

std::string RoffVerbatim(const std::string& text) {
  std::string out;
  bool lineStart = true;
  for (char c : text) {
    if (lineStart && (c == '.' || c == '\'')) out += "\\&";
    lineStart = c == '\n';
    if (c == '\\')
      out += "\\e";
    else if (c == '-')
      out += "\\-";
    else
      out += c;
  }
  return out;
}

std::string ManPageText() {
  std::string synopsis, description;
  SplitUsage(synopsis, description);
  std::ostringstream page;
  page << ".TH QUILLANE\\-CLI 1 \"\" \"" << RoffVerbatim(VersionText()) << "\" \"User Commands\"\n"
       << ".SH NAME\n"
       << "quillane\\-cli \\- turn photographs into artwork without a window\n"
       << ".SH SYNOPSIS\n.nf\n"
       << RoffVerbatim(synopsis) << ".fi\n"
       << ".SH DESCRIPTION\n.nf\n"
       << RoffVerbatim(description) << ".fi\n"
       << ".SH EFFECTS\n.nf\n"
       << RoffVerbatim(EffectListText()) << ".fi\n"
       << ".SH SEE ALSO\n"
       << "The Quillane program, \\fBquillane\\fR FILE, shows the same effects in tool windows.\n";
  return page.str();
}

std::string BashCompletionText() {
  std::ostringstream effects, batchEffects, options, choices;
  for (const EffectSpec* e : Effects()) {
    if (!e->routine) continue;
    effects << " " << e->cliName;
    if (e->HasBatchPanel()) batchEffects << " " << e->cliName;
    options << "    " << e->cliName << ") opts=\"";
    for (const ParamSpec& p : e->params) {
      if (p.kind == ParamKind::Hidden) continue;
      options << "--" << p.name << " ";
      if (p.kind != ParamKind::Choice) continue;
      choices << "    " << e->cliName << ":--" << p.name << ") words=\"";
      for (const ParamOption& o : p.options) choices << o.word << " ";
      choices << "\" ;;\n";
    }
    options << "\" ;;\n";
  }
  std::ostringstream script;
  script << "# bash completion for quillane-cli; written by \"quillane-cli completion\".\n"
         << "_quillane_cli() {\n"
         << "  local cur=${COMP_WORDS[COMP_CWORD]} prev=${COMP_WORDS[COMP_CWORD-1]}\n"
         << "  local command=${COMP_WORDS[1]} effect=${COMP_WORDS[2]} opts= words=\n"
         << "  COMPREPLY=()\n"
         << "  if [[ $COMP_CWORD -eq 1 ]]; then\n"
         << "    COMPREPLY=($(compgen -W \"list apply batch gallery rotate resize convert manpage "
            "completion help "
            "--help --version\" -- \"$cur\"))\n"
         << "    return\n"
         << "  fi\n"
         << "  case $command in\n"
         << "  apply|batch)\n"
         << "    if [[ $COMP_CWORD -eq 2 ]]; then\n"
         << "      if [[ $command == batch ]]; then words=\"" << batchEffects.str() << "\"\n"
         << "      else words=\"" << effects.str() << "\"; fi\n"
         << "      COMPREPLY=($(compgen -W \"$words\" -- \"$cur\"))\n"
         << "      return\n"
         << "    fi\n"
         << "    case \"$effect:$prev\" in\n"
         << choices.str() << "    esac\n"
         << "    if [[ -n $words ]]; then\n"
         << "      COMPREPLY=($(compgen -W \"$words\" -- \"$cur\"))\n"
         << "      return\n"
         << "    fi\n"
         << "    case $prev in\n"
         << "    --input|--output) COMPREPLY=($(compgen -d -- \"$cur\")); return ;;\n"
         << "    -o) COMPREPLY=($(compgen -f -- \"$cur\")); return ;;\n"
         << "    --format) COMPREPLY=($(compgen -W \"png jpg bmp wmf\" -- \"$cur\")); return ;;\n"
         << "    --seed|--[a-z]*) return ;;\n"
         << "    esac\n"
         << "    if [[ $cur == -* ]]; then\n"
         << "      case $effect in\n"
         << options.str() << "      esac\n"
         << "      if [[ $command == batch ]]; then\n"
         << "        opts+=\" --input --output --seed --max-pixels\"\n"
         << "      else opts+=\" -o --format --seed --max-pixels\"; fi\n"
         << "      COMPREPLY=($(compgen -W \"$opts\" -- \"$cur\"))\n"
         << "      return\n"
         << "    fi\n"
         << "    [[ $command == apply ]] && COMPREPLY=($(compgen -f -X "
            "'!*.@(jpg|jpeg|bmp|ico|gif|wmf|emf|png|JPG|JPEG|BMP|ICO|GIF|WMF|EMF|PNG)' "
            "-- \"$cur\") $(compgen -d -- \"$cur\"))\n"
         << "    ;;\n"
         << "  gallery)\n"
         << "    if [[ $prev == --input ]]; then COMPREPLY=($(compgen -f -- \"$cur\"))\n"
         << "    elif [[ $cur == -* ]]; then COMPREPLY=($(compgen -W \"--input\" -- \"$cur\"))\n"
         << "    else COMPREPLY=($(compgen -d -- \"$cur\")); fi\n"
         << "    ;;\n"
         << "  rotate|resize|convert)\n"
         << "    if [[ $command == rotate && $COMP_CWORD -eq 2 ]]; then\n"
         << "      COMPREPLY=($(compgen -W \"cw ccw\" -- \"$cur\"))\n"
         << "    elif [[ $cur == -* ]]; then COMPREPLY=($(compgen -W \"-o\" -- \"$cur\"))\n"
         << "    else COMPREPLY=($(compgen -f -- \"$cur\")); fi\n"
         << "    ;;\n"
         << "  esac\n"
         << "}\n"
         << "complete -F _quillane_cli quillane-cli\n";
  return script.str();
}

}  // namespace quillane::cli
