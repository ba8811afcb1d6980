# Completion of the command ktfiles for bash.

_ktfiles()
{
    local cur prev words cword
    _init_completion || return

    local common='--json --jsonl --quiet --color --coordination --help' edit='--in-place --dry-run --backup --keep-times --timeout'
    local files='--files-from --null'
    local keys='beatCount midiRootNote keyType signatureTop signatureBottom loopFileType instrumentType
        instrumentSubType genre descriptors title artist copyright comments transients key mode signature beats category subCategory kind'
    local fields='bext.description bext.originator bext.originatorReference bext.originationDate bext.originationTime bext.timeReference
        bext.version bext.umid bext.loudnessValue bext.loudnessRange bext.maxTruePeakLevel bext.maxMomentaryLoudness
        bext.maxShortTermLoudness bext.codingHistory info.INAM info.IART info.ICMT info.ICRD info.ICOP info.IGNR info.IPRD info.ISFT
        acid.tempo acid.beats acid.rootNote smpl.midiUnityNote cart.title cart.artist ixml.PROJECT ixml.SCENE ixml.TAKE ixml.NOTE NAME AUTH ANNO'
    local projects='media dirs backup restore settle rename-alternative'
    local verb=${words[1]} object=${words[2]}

    if [[ $verb == lock ]]; then
        local i
        for ((i = 2; i < cword; ++i)); do
            if [[ ${words[i]} == -- ]]; then
                _command_offset $((i + 1))
                return
            fi
        done
    fi

    case $verb/$prev in
        decode/--format) COMPREPLY=($(compgen -W 'wav aiff caf raw' -- "$cur")); return ;;
        decode/--bits) COMPREPLY=($(compgen -W '16 24 32 f32' -- "$cur")); return ;;
        decode/--rate) COMPREPLY=($(compgen -W '44100 48000 88200 96000' -- "$cur")); return ;;
        overview/--format) COMPREPLY=($(compgen -W 'audiowaveform' -- "$cur")); return ;;
        overview/--gain) COMPREPLY=($(compgen -W 'auto 6 12 24' -- "$cur")); return ;;
        overview/--channels) COMPREPLY=($(compgen -W 'split sum 1 2' -- "$cur")); return ;;
        find/--format | page/--format) COMPREPLY=($(compgen -W 'wav aiff aifc caf mp3 aac m4a flac ogg wma wavpack w64' -- "$cur")); return ;;
        find/--rate | page/--rate) COMPREPLY=($(compgen -W '44.1k 48k 88.2k 96k' -- "$cur")); return ;;
        find/--channels | page/--channels) COMPREPLY=($(compgen -W '1 2 3..' -- "$cur")); return ;;
        decode/--channels | */--frames | */--frames-per-point) return ;;
    esac
    case $prev in
        --color) COMPREPLY=($(compgen -W 'auto always never' -- "$cur")); return ;;
        --coordination | --with) _filedir -d; return ;;
        --files-from | --from | -o | --output | --png | --svg | --sheet) _filedir; return ;;
        --only) COMPREPLY=($(compgen -W 'bext ixml info cue smpl inst acid cart chna axml comt mark strg regn id3 xmp' -- "$cur")); return ;;
        --kind) COMPREPLY=($(compgen -W 'loop one-shot recording' -- "$cur")); return ;;
        --problem) COMPREPLY=($(compgen -W 'any truncated unreadable' -- "$cur")); return ;;
        --since) COMPREPLY=($(compgen -W 'today yesterday 3d 2w' -- "$cur")); return ;;
        --sort) COMPREPLY=($(compgen -W 'name path tempo key duration size modified category rate relevance' -- "$cur")); return ;;
        --db) _filedir db; return ;;
        --tempo | --key | --category | --genre | --artist | --title | --album | --longer | --shorter | --limit) return ;;
        --sidecar) return ;;
        --colors) COMPREPLY=($(compgen -W 'night day amber rose ink' -- "$cur")); return ;;
        --width | --height | --start | --end | --alternative | --keep | --timeout) return ;;
    esac

    if ((cword == 1)); then
        COMPREPLY=($(compgen -W 'info pair chunks tags meta scan index find page overview adm project lock locks decode help --help --version -V' -- "$cur"))
    elif [[ $verb == help ]]; then
        if ((cword == 2)); then
            COMPREPLY=($(compgen -W 'info pair chunks tags meta scan index find page overview adm project lock locks decode' -- "$cur"))
        elif ((cword == 3)) && [[ $object == chunks ]]; then
            COMPREPLY=($(compgen -W 'get add remove' -- "$cur"))
        elif ((cword == 3)) && [[ $object == tags ]]; then
            COMPREPLY=($(compgen -W 'set remove copy' -- "$cur"))
        elif ((cword == 3)) && [[ $object == meta ]]; then
            COMPREPLY=($(compgen -W 'set remove copy export import' -- "$cur"))
        elif ((cword == 3)) && [[ $object == index ]]; then
            COMPREPLY=($(compgen -W 'merge export' -- "$cur"))
        elif ((cword == 3)) && [[ $object == project ]]; then
            COMPREPLY=($(compgen -W "$projects" -- "$cur"))
        fi
    elif [[ $cur == -* ]]; then
        case $verb/$object in
            info/*) COMPREPLY=($(compgen -W "--csv --long --check --md5 --sha256 --threads $files $common" -- "$cur")) ;;
            chunks/get) COMPREPLY=($(compgen -W "--output --force --sidecar $common" -- "$cur")) ;;
            chunks/add) COMPREPLY=($(compgen -W "--from --replace --sidecar --force $edit $common" -- "$cur")) ;;
            chunks/remove) COMPREPLY=($(compgen -W "--sidecar --force $edit $common" -- "$cur")) ;;
            adm/*) COMPREPLY=($(compgen -W "--long --lenient --check --threads $files $common" -- "$cur")) ;;
            tags/set | tags/remove | tags/copy) COMPREPLY=($(compgen -W "$files $edit $common" -- "$cur")) ;;
            overview/*) COMPREPLY=($(compgen -W "--png --svg --width --height --start --end --frames --scale --colors
                --sheet --columns --channels --gain --scale-factor --format --output --frames-per-point --force --stored --store --threads $files $edit $common" -- "$cur")) ;;
            decode/*) COMPREPLY=($(compgen -W "--output --format --rate --channels --bits --start --end --frames --conceal
                --force --threads $files $common" -- "$cur")) ;;
            lock/*) COMPREPLY=($(compgen -W "--read --write --presenter --timeout -- $common" -- "$cur")) ;;
            scan/*) COMPREPLY=($(compgen -W "--csv --threads $files $common" -- "$cur")) ;;
            find/*) COMPREPLY=($(compgen -W "--tempo --key --related --kind --category --genre --artist --title --album --longer --shorter
                --rate --channels --format --problem --duplicates --since --sort --reverse --limit --db --fresh --null --csv $common" -- "$cur")) ;;
            page/*) COMPREPLY=($(compgen -W "--tempo --key --related --kind --category --genre --artist --title --album --longer --shorter
                --rate --channels --format --problem --duplicates --since --sort --reverse --limit
                --output --heading --previews --embed-previews --serve --port --fresh --force --db $common" -- "$cur")) ;;
            index/merge | index/export) COMPREPLY=($(compgen -W "--db $common" -- "$cur")) ;;
            index/*) COMPREPLY=($(compgen -W "--db --hash --no-overview --prune --watch --shard --records --threads $files $common" -- "$cur")) ;;
            meta/set) COMPREPLY=($(compgen -W "--lenient --loudness --md5 $files $edit $common" -- "$cur")) ;;
            meta/remove) COMPREPLY=($(compgen -W "$files $edit $common" -- "$cur")) ;;
            meta/copy) COMPREPLY=($(compgen -W "--only --lenient $files $edit $common" -- "$cur")) ;;
            meta/export) COMPREPLY=($(compgen -W "--csv --xml --bom --output --force --only --threads $files $common" -- "$cur")) ;;
            meta/import) COMPREPLY=($(compgen -W "--empty-removes --lenient $edit $common" -- "$cur")) ;;
            meta/*) COMPREPLY=($(compgen -W "--only --csv --threads $files $common" -- "$cur")) ;;
            tags/*) COMPREPLY=($(compgen -W "--csv --threads $files $common" -- "$cur")) ;;
            pair/*) COMPREPLY=($(compgen -W "--csv $files $common" -- "$cur")) ;;
            chunks/*) COMPREPLY=($(compgen -W "$files $common" -- "$cur")) ;;
            project/media) COMPREPLY=($(compgen -W "--missing --alternative $common" -- "$cur")) ;;
            project/dirs) COMPREPLY=($(compgen -W "--create --alternative --timeout $common" -- "$cur")) ;;
            project/backup) COMPREPLY=($(compgen -W "--keep --alternative --dry-run --timeout $common" -- "$cur")) ;;
            project/restore) COMPREPLY=($(compgen -W "--alternative --dry-run --timeout $common" -- "$cur")) ;;
            project/settle) COMPREPLY=($(compgen -W "--undo --forget --with --alternative --dry-run --timeout $common" -- "$cur")) ;;
            project/rename-alternative) COMPREPLY=($(compgen -W "$edit $common" -- "$cur")) ;;
            *) COMPREPLY=($(compgen -W "$common" -- "$cur")) ;;
        esac
    elif [[ $verb == chunks && $object == @(get|add|remove) ]] && ((cword == 4)) && [[ $prev != -* ]]; then
        # The ids of the file's chunks; readarray, since an id may hold spaces.
        local id ids
        readarray -t ids < <(command ktfiles chunks "${prev/#\~/$HOME}" 2>/dev/null | cut -f1 | sort -u)
        for id in "${ids[@]%%*( )}"; do
            [[ $id == "$cur"* ]] && COMPREPLY+=("$(printf %q "$id")")
        done
    elif [[ $verb == @(scan|index) ]]; then
        _filedir -d
    elif [[ $verb == project ]]; then
        _filedir -d
        ((cword == 2)) && COMPREPLY+=($(compgen -W "$projects" -- "$cur"))
    else
        _filedir
        if ((cword > 3)) && [[ $verb/$object == tags/set ]]; then
            COMPREPLY+=($(compgen -S = -W "$keys" -- "$cur"))
            compopt -o nospace
        elif ((cword > 3)) && [[ $verb/$object == tags/remove ]]; then
            COMPREPLY+=($(compgen -W "$keys" -- "$cur"))
        elif ((cword > 3)) && [[ $verb/$object == meta/set ]]; then
            COMPREPLY+=($(compgen -S = -W "$fields" -- "$cur"))
            compopt -o nospace
        elif ((cword > 3)) && [[ $verb/$object == meta/remove ]]; then
            COMPREPLY+=($(compgen -W "$fields" -- "$cur"))
        elif ((cword == 2)) && [[ $verb == meta ]]; then
            COMPREPLY+=($(compgen -W 'set remove copy export import' -- "$cur"))
        elif ((cword == 2)) && [[ $verb == index ]]; then
            COMPREPLY+=($(compgen -W 'merge export' -- "$cur"))
        elif ((cword == 2)) && [[ $verb == tags ]]; then
            COMPREPLY+=($(compgen -W 'set remove copy' -- "$cur"))
        elif ((cword == 2)) && [[ $verb == chunks ]]; then
            COMPREPLY+=($(compgen -W 'get add remove' -- "$cur"))
        fi
    fi
} && complete -F _ktfiles ktfiles
