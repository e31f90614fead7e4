// Programs with the two shaders that each is made of: how they are compiled, linked, looked up and deleted.
// Names are 0 where there is no object.
#pragma once

#include <cstddef>
#include <cstdint>

// What a program is made of.
struct QexProgramSource {
    const char* name;  // in the lines that say why the program is not to be had
    const char* vertex;
    const char* fragment;
    const char* const* attributes;  // at locations 0, 1, ...; null: where the linker puts them
    int32_t attributeCount;
    const char* prefix = nullptr;        // lines in front of both sources, or null
    const char* vertexPrefix = nullptr;  // more of them in front of the vertex shader's, with a prefix only
};

// Where the GL names of a program and its shaders are kept.
struct QexProgramNames {
    uint32_t* program;
    uint32_t* vertexShader;
    uint32_t* fragmentShader;
};

// Compiles, links and makes the program current. When a step fails it says so, and the objects that there are
// stay, unless the application handles errors: then nothing is left.
bool QexProgram_Compile(const QexProgramSource& source, const QexProgramNames& names);

// The same, but nothing is left when a step fails.
bool QexProgram_Build(const QexProgramSource& source, const QexProgramNames& names);

// Deletes what there is of them and makes the names 0. No program is in use afterwards. Where not `checked`,
// no errors are looked for.
void QexProgram_Delete(const QexProgramNames& names, bool checked = true);

// Logs why a program is not to be had: what the GL says of each shader that does not compile, and of the
// link. `name` is the program's in these lines.
void QexProgram_LogFailure(const char* name, uint32_t vertexShader, uint32_t fragmentShader,
                           uint32_t program);

// A location to be looked up, and where it goes.
struct QexProgramLocation {
    int32_t* location;
    const char* name;
};

struct QexProgramSampler {
    const char* name;
    int32_t unit;
};

// Looks a program up for a module, under which GL errors are reported.
struct QexProgramLookup {
    const char* module;
    uint32_t program;
    bool checked = true;  // whether looking up is followed by a look for errors

    int32_t Uniform(const char* name) const;
    int32_t Attribute(const char* name) const;
    // The program is current.
    void SetSampler(const QexProgramSampler& sampler) const;

    template <size_t count>
    void Uniforms(const QexProgramLocation (&uniforms)[count]) const {
        for (const QexProgramLocation& uniform : uniforms) *uniform.location = Uniform(uniform.name);
    }
    template <size_t count>
    void Attributes(const QexProgramLocation (&attributes)[count]) const {
        for (const QexProgramLocation& attribute : attributes)
            *attribute.location = Attribute(attribute.name);
    }
};
