#include "runtime/Object.h"

#include <gtest/gtest.h>

#include <string>

namespace {

using runtime::Selector;

class Animal : public runtime::Object {
public:
    static const runtime::Class& classObject()
    {
        static const runtime::Class& instance = runtime::ClassBuilder<Animal>("Animal", &Object::classObject())
                                                    .method("name", &Animal::name)
                                                    .method("sound", &Animal::sound)
                                                    .method("eat:with:", &Animal::eat_with)
                                                    .instanceVariable("m_meals", &Animal::m_meals)
                                                    .instanceVariable("m_friend", &Animal::m_friend)
                                                    .maker([] { return std::make_shared<Animal>(); })
                                                    .build();
        return instance;
    }
    const runtime::Class& isa() const override { return classObject(); }

    std::string name() { return "animal"; }
    std::string sound() { return "…"; }
    int eat_with(int meals, std::shared_ptr<Animal> company)
    {
        m_meals += meals;
        m_friend = company;
        return m_meals;
    }
    int m_meals = 0;
    std::shared_ptr<Animal> m_friend;
};

class Dog final : public Animal {
public:
    static const runtime::Class& classObject()
    {
        static const runtime::Class& instance = runtime::ClassBuilder<Dog>("Dog", &Animal::classObject())
                                                    .method("sound", &Dog::sound)
                                                    .method("bark", &Dog::bark)
                                                    .build();
        return instance;
    }
    const runtime::Class& isa() const override { return classObject(); }

    std::string sound() { return "bark"; }
    std::string bark() { return "Bark!"; }
};

std::string text(runtime::Object& object, const char* selector)
{
    return runtime::fromValue<std::string>(object.perform(Selector(selector)));
}

TEST(ClassTests, AClassIsFoundByItsName)
{
    const auto& dog = Dog::classObject();
    EXPECT_EQ(runtime::Class::named("Dog"), &dog);
    EXPECT_EQ(runtime::Class::named("Unicorn"), nullptr);
    EXPECT_TRUE(dog.isSubclassOf(Animal::classObject()));
    EXPECT_FALSE(Animal::classObject().isSubclassOf(dog));
}

TEST(ClassTests, AClassFoundByItsNameMakesObjects)
{
    (void)Animal::classObject();
    const auto object = runtime::Class::named("Animal")->instantiate();
    ASSERT_TRUE(object);
    EXPECT_EQ(text(*object, "name"), "animal");
    EXPECT_EQ(Dog::classObject().instantiate(), nullptr);
}

TEST(ClassTests, MessagesReachInheritedAndOverriddenMethods)
{
    const auto dog = std::make_shared<Dog>();
    EXPECT_EQ(text(*dog, "name"), "animal");
    EXPECT_EQ(text(*dog, "sound"), "bark");
}

TEST(ClassTests, AMessageThatNobodyAnswersDoesNothing)
{
    const auto dog = std::make_shared<Dog>();
    EXPECT_FALSE(dog->respondsTo(Selector("fly")));
    EXPECT_FALSE(dog->perform(Selector("fly")).has_value());
}

TEST(ClassTests, ArgumentsAreUnwrappedAndMissingOnesAreNil)
{
    const auto dog = std::make_shared<Dog>();
    const auto other = std::make_shared<Dog>();
    dog->perform(Selector("eat:with:"), {runtime::toValue(2), runtime::toValue(other)});
    EXPECT_EQ(dog->m_meals, 2);
    EXPECT_EQ(dog->m_friend, other);
    dog->perform(Selector("eat:with:"), {runtime::toValue(std::string("two"))});
    EXPECT_EQ(dog->m_meals, 2);
    EXPECT_EQ(dog->m_friend, nullptr);
}

TEST(ClassTests, InstanceVariablesAreReadAndWrittenByName)
{
    const auto dog = std::make_shared<Dog>();
    EXPECT_TRUE(dog->setInstanceVariable("m_meals", runtime::toValue(5)));
    EXPECT_EQ(runtime::fromValue<int>(dog->instanceVariable("m_meals")), 5);
    EXPECT_TRUE(dog->setInstanceVariable("m_friend", runtime::toValue(std::make_shared<Dog>())));
    EXPECT_TRUE(runtime::fromValue<std::shared_ptr<Dog>>(dog->instanceVariable("m_friend")));
    EXPECT_FALSE(dog->setInstanceVariable("m_wings", runtime::toValue(2)));
    EXPECT_FALSE(dog->instanceVariable("m_wings").has_value());
}

TEST(ClassTests, TwoMethodsOfAClassAreExchangedAndBackAgain)
{
    const auto dog = std::make_shared<Dog>();
    const auto& itsClass = Dog::classObject();
    ASSERT_TRUE(runtime::Class::exchangeImplementations(itsClass, Selector("sound"), itsClass, Selector("bark")));
    EXPECT_EQ(text(*dog, "sound"), "Bark!");
    EXPECT_EQ(text(*dog, "bark"), "bark");
    ASSERT_TRUE(runtime::Class::exchangeImplementations(itsClass, Selector("sound"), itsClass, Selector("bark")));
    EXPECT_EQ(text(*dog, "sound"), "bark");
}

TEST(ClassTests, WhatAClassDoesNotDefineItselfIsNotExchanged)
{
    const auto dog = std::make_shared<Dog>();
    const auto& itsClass = Dog::classObject();
    EXPECT_FALSE(runtime::Class::exchangeImplementations(itsClass, Selector("sound"), itsClass, Selector("name")));
    EXPECT_EQ(text(*dog, "sound"), "bark");
}

TEST(ClassTests, AMethodThatWasExchangedOntoAnotherClassLeavesItsObjectsAlone)
{
    const auto animal = std::make_shared<Animal>();
    const auto& dogs = Dog::classObject();
    const auto& animals = Animal::classObject();
    ASSERT_TRUE(runtime::Class::exchangeImplementations(dogs, Selector("bark"), animals, Selector("name")));
    EXPECT_FALSE(animal->perform(Selector("name")).has_value());
    EXPECT_EQ(text(*std::make_shared<Dog>(), "bark"), "animal");
    ASSERT_TRUE(runtime::Class::exchangeImplementations(dogs, Selector("bark"), animals, Selector("name")));
}

} // namespace
