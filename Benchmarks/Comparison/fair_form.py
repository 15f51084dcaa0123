"""The C of a program in the form that is fair to the large compilers.

The unoptimised C keeps its states at file scope, where no compiler puts them into SSA form: there would be nothing to
measure. In the fair form the states are locals of one function that runs the program for ever, as the loop around main
does for our road:

    void NAME_run(void) {
        <states>  <what NAME_init does>
        do { <what NAME_step does> } while (hpn_going);
    }

Inputs stay volatile and outputs external, so every read happens and every result is seen; what an extern could see does
not exist in the measured families. A program with procedures keeps its states static at file scope, for locals of one function
could not be shared: that is the form in which ipsccp follows a variable across calls, and in which gcc has little to do.
"""
import re

STATE = re.compile(r"^static (?!const\b)[A-Za-z0-9_ ]+ \w+(\[\d+\])?;$")


def body_of(lines, opening):
    """The lines between the line that begins a function and its closing brace."""
    start = lines.index(opening)
    end = lines.index("}", start)
    return start, end, lines[start + 1:end]


def fair_form(source):
    """Takes the text that `hpncg --no-optimize` writes; answers the fair form."""
    lines = source.split("\n")
    name = next(re.match(r"void (\w+)_step\(void\);", line) for line in lines if line.endswith("_step(void);")).group(1)
    has_procedures = any(re.match(r"^static [A-Za-z0-9_ ]+\(.*\);$", line) for line in lines)
    going = "extern volatile int hpn_going;"
    if has_procedures:
        text = re.sub(rf"^void {name}_(init|step)\(void\)", rf"static void {name}_\1(void)", source, flags=re.M)
        return f"{text}\n{going}\nvoid {name}_run(void) {{\n    {name}_init();\n    do {{ {name}_step(); }} while (hpn_going);\n}}\n"
    states = [line for line in lines if STATE.match(line)]
    init_start, _, init_body = body_of(lines, f"void {name}_init(void) {{")
    _, _, step_body = body_of(lines, f"void {name}_step(void) {{")
    if any(re.search(r"\breturn\b", line) for line in step_body):
        raise ValueError(f"{name}: main returns early")
    dropped = set(states) | {f"void {name}_init(void);", f"void {name}_step(void);"}
    head = [line for line in lines[:init_start] if line not in dropped]
    return "\n".join(head + [going, f"void {name}_run(void);", f"void {name}_run(void) {{"]
                     + ["    " + line.replace("static ", "", 1) for line in states] + init_body
                     + ["    do {"] + step_body + ["    } while (hpn_going);", "}", ""])
